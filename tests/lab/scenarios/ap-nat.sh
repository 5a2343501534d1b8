# An access point with address translation leads to a third network; it is refused twice at once, taken back, and put up
# again.
# shellcheck shell=bash

appliance nas
appliance guest
wire shop nas
ip -n shop address add 203.0.113.1/24 dev eth0
ip -n nas address add 203.0.113.2/24 dev eth0
plug_in nas
key=(essid=cafe auth=WPA2PSK encrypt=AES key='deux croissants')

say '-- not yet: nothing is saved'
fails_on nas mero-call ap-enable
# The program finds that out by itself.
if through_functions; then
  expect_line result=0
  expect_message nas 'Failed to get ap info of secname[mac80211_hwsim]'
  expect_message nas 'Failed to enable AP.'
fi
expect_processes nas </dev/null

say '-- to a third network and back'
serves nas ssid=cafe encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 \
  ieee80211n_wireless_width=1 channel=6
guest_of nas guest "${key[@]}"
expect_default_route guest 10.1.14.1
expect_reachable guest 203.0.113.1
# It knows no way to 10.1.14.0/24: what it has answered came from the appliance's address.
expect_unreachable shop 10.1.14.1
expect_file nas /etc/dhcpd/dhcpd-lbr0-lbr0.info <<'END'
auto_time="30"
enable="yes"
END

# The program asks whether anybody who could have made the marker still lives.
if through_functions; then
  say '-- while another one is under way'
  inside nas touch /var/tmp/.wireless_ap_connecting
  fails_on nas mero-call ap-enable
  expect_line result=0
  expect_message nas 'Another ap construction is going'
  gone "/proc/${INIT_OF[nas]}/root/var/tmp/.wireless_ap_connecting" || fail 'the marker is still there'
  expect_station nas guest
  expect_reachable guest 203.0.113.1
fi

say '-- the end of it'
on nas mero-call ap-disable
expect_line result=1
within 5 no_station nas guest || fail 'the station is still there'
expect_file nas /etc/dhcpd/dhcpd-lbr0-lbr0.info <<'END'
auto_time="30"
enable="no"
END
expect_file nas /etc/sysconfig/network-scripts/ifcfg-wlan0 <<'END'
ONBOOT=yes
DEVICE=wlan0
IPADDR=10.1.14.1
NETMASK=255.255.255.0
BOOTPROTO=static
END
on nas grep ^ONBOOT= /etc/sysconfig/network-scripts/ifcfg-lbr0
expect_output <<<ONBOOT=no
fails_on nas test -e /etc/hostapd/hostapd-wlan0.info
expect_processes nas </dev/null
expect_same 'the addresses of nas' 'eth0 203.0.113.2/24' "$(addresses_of nas)"
leaves guest
on nas mero-call ap-disable
expect_line result=1

say '-- the radio is a client again'
access_point square ssid=square channel=11
joins nas square essid=square bssid="$(address_of square)" auth=OPEN encrypt=NONE

say '-- and an access point again, which ends the client'
on nas mero-call ap-enable
expect_line result=1
expect_no_station square nas
guest_of nas guest "${key[@]}"
expect_reachable guest 203.0.113.1
