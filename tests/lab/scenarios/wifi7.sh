# An adapter of Wi-Fi 7, which has no wireless extensions, is an access point as any other, and says that it is no client.
# Kernel: trixie
# Wi-Fi 7
# On request
# Plain only
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
appliance nas

wpa_passphrase cafe 'deux croissants' | write_file nas /var/lib/cafe.conf

says() {  # WHAT-IT-SAYS COMMAND...
  local said
  say_words 'nas$' "${@:2}"
  said=$(inside nas "${@:2}" 2>&1) || :
  expect_same "what $2 says" "$1" "$(sed 's/ *$//; /^$/d' <<<"$said")"
}

say '-- the ordinary tools find no wireless extensions'
inside nas ip link set wlan0 up
says "wlan0     Interface doesn't support scanning." iwlist wlan0 scanning
says 'wlan0     no wireless extensions.' iwconfig wlan0
says $'Error for wireless request "Set Mode" (8B06) :\n    SET failed on device wlan0 ; Operation not supported.' \
  iwconfig wlan0 mode ad-hoc

say '-- nor does the supplicant that joins by them'
inside nas timeout 15 wpa_supplicant -Dwext -i wlan0 -c /var/lib/cafe.conf >"$LOGS/wext.supplicant" 2>&1 || :
grep -q '^Successfully initialized wpa_supplicant' "$LOGS/wext.supplicant" || fail 'the supplicant does not start'
grep -qF 'ioctl[SIOCSIWMODE]: Operation not supported' "$LOGS/wext.supplicant" ||
  fail 'the supplicant does not say what it misses'
! grep -q CTRL-EVENT-CONNECTED "$LOGS/wext.supplicant" || fail 'the supplicant joins by wireless extensions'
inside nas ip link set wlan0 down

say '-- nobody has it listen, so that it lists what it has heard for somebody else'
on nas mero-call scan renew
expect_output <<<result=0
inside nas iw dev wlan0 scan >/dev/null
on nas mero-call scan last
expect_output <<END
result=0
essid=cafe bssid=$(address_of cafe) channel=6 signal=-30 opmode=AUTO protocol=11b/g auth=WPA2PSK encrypt=AES
END

say '-- it joins nothing, and leaves nothing behind'
refused nas essid=cafe bssid="$(address_of cafe)" auth=WPA2PSK encrypt=AES key='deux croissants'
expect_message nas 'Failed to connect network.'
expect_no_station cafe nas
expect_nothing_left nas
refused nas essid=barn opmode=ADHOC encrypt=NONE
expect_message nas 'Failed to set the mode of wlan0: Operation not supported'
inside nas ip link set wlan0 up
on nas mero-call status
expect_output <<'END'
result=1
status=NOT_SUPPORTED
END
inside nas merowireless status >/run/lab/status 2>&1 || :
grep -qF "the adapter's driver cannot tell" /run/lab/status || fail "the program says: $(</run/lab/status)"

say "-- with the kernel's own interface it joins by the same file"
inside nas wpa_supplicant -B -Dnl80211 -i wlan0 -c /var/lib/cafe.conf -P /run/nl80211.pid >"$LOGS/nl80211.supplicant"
within 30 station cafe nas || fail 'the supplicant cannot join'
# shellcheck disable=SC2016  # for the appliance's shell
inside nas sh -c 'kill $(cat /run/nl80211.pid)'
within 30 no_station cafe nas || fail 'the supplicant does not leave'

say '-- it is an access point'
plug_in nas
serves nas ssid='My NAS' encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6
give_radio phone
wpa_passphrase 'My NAS' 'deux croissants' >/run/lab/phone.conf
ip netns exec phone wpa_supplicant -B -D nl80211 -i wlan0 -c /run/lab/phone.conf >"$LOGS/phone.supplicant"
within 30 station nas phone || fail 'the phone cannot join'
ip netns exec phone busybox udhcpc -n -q -f -i wlan0 -s /bin/true 2>&1 | show
serves_no_more nas
