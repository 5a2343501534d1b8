# The status agrees with the kernel and the resolver; what is edited of a network comes with the next join, and what was exported can be taken back.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

access_point home ssid=home channel=6 wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP
serve home 10.1.0
appliance nas

inside nas tee /var/lib/home.key >/dev/null <<<'the old printer'
inside nas tee /var/lib/wrong.key >/dev/null <<<'quatre baguettes'
inside nas tee /etc/resolv.conf >/dev/null <<<'nameserver 192.0.2.1'

# field NAME: what the status says.
field() {
  inside nas sh -c 'merowireless status --json' | sed -n "s/.*\"$1\":\(\"[^\"]*\"\|[^,}]*\).*/\1/p" | tr -d '"'
}

link() {
  ip netns exec nas iw dev wlan0 link
}

servers() {
  inside nas sed -n 's/^nameserver //p' /etc/resolv.conf | tr '\n' ' '
}

# expect_truth GATEWAY SERVERS: the status is what iw, ip and the resolver say, and that is these.
expect_truth() {
  expect_same 'the access point' "$(link | awk '/^Connected/ { print toupper($3) }')" "$(field access_point)"
  expect_same 'the channel' 6 "$(field channel)"
  local signal
  signal=$(field signal_dbm)
  ((signal < 0 && signal > -100)) || fail "this is no signal: $signal"
  ((10#$(field rate_kbps) > 0)) || fail "this is no rate: $(field rate_kbps)"
  expect_default_route nas "$1"
  expect_same 'the gateway' "$1" "$(field gateway)"
  expect_same 'the name servers' "$2" "$(field name_servers)"
  expect_same 'the resolver' "192.0.2.1 $2 " "$(servers)"
  local since connected now
  since=$(date -d "$(field since)" +%s)
  connected=$(ip netns exec nas iw dev wlan0 station dump | sed -n 's/.*connected time:[^0-9]*\([0-9]*\).*/\1/p')
  now=$(inside nas date +%s)
  ((now - since - connected <= 3 && now - since - connected >= -3)) || fail "it is not so long: $since, for $connected s at $now"
}

say '-- with a lease'
on nas merowireless save home --key-file /var/lib/home.key
on nas merowireless connect home
expect_truth 10.1.0.1 10.1.0.1
before=$(inside nas cat /usr/mero/etc/wireless.conf)

say '-- name servers in place of the lease'\''s; the connection stays as it is until then'
on nas merowireless edit home --dns 10.1.0.8,10.1.0.9
expect_output <<<'changed home; the connection stays as it is until the network is joined again'
expect_truth 10.1.0.1 10.1.0.1
expect_same 'all but the name servers' "$before" "$(inside nas grep -v '^	DNS=' /usr/mero/etc/wireless.conf)"
expect_mode nas /usr/mero/etc/wireless.conf 600
on nas merowireless connect home
expect_truth 10.1.0.1 '10.1.0.8 10.1.0.9'
inside nas pkill -USR1 -f "udhcpc -b" # renews the lease
sleep 2
expect_truth 10.1.0.1 '10.1.0.8 10.1.0.9'

say '-- a static address, with its name servers; a failed join brings both back'
on nas merowireless edit home --ip 10.1.0.5 --mask 255.255.255.0 --gateway 10.1.0.1 --dns 10.1.0.7
on nas merowireless connect home
expect_address nas 10.1.0.5/24
expect_truth 10.1.0.1 10.1.0.7
ends_with nas 5 connect home --key-file /var/lib/wrong.key
expect_address nas 10.1.0.5/24
expect_truth 10.1.0.1 10.1.0.7

say '-- all of it is given back'
on nas merowireless disconnect
expect_same 'the resolver' '192.0.2.1 ' "$(servers)"
expect_nothing_left nas

say '-- it is not joined by itself, and then it is'
on nas merowireless edit home --auto no
ends_with nas 4 autoconnect
on nas merowireless edit home --auto yes --ip dhcp --dns none
on nas merowireless autoconnect
expect_truth 10.1.0.1 10.1.0.1

say '-- what was exported is known again once it is imported, and joins'
on nas merowireless export --secrets /var/lib/settings.json
expect_mode nas /var/lib/settings.json 600
known=$(inside nas merowireless known --show-secrets --json)
on nas merowireless disconnect
on nas merowireless forget home
ends_with nas 4 autoconnect
on nas merowireless import /var/lib/settings.json
expect_same 'what is known' "$known" "$(inside nas merowireless known --show-secrets --json)"
on nas merowireless autoconnect
expect_truth 10.1.0.1 10.1.0.1
