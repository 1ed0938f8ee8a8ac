# Completion of zubtool(1) for bash.

_zubtool() {
  local IFS=$' \t\n' current=${COMP_WORDS[COMP_CWORD]} word
  local offered='' group=() file=  # group: the words typed so far of the command, which "--" ends
  for word in "${COMP_WORDS[@]:1:COMP_CWORD-1}"; do
    if [[ $file ]]; then
      file=
    elif [[ $word == *[\<\>]* ]]; then
      file=next
    elif [[ $word == -- ]]; then
      group=()
    else
      group+=("$word")
    fi
  done
  if [[ $file || $current == [\$\<\>]* ]]; then  # a redirection's file, a variable: bash's own
    COMPREPLY=()
    compopt -o default
    return
  fi

  case "${group[*]:0:2}" in
    '') offered='logdump cd help back quit exit' ;;
    cd) offered='logdump' ;;
    logdump) offered='bb core oslog tel help' ;;
    logdump\ tel | logdump\ core) offered='nocompress tar.gz tar nonui --' ;;
    logdump\ bb) offered='nocompress tar.gz tar --' ;;
    logdump\ oslog)
      case ${#group[@]} in
        2) offered='600 3600 86400' ;;
        3) compopt -o default ;;  # a path
        *) [[ ${group[-1]} == -[pi] ]] || offered='-p -i --' ;;
      esac
      ;;
  esac
  if [[ ${group[1]-} == @(tel|core|bb) ]]; then
    for word in "${group[@]:2}"; do  # options end at the reason
      [[ ${word,,} == @(nocompress|tar.gz|tar|nonui) ]] || offered=''
    done
  fi
  mapfile -t COMPREPLY < <(compgen -W "$offered" -- "$current")
}

complete -F _zubtool zubtool
