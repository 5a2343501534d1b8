# A network without DHCP is joined all the same, and asked on for an address; an attempt beside another is refused; a
# broken connection comes back.
# shellcheck shell=bash

access_point square ssid=square channel=1
appliance nas
square=(essid=square bssid="$(address_of square)" auth=OPEN encrypt=NONE)

say '-- no lease'
joins nas square "${square[@]}"
began=$(uptime_seconds)
# The program takes that for a failure.
if through_functions; then
  on nas mero-call ifconfig wlan0 ip=DHCP
  expect_output <<<result=0
else
  fails_on nas mero-call ifconfig wlan0 ip=DHCP
  expect_output <<<result=-1
fi
ended=$(uptime_seconds)
((${ended%.*} - ${began%.*} <= 18)) || fail "it was waited for too long: $began to $ended"
expect_message nas 'Failed to get IP from DHCP'
expect_processes nas <<END
/bin/busybox udhcpc -b -S -i wlan0 -p /var/run/udhcpc-wlan0.pid -s /usr/mero/sbin/udhcpc.lease -t 16 -T 1
/usr/sbin/wpa_supplicant -Dwext -iwlan0 -c/usr/mero/etc/wpa_supplicant.conf -B -P/var/run/wpa_supplicant.pid
END
expect_address nas ''
expect_station square nas

say '-- an address of no network'
fails_on nas mero-call ifconfig wlan0 ip=dhcp mask=255.255.255.0
# The program finds that out by itself.
if through_functions; then
  expect_output <<<result=-1
  expect_message nas 'Failed to set network interface'
fi
expect_address nas ''
leaves nas

say '-- while another attempt is under way'
inside nas touch /var/tmp/.wireless_connecting
refused nas "${square[@]}"
if through_functions; then
  expect_message nas 'Another connection construction is going'
else
  # The program leaves the attempt to whoever makes it, and so the marker, too.
  inside nas rm /var/tmp/.wireless_connecting
fi
expect_no_station square nas
expect_nothing_left nas

disconnected() {
  inside nas mero-call status | grep -xF status=DISCONNECTED >/dev/null
}

say '-- a connection that breaks comes back by itself'
joins nas square "${square[@]}"
switch_off square
within 20 disconnected || fail 'the connection holds without an access point'
switch_on square
within 30 station square nas || fail 'the connection does not come back'
leaves nas
