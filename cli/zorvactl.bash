# Completion of zorvactl for bash: source <(zorvactl completion bash)
_zorvactl() {
  local IFS=$'\n'
  COMPREPLY=($("${COMP_WORDS[0]}" complete -- "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null))
  if [[ ${COMPREPLY[0]} == *= ]]; then compopt -o nospace 2>/dev/null; fi
}
complete -o default -F _zorvactl zorvactl
