# Protected networks are joined, addressed and routed; one takes the place of another; leaving leaves nothing.
# shellcheck shell=bash

access_point cafe   ssid='Café du coin' channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point office ssid=office         channel=1 wpa=1 wpa_passphrase='the old printer' wpa_pairwise=TKIP
access_point lounge ssid=lounge         channel=36 hw_mode=a wpa=3 wpa_passphrase='any old key' \
  wpa_pairwise='TKIP CCMP' rsn_pairwise='TKIP CCMP'
serve cafe 10.1.0
serve office 10.2.0
appliance nas

cafe=(essid='Café du coin' bssid="$(address_of cafe)" protocol=11b/g auth=WPA2PSK encrypt=AES key='deux croissants')
office=(essid=office bssid="$(address_of office)" protocol=11b/g auth=WPAPSK encrypt=TKIP key='the old printer')
lounge=(essid=lounge bssid="$(address_of lounge)" protocol=11a auth=WPA2PSK encrypt=TKIP+AES key='any old key')
supplicant='/usr/sbin/wpa_supplicant -Dwext -iwlan0 -c/usr/mero/etc/wpa_supplicant.conf -B'
supplicant+=' -P/var/run/wpa_supplicant.pid'
dhcp_client='/bin/busybox udhcpc -b -S -i wlan0 -p /var/run/udhcpc-wlan0.pid -s /usr/mero/sbin/udhcpc.lease -t 16 -T 1'

# The media service has to be told of a new network.
inside nas tee /etc/meroinfo.conf >/dev/null <<'END'
runmediaservice=yes
network_mediaservice=wlan0
END
inside nas tee /etc/rc.mediaservice >/dev/null <<'END'
#!/bin/sh
echo "$@" >>/usr/mero/told
END
inside nas chmod 755 /etc/rc.mediaservice
inside nas rm -f /etc/resolv.conf
inside nas tee /etc/resolv.conf >/dev/null <<<'nameserver 192.0.2.1'

say '-- WPA2 with CCMP'
joins nas cafe "${cafe[@]}"
expect_processes nas <<<"$supplicant"
expect_file nas /var/tmp/.wireless_current_connection <<END
Café du coin
1
5
8
$(address_of cafe | tr a-f A-F)
END
expect_file nas /usr/mero/told <<<restart
expect_file nas /etc/resolv.conf.wireless.bak <<<'nameserver 192.0.2.1'
on nas mero-call status
expect_output <<'END'
result=5
status=CONNECTED_MANAGED
END

say '-- an address by DHCP, and the way out that comes with it'
on nas mero-call ifconfig wlan0 ip=DHCP
expect_output <<<result=0
expect_address nas '10.1.0.1??/24'
expect_default_route nas 10.1.0.1
expect_reachable nas 10.1.0.1
address=$(ipv4_of nas)
expect_reachable cafe "${address%/*}"
expect_processes nas <<END
$dhcp_client
$supplicant
END
expect_file nas /etc/resolv.conf <<'END'
nameserver 192.0.2.1
# By the DHCP client of wlan0, until it leaves the network:
nameserver 10.1.0.1
# (end of what the DHCP client of wlan0 has added)
END
expect_file nas /etc/sysconfig/network-scripts/ifcfg-wlan0 <<'END'
DEVICE=wlan0
BOOTPROTO=dhcp
END

say '-- WPA with TKIP, in place of the first'
joins nas office "${office[@]}"
expect_no_station cafe nas
expect_processes nas <<END
$dhcp_client
$supplicant
END

say '-- a fixed address, and a way out that is set by itself'
on nas mero-call ifconfig wlan0 ip=10.2.0.5 mask=255.255.255.0
expect_output <<<result=0
expect_address nas 10.2.0.5/24
expect_processes nas <<<"$supplicant"
expect_file nas /etc/resolv.conf <<<'nameserver 192.0.2.1'
on nas mero-call gateway 10.2.0.1
expect_output <<<result=0
expect_default_route nas 10.2.0.1
expect_reachable nas 10.2.0.1
expect_reachable office 10.2.0.5

say '-- the end of it'
leaves nas
expect_no_station office nas
on nas mero-call status
expect_output <<'END'
result=3
status=DOWN
END

say '-- WPA and WPA2 with both ciphers, on 5 GHz'
joins nas lounge "${lounge[@]}"
leaves nas
