#!/usr/bin/env bash
# Installs the build dependencies (Debian, as root), builds ostracli and its
# plug-in, and lists the NICs of the default demo host.
set -euo pipefail
cd "$(dirname "$0")/.."
./scripts/install-deps.sh build
export CCACHE_BASEDIR="$PWD" CCACHE_NOHASHDIR=true
cmake --preset default >/dev/null
cmake --build --preset default -j"$(nproc)"
./build/bin/ostracli network nic list
