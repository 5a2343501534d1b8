# An adapter of Wi-Fi 7, which has no wireless extensions, is an access point as any other, and says that it is no client.
# Kernel: trixie
# Wi-Fi 7
# On request
# Plain only
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
appliance nas

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

say '-- it is an access point'
plug_in nas
serves nas ssid='My NAS' encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6
give_radio phone
wpa_passphrase 'My NAS' 'deux croissants' >/run/lab/phone.conf
ip netns exec phone wpa_supplicant -B -D nl80211 -i wlan0 -c /run/lab/phone.conf >"$LOGS/phone.supplicant"
within 30 station nas phone || fail 'the phone cannot join'
ip netns exec phone busybox udhcpc -n -q -f -i wlan0 -s /bin/true 2>&1 | show
serves_no_more nas
