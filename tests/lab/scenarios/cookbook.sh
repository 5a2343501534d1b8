# The recipes of docs/cookbook.md, each as it stands there, and what comes of them.
# Plain only
# Limit: 900 s
# shellcheck shell=bash

recipes_of "$LAB/../../docs/cookbook.md"

access_point home  ssid=Home  channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
# The page tells its address, which is that of the second radio.
access_point attic ssid=Attic channel=1 wpa=2 wpa_passphrase='among old books' rsn_pairwise=CCMP ignore_broadcast_ssid=1
serve home 10.1.0
serve attic 10.2.0
appliance nas
appliance shelf
plug_in nas

# What the recipes find: a built-in card, and secrets in files.
inside nas mkdir -p /etc.defaults
inside nas tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'
inside nas sh -c 'umask 077 && cat >/usr/mero/etc/home.key' <<<'deux croissants'
inside nas sh -c 'umask 077 && cat >/usr/mero/etc/attic.key' <<<'among old books'
inside nas sh -c 'umask 077 && cat >/usr/mero/etc/nas.key' <<<'the old printer'
inside nas sh -c 'umask 077 && cat >/usr/mero/etc/visitors.key' <<<'come on in'

# on_air INTERFACE...: these interfaces of nas are access points on a channel, and no others.
on_air() {
  [[ $(ip netns exec nas iw dev | awk '
    $1 == "Interface" { name = $2 }
    $1 == "type" { kind = $2 }
    $1 == "channel" && kind == "AP" { print name }' | sort | xargs) == "$*" ]]
}

in_cell() {  # ESSID
  ip netns exec nas iw dev wlan0 link | grep -qxF "	SSID: $1" && [[ $(radio_type nas) == IBSS ]]
}

recipe nas 'See what is around'
grep -q "^Home .*WPA2 AES .*$(address_of home | tr a-f A-F)" <<<"$OUTPUT" || fail "Home is not listed: $OUTPUT"
expect_no_line 'Attic'

recipe nas 'Join a protected network'
expect_station home nas
expect_address nas '10.1.0.1??/24'
expect_reachable nas 10.1.0.1

on nas merowireless disconnect
expect_no_station home nas
recipe nas 'Join again at start-up'
expect_station home nas
expect_address nas '10.1.0.1??/24'

recipe nas 'Take a static address'
expect_station home nas
expect_address nas 10.1.0.5/24
expect_default_route nas 10.1.0.1
expect_reachable nas 10.1.0.1

# expect_access_point NAME: what the last status says of it.
expect_access_point() {
  grep -q "^access point  *$(address_of "$1" | tr a-f A-F)$" <<<"$OUTPUT" || fail "it is not at $1: $OUTPUT"
}

access_point hall ssid=Home channel=11 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP signal=-60
recipe nas 'Roam between access points of one name'
expect_same 'the access points of Home in range' 2 "$(grep -c '^Home .*WPA2 AES' <<<"$OUTPUT")"
expect_station home nas
expect_access_point home
switch_off home
within 30 station hall nas || fail 'the supplicant stays where nobody is'
on nas merowireless status
expect_access_point hall
expect_address nas 10.1.0.5/24
switch_on home
switch_off hall

recipe nas 'Join a hidden network'
expect_station attic nas
expect_address nas '10.2.0.1??/24'

recipe nas 'Forget a network'
expect_line 'forgot Attic'
expect_same 'the listings with Attic' 1 "$(grep -c '^Attic ' <<<"$OUTPUT")"
expect_same 'the listings with Home' 2 "$(grep -c '^Home ' <<<"$OUTPUT")"

recipe nas 'Meet without an access point'
expect_no_station attic nas
within 20 in_cell Workbench || fail 'it is in no cell'
expect_address nas 10.9.0.1/24
on nas merowireless disconnect

recipe nas 'Say where it is'
expect_same 'the country of the kernel' DE "$(ip netns exec nas iw reg get | sed -n 's/^country \(..\):.*/\1/p;/^$/q')"
grep -q '^in force  *yes$' <<<"$OUTPUT" || fail "the country is not in force: $OUTPUT"
grep -q '^2\.4 GHz .* quietest$' <<<"$OUTPUT" || fail "no channel is the quietest: $OUTPUT"

recipe nas 'Become an access point'
guest_of nas shelf essid='My NAS' auth=WPA2PSK encrypt=AES key='the old printer'

recipe nas 'See who is on the access point'
grep -qi "^.* $(address_of shelf)  *10\.1\.14\." <<<"$OUTPUT" || fail "shelf is not listed: $OUTPUT"
grep -qi "$(address_of shelf).* has left the access point" <<<"$OUTPUT" || fail "shelf has not left: $OUTPUT"
leaves shelf

recipe nas 'Share a network with a phone'
expect_line 'whoever sees this can join My NAS'
for file in nas.png home.svg; do expect_mode nas "/usr/mero/etc/$file" 600; done
[[ $(inside nas head -c 4 /usr/mero/etc/nas.png) == $'\x89PNG' ]] || fail 'nas.png is no picture'
inside nas grep -q '<svg xmlns' /usr/mero/etc/home.svg

# A Wednesday.
date -s '2026-11-18 12:30' >/dev/null
recipe nas 'Let guests in, at some hours'
within 5 on_air gwlan wlan0 || fail 'both networks should be on the air'
date -s '2026-11-18 20:00' >/dev/null
on nas /etc/rc.network schedule wlan0
within 5 on_air wlan0 || fail 'the main network alone should be on the air'

recipe nas 'Go back to being a client'
expect_station home nas
expect_address nas 10.1.0.5/24
expect_default_route nas 10.1.0.1

recipe nas 'Read it from a script'
expect_line 'Home is on channel 6'
expect_line 'my address: 10.1.0.5'
grep -q '^{"result":"ok","status":{"state":"connected","name":"Home",' <<<"$OUTPUT" || fail "no document: $OUTPUT"

recipe nas 'Find out why it does not work'
expect_line 'there is no such network in range'
recipe nas 'Find out why it does not work'
expect_line 'exit status 4'
grep -q 'wireless_network_scan:[0-9]* Scan 1: success' <<<"$OUTPUT" || fail "the library's report is missing: $OUTPUT"

expect_all_recipes_done
