# What an access point leads to: a network with addresses.
# shellcheck shell=bash

# serve NAME PREFIX: puts an access point at PREFIX.1, where it also gives PREFIX.100 to PREFIX.199 to who asks by DHCP,
# with itself as the gateway and the name server.
serve() {
  local log=$LOGS/$1.dnsmasq
  say "access point $1: $2.0/24"
  ip -n "$1" address add "$2.1/24" dev wlan0
  # What it asks before it offers an address, whether somebody has it, takes 3 s.
  ip netns exec "$1" dnsmasq --conf-file=/dev/null --user=root --port=0 --interface=wlan0 --bind-interfaces --no-ping \
    --dhcp-authoritative --dhcp-range="$2.100,$2.199,1h" --dhcp-option="option:dns-server,$2.1" \
    --dhcp-leasefile="/run/lab/$1.leases" --pid-file="/run/lab/$1.dnsmasq.pid" --log-dhcp --log-facility="$log" ||
    fail "dnsmasq refuses to serve $1: $(cat "$log")"
}

# expect_reachable NAME ADDRESS: an appliance or access point gets an answer from there.
expect_reachable() {
  ip netns exec "$1" busybox ping -c 1 -w 5 "$2" >/dev/null || fail "from $1, $2 does not answer"
}

# ipv4_of NAME: its addresses, each as ADDRESS/BITS.
ipv4_of() {
  ip -n "$1" -brief -4 address show dev wlan0 | awk '{ for (i = 3; i <= NF; i++) print $i }'
}

# expect_address NAME PATTERN: it has one address, ADDRESS/BITS, which matches the pattern.
expect_address() {
  # shellcheck disable=SC2053  # a pattern it is
  [[ $(ipv4_of "$1") == $2 ]] || fail "the address of $1 should be $2, and is $(ipv4_of "$1")"
}

# expect_default_route NAME GATEWAY
expect_default_route() {
  expect_same "the default route of $1" "default via $2 dev wlan0" "$(ip -n "$1" route show default | sed 's/ *$//')"
}
