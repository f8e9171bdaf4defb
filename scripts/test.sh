#!/usr/bin/env bash
# The README's test command: installs what the tests need (Debian, as root,
# only what is missing), builds ostracli with its plug-in and runs the whole
# test suite through CTest. OSTRA_PRESET names another preset of the same
# build (CI uses "ci": warnings are errors there).
set -euo pipefail
cd "$(dirname "$0")/.."
./scripts/install-deps.sh test
# ccache hits across checkouts in other folders (CI clones afresh each time).
export CCACHE_BASEDIR="$PWD" CCACHE_NOHASHDIR=true
preset=${OSTRA_PRESET:-default}
cmake --preset "$preset" >/dev/null
cmake --build --preset "$preset" -j"$(nproc)"
ctest --preset "$preset" -j"$(nproc)"
