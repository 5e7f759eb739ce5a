# bash completion for hbctl

# Runs hbctl against the socket that is on the command line, quietly and not for long.
_hbctl_ask() {
  local -a command=("${COMP_WORDS[0]}")
  local i
  for ((i = 1; i < ${#COMP_WORDS[@]} - 1; i++)); do
    [[ ${COMP_WORDS[i]} == --socket ]] || continue
    # "--socket=PATH" reaches us as three words.
    [[ ${COMP_WORDS[i + 1]} == '=' ]] && ((i++))
    command+=(--socket "${COMP_WORDS[i + 1]}")
  done
  timeout 2 "${command[@]}" "$@" --json 2>/dev/null
}

# The values of one top-level member of each listed object.
_hbctl_values() {
  sed -n 's/^      "'"$1"'": "\{0,1\}\([^",]*\)"\{0,1\},\{0,1\}$/\1/p'
}

_hbctl_nodes() { _hbctl_ask nodes --wait 0 | _hbctl_values number; }
_hbctl_adapters() { _hbctl_ask adapters --wait 0 | _hbctl_values number; }
_hbctl_addresses() { _hbctl_ask adapters --wait 0 | _hbctl_values address; }
_hbctl_interfaces() { _hbctl_ask adapters --wait 0 | _hbctl_values adapter_type | sort -u; }
_hbctl_networks() { _hbctl_ask networks --wait 0 | _hbctl_values name; }

_hbctl_commands='status nodes adapters networks sites watch adapter node route security send heartbeat simulate-death
stale monitors'

# The subcommand on the command line, if there is one.
_hbctl_subcommand() {
  local i
  for ((i = 1; i < COMP_CWORD; i++)); do
    if [[ " ${_hbctl_commands//$'\n'/ } " == *" ${COMP_WORDS[i]} "* ]]; then
      printf '%s' "${COMP_WORDS[i]}"
      return
    fi
  done
}

# What stands between the subcommand $1 and the word that is being typed, without options and the values of --socket
# and --color.
_hbctl_arguments() {
  local i seen=
  for ((i = 1; i < COMP_CWORD; i++)); do
    case ${COMP_WORDS[i]} in
      --socket | --color)
        [[ ${COMP_WORDS[i + 1]} == '=' ]] && ((i++))
        ((i++))
        ;;
      -*) ;;
      *)
        if [[ -n $seen ]]; then
          printf '%s\n' "${COMP_WORDS[i]}"
        elif [[ ${COMP_WORDS[i]} == "$1" ]]; then
          seen=1
        fi
        ;;
    esac
  done
}

# The option whose values are being typed: the nearest one on the left.
_hbctl_option() {
  local i
  for ((i = COMP_CWORD - 1; i > 0; i--)); do
    if [[ ${COMP_WORDS[i]} == --* ]]; then
      printf '%s' "${COMP_WORDS[i]}"
      return
    fi
  done
}

_hbctl_options_of() {
  local common='--help --socket --color'
  case $1 in
    '') printf '%s' "$common --version" ;;
    status | nodes | networks) printf '%s' "$common --json --wait" ;;
    adapters) printf '%s' "$common --json --wait --node --network" ;;
    sites) printf '%s' "$common --json" ;;
    watch)
      printf '%s' "$common --json --node --adapter --network --events --count --duration --name --discard-stale"
      ;;
    adapter | node | simulate-death) printf '%s' "$common --json --yes" ;;
    route) printf '%s' "$common --json --from-daemon --ip" ;;
    security) printf '%s' "$common --json --reveal" ;;
    send) printf '%s' "$common --json --node --port" ;;
    heartbeat) printf '%s' "$common --json --sequence --every --count --settings --wait" ;;
    stale | monitors) printf '%s' "$common --json" ;;
  esac
}

# Offers those of the lines in $1 that begin with $2. They may come from the daemon: nothing in them is expanded.
_hbctl_offer() {
  local word
  while IFS= read -r word; do
    [[ -n $word && $word == "$2"* ]] && COMPREPLY+=("$(printf '%q' "$word")")
  done <<<"$1"
  return 0
}

_hbctl_offer_words() { _hbctl_offer "${1// /$'\n'}" "$2"; }

# The value that directly follows an option: "--color WORD" and "--color=WORD", which reaches us as three words.
_hbctl_is_first_value() {
  local before=${COMP_WORDS[COMP_CWORD - 1]}
  [[ $before == --* || $before == '=' ]]
}

_hbctl_offer_files() {
  local path
  while IFS= read -r path; do COMPREPLY+=("$path"); done < <(compgen -f -- "$1")
  compopt -o filenames 2>/dev/null
}

# Offers the values of option $1 that begin with $2; fails when the option has none at this place.
_hbctl_offer_values() {
  case $1 in
    --node) _hbctl_offer "$(_hbctl_nodes)" "$2" ;;
    --adapter) _hbctl_offer "$(_hbctl_adapters)" "$2" ;;
    --network) _hbctl_offer "$(_hbctl_networks)" "$2" ;;
    --events)
      _hbctl_offer_words 'all death join new-group sites different-instance heartbeat split-merge' "$2"
      ;;
    --color) _hbctl_is_first_value && _hbctl_offer_words 'auto always never' "$2" ;;
    --socket) _hbctl_is_first_value && _hbctl_offer_files "$2" ;;
    --wait | --count | --duration | --name | --port | --sequence | --every) _hbctl_is_first_value ;;
    *) return 1 ;;
  esac
}

# Offers the values that subcommand $1 takes by their place and that begin with $2.
_hbctl_offer_arguments() {
  local -a before
  mapfile -t before < <(_hbctl_arguments "$1")
  case $1:${#before[@]} in
    adapter:0) _hbctl_offer "$(_hbctl_adapters)" "$2" ;;
    adapter:1)
      _hbctl_offer_words 'enable disable ifdown ifup configure unconfigure swap grace state may-be-down is-down' "$2"
      ;;
    adapter:2) [[ ${before[1]} == swap ]] && _hbctl_offer "$(_hbctl_addresses)" "$2" ;;
    node:0 | route:0) _hbctl_offer "$(_hbctl_nodes)" "$2" ;;
    node:1) _hbctl_offer_words 'may-be-down is-down' "$2" ;;
    stale:0 | monitors:0) _hbctl_offer_words 'on off' "$2" ;;
    monitors:1) _hbctl_offer "$(_hbctl_interfaces)" "$2" ;;
  esac
}

_hbctl() {
  local current=${COMP_WORDS[COMP_CWORD]}
  [[ $current == '=' ]] && current=
  local subcommand
  subcommand=$(_hbctl_subcommand)
  COMPREPLY=()
  if [[ $current == -* ]]; then
    _hbctl_offer_words "$(_hbctl_options_of "$subcommand")" "$current"
  elif _hbctl_offer_values "$(_hbctl_option)" "$current"; then
    return
  elif [[ -z $subcommand ]]; then
    _hbctl_offer_words "${_hbctl_commands//$'\n'/ }" "$current"
  else
    _hbctl_offer_arguments "$subcommand" "$current"
  fi
}

complete -F _hbctl hbctl
