#!/usr/bin/env bash
# Runs clang-tidy (.clang-tidy) on the C++ files of ours that a change touched
# and fails on any finding.
#
#   scripts/tidy.sh [BASE]   files changed from BASE to HEAD (default HEAD^:
#                            the last commit, or on a merge commit everything
#                            the merge brought in, since HEAD^ is its first
#                            parent); $TIDY_BASE sets BASE too
#   scripts/tidy.sh --all    every source file of ours
#
# "Ours" is src/, include/, tools/ and platform/ (the framework and the host
# library); a changed header is checked through the source file of the same
# name beside it, and with every file that includes it as far as clang-tidy's
# header filter reaches. The compile commands come from the ci build
# (build-ci/), else the default build (build/); configure one first.
set -euo pipefail
cd "$(dirname "$0")/.."

db=
for dir in build-ci build; do
  [ -f "$dir/compile_commands.json" ] && { db=$dir; break; }
done
[ -n "$db" ] || { echo "tidy: no compile_commands.json; run cmake --preset ci first" >&2; exit 2; }

ours='^(src|include|tools|platform)/.*\.(cpp|h)$'
if [ "${1:-}" = "--all" ]; then
  changed=$(git ls-files | grep -E "$ours" || true)
else
  base=${1:-${TIDY_BASE:-HEAD^}}
  if ! git rev-parse -q --verify "$base^{commit}" >/dev/null; then
    echo "tidy: no commit $base to compare with (a shallow clone?); checking every file" >&2
    changed=$(git ls-files | grep -E "$ours" || true)
  else
    changed=$(git diff --name-only --diff-filter=d "$base" HEAD | grep -E "$ours" || true)
  fi
fi

# Source files to run: the changed ones, and for a header the source beside it,
# if the build compiles it.
files=()
for file in $changed; do
  case $file in
    *.h) file=${file%.h}.cpp ;;
  esac
  [ -f "$file" ] && grep -q "\"file\": \"$PWD/$file\"" "$db/compile_commands.json" &&
    files+=("$file")
done
if [ "${#files[@]}" = 0 ]; then
  echo "tidy: no changed source file of ours to check"
  exit 0
fi
mapfile -t files < <(printf '%s\n' "${files[@]}" | sort -u)
echo "tidy: checking ${#files[@]} files with the compile commands of $db/"
# One clang-tidy per core; each prints its findings and exits non-zero on one.
# Its counts of suppressed warnings (stderr) are left out; anything else it
# says there is shown when it fails.
errors=$(mktemp)
trap 'rm -f "$errors"' EXIT
if ! printf '%s\0' "${files[@]}" |
  xargs -0 -n 4 -P "$(nproc)" clang-tidy -p "$db" --quiet 2>"$errors"; then
  grep -v 'warnings\? generated\.$' "$errors" >&2 || true
  echo "tidy: findings above" >&2
  exit 1
fi
echo "tidy: ${#files[@]} files clean"
