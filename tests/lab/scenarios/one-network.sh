# A network is all of its access points: it is joined through any that is there, the supplicant changes between them, and
# nothing that only bears its name is given its secret.
# Plain only
# Limit: 800 s
# shellcheck shell=bash

home=(ssid=home wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP)
access_point near "${home[@]}" channel=1 signal=-40
access_point far "${home[@]}" channel=11 signal=-60
appliance nas
inside nas tee /var/lib/home.key >/dev/null <<<'the old printer'

# expect_joined ACCESS-POINT: the access point, the kernel and the program agree that it is joined.
expect_joined() {
  within 2 station "$1" nas || fail "nas is no station of $1"
  expect_same 'the access point, as the kernel says' "$(address_of "$1")" \
    "$(ip netns exec nas iw dev wlan0 link | awk 'NR == 1 { print $3 }')"
  on nas merowireless scan --cached --porcelain
  expect_same 'the access point, as the program says' "$(address_of "$1")" \
    "$(awk -F '\t' '$9 == "yes" { print tolower($7) }' <<<"$OUTPUT")"
}

settings() {
  inside nas cat /usr/mero/etc/wpa_supplicant.conf
}

# is_forgotten NAME: the kernel has dropped what it had heard of an access point.
is_forgotten() {
  [[ $(ip netns exec nas iw dev wlan0 scan dump) != *"BSS $(address_of "$1")"* ]]
}

say '-- saved once, it is joined by its name through the strongest, and then through the one that is left'
on nas merowireless save home --key-file /var/lib/home.key --ip none
on nas merowireless connect home
expect_joined near
expect_same 'the protection that the supplicant is given' '	key_mgmt=WPA-PSK
	pairwise=CCMP' "$(settings | grep -E 'bssid|key_mgmt|pairwise')"

say '-- the supplicant changes to the other access point by itself'
switch_off near
within 30 station far nas || fail 'it stays where nobody is'
expect_joined far
on nas merowireless disconnect

say '-- the one that it was saved with is off'
on nas merowireless connect home
expect_joined far
on nas merowireless disconnect
on nas merowireless autoconnect
expect_joined far
on nas merowireless disconnect

say '-- by an address, through that one alone'
switch_on near
ends_with nas 4 connect 02:00:00:00:99:00
on nas merowireless connect "$(address_of far)"
expect_joined far
settings | grep -qi "bssid=$(address_of far)" || fail 'the supplicant may change'
on nas merowireless disconnect

say '-- both access points are one network: it is saved and forgotten as one'
on nas merowireless save "$(address_of far)" --key-file /var/lib/home.key --ip none
on nas merowireless known --porcelain
expect_same 'how many are known' 1 "$(wc -l <<<"$OUTPUT")"
expect_same 'its access points' 2 "$(cut -f 12 <<<"$OUTPUT" | wc -w)"
on nas merowireless save home --key-file /var/lib/home.key --ip none
expect_same 'the secrets that were saved' 2 "$(inside nas grep -c 'KEY=the old printer' /usr/mero/etc/wireless.conf)"

say '-- who only bears the name gets no station'
switch_off far
access_point other ssid=home channel=6 wpa=2 wpa_passphrase='another secret' rsn_pairwise=CCMP signal=-20
on nas merowireless connect home
expect_joined near
on nas merowireless disconnect
switch_off other
# Its beacons go on, and it answers nothing.
access_point mute "${home[@]}" channel=6 beacon_int=20 signal=-20
kill -STOP "$(</run/lab/mute.pid)"
on nas merowireless connect home
expect_joined near
on nas merowireless disconnect
kill -CONT "$(</run/lab/mute.pid)"
switch_off mute
access_point open ssid=home channel=6 signal=-20
access_point old ssid=home channel=6 wpa=1 wpa_passphrase='the old printer' wpa_pairwise=TKIP signal=-20
on nas merowireless connect home
expect_joined near
switch_off near
sleep 16 # enough for the supplicant to look around more than once
for pretender in open old; do
  no_station $pretender nas || fail 'the supplicant has changed to who only bears the name'
done
on nas merowireless disconnect
expect_nothing_left nas
within 40 is_forgotten near || fail 'the kernel still has heard of near'
for command in 'connect home' autoconnect; do
  # shellcheck disable=SC2086  # words of their own
  ends_with nas 4 $command
  grep -q 'home was saved as WPA2 AES and is .* now' <<<"$ERRORS" || fail "it says otherwise: $ERRORS"
  expect_nothing_left nas
done

say '-- who has changed the protection says so'
switch_off old
on nas merowireless connect home --changed
expect_joined open
on nas merowireless disconnect
on nas merowireless forget home
on nas merowireless known --porcelain
expect_same 'what is known' '' "$OUTPUT"

say '-- what cannot be joined is called what it is, and is not tried'
switch_off open
modern=(ssid=modern wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP)
access_point sae "${modern[@]}" channel=1 wpa_key_mgmt=SAE ieee80211w=2
access_point owe ssid=guests channel=6 wpa=2 wpa_key_mgmt=OWE rsn_pairwise=CCMP ieee80211w=2
access_point strict ssid=strict wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP channel=6 ieee80211w=2
access_point both ssid=both wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP channel=11 \
  wpa_key_mgmt='WPA-PSK SAE' ieee80211w=1
on nas merowireless scan --renew --porcelain
expect_same 'what cannot be joined' 'both=
guests=OWE
modern=WPA3
strict=WPA2 PMF' "$(awk -F '\t' '$1 != "home" { print $1 "=" $11 }' <<<"$OUTPUT" | sort)"
for name in modern guests strict; do
  ends_with nas 10 save "$name"
  ends_with nas 10 connect "$name"
done
on nas merowireless connect both --key-file /var/lib/home.key --no-address
expect_joined both
on nas merowireless disconnect
expect_nothing_left nas
