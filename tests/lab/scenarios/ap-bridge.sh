# An access point in a plain bridge passes frames between the radio and the wire, and leaves the wire working behind it.
# shellcheck shell=bash

appliance nas
appliance guest
wire office nas
serve office 192.168.7 eth0
plug_in nas

say '-- on the air'
serves nas ssid=office encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 bridge=br0 \
  ieee80211n_wireless_width=1
expect_file nas /etc/sysconfig/network-scripts/ifcfg-br0 <<'END'
DEVICE=br0
NAT=no
PRIMARY=eth0
BOOTPROTO=dhcp
ONBOOT=yes
TYPE=Bridge
END
fails_on nas test -e /etc/dhcpd
expect_same 'the members' 'eth0 wlan0' "$(inside nas ls /sys/class/net/br0/brif | xargs)"
[[ $(addresses_of nas) == 'br0 192.168.7.1'??/24 ]] || fail "the addresses of nas are $(addresses_of nas)"

say '-- the office gives the address, and answers'
joins guest nas essid=office bssid="$(address_of nas)" auth=WPA2PSK encrypt=AES key='deux croissants'
on guest mero-call ifconfig wlan0 ip=DHCP
expect_address guest '192.168.7.1??/24'
expect_reachable guest 192.168.7.1
expect_reachable office "$(address_in guest)"
expect_reachable nas "$(address_in guest)"
expect_same 'what nas passes on' 0 "$(inside nas cat /proc/sys/net/ipv4/ip_forward)"
leaves guest

say '-- off the air, the wire stays in the bridge'
on nas mero-call ap-disable
expect_line result=1
expect_same 'the members' eth0 "$(inside nas ls /sys/class/net/br0/brif | xargs)"
expect_reachable nas 192.168.7.1
expect_file nas /etc/sysconfig/network-scripts/ifcfg-br0 <<'END'
DEVICE=br0
NAT=no
PRIMARY=eth0
BOOTPROTO=dhcp
ONBOOT=yes
TYPE=Bridge
END
expect_same "the kind of nas's interface" managed "$(radio_type nas)"
