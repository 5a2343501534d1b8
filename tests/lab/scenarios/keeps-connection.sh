# A connection outlives an attempt that comes to nothing, with its address, routes and name servers; so does an access point.
# Plain only
# Limit: 500 s
# shellcheck shell=bash

access_point home ssid=home channel=1 wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP
access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point shy ssid=shy channel=11 ignore_broadcast_ssid=1
serve home 10.1.0
appliance nas

inside nas tee /var/lib/home.key >/dev/null <<<'the old printer'
inside nas tee /var/lib/wrong.key >/dev/null <<<'trois croissants'
on nas merowireless save home --key-file /var/lib/home.key
on nas merowireless save cafe --key-file /var/lib/wrong.key
on nas merowireless save shy --bssid "$(address_of shy)" --security open --ip none
on nas merowireless save nowhere --bssid 02:00:00:00:99:00 --security open

# What the kernel, the supplicant and the resolver say of the connection, and what runs.
state() {
  ip netns exec nas iw dev wlan0 link | sed -n '1p; s/^\t\(SSID\)/\1/p'
  ipv4_of nas
  ip -n nas route show
  inside nas cat /etc/resolv.conf
  inside nas cat /usr/mero/etc/wpa_supplicant.conf
  processes_of nas | sed 's/^[0-9]* //' | sort
}

expect_home() {
  within 2 station home nas || fail 'nas is no station of home any more'
  expect_same 'the connection' "$kept" "$(state)"
  expect_reachable nas 10.1.0.1
  expect_nothing_inherited nas
  on nas merowireless status --porcelain
  [[ $OUTPUT == "connected	home	"*"	$(ipv4_of nas | sed 's,/.*,,')	"* ]] || fail "the program says otherwise: $OUTPUT"
}

expect_back() {
  grep -qx 'merowireless: the former connection, to home, is back' <<<"$ERRORS" || fail "it does not say so: $ERRORS"
}

# is_busy COMMAND...: the program does not do it now. What others end with meanwhile is kept.
is_busy() {
  local status=0
  inside nas merowireless "$@" 2>/dev/null || status=$?
  expect_same "the status of $1" 8 "$status"
}

on nas merowireless connect home
expect_address nas '10.1.0.1??/24'
kept=$(state)
processes=$(processes_of nas)

say '-- out of range: nothing is touched'
ends_with nas 4 connect nowhere
expect_same 'the processes' "$processes" "$(processes_of nas)"
expect_home

say '-- the wrong secret; in the meantime another command is refused, and disturbs nothing'
ends_with nas 5 connect cafe &
attempt=$!
within 20 inside nas grep -q cafe /usr/mero/etc/wpa_supplicant.conf || fail 'cafe is not tried'
is_busy connect home
is_busy autoconnect
is_busy adhoc bench
is_busy disconnect
wait "$attempt" || exit 1
ERRORS=$(<"$LOGS/nas.errors")
expect_back
expect_home

say '-- an interruption, with a static address and routes'
on nas merowireless address 10.1.0.5 --mask 255.255.255.0
on nas merowireless gateway 10.1.0.1
ip -n nas route add 192.0.2.0/24 via 10.1.0.2 dev wlan0
kept=$(state)
inside nas sh -c 'merowireless connect cafe 2>/var/lib/errors; echo $? >/var/lib/status' &
attempt=$!
within 20 inside nas grep -q cafe /usr/mero/etc/wpa_supplicant.conf || fail 'cafe is not tried'
inside nas pkill -INT -x merowireless
wait "$attempt"
expect_file nas /var/lib/status <<<130
ERRORS=$(inside nas cat /var/lib/errors)
expect_back
expect_home

say '-- a network that hides is in range'
on nas merowireless connect shy
expect_station shy nas
on nas merowireless disconnect
expect_nothing_left nas

say '-- an access point that cannot be put on the air'
plug_in nas
on nas merowireless connect home
kept=$(state)
on nas merowireless ap set --ssid office --encryption open --channel 11 --bridge br0
ends_with nas 1 ap enable
expect_back
expect_home
on nas merowireless disconnect

say '-- an access point stays on the air'
on nas merowireless ap set --ssid office --encryption wpa2 --key-file /var/lib/home.key --channel 11 --bridge lbr0
on nas merowireless ap enable
processes=$(processes_of nas)
refuses() {
  ends_with nas 8 "$@"
  # shellcheck disable=SC2016  # nothing is to be expanded
  [[ $ERRORS == *'`merowireless ap disable`'* ]] || fail "it does not tell what to do: $ERRORS"
}
refuses connect home
refuses autoconnect
refuses adhoc bench
expect_same "the kind of nas's interface" AP "$(radio_type nas)"
expect_same 'the processes' "$processes" "$(processes_of nas)"
on nas merowireless ap disable
expect_no_access_point nas
