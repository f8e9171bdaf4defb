# Bash completion of ostracli. The candidates come from the command tree of
# the ostracli being completed ("ostracli --complete WORD..."), so they always
# match the installed namespaces, commands and options, and the names of the
# host's objects come from the host the command line names.
_ostracli() {
  local cur=${COMP_WORDS[COMP_CWORD]}
  local IFS=$'\n'
  local candidates reply
  candidates=$("${COMP_WORDS[0]}" --complete "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
  COMPREPLY=()
  # Names with blanks ("Storage A") are offered escaped, as one word.
  for reply in $(compgen -W "$candidates" -- "$cur"); do
    COMPREPLY+=("$(printf '%q' "$reply")")
  done
}
complete -o default -F _ostracli ostracli
