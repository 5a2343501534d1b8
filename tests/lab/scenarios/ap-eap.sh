# An appliance is an access point whose users a RADIUS server knows.
# shellcheck shell=bash

appliance nas
appliance guest
radius_server nas
plug_in nas

serves nas ssid=campus encryption=3 wpa=2 cipher=2 radius=127.0.0.1 radius_port=1812 radius_secret='between us' width=1
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
