# Shows a person what the library does. All that is told about networks is what its functions returned in the machine.
# shellcheck shell=bash
# shellcheck disable=SC2034  # records are set whole, and not all of a record is shown

readonly CONFIGURATION=/usr/mero/etc/wireless.conf

if [[ $LAB_COLOUR ]]; then
  readonly BOLD=$'\e[1m' FAINT=$'\e[2m' GREEN=$'\e[32m' PLAIN=$'\e[0m'
else
  readonly BOLD='' FAINT='' GREEN='' PLAIN=''
fi

# What the helpers tell goes to the logs; here, only what is worth a person's time.
exec {STEPS}>"$LOGS/steps"

heading() {
  printf '\n%s%s%s\n' "$BOLD" "$*" "$PLAIN"
}

remark() {
  printf '          %s%s%s\n' "$FAINT" "$*" "$PLAIN"
}

# The seconds since the demonstration was asked for, by the clock on the wall: the machine's own stands still while the
# host has no time for it.
seconds_passed() {
  local now
  read -r now </sys/class/rtc/rtc0/since_epoch
  printf '%d' $((now - LAB_BEGAN))
}

# doing TEXT COMMAND...: runs a command and tells when it began. On a terminal dots tell that it is still at it.
doing() {
  local ticker=''
  printf '%s%6d s%s  %s ...' "$FAINT" "$(seconds_passed)" "$PLAIN" "$1"
  if [[ $LAB_TERMINAL ]]; then
    tick &
    ticker=$!
    disown
  fi
  "${@:2}"
  [[ ! $ticker ]] || kill "$ticker"
  printf ' %sdone%s\n' "$GREEN" "$PLAIN"
}

tick() {
  while sleep 0.2; do printf .; done
}

