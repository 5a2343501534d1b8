# Who is on the access point is who the kernel and the DHCP server say, and whoever is sent away leaves.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

appliance nas
appliance tablet
appliance visitor
appliance stranger
plug_in nas
inside nas mkdir -p /etc.defaults
inside nas tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'
ends_with nas 1 ap stations
serves nas ssid=office encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
  ieee80211n_wireless_width=1 guest_net_enable=1 guest_net_ssid=visitors guest_net_encryption=0 guest_net_max_num_sta=2

# fact KEY ADDRESS: what iw tells of a station.
fact() {
  networks_of nas | awk -v key="$1:" -v address="$2" '
    $1 == "Station" { this = $2 == address }
    this && index($0, key) { sub(/^[^:]*:[ \t]*/, ""); print $1; exit }'
}

# expect_listed NAME GUEST STATE: the program tells of an appliance what iw and the leases tell.
expect_listed() {
  local address lease rx since
  local -a said
  address=$(address_of "$1")
  rx=$(fact 'rx bytes' "$address")
  on nas merowireless ap stations --porcelain
  IFS=$'\x1f' read -r -a said <<<"$(grep -i "$address" <<<"${OUTPUT//$'\t'/$'\x1f'}")"
  lease=$(inside nas sh -c 'cat /var/run/rc.network/dnsmasq-*.leases' | awk -v address="$address" '$2 == address')
  expect_same 'the lease' "$(awk '{ print ($4 == "*" ? "" : $4), $3 }' <<<"$lease")" "${said[0]} ${said[2]}"
  expect_same 'the signal' "$(fact signal "$address")" "${said[3]}"
  ((rx <= said[4] && said[4] <= $(fact 'rx bytes' "$address"))) || fail "not the bytes that iw tells: ${said[4]}"
  since=$(($(date +%s) - $(date -d "${said[6]}" +%s) - $(fact 'connected time' "$address")))
  ((since >= -2 && since <= 2)) || fail "it has come when iw does not say so: ${said[6]}"
  expect_same 'whether it is a guest' "$2" "${said[7]}"
  expect_same 'its state' "$3" "${said[8]}"
  expect_same 'whether the kernel has let it in' "$([[ $3 == joined ]] && echo yes || echo no)" \
    "$(fact authorized "$address")"
}

# leases NAME: takes an address, and gives its name.
leases() {
  on "$1" busybox udhcpc -i wlan0 -n -q -x "hostname:$1" -s /usr/mero/sbin/udhcpc.lease
}

count() {
  inside nas merowireless ap status --porcelain | cut -f 9
}

say '-- a station of the main network, and a guest'
joins tablet nas bssid="$(address_of nas)" essid=office auth=WPA2PSK encrypt=AES key='deux croissants'
leases tablet
guests=$(ip -n nas -brief link show gwlan | awk '{ print $3 }')
joins visitor nas essid=visitors bssid="$guests" auth=OPEN encrypt=NONE
leases visitor
expect_listed tablet no joined
expect_listed visitor yes joined
expect_same 'the stations' 2 "$(count)"
on nas merowireless ap stations

is_joining() {
  inside nas merowireless ap stations --porcelain | grep -qi "$(address_of stranger).*joining$"
}

say '-- one that does not know the secret'
inside stranger mero-call connect bssid="$(address_of nas)" essid=office auth=WPA2PSK encrypt=AES key='trois croissants' \
  >/dev/null 2>&1 &
attempt=$!
within 15 is_joining || fail 'the stranger was never seen'
expect_same 'the stations' 2 "$(count)"
! wait "$attempt" || fail 'the stranger was let in'

# sent_away: how often the kernel of a station was told to leave.
sent_away() {
  dmesg | grep -c 'wlan0: deauthenticated from .* (Reason: ' || true
}

say '-- sent away, and back by themselves'
sent=$(sent_away)
on nas merowireless ap kick "$(address_of tablet)"
expect_output <<<"tablet ($(address_of tablet)) has left the access point; it may come back by itself"
expect_same 'those that were sent away' $((sent + 1)) "$(sent_away)"
within 20 station nas tablet || fail 'the tablet does not come back'
expect_listed tablet no joined
sent=$(sent_away)
on nas merowireless ap kick "$(address_of visitor)"
expect_same 'those that were sent away' $((sent + 1)) "$(sent_away)"
within 20 station nas visitor || fail 'the visitor does not come back'

say '-- whoever is not there'
leaves visitor
ends_with nas 1 ap kick "$(address_of visitor)"
ends_with nas 2 ap kick visitor
expect_same 'the stations' 1 "$(count)"
serves_no_more nas
ends_with nas 1 ap stations
ends_with nas 1 ap kick "$(address_of tablet)"
