#!/usr/bin/env bash
# Installs the build dependencies (Debian, as root), builds ostracli and its
# plug-in, and lists the NICs of the default demo host.
set -euo pipefail
cd "$(dirname "$0")/.."
if [ "$(id -u)" = 0 ]; then
  apt-get update -qq
  DEBIAN_FRONTEND=noninteractive apt-get install -y -qq --no-install-recommends \
    build-essential cmake ninja-build ccache python3 libsqlite3-dev nlohmann-json3-dev \
    libboost-regex-dev libgtest-dev libgmock-dev libbenchmark-dev libxml2-utils sqlite3 \
    pkg-config libnl-3-dev libnl-route-3-dev libnl-genl-3-dev libnl-xfrm-3-dev iproute2 ethtool \
    >/dev/null
fi
cmake --preset default >/dev/null
cmake --build --preset default -j"$(nproc)"
./build/bin/ostracli network nic list
