#!/usr/bin/env bash
# Builds the libFuzzer targets (clang) and runs each for a bounded time from
# the committed seed corpus. New inputs go to a scratch corpus, so the
# committed one stays as it is; a crash leaves its input in build-fuzz/crashes.
#
#   scripts/fuzz.sh [SECONDS]        (default 60 per target)
set -euo pipefail
cd "$(dirname "$0")/.."
seconds="${1:-60}"
export CCACHE_BASEDIR="$PWD" CCACHE_NOHASHDIR=true
cmake --preset fuzz >/dev/null
cmake --build --preset fuzz -j"$(nproc)"
mkdir -p build-fuzz/crashes
status=0
for pair in AddressFuzz:address ImportFuzz:import OptionsFuzz:options; do
  target="${pair%%:*}" seeds="tests/fuzz/corpus/${pair#*:}"
  scratch="build-fuzz/corpus/${pair#*:}"
  mkdir -p "$scratch"
  echo "== $target: ${seconds}s from $seeds"
  if ! "build-fuzz/bin/$target" "$scratch" "$seeds" -max_total_time="$seconds" \
      -artifact_prefix=build-fuzz/crashes/"$target"- -print_final_stats=1 2>build-fuzz/"$target".log; then
    status=1
    tail -n 40 build-fuzz/"$target".log
  fi
  grep -E "^stat::number_of_executed_units|^Done" build-fuzz/"$target".log || true
done
exit "$status"
