#!/usr/bin/env bash
# Runs the installed bash completion function against the built ostracli and
# checks the candidates it offers.
set -u
script=$1
ostracli=$2
ostrahost=$3
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

# Names of the host's objects, from the host the command line names.
scratch=$(mktemp -d)
trap 'rm -rf "$scratch"' EXIT
"$ostrahost" init "$scratch/host.db" --profile demo
export OSTRACLI_HOST=$scratch/host.db
expect "ostracli network nic get -n vmnic" $'vmnic0\nvmnic1\nvmnic2\nvmnic3\nvmnic4\nvmnic5'
expect "ostracli network vswitch standard portgroup set -p Stor" $'Storage\\ A\nStorage\\ B'
expect "ostracli network vm port list --world-id " $'2100401\n2100502'
expect "ostracli --host $scratch/none.db network nic get -n " ""
[ ! -e "$scratch/none.db" ] || { echo "completion created a host state"; failed=$((failed + 1)); }

echo "$passed passed, $failed failed"
[ "$failed" = 0 ]
