#compdef velltool
# Completion of velltool's command lines for zsh.

# Offers the names of the processes on the device that the tool looks at. The process table cuts
# names at 15 bytes: a longer one is known by its executable only.
_velltool_processes() {
  local table=${VELL_SYSROOT-}/proc
  local -aU names
  names=(${(f)"$({
    readlink $table/[0-9]*/exe(N) | sed 's|.*/||; s| (deleted)$||'
    grep -hvx '.\{15\}' $table/[0-9]*/comm(N)
  } 2>/dev/null)"})
  compadd -a names
}

_velltool() {
  # Only the words since the last "--" count: each command starts at the root.
  local -a group=("${(@)words[2,CURRENT-1]}")
  group=("${(@)group[${group[(I)--]}+1,-1]}")
  local option=${group[(R)-*]}

  case "${group[1]}:${group[2]}:${#group}" in
    ::0) compadd logdump help ;;
    logdump::1) compadd tel core bb oslog help ;;
    logdump:(tel|core|bb):*)
      # Keywords count up to the reason, which is the first other word.
      compadd -- --
      [[ -z ${(M)group[3,-1]:#^(#i)(nocompress|tar|tar.gz|nonui)} ]] || return
      compadd nocompress tar.gz tar
      [[ $group[2] == bb ]] || compadd nonui
      ;;
    logdump:oslog:2) ;;
    logdump:oslog:3) _files ;;
    logdump:oslog:*)
      if [[ $PREFIX != -* && $option == -p ]]; then
        _velltool_processes
      elif [[ $PREFIX != -* && $option == -i ]]; then
        _files
      else
        compadd -- -p -i --
      fi
      ;;
  esac
}

_velltool "$@"
