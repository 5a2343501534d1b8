# Beside a wire, a wireless network is a second way out: its route and its name server come and go, also with a DHCP
# server that is late, and those of the wire are there all the time.
# Limit: 600 s
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.1.0
access_point square ssid=square channel=1
appliance nas
wire office nas
cafe=(essid=cafe bssid="$(address_of cafe)" auth=WPA2PSK encrypt=AES key='deux croissants')
square=(essid=square bssid="$(address_of square)" auth=OPEN encrypt=NONE)

ip -n office address add 192.0.2.1/24 dev eth0
ip -n nas address add 192.0.2.9/24 dev eth0
ip -n nas route add default via 192.0.2.1
inside nas rm -f /etc/resolv.conf
inside nas tee /etc/resolv.conf >/dev/null <<<'nameserver 192.0.2.1'
readonly BLOCK='# By the DHCP client of wlan0, until it leaves the network:'
readonly BLOCK_END='# (end of what the DHCP client of wlan0 has added)'

# The wire's way out is there, and is taken; so it is from the first step to the last.
expect_wire() {
  expect_same 'the way out that is taken' 'default via 192.0.2.1 dev eth0' "$(default_routes nas | head -n 1)"
  expect_same 'the name server that is asked first' 'nameserver 192.0.2.1' "$(inside nas head -n 1 /etc/resolv.conf)"
  expect_reachable nas 192.0.2.1
}

expect_wire_alone() {
  expect_wire
  expect_same 'the ways out' 'default via 192.0.2.1 dev eth0' "$(default_routes nas)"
  expect_file nas /etc/resolv.conf <<<'nameserver 192.0.2.1'
}

# The wireless network stands behind it, with the metric that is its interface's.
expect_both() {  # PREFIX
  local index
  index=$(inside nas cat /sys/class/net/wlan0/ifindex)
  expect_wire
  expect_same 'the ways out' "default via 192.0.2.1 dev eth0
default via $1.1 dev wlan0 metric $((3000 + index))" "$(default_routes nas)"
  expect_file nas /etc/resolv.conf <<END
nameserver 192.0.2.1
$BLOCK
nameserver $1.1
$BLOCK_END
END
  expect_reachable nas "$1.1"
}

# The name servers are what is applied last. Asked about at leisure: the client rests for 20 s between its rounds.
applied() {
  sleep 1
  inside nas grep -qxF "$BLOCK_END" /etc/resolv.conf
}

# The traces of the connection. The routes of the wire are not among them.
disconnects() {
  on nas mero-call disconnect
  within 2 nothing_runs nas || fail "this still runs on nas: $(processes_of nas)"
  expect_address nas ''
}

for round in first second; do
  say "-- joined for the $round time"
  joins nas cafe "${cafe[@]}"
  expect_wire_alone
  on nas mero-call ifconfig wlan0 ip=DHCP
  expect_output <<<result=0
  expect_both 10.1.0
  say '-- and left'
  disconnects
  expect_wire_alone
done

say '-- thrown off the air'
joins nas cafe "${cafe[@]}"
on nas mero-call ifconfig wlan0 ip=DHCP
expect_output <<<result=0
switch_off cafe
expect_wire
disconnects
expect_wire_alone

say '-- a client that was killed'
switch_on cafe
joins nas cafe "${cafe[@]}"
on nas mero-call ifconfig wlan0 ip=DHCP
expect_output <<<result=0
expect_both 10.1.0
# shellcheck disable=SC2016  # the appliance's shell is to expand it
inside nas sh -c 'kill -KILL "$(cat /var/run/udhcpc-wlan0.pid)"'
disconnects
expect_wire_alone

say '-- a DHCP server that comes late'
joins nas square "${square[@]}"
if through_functions; then
  on nas mero-call ifconfig wlan0 ip=DHCP
else
  fails_on nas mero-call ifconfig wlan0 ip=DHCP
fi
expect_message nas 'Failed to get IP from DHCP'
expect_address nas ''
expect_wire_alone
serve square 10.3.0
within 60 applied || fail 'the appliance does not ask on'
expect_address nas '10.3.0.1??/24'
expect_both 10.3.0
disconnects
expect_wire_alone
expect_same 'what lies about on nas' '' "$(transient_files nas)"
