# Appliances that are access points themselves, and those that join them.
# shellcheck shell=bash

# plug_in NAME: the appliance's adapter, which has been there all along, is noted by the appliance too.
plug_in() {
  on "$1" /usr/mero/hotplug/usb.wireless.function add
}

# serves NAME KEY=VALUE...: the appliance is made an access point with these settings, the rest as it was.
serves() {
  on "$1" mero-call ap-save "${@:2}"
  expect_line result=1
  on "$1" mero-call ap-enable
  expect_line result=1
  gone "/proc/${INIT_OF[$1]}/root/var/tmp/.wireless_ap_connecting" || fail "$1 keeps the marker of its access point"
  expect_nothing_inherited "$1"
}

# serves_no_more NAME: the appliance is made a client again, and nothing of the access point is left.
serves_no_more() {
  on "$1" mero-call ap-disable
  expect_line result=1
  expect_no_access_point "$1"
}

expect_no_access_point() {  # NAME
  expect_processes "$1" </dev/null
  expect_same "the addresses of $1" '' "$(addresses_of "$1")"
  expect_same "the bridges of $1" '' "$(ip -n "$1" -brief link show type bridge)"
  expect_same "the rules of $1" '' "$(inside "$1" nft list ruleset)"
  expect_same "what $1 passes on" 0 "$(inside "$1" cat /proc/sys/net/ipv4/ip_forward)"
  expect_same "the kind of $1's interface" managed "$(radio_type "$1")"
}

radio_type() {  # NAME
  ip netns exec "$1" iw dev wlan0 info | awk '$1 == "type" { print $2 }'
}

# addresses_of NAME: all that it has, but for the loopback's.
addresses_of() {
  ip -n "$1" -brief -4 address show | awk '
    $1 != "lo" { sub(/@.*/, "", $1); for (i = 3; i <= NF; i++) print $1, $i }'
}

# guest_of NAME CLIENT KEY=VALUE...: the client joins the appliance's network, gets an address there, and they answer each
# other.
guest_of() {
  joins "$2" "$1" bssid="$(address_of "$1")" "${@:3}"
  on "$2" mero-call ifconfig wlan0 ip=DHCP
  expect_output <<<result=0
  expect_leased "$2"
  expect_reachable "$2" 10.1.14.1
  expect_reachable "$1" "$(address_in "$2")"
}

# expect_leased NAME: its address is one of those that an appliance gives out.
expect_leased() {
  local address
  address=$(ipv4_of "$1")
  [[ $address =~ ^10\.1\.14\.([0-9]+)/24$ && ${BASH_REMATCH[1]} -ge 2 && ${BASH_REMATCH[1]} -le 254 ]] ||
    fail "the address of $1 is none of 10.1.14.2 to 10.1.14.254: '$address'"
}

# address_in NAME: its address alone.
address_in() {
  local address
  address=$(ipv4_of "$1")
  printf '%s' "${address%/*}"
}
