# Networks whose users a RADIUS server knows are joined, by PEAP and by TTLS; one that it does not know is not let in.
# shellcheck shell=bash

access_point campus ssid=campus channel=1 wpa=2 wpa_key_mgmt=WPA-EAP rsn_pairwise=CCMP ieee8021x=1 \
  own_ip_addr=127.0.0.1 auth_server_addr=127.0.0.1 auth_server_port=1812 auth_server_shared_secret='between us'
radius_server campus
serve campus 10.1.0
appliance nas
campus=(essid=campus bssid="$(address_of campus)" auth=WPA2EAP encrypt=AES)

# expect_method TEXT: how the last user was recognised, as the access point heard it from the server.
expect_method() {
  expect_same 'the method' "$1" "$(sed -n 's/.*authenticated - EAP type: [0-9]* (\(.*\))$/\1/p' "$LOGS/campus.hostapd" |
    tail -n 1)"
}

say '-- PEAP'
joins nas campus "${campus[@]}" user=peter key="peter's secret"
expect_method PEAP
on nas mero-call ifconfig wlan0 ip=DHCP
expect_reachable nas 10.1.0.1
leaves nas

say '-- TTLS'
joins nas campus "${campus[@]}" user=tina key="tina's \$ecret"
expect_method TTLS
on nas mero-call ifconfig wlan0 ip=DHCP
expect_reachable nas 10.1.0.1
leaves nas

say '-- a wrong password'
refused nas "${campus[@]}" user=tina key="peter's secret"
expect_no_station campus nas
expect_nothing_left nas
