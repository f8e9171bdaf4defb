#!/usr/bin/env bash
# Runs the installed bash completion function against the built ostracli and
# checks the candidates it offers.
set -u
script=$1
ostracli=$2
source "$script"
passed=0
failed=0

# expect "WORDS TYPED" "expected candidates, one per line"
expect() {
  local line=$1 want=$2
  read -r -a COMP_WORDS <<<"$line"
  COMP_WORDS[0]=$ostracli
  if [[ $line == *" " ]]; then COMP_WORDS+=(""); fi
  COMP_CWORD=$((${#COMP_WORDS[@]} - 1))
  COMPREPLY=()
  _ostracli
  local got
  got=$(printf '%s\n' "${COMPREPLY[@]}")
  if [[ "$got" == "$want" ]]; then
    passed=$((passed + 1))
  else
    failed=$((failed + 1))
    printf 'completion of "%s":\n--- expected\n%s\n--- got\n%s\n' "$line" "$want" "$got"
  fi
}

expect "ostracli netw" "network"
expect "ostracli network ni" "nic"
expect "ostracli network nic hw" "hwCap"
expect "ostracli network nic hwCap " $'supported\nactivated'
expect "ostracli --form" $'--formatter\n--format-param'
expect "ostracli --formatter j" "json"
expect "ostracli network nic list --h" "--help"
expect "ostracli network nosuch " ""

echo "$passed passed, $failed failed"
[ "$failed" = 0 ]
