# Completion of velltool's command lines for bash.

_velltool() {
  local current=${COMP_WORDS[COMP_CWORD]} word words=() index
  # Only the words since the last "--" count: each command starts at the root.
  for ((index = 1; index < COMP_CWORD; ++index)); do
    word=${COMP_WORDS[index]}
    if [[ $word == -- ]]; then
      words=()
    else
      words+=("$word")
    fi
  done

  local choices=
  case "${words[0]-}:${words[1]-}:${#words[@]}" in
    ::0) choices='logdump help' ;;
    logdump::1) choices='tel core bb oslog help' ;;
    logdump:tel:* | logdump:core:* | logdump:bb:*)
      # Keywords count up to the reason, which is the first other word.
      choices='nocompress tar.gz tar --'
      [[ ${words[1]} == bb ]] || choices+=' nonui'
      for word in "${words[@]:2}"; do
        [[ ${word,,} =~ ^(nocompress|tar|tar\.gz|nonui)$ ]] || choices=--
      done
      ;;
    logdump:oslog:3)
      compopt -o default
      return
      ;;
    logdump:oslog:2) ;;
    logdump:oslog:*) choices='-p -i --' ;;
  esac
  mapfile -t COMPREPLY < <(compgen -W "$choices" -- "$current")
}

complete -F _velltool velltool
