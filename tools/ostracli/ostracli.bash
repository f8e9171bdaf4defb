# Bash completion of ostracli. The candidates come from the command tree of
# the ostracli being completed ("ostracli --complete WORD..."), so they always
# match the installed namespaces, commands and options.
_ostracli() {
  local cur=${COMP_WORDS[COMP_CWORD]}
  local IFS=$'\n'
  local candidates
  candidates=$("${COMP_WORDS[0]}" --complete "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
  COMPREPLY=($(compgen -W "$candidates" -- "$cur"))
}
complete -o default -F _ostracli ostracli
