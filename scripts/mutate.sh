#!/usr/bin/env bash
# Seeds small faults into a scratch copy of the tree, one at a time, and
# counts how many the test suite catches.
#
#   scripts/mutate.sh [--list FILE] [--work DIR] [--jobs N] [--check] [ID...]
#
# The faults are listed in scripts/mutations.txt (format at its top); IDs
# pick some of them. The tree as it is now (tracked and untracked files, not
# the ignored ones) is copied to DIR (default: a new directory under
# ${TMPDIR:-/tmp}), built there with the default preset and its own build
# directory (ccache is shared when present), and the suite must pass on it
# unchanged. Then each fault is applied alone, the tree rebuilt and the
# suite run: a failing suite has caught the fault, a passing one lets it
# survive. A fault whose text is not found is "not applied", one that does
# not build is "broken"; neither counts. --check only tells, without
# building, whether each fault's text is found once.
#
# The suite is the default preset's CTest run without the concurrency and
# crash tests (reliability-concurrency, reliability-crash): they take minutes
# each and check what no seeded fault touches (locking and durability under
# kills), so they would only stretch the run. Everything else runs, the
# reliability faults test included.
#
# Not part of CI: a run takes about an hour on two cores. Run it at a low
# priority (the builds and tests run under nice 10) and let it go; the last
# lines are the figure and the survivors. Leaves DIR behind with --work.
set -euo pipefail

top=$(cd "$(dirname "$0")/.." && pwd)
list="$top/scripts/mutations.txt"
work=""
jobs=2
check=0
ids=()
while [ $# -gt 0 ]; do
  case "$1" in
  --list) list=$(realpath "$2"); shift 2 ;;
  --work) work="$2"; shift 2 ;;
  --jobs) jobs="$2"; shift 2 ;;
  --check) check=1; shift ;;
  -h | --help) sed -n '2,/^set -euo/p' "$0" | sed '$d; s/^# \{0,1\}//'; exit 0 ;;
  -*) echo "mutate.sh: unknown option $1" >&2; exit 2 ;;
  *) ids+=("$1"); shift ;;
  esac
done

keep_work=1
if [ -z "$work" ]; then
  work=$(mktemp -d "${TMPDIR:-/tmp}/ostra-mutate.XXXXXX")
  keep_work=0
fi
mkdir -p "$work"
src="$work/tree"
log="$work/log"
mkdir -p "$log"
cleanup() { [ "$keep_work" = 1 ] || rm -rf "$work"; }
trap cleanup EXIT

export CCACHE_BASEDIR="$src" CCACHE_NOHASHDIR=true
exclude='^(reliability-concurrency|reliability-crash)$'

# The faults as "id<TAB>file<TAB>description" lines; the texts are read by
# apply() from the list itself.
mapfile -t faults < <(awk '/^@ /{id=$2; $1=$2=""; d=substr($0,3)}
  /^file: /{print id "\t" $2 "\t" d}' "$list")

# apply ID: applies fault ID to the scratch tree; 0 applied, 3 not found.
apply() {
  python3 - "$list" "$1" "$src" <<'EOF'
import sys
listing, wanted, root = sys.argv[1:]
blocks, current = {}, None
for line in open(listing, encoding="utf-8").read().split("\n"):
    if line.startswith("@ "):
        current = {"file": None, "old": [], "new": []}
        blocks[line.split()[1]] = current
    elif current is not None and line.startswith("file: "):
        current["file"] = line[6:].strip()
    elif current is not None and line.startswith("- "):
        current["old"].append(line[2:])
    elif current is not None and line.startswith("+ "):
        current["new"].append(line[2:])
    elif current is not None and line in ("-", "+"):
        current["old" if line == "-" else "new"].append("")
fault = blocks[wanted]
path = f"{root}/{fault['file']}"
try:
    text = open(path, encoding="utf-8").read()
except OSError:
    sys.exit(3)
old = "\n".join(fault["old"]) + "\n"
new = "\n".join(fault["new"]) + "\n" if fault["new"] else ""
if text.count(old) != 1:
    sys.exit(3)
open(path, "w", encoding="utf-8").write(text.replace(old, new))
EOF
}

build() {
  nice -n 10 cmake --build --preset default -j"$jobs" >"$1" 2>&1
}

suite() {
  nice -n 10 ctest --preset default -j"$jobs" -E "$exclude" --timeout 900 >"$1" 2>&1
}

echo "mutate.sh: copying the tree to $src"
mkdir -p "$src"
(cd "$top" && git ls-files -z -co --exclude-standard | tar --null -T - -cf -) | tar -xf - -C "$src"
cd "$src"
if [ "$check" = 1 ]; then
  status=0
  for entry in "${faults[@]}"; do
    IFS=$'\t' read -r id file _ <<<"$entry"
    cp -p "$file" "$work/original"
    if apply "$id"; then echo "$id: applies"; else echo "$id: NOT FOUND once in $file"; status=1; fi
    cp -p "$work/original" "$file"
  done
  exit $status
fi
cmake --preset default >"$log/configure" 2>&1
echo "mutate.sh: building and running the suite on the unchanged tree"
start=$(date +%s)
if ! build "$log/baseline-build"; then
  echo "mutate.sh: the unchanged tree does not build; see $log/baseline-build" >&2
  keep_work=1
  exit 1
fi
if ! suite "$log/baseline-suite"; then
  echo "mutate.sh: the suite fails on the unchanged tree; see $log/baseline-suite" >&2
  grep -E "^\s+[0-9]+ - " "$log/baseline-suite" >&2 || true
  keep_work=1
  exit 1
fi
echo "mutate.sh: baseline passed in $(($(date +%s) - start)) s"

caught=0
missed=0
skipped=0
survivors=()
for entry in "${faults[@]}"; do
  IFS=$'\t' read -r id file description <<<"$entry"
  if [ ${#ids[@]} -gt 0 ] && ! printf '%s\n' "${ids[@]}" | grep -qx "$id"; then
    continue
  fi
  cp -p "$file" "$work/original"
  started=$(date +%s)
  if ! apply "$id"; then
    verdict="not applied"
    skipped=$((skipped + 1))
  elif ! build "$log/$id.build"; then
    verdict="broken"
    skipped=$((skipped + 1))
  elif suite "$log/$id.suite"; then
    verdict="SURVIVED"
    missed=$((missed + 1))
    survivors+=("$id: $description")
  else
    failing=$(sed -n '/tests FAILED:/,$p' "$log/$id.suite" | grep -E "^\s+[0-9]+ - " |
      sed -E 's/^\s+[0-9]+ - //; s/ \(.*//' | head -3 | paste -sd, -)
    verdict="caught ($failing)"
    caught=$((caught + 1))
  fi
  # The original file back, with a new time so that the build sees it.
  cp "$work/original" "$file"
  touch "$file"
  printf '%-28s %-60s %4ss\n' "$id" "$verdict" "$(($(date +%s) - started))"
done

# Leave the build as the tree is, for the next run in the same DIR.
build "$log/final-build" || true
counted=$((caught + missed))
echo
if [ "$counted" -gt 0 ]; then
  echo "mutate.sh: $caught of $counted faults caught ($((100 * caught / counted)) %);" \
    "$skipped not counted (not applied or broken)"
else
  echo "mutate.sh: no fault was counted; $skipped not applied or broken"
fi
for survivor in "${survivors[@]}"; do
  echo "  survived: $survivor"
done
[ "$missed" -eq 0 ]
