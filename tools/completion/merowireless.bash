# Completion of merowireless for bash.

# The names of the known networks; those that a shell would have to quote are left out. Those in range would take a scan.
_merowireless_names() {
  merowireless --porcelain known 2>/dev/null </dev/null | cut -f 1 | grep -E '^[[:alnum:]_.:-]+$'
}

# What may follow an option that takes a value; fails for all others.
_merowireless_values() {
  case $1 in
    --key-file | --guest-key-file | --schedule | --guest-schedule) compgen -f -- "$2" ;;
    --security)
      if [[ $3 == ap ]]; then
        compgen -W 'open wep wpa wpa2 mixed eap' -- "$2"
      else
        compgen -W 'open wep wpa wpa2 wpa-eap wpa2-eap' -- "$2"
      fi
      ;;
    --guest-security) compgen -W 'open wep wpa wpa2 mixed' -- "$2" ;;
    --cipher | --guest-cipher) compgen -W 'tkip aes both' -- "$2" ;;
    --band) compgen -W '2.4 5' -- "$2" ;;
    --mode) compgen -W 'b g bn gn n a an' -- "$2" ;;
    --width) compgen -W '20 40 both' -- "$2" ;;
    --channel) compgen -W 'auto' -- "$2" ;;
    --ip) compgen -W 'DHCP none' -- "$2" ;;
    --hidden | --wmm | --guest | --guest-hidden | --guest-isolated | --guest-lan | --guest-internet | \
      --guest-appliance | --guest-web) compgen -W 'yes no' -- "$2" ;;
    --ssid | --guest-ssid | --max-stations | --guest-max-stations | --tx-power | --bridge | --radius-server | --mask | \
      --gateway | --bssid | --user | --count) ;;
    *) return 1 ;;
  esac
}

# What may stand at some place of a command.
_merowireless_words() {
  local secret='--key-file --key-stdin'
  case $1 in
    '') echo 'scan known save forget connect autoconnect disconnect status watch address gateway adhoc ap mode radio' ;;
    scan) echo '--renew' ;;
    known) echo '--by-time --show-secrets' ;;
    save) echo "$secret --ip --mask --gateway --security --bssid" ;;
    connect) echo "$secret --user --any-ap --no-address $([[ $2 == -* ]] || _merowireless_names)" ;;
    forget) [[ $2 == -* ]] || _merowireless_names ;;
    watch) echo '--count' ;;
    address) echo 'DHCP --mask' ;;
    adhoc) echo "$secret --wep" ;;
    ap) echo 'show set enable disable status' ;;
    'ap show') echo '--show-secrets' ;;
    'ap set')
      echo "$secret --ssid --security --cipher --radius-server --band --mode --channel --width --hidden --max-stations" \
        '--wmm --tx-power --bridge --schedule --guest --guest-ssid --guest-security --guest-cipher --guest-hidden' \
        '--guest-max-stations --guest-isolated --guest-lan --guest-internet --guest-appliance --guest-web' \
        '--guest-schedule --guest-key-file'
      ;;
    mode) echo 'ap client' ;;
    radio) echo 'on off' ;;
  esac
}

_merowireless() {
  local current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]} command='' word values
  COMPREPLY=()
  for word in "${COMP_WORDS[@]:1:COMP_CWORD-1}"; do
    case $word in
      -*) ;;
      show | set | enable | disable | status) [[ $command == ap ]] && command="ap $word" || command=${command:-$word} ;;
      *) command=${command:-$word} ;;
    esac
  done

  if values=$(_merowireless_values "$previous" "$current" "${command%% *}"); then
    mapfile -t COMPREPLY < <(printf '%s' "$values${values:+$'\n'}")
    return
  fi
  local words
  words=$(_merowireless_words "$command" "$current")
  # Options are offered once one is begun, or when there is nothing else.
  local options='--json --porcelain --verbose --help'
  [[ $current == -* ]] && words+=" $options"
  mapfile -t COMPREPLY < <(compgen -W "$words" -- "$current")
}

complete -F _merowireless merowireless
