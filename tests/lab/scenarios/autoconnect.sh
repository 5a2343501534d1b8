# The network that was saved last and can be joined is joined, and addressed as it was saved.
# Limit: 400 s
# shellcheck shell=bash

access_point cafe   ssid=cafe   channel=6  wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point office ssid=office channel=11 wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP
access_point square ssid=square channel=1
serve office 10.2.0
serve square 10.3.0
appliance nas

# Two networks saved in the same second would stand in the order of the file.
save() {  # KEY=VALUE...
  local second=$EPOCHSECONDS
  until ((EPOCHSECONDS > second)); do sleep 0.1; done
  on nas mero-call save "$@"
  expect_output <<<result=0
}

autoconnects() {  # ACCESS-POINT
  on nas mero-call autoconnect
  expect_line result=0
  expect_station "$1" nas
}

say '-- nothing is known'
fails_on nas mero-call autoconnect
expect_line result=-1
through_functions && expect_message nas 'Failed to connect any access point'
expect_nothing_left nas

say '-- the one that was saved last is joined; what is not in range, and of unknown security, is passed over'
save essid=cafe   bssid="$(address_of cafe)"   auth=WPA2PSK encrypt=AES  key='deux croissants' ip=DHCP
save essid=square bssid="$(address_of square)" auth=OPEN    encrypt=NONE ip=10.3.0.5 mask=255.255.255.0
save essid=office bssid="$(address_of office)" auth=WPA2PSK encrypt=AES  key='the old printer' ip=DHCP
# The program saves no such thing.
through_functions && save essid=boat bssid=02:11:22:33:44:55 auth=UNKNOWN encrypt=NONE ip=DHCP
autoconnects office
expect_address nas '10.2.0.1??/24'
expect_reachable nas 10.2.0.1
expect_file nas /etc/sysconfig/network-scripts/ifcfg-wlan0 <<'END'
DEVICE=wlan0
BOOTPROTO=dhcp
END

if through_functions; then
  say '-- who is connected gets disconnected'
  fails_on nas mero-call autoconnect
  expect_line result=-1
  expect_message nas 'Connection exists'
  expect_no_station office nas
  expect_nothing_left nas
else
  say '-- who is connected stays so'
  autoconnects office
  expect_reachable nas 10.2.0.1
  leaves nas
fi

say '-- one that went off the air; the next is joined, at a fixed address'
switch_off office
autoconnects square
expect_address nas 10.3.0.5/24
expect_reachable nas 10.3.0.1
expect_file nas /etc/sysconfig/network-scripts/ifcfg-wlan0 <<'END'
DEVICE=wlan0
BOOTPROTO=static
IPADDR=10.3.0.5
NETMASK=255.255.255.0
END
leaves nas
