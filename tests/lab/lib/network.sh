# What an access point or a wire leads to: a network with addresses.
# shellcheck shell=bash

# serve NAME PREFIX [INTERFACE]: puts an access point, or what is at the end of a wire, at PREFIX.1, where it also gives
# PREFIX.100 to PREFIX.199 to who asks by DHCP, with itself as the gateway and the name server.
serve() {
  local log=$LOGS/$1.dnsmasq interface=${3:-wlan0}
  say "$1: $2.0/24"
  ip -n "$1" address add "$2.1/24" dev "$interface"
  # Before it offers an address it asks whether somebody has it, which takes 3 s.
  ip netns exec "$1" dnsmasq --conf-file=/dev/null --user=root --port=0 --interface="$interface" --bind-interfaces --no-ping \
    --dhcp-authoritative --dhcp-range="$2.100,$2.199,1h" --dhcp-option="option:dns-server,$2.1" \
    --dhcp-leasefile="/run/lab/$1.leases" --pid-file="/run/lab/$1.dnsmasq.pid" --log-dhcp --log-facility="$log" ||
    fail "dnsmasq refuses to serve $1: $(cat "$log")"
}

# wire NAME APPLIANCE: puts something at the other end of an appliance's wire, whose both ends are eth0.
wire() {
  say "a wire from $2 to $1"
  ip netns add "$1"
  ip link add eth0 netns "$1" type veth peer name eth0 netns "$2"
  ip -n "$1" link set lo up
  ip -n "$1" link set eth0 up
  ip -n "$2" link set eth0 up
}

# expect_reachable NAME ADDRESS: an appliance or access point gets an answer from there.
expect_reachable() {
  ip netns exec "$1" busybox ping -c 1 -w 5 "$2" >/dev/null || fail "from $1, $2 does not answer"
}

# expect_unreachable NAME ADDRESS: it gets none.
expect_unreachable() {
  ! ip netns exec "$1" busybox ping -c 1 -W 1 "$2" >/dev/null 2>&1 || fail "from $1, $2 answers"
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

# expect_default_route NAME GATEWAY: its one way out, however far behind others it would stand.
expect_default_route() {
  expect_same "the default route of $1" "default via $2 dev wlan0" "$(default_routes "$1" | sed 's/ metric .*//')"
}

# default_routes NAME: the ways out that it has, the one that is taken first.
default_routes() {
  ip -n "$1" route show default | sed 's/ *$//'
}
