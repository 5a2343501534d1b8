# An appliance is an access point, for each kind of protection, and another one joins it and gets an address.
# Limit: 500 s
# shellcheck shell=bash
# shellcheck disable=SC2016  # nothing in a name or a key is to be expanded

appliance nas
appliance guest
plug_in nas

say '-- WPA2'
serves nas ssid='My NAS' encryption=2 wpa_passphrase='deux $croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
  ieee80211n_wireless_width=1
guest_of nas guest essid='My NAS' auth=WPA2PSK encrypt=AES key='deux $croissants'
expect_mode nas /etc/hostapd/hostapd-wlan0-host.conf 600
expect_mode nas /usr/mero/etc/wireless_ap.conf 600
expect_mode nas /etc/hostapd.psk 600
expect_file nas /etc/hostapd/hostapd-wlan0.info <<<'enable="yes"'
expect_file nas /etc/sysconfig/network-scripts/ifcfg-wlan0 <<'END'
ONBOOT=yes
DEVICE=wlan0
BRIDGE=lbr0
IPADDR=10.1.14.1
NETMASK=255.255.255.0
BOOTPROTO=static
END
leaves guest

# The daemon that still runs is replaced each time.
say '-- WPA'
serves nas ssid=old encryption=2 wpa_passphrase='the old printer' wpa=1 wpa_encrypt_type=1 ieee80211n=0
guest_of nas guest essid=old auth=WPAPSK encrypt=TKIP key='the old printer'
leaves guest

say '-- WPA and WPA2'
serves nas ssid=both encryption=2 wpa_passphrase='any old key' wpa=3 wpa_encrypt_type=3
guest_of nas guest essid=both auth=WPAPSK encrypt=TKIP key='any old key'
leaves guest
guest_of nas guest essid=both auth=WPA2PSK encrypt=AES key='any old key'
leaves guest

say '-- WEP'
serves nas ssid=wired encryption=1 wep_key0='t&r$e'
guest_of nas guest essid=wired auth=SHARED encrypt=WEP key='t&r$e'
leaves guest

say '-- open, and it keeps its name out of its beacons'
serves nas ssid=square encryption=0 ignore_broadcast_ssid=1
on guest mero-call scan renew
expect_no_line 'essid=square'
guest_of nas guest essid=square auth=OPEN encrypt=NONE
leaves guest

say '-- the end of it'
serves_no_more nas
expect_processes nas </dev/null
