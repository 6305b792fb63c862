# Completion of the command orv for bash: source this file, or install it as
# /usr/share/bash-completion/completions/orv.

_orv_options() {
  local common='--help --output'
  local reading="$common --delimited --from --max-size"
  local typed="$reading --type --payload"
  case $1 in
    decode | convert) echo "$typed --to --no-unwrap --unknown" ;;
    encode) echo "$typed --to" ;;
    inspect) echo "$typed --no-unwrap --color" ;;
    diff) echo "$typed --no-unwrap --color --bytes --quiet" ;;
    identify) echo "$reading" ;;
    types | schema) echo "$common" ;;
  esac
}

_orv_formats() {
  case $1$2 in
    encode--from | decode--to) echo 'text json' ;;
    encode--to | decode--from | identify--from) echo 'binary hex base64' ;;
    *) echo 'binary hex base64 text json' ;;
  esac
}

_orv() {
  local commands='decode encode inspect convert diff identify types schema'
  local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
  local command=decode words=''
  if ((COMP_CWORD > 1)) && [[ " $commands " == *" ${COMP_WORDS[1]} "* ]]; then
    command=${COMP_WORDS[1]}
  fi
  case $previous in
    -t | --type | --payload | =) words=$("${COMP_WORDS[0]}" types 2> /dev/null | sed -n 's/^orv\.\([^ ]*\).*/\1/p') ;;
    --from | --to) words=$(_orv_formats "$command" "$previous") ;;
    --color) words='auto always never' ;;
    -o | --output | --max-size) return ;;
    *)
      if [[ $current == -* ]]; then
        words=$(_orv_options "$command")
        ((COMP_CWORD == 1)) && words+=' --version'
      elif ((COMP_CWORD == 1)); then
        words=$commands
      elif [[ $command == types ]]; then
        words=$("${COMP_WORDS[0]}" types 2> /dev/null | sed -n 's/^orv\.\([^ ]*\).*/\1/p')
      fi
      ;;
  esac
  mapfile -t COMPREPLY < <(compgen -W "$words" -- "$current")
}

complete -o default -F _orv orv
