# A network that does not let the appliance in is given up, and so is one while the radio is switched off.
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
appliance nas

cafe=(essid=cafe bssid="$(address_of cafe)" auth=WPA2PSK encrypt=AES)

say '-- the wrong passphrase'
began=$(uptime_seconds)
refused nas "${cafe[@]}" key='trois croissants'
ended=$(uptime_seconds)
((${ended%.*} - ${began%.*} >= 15)) || fail "it was given up too early: $began to $ended"
expect_message nas 'Time out to connect AP, kill wpa_supplicant.'
expect_message nas 'Failed to connect network.'
expect_no_station cafe nas
expect_nothing_left nas

say '-- the radio is switched off: nobody is told, and nothing is done'
inside nas tee /tmp/wireless.info >/dev/null <<<PRODUCT=WLAN-N
inside nas tee /usr/mero/etc/wireless_ap.conf >/dev/null <<'END'
[WLAN-N]
unblock=no
END
log=$(<"$LOGS/nas.syslog")
on nas mero-call connect "${cafe[@]}" key='deux croissants'
expect_output <<<result=0
expect_no_station cafe nas
expect_same 'the system log of nas' "$log" "$(<"$LOGS/nas.syslog")"
inside nas rm /tmp/wireless.info
expect_nothing_left nas

say '-- nor when it is not known which adapter there is'
on nas mero-call connect "${cafe[@]}" key='deux croissants'
expect_output <<<result=0
expect_no_station cafe nas
expect_same 'the system log of nas' "$log" "$(<"$LOGS/nas.syslog")"
expect_nothing_left nas

say '-- the radio is switched on again'
inside nas rm /usr/mero/etc/wireless_ap.conf
joins nas cafe "${cafe[@]}" key='deux croissants'
leaves nas
