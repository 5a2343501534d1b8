# The adapter changes between client and access point, and back; what goes wrong is told with its reason.
# Limit: 500 s
# shellcheck shell=bash

access_point cafe ssid=cafe channel=1
serve cafe 10.1.0
appliance nas
appliance guest
plug_in nas
expect_file nas /tmp/wireless.info <<'END'
INTERFACE="wlan0"
PRODUCT="mac80211_hwsim"
END
cafe=(essid=cafe bssid="$(address_of cafe)" auth=OPEN encrypt=NONE)
home=(essid=home auth=WPA2PSK encrypt=AES key='deux croissants')

say '-- a client becomes an access point'
joins nas cafe "${cafe[@]}"
on nas mero-call ifconfig wlan0 ip=DHCP
# The program refuses that: nothing would come in the connection's place.
if through_functions; then
  on nas mero-call mode ap
  expect_line result=1
  within 2 no_station cafe nas || fail 'it is still a client'
  expect_processes nas </dev/null
  expect_same 'the addresses of nas' '' "$(addresses_of nas)"
fi
serves nas ssid=home encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
  ieee80211n_wireless_width=1
guest_of nas guest "${home[@]}"
leaves guest

say '-- and a client again, without an end of the access point for good'
on nas mero-call mode client
expect_line result=1
expect_same "the kind of nas's interface" managed "$(radio_type nas)"
joins nas cafe "${cafe[@]}"
on nas mero-call disconnect

say '-- the access point comes back with the mode'
on nas mero-call mode ap
expect_line result=1
guest_of nas guest "${home[@]}"
leaves guest

say '-- and with the adapter'
on nas /usr/mero/hotplug/usb.wireless.function remove
expect_file nas /tmp/wireless.info </dev/null
expect_mode nas /tmp/wireless.info 644
plug_in nas
guest_of nas guest "${home[@]}"
leaves guest

# fails_to_start REASON: enabling the access point fails, and both those who read the log and those who started it by
# hand are told why.
fails_to_start() {
  fails_on nas mero-call ap-enable
  expect_line result=0
  # The program finds out by itself that there is no adapter.
  if through_functions; then
    expect_message nas 'Failed to restart /etc/rc.network'
    expect_message nas "$1"
  fi
  fails_on nas sh -c '/etc/rc.network start wlan0 lbr0 2>&1'
  grep -qF -e "$1" <<<"$OUTPUT" || fail "it does not say why: $OUTPUT"
}

# The program saves neither.
if through_functions; then
  say '-- a passphrase that is too short'
  on nas mero-call ap-save wpa_passphrase=short
  fails_to_start 'invalid WPA passphrase length'

  say '-- a channel that there is not'
  on nas mero-call ap-save wpa_passphrase='deux croissants' channel=99
  fails_to_start 'the access point on wlan0'
else
  say '-- a passphrase that is too short, and a channel that there is not'
  fails_on nas mero-call ap-save wpa_passphrase=short
  expect_line result=0
  expect_same 'the status for channel 99' 2 "$(inside nas mero-call ap-save channel=99 >/dev/null && echo 0 || echo $?)"
fi

say '-- no adapter'
unplug nas
on nas mero-call ap-save channel=6
fails_to_start "there is no interface 'wlan0'"
fails_on nas mero-call mode ap
# The program finds that out by itself, too.
if through_functions; then expect_message nas 'no adapter is plugged in'; fi
plug nas

say '-- somebody else answers names'
on nas mero-call mode client
ip netns exec nas dnsmasq --conf-file=/dev/null --user=root --pid-file=/run/lab/names.pid
serves nas ssid=home
expect_message nas 'no names are answered on lbr0'
guest_of nas guest "${home[@]}"
kill "$(</run/lab/names.pid)"

say '-- wrong words'
fails_on nas sh -c '/etc/rc.network start wlan0 2>&1'
grep -q '^usage: rc.network start' <<<"$OUTPUT" || fail 'no usage is told'
fails_on nas sh -c "/etc/rc.network start wlan0 '../lbr0' 2>&1"
expect_output <<<"rc.network: '../lbr0' is no name of an interface"
fails_on nas sh -c '/usr/mero/hotplug/usb.wireless.function change-mode 2>&1'
