# An appliance is an access point whose users a RADIUS server knows.
# shellcheck shell=bash

appliance nas
appliance guest
radius_server nas
plug_in nas

serves nas ssid=campus encryption=3 wpa=2 wpa_encrypt_type=2 auth_server_addr=127.0.0.1 auth_server_port=1812 \
  auth_server_shared_secret='between us' ieee80211n_wireless_width=1
campus=(essid=campus auth=WPA2EAP encrypt=AES)

say '-- PEAP'
guest_of nas guest "${campus[@]}" user=peter key="peter's secret"
leaves guest

say '-- TTLS'
guest_of nas guest "${campus[@]}" user=tina key="tina's \$ecret"
leaves guest

say '-- a wrong password'
refused guest bssid="$(address_of nas)" "${campus[@]}" user=tina key="peter's secret"
expect_no_station nas guest