# A text in a column of some width; printf counts bytes, and names are not always ASCII.
column() {  # WIDTH TEXT
  printf '%s%*s' "$2" $(($1 > ${#2} ? $1 - ${#2} : 0)) ''
}

# The record on a line of mero-call, whose values are quoted for the shell, as variables.
set_record() {  # LINE
  eval "$1"
}

security() {  # AUTH ENCRYPT
  case $1/$2 in
    OPEN/NONE) printf 'open' ;;
    WPAPSK/* | WPA2PSK/*) printf '%s-PSK, %s' "${1%PSK}" "${2//+/ and }" ;;
    *) printf '%s, %s' "$1" "$2" ;;
  esac
}

# The records that the last call printed, behind its result.
records() {
  sed 1d <<<"$OUTPUT"
}

# show_networks [NAME]: the networks that the last scan found; the one of that name stands out.
show_networks() {
  local line start
  local essid bssid channel signal opmode protocol auth encrypt
  printf '\n          %sCH  NETWORK         ADDRESS            SIGNAL   PROTOCOL  SECURITY%s\n' "$FAINT" "$PLAIN"
  while IFS= read -r line; do
    set_record "$line"
    start=''
    [[ $essid != "${1-}" ]] || start=$GREEN
    printf '          %s%2d  %s%s  %s%s%s%s\n' "$start" "$channel" "$(column 16 "$essid")" "$bssid" \
      "$(column 9 "$signal dBm")" "$(column 10 "$protocol")" "$(security "$auth" "$encrypt")" "$PLAIN"
  done < <(records)
}

show_known_networks() {
  local line
  local essid bssid channel signal opmode protocol auth encrypt key user ip mask gateway none_bssid atime
  printf '\n          %sSAVED AT  NETWORK         ADDRESS            SECURITY%s\n' "$FAINT" "$PLAIN"
  while IFS= read -r line; do
    set_record "$line"
    printf '          %(%H:%M:%S)T  %s%s  %s\n' "$atime" "$(column 16 "$essid")" "$bssid" \
      "$(security "$auth" "$encrypt")"
  done < <(records)
}

show_file() {  # APPLIANCE PATH
  inside "$1" cat "$2" | sed "s/\t/  /; s/^/          /"
}

# find_and_save NAME PASSPHRASE: looks a network up, and saves what was found with the passphrase.
find_and_save() {
  local essid bssid channel signal opmode protocol auth encrypt
  on nas mero-call get essid "$1"
  set_record "$(records)"
  on nas mero-call save essid="$essid" bssid="$bssid" channel="$channel" signal="$signal" opmode=MANAGED \
    protocol="$protocol" auth="$auth" encrypt="$encrypt" key="$2" ip=DHCP
}

remark "Simulated radios under Debian's own kernel, in a virtual machine that has just been switched on."

heading 'Access points'
doing "'open square', open" \
  access_point square ssid='open square' channel=1 signal=-67
doing "'Café du coin', WPA2" \
  access_point cafe ssid='Café du coin' channel=6 signal=-48 ieee80211n=1 \
  wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
doing "'office', WPA and WPA2, on 5 GHz" \
  access_point office ssid=office channel=36 signal=-55 hw_mode=a \
  wpa=3 wpa_passphrase='the old printer' wpa_pairwise='TKIP CCMP' rsn_pairwise='TKIP CCMP'
doing 'one that keeps its name out of its beacons' \
  access_point shy ssid='not told' channel=6 signal=-40 ignore_broadcast_ssid=1

heading 'A storage appliance'
doing 'switching it on' appliance nas
doing 'scanning afresh: MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW)' on nas mero-call scan renew
show_networks

heading 'A newcomer'
doing "'food truck' comes by" access_point truck ssid='food truck' channel=11 signal=-72 hw_mode=b
doing 'reading the last scan: MEROWirelessNetworkScan(WIRELESS_SCAN_LAST)' on nas mero-call scan last
remark "$(records | wc -l) networks, as before"
doing 'scanning afresh: MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW)' on nas mero-call scan renew
show_networks 'food truck'

heading 'Known networks'
doing "finding 'office' and saving it: MEROWirelessNetworkGet, MEROWirelessConfSet" \
  find_and_save office 'the old printer'
doing "finding 'Café du coin' and saving it" find_and_save 'Café du coin' 'deux croissants'
remark "they are in a file:"
remark "$(inside nas stat -c '%n  %A  %U' "$CONFIGURATION")"
show_file nas "$CONFIGURATION"
doing 'listing them by last save: MEROWirelessConfEnumByAtime' on nas mero-call enum-by-time
show_known_networks

heading 'Switched on next to a network that it knows'
doing "'Café du coin' gives out addresses" serve cafe 192.168.20
doing 'joining the last saved network in range: MEROWirelessAutoConnect' on nas mero-call autoconnect
remark "its address: $(ipv4_of nas)"
doing 'adding the default route: MEROWirelessDefaultGatewaySet' on nas mero-call gateway 192.168.20.1
remark "$(ip -n nas route show default)"
doing 'asking the gateway for an answer: ping' expect_reachable nas 192.168.20.1
on nas mero-call status
remark "MEROWirelessConnStatusGet: ${OUTPUT##*status=}"

heading 'Another appliance becomes an access point'
doing 'switching it on' appliance shelf
doing 'noting its adapter, as the hot-plug script does' plug_in shelf
doing "saving its settings: MEROWirelessSetAPConfig" on shelf mero-call ap-save ssid='Shelf 7' channel=11 \
  encryption=2 wpa=2 wpa_encrypt_type=2 wpa_passphrase='among old books'
doing 'bridge, addresses, hostapd and a DHCP server: MEROWirelessAPEnable' on shelf mero-call ap-enable
remark "$(ip -n shelf -brief -4 address show lbr0 | xargs)"
remark "$(ip netns exec shelf iw dev wlan0 info | awk '$1 ~ /^(ssid|type|channel)$/' | xargs)"

heading 'And the first one joins it'
doing 'leaving the café: MEROWirelessNetworkDisconnect' on nas mero-call disconnect
doing 'scanning afresh: MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW)' on nas mero-call scan renew
show_networks 'Shelf 7'
doing 'joining it: MEROWirelessNetworkConnect' on nas mero-call connect essid='Shelf 7' bssid="$(address_of shelf)" \
  auth=WPA2PSK encrypt=AES key='among old books'
doing 'asking it for an address: MEROWirelessIfconfigSet' on nas mero-call ifconfig wlan0 ip=DHCP
remark "its address: $(ipv4_of nas)"
doing 'asking the access point for an answer: ping 10.1.14.1' expect_reachable nas 10.1.14.1
doing 'taking the access point down: MEROWirelessAPDisable' on shelf mero-call ap-disable
remark "it is a $(radio_type shelf) interface again, and nothing of the access point runs"
expect_no_access_point shelf

printf '\nThat took %d seconds.\n' "$(seconds_passed)"
