# The management program: networks are found, joined and left by its commands, and what goes wrong is told apart.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 signal=-47 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas

inside nas tee /var/lib/wrong.key >/dev/null <<<'trois croissants'
inside nas tee /var/lib/right.key >/dev/null <<<'deux croissants'

say '-- what is in range'
on nas merowireless scan --renew --porcelain
expect_output <<END
cafe	-47	6	WPA2PSK	AES	11b/g	$(address_of cafe)		no	no	
END

say '-- one that came after the last scan'
access_point square ssid=square channel=1
on nas merowireless connect square --no-address --no-save
expect_station square nas
on nas merowireless disconnect
switch_off square

say '-- the wrong passphrase'
on nas merowireless save cafe --key-file /var/lib/wrong.key
on nas merowireless known --porcelain
[[ $OUTPUT == "cafe	WPA2PSK	AES	MANAGED	DHCP	"*"	$(address_of cafe)		yes	"* ]] || fail "this should be known: $OUTPUT"
ends_with nas 5 connect cafe
expect_nothing_left nas

say '-- the user does not want to wait: the supplicant that tries goes too'
inside nas sh -c 'merowireless connect cafe; echo $? >/var/lib/status' &
attempt=$!
within 20 inside nas test -e /run/wpa_supplicant.pid || fail 'no supplicant tries'
inside nas pkill -INT -x merowireless
wait "$attempt"
expect_file nas /var/lib/status <<<130
expect_nothing_left nas

say '-- the right passphrase, without an address; then one, and a way out'
on nas sh -c 'merowireless save cafe --key-stdin </var/lib/right.key'
on nas merowireless connect cafe --no-address
expect_station cafe nas
expect_same 'the addresses of nas' '' "$(ipv4_of nas)"
on nas merowireless address 10.2.0.5 --mask 255.255.255.0
on nas merowireless gateway 10.2.0.1
expect_address nas 10.2.0.5/24
expect_default_route nas 10.2.0.1
expect_reachable nas 10.2.0.1
expect_nothing_inherited nas
on nas merowireless disconnect
expect_nothing_left nas

say '-- out of range, and the radio is switched off'
switch_off cafe
ends_with nas 4 connect cafe
expect_nothing_left nas
plug_in nas
on nas merowireless radio off
ends_with nas 6 connect cafe
on nas merowireless radio on

say '-- an access point, which gives way to a client and comes back with the mode'
on nas merowireless ap set --ssid office --encryption wpa2 --key-file /var/lib/right.key --channel 11
on nas merowireless ap enable
expect_nothing_inherited nas
on nas merowireless ap status --porcelain
expect_output <<<'on-air	office	yes	wlan0	office		11	2462	0	no'
on nas merowireless mode client
expect_same "the kind of nas's interface" managed "$(radio_type nas)"
on nas merowireless mode ap
on nas merowireless ap status --porcelain
expect_output <<<'on-air	office	yes	wlan0	office		11	2462	0	no'
on nas merowireless ap disable
expect_no_access_point nas
