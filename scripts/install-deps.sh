#!/usr/bin/env bash
# Installs the Debian packages a stage needs, as root; a no-op when they are
# all installed already (then no package list is fetched). Not root: prints
# what is missing and leaves the machine as it is.
#
#   scripts/install-deps.sh build|test|ci
#
#   build  compilers, CMake, Ninja and the libraries ostracli is built from
#          (libnl for the Linux host)
#   test   build, plus what the test suite runs (xmllint, sqlite3, iproute2,
#          ethtool, groff for the manual page check)
#   ci     test, plus clang and its libFuzzer runtime for the fuzz stage, and
#          clang-tidy
set -euo pipefail

build=(build-essential cmake ninja-build ccache pkg-config python3 libsqlite3-dev
       nlohmann-json3-dev libboost-regex-dev libgtest-dev libgmock-dev libbenchmark-dev
       libnl-3-dev libnl-route-3-dev libnl-genl-3-dev libnl-xfrm-3-dev)
test=("${build[@]}" libxml2-utils sqlite3 iproute2 ethtool groff-base)
ci=("${test[@]}" clang libclang-rt-14-dev clang-tidy)

case "${1:-}" in
  build) wanted=("${build[@]}") ;;
  test) wanted=("${test[@]}") ;;
  ci) wanted=("${ci[@]}") ;;
  *) echo "usage: $0 build|test|ci" >&2; exit 2 ;;
esac

missing=()
for package in "${wanted[@]}"; do
  dpkg-query -W -f='${Status}' "$package" 2>/dev/null | grep -q '^install ok installed$' ||
    missing+=("$package")
done
[ "${#missing[@]}" = 0 ] && exit 0
if [ "$(id -u)" != 0 ]; then
  echo "install-deps: not root; missing packages: ${missing[*]}" >&2
  exit 0
fi
export DEBIAN_FRONTEND=noninteractive
# One update per machine and hour: a later stage (ci after test) reuses it.
if [ -z "$(find /var/lib/apt/lists -maxdepth 1 -name '*_Packages*' -mmin -60 2>/dev/null)" ]; then
  apt-get update -qq
fi
apt-get install -y -qq --no-install-recommends "${missing[@]}" >/dev/null
