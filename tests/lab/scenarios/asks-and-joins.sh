# connect asks, waits, calls what hides, tells a wrong secret at once, and saves what worked.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

access_point home ssid=home channel=1 wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP
access_point campus ssid=campus channel=6 wpa=2 wpa_key_mgmt=WPA-EAP rsn_pairwise=CCMP ieee8021x=1 \
  own_ip_addr=127.0.0.1 auth_server_addr=127.0.0.1 auth_server_port=1812 auth_server_shared_secret='between us'
radius_server campus
access_point shy ssid='not told' channel=11 ignore_broadcast_ssid=1 wpa=2 wpa_passphrase='deux croissants' \
  rsn_pairwise=CCMP
serve home 10.1.0
appliance nas

for secret in 'the old printer' 'deux croissants' 'trois croissants' "tina's \$ecret"; do
  inside nas tee "/var/lib/${secret%% *}.key" >/dev/null <<<"$secret"
done

# What is saved: each network with its secret.
saved() {
  inside nas merowireless --porcelain known --show-secrets | awk -F '\t' '{ print $1, $12 }' | sort
}

# within_seconds SECONDS COMMAND...: by the clock of the machine.
within_seconds() {
  local began ended
  began=$(uptime_seconds)
  "${@:2}"
  ended=$(uptime_seconds)
  say "it took $(awk "BEGIN { print $ended - $began }") s"
  awk "BEGIN { exit !($ended - $began < $1) }" || fail "it took longer than $1 s: ${*:2}"
}

# An appliance has no terminals; this one gets some.
inside nas sh -c 'mkdir -p /dev/pts && mount -t devpts -o newinstance,ptmxmode=0666 devpts /dev/pts &&
  ln -s pts/ptmx /dev/ptmx && mknod -m 666 /dev/tty c 5 0'

say '-- a secret that is asked for, on a terminal, and saved with the network'
inside nas touch /var/lib/terminal
inside nas script -qefc 'merowireless connect home' /var/lib/terminal >/dev/null < <(
  within 20 inside nas grep -q 'secret of home: ' /var/lib/terminal && echo 'the old printer'
  sleep 20
) || fail "$(inside nas cat /var/lib/terminal)"
expect_station home nas
expect_address nas '10.1.0.1??/24'
inside nas grep -q 'connected to home as .*, and saved' /var/lib/terminal || fail "$(inside nas cat /var/lib/terminal)"
! inside nas grep -q printer /var/lib/terminal || fail 'the terminal shows the secret'
expect_same 'what is saved' 'home the old printer' "$(saved)"
expect_mode nas /usr/mero/etc/wireless.conf 600

say '-- a wrong secret is told at once, is not saved, and the former connection is back'
within_seconds 20 ends_with nas 5 connect 'not told' --key-file /var/lib/trois.key
grep -qx 'merowireless: the former connection, to home, is back' <<<"$ERRORS" || fail "it does not say so: $ERRORS"
expect_station home nas
expect_address nas '10.1.0.1??/24'
within_seconds 10 ends_with nas 5 connect campus --user tina --key-file /var/lib/trois.key
expect_station home nas
expect_same 'what is saved' 'home the old printer' "$(saved)"
on nas merowireless disconnect
expect_nothing_left nas
within_seconds 9 ends_with nas 5 connect home --key-file /var/lib/trois.key &
attempt=$!
says() {  # STATE
  [[ $(inside nas merowireless --porcelain status) == "$1	"* ]]
}
within 8 says joining || fail 'it is not said that it is joining'
no_station home nas || fail 'it is let in'
wait "$attempt" || exit 1
expect_same 'what is saved' 'home the old printer' "$(saved)"
expect_nothing_left nas

say '-- a network that hides, by its name alone'
on nas merowireless connect 'not told' --key-file /var/lib/deux.key --no-address
expect_station shy nas
expect_same 'what is saved' 'home the old printer
not told deux croissants' "$(saved)"
on nas merowireless --porcelain known
grep -q "^not told	WPA2PSK	AES	MANAGED	DHCP	.*	$(address_of shy | tr a-f A-F)	" <<<"$OUTPUT" || fail 'it is saved otherwise'
on nas merowireless disconnect
on nas merowireless forget 'not told'
on nas merowireless save 'not told' --key-file /var/lib/deux.key --ip none
on nas merowireless connect 'not told'
expect_station shy nas
on nas merowireless disconnect

say '-- a network that hides, by itself, behind all those that are not there'
switch_off home
for number in {1..3}; do
  on nas merowireless save "away $number" --bssid "02:00:5e:00:00:0$number" --security open
done
on nas merowireless autoconnect
expect_station shy nas
on nas merowireless disconnect
for number in {1..3}; do on nas merowireless forget "away $number"; done

say '-- a network that is not there yet'
inside nas sh -c 'merowireless connect home --wait 60 >/var/lib/output 2>&1; echo $? >/var/lib/status' &
waiting=$!
sleep 3
switch_on home
wait "$waiting"
expect_file nas /var/lib/status <<<0
expect_station home nas
expect_address nas '10.1.0.1??/24'

say '-- a cell has nothing of the network that was left for it'
on nas merowireless adhoc bench
expect_nothing_left nas
