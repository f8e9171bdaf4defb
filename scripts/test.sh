#!/usr/bin/env bash
# The README's test command: installs what the tests need (Debian, as root,
# only what is missing), builds ostracli with its plug-in and runs the whole
# test suite through CTest.
set -euo pipefail
cd "$(dirname "$0")/.."
./scripts/install-deps.sh test
# ccache hits across checkouts in other folders (CI clones afresh each time).
export CCACHE_BASEDIR="$PWD" CCACHE_NOHASHDIR=true
cmake --preset default >/dev/null
cmake --build --preset default -j"$(nproc)"
ctest --preset default -j"$(nproc)"
