# A network that does not let the appliance in is given up, and so is one while the radio is switched off.
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
appliance nas

cafe=(essid=cafe auth=WPA2PSK encrypt=AES)
# The program would look for the address, which it cannot while the radio is off.
if through_functions; then cafe+=(bssid="$(address_of cafe)"); fi

say '-- the wrong passphrase'
began=$(uptime_seconds)
refused nas "${cafe[@]}" key='trois croissants'
ended=$(uptime_seconds)
# The program ends the attempt when the supplicant knows that the passphrase is wrong.
if through_functions; then
  ((${ended%.*} - ${began%.*} >= 15)) || fail "it was given up too early: $began to $ended"
  expect_message nas 'Time out to connect AP, kill wpa_supplicant.'
  expect_message nas 'Failed to connect network.'
else
  ((${ended%.*} - ${began%.*} < 15)) || fail "it was given up too late: $began to $ended"
fi
expect_no_station cafe nas
expect_nothing_left nas

# does_nothing: connecting comes to nothing without a word in the log. The function takes that for a success.
does_nothing() {
  local log
  log=$(<"$LOGS/nas.syslog")
  if through_functions; then
    on nas mero-call connect "${cafe[@]}" key='deux croissants'
    expect_output <<<result=0
  else
    refused nas "${cafe[@]}" key='deux croissants'
  fi
  expect_no_station cafe nas
  expect_same 'the system log of nas' "$log" "$(<"$LOGS/nas.syslog")"
}

say '-- the radio is switched off: nothing is done'
inside nas tee /tmp/wireless.info >/dev/null <<<PRODUCT=WLAN-N
inside nas tee /usr/mero/etc/wireless_ap.conf >/dev/null <<'END'
[WLAN-N]
unblock=no
END
does_nothing
inside nas rm /tmp/wireless.info
expect_nothing_left nas

say '-- nor when it is not known which adapter there is'
does_nothing
expect_nothing_left nas

say '-- the radio is switched on again'
inside nas rm /usr/mero/etc/wireless_ap.conf
joins nas cafe "${cafe[@]}" key='deux croissants'
leaves nas
