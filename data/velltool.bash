# Completion of velltool's command lines for bash.

# Prints the names of the processes on the device that the tool looks at. The process table cuts
# names at 15 bytes: a longer one is known by its executable only.
_velltool_processes() {
  local table=${VELL_SYSROOT-}/proc
  {
    readlink "$table"/[0-9]*/exe | sed 's|.*/||; s| (deleted)$||'
    grep -hvx '.\{15\}' "$table"/[0-9]*/comm
  } 2>/dev/null
}

# Offers those words that begin as the current one. Names of processes are anybody's choice: they are
# never expanded (as compgen -W would) and are put in quotes where they need it.
_velltool_offer() {
  local word
  for word in "$@"; do
    [[ $word != "$current"* ]] || COMPREPLY+=("$(printf %q "$word")")
  done
}

# Completes what stands behind the output file of `oslog`: options, each with a list behind it.
_velltool_selection() {
  local option= word names
  for word in "$@"; do
    [[ $word != -* ]] || option=$word
  done
  if [[ $current != -* && $option == -p ]]; then
    mapfile -t names < <(_velltool_processes | sort -u)
    _velltool_offer "${names[@]}"
  elif [[ $current != -* && $option == -i ]]; then
    compopt -o default
  else
    _velltool_offer -p -i --
  fi
}

_velltool() {
  local current=${COMP_WORDS[COMP_CWORD]} word words=() index
  COMPREPLY=()
  # Only the words since the last "--" count: each command starts at the root.
  for ((index = 1; index < COMP_CWORD; ++index)); do
    word=${COMP_WORDS[index]}
    if [[ $word == -- ]]; then
      words=()
    else
      words+=("$word")
    fi
  done

  case "${words[0]-}:${words[1]-}:${#words[@]}" in
    ::0) _velltool_offer logdump help ;;
    logdump::1) _velltool_offer tel core bb oslog help ;;
    logdump:tel:* | logdump:core:* | logdump:bb:*)
      # Keywords count up to the reason, which is the first other word.
      for word in "${words[@]:2}"; do
        if [[ ! ${word,,} =~ ^(nocompress|tar|tar\.gz|nonui)$ ]]; then
          _velltool_offer --
          return
        fi
      done
      _velltool_offer nocompress tar.gz tar --
      [[ ${words[1]} == bb ]] || _velltool_offer nonui
      ;;
    logdump:oslog:3) compopt -o default ;;
    logdump:oslog:2) ;;
    logdump:oslog:*) _velltool_selection "${words[@]:4}" ;;
  esac
}

complete -F _velltool velltool
