# Completion of merowireless for bash.

# The names of the known networks, quoted; those in range would take a scan. Left out are those that would be options,
# and those with characters that cannot be typed: the program writes them out, or they are quoted as $'...'.
_merowireless_names() {
  local line name
  while IFS= read -r line; do
    name=${line%%$'\t'*}
    [[ ${name//\\\\/} != *\\0* ]] || continue
    printf -v name %b "$name"
    printf -v name %q "$name"
    [[ $name == [-\$\']* ]] || printf '%s\n' "$name"
  done < <(merowireless --porcelain known 2>/dev/null </dev/null)
}

# What the value of an option may be; fails for options that take none.
_merowireless_values() { # OPTION COMMAND
  case $1 in
    --security)
      if [[ $2 == ap* ]]; then
        echo 'open wep wpa wpa2 mixed eap'
      else
        echo 'open wep wpa wpa2 wpa-eap wpa2-eap'
      fi
      ;;
    --guest-security) echo 'open wep wpa wpa2 mixed' ;;
    --cipher | --guest-cipher) echo 'tkip aes both' ;;
    --band) echo '2.4 5' ;;
    --mode) echo 'b g bn gn n a an' ;;
    --width) echo '20 40 both' ;;
    --channel) echo 'auto' ;;
    --ip) echo 'DHCP none' ;;
    --hidden | --wmm | --guest | --guest-hidden | --guest-isolated | --guest-lan | --guest-internet | \
      --guest-appliance | --guest-web) echo 'yes no' ;;
    --ssid | --guest-ssid | --max-stations | --guest-max-stations | --tx-power | --bridge | --radius-server | --mask | \
      --gateway | --bssid | --user | --count) ;;
    *) return 1 ;;
  esac
}

# What may stand at some place of a command.
_merowireless_words() { # COMMAND CURRENT-WORD
  local secret='--key-file --key-stdin'
  # Options of all commands are offered once one is begun.
  [[ $2 != -* ]] || echo '--json --porcelain --verbose --help'
  case $1 in
    '') echo 'scan known save forget connect autoconnect disconnect status watch address gateway adhoc ap mode radio' ;;
    scan) echo '--renew' ;;
    known) echo '--by-time --show-secrets' ;;
    save) echo "$secret --ip --mask --gateway --security --bssid" ;;
    connect)
      echo "$secret --user --any-ap --no-address"
      _merowireless_names
      ;;
    forget) _merowireless_names ;;
    watch) echo '--count' ;;
    address) echo 'DHCP --mask' ;;
    adhoc) echo "$secret --wep" ;;
    ap) echo 'show set enable disable status' ;;
    'ap show') echo '--show-secrets' ;;
    'ap set')
      echo "$secret --ssid --security --cipher --radius-server --band --mode --channel --width --hidden" \
        '--max-stations --wmm --tx-power --bridge --schedule --guest --guest-ssid --guest-security --guest-cipher' \
        '--guest-hidden --guest-max-stations --guest-isolated --guest-lan --guest-internet --guest-appliance' \
        '--guest-web --guest-schedule --guest-key-file'
      ;;
    mode) echo 'ap client' ;;
    radio) echo 'on off' ;;
  esac
}

# Writes how the words that it reads go on after a beginning that has been typed, which may have opened quotes.
_merowireless_rest() { # TYPED
  local word char
  while IFS= read -r word; do
    case $1 in
      \"*)
        for char in \\ \" \$ \`; do word=${word//"$char"/"\\$char"}; done
        word=\"${word//!/'"\!"'}\" # not even a backslash keeps the history out of these quotes
        ;;
      \'*) word=${word@Q} ;;
      *) printf -v word %q "$word" ;;
    esac
    [[ $word != "$1"* ]] || printf '%s\n' "${word#"$1"}"
  done
}

_merowireless() { # PROGRAM REPLACED, which is the end of the current word: bash replaces no more than that
  # Bash takes words apart at colons and the like; what has no blank between is one word. The last ends at the cursor.
  local rest=" ${COMP_LINE:0:COMP_POINT}" words=() part
  for part in "${COMP_WORDS[@]:0:COMP_CWORD}" ''; do
    [[ $rest != [[:space:]]* ]] || words+=('')
    rest=${rest#"${rest%%[![:space:]]*}"}
    part=${part:-$rest}
    words[-1]+=$part
    rest=${rest#"$part"}
  done

  local command='' word
  for word in "${words[@]:1:${#words[@]}-2}"; do
    case $command:$word in
      *:-*) ;;
      :*) command=$word ;;
      ap:*) command="ap $word" ;;
    esac
  done

  local current=${words[-1]} option=${words[-2]} value=${words[-1]} offered
  [[ $current != --*=* ]] || option=${current%%=*} value=${current#*=}
  case $option in
    --key-file | --guest-key-file | --schedule | --guest-schedule)
      COMPREPLY=()
      compopt -o default # the names of files
      return
      ;;
  esac
  if offered=$(_merowireless_values "$option" "$command"); then
    current=$value
  else
    offered=$(_merowireless_words "$command" "$current")
  fi
  mapfile -t COMPREPLY < <(compgen -W "$offered" -- "$current" | _merowireless_rest "${current%"$2"}")
}

complete -F _merowireless merowireless
