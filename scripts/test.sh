#!/usr/bin/env bash
# Builds ostracli with its plug-in and runs the whole test suite.
set -euo pipefail
cd "$(dirname "$0")/.."
# ccache hits across checkouts in other folders (CI clones afresh each time).
export CCACHE_BASEDIR="$PWD" CCACHE_NOHASHDIR=true
cmake --preset default >/dev/null
cmake --build --preset default -j"$(nproc)"
ctest --preset default -j"$(nproc)"
