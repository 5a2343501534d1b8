# Networks whose users a RADIUS server knows are joined, by PEAP and by TTLS; one that it does not know is not let in.
# shellcheck shell=bash

# The access point asks over the wire, and hostapd's own RADIUS server answers.
radius_server() {  # ACCESS-POINT, in whose namespace it runs
  local log=$LOGS/radius
  say "RADIUS server beside $1"
  openssl req -x509 -newkey ec -pkeyopt ec_paramgen_curve:prime256v1 -noenc -days 30 -subj /CN=radius \
    -keyout /run/lab/radius.key -out /run/lab/radius.pem 2>"$log" || fail "no certificate: $(cat "$log")"
  echo '127.0.0.1 between us' >/run/lab/radius.clients
  cat >/run/lab/radius.users <<'END'
"peter" PEAP
"tina" TTLS
"peter" MSCHAPV2 "peter's secret" [2]
"tina" MSCHAPV2 "tina's $ecret" [2]
END
  cat >/run/lab/radius.conf <<'END'
interface=lo
driver=none
eap_server=1
eap_user_file=/run/lab/radius.users
ca_cert=/run/lab/radius.pem
server_cert=/run/lab/radius.pem
private_key=/run/lab/radius.key
radius_server_clients=/run/lab/radius.clients
radius_server_auth_port=1812
END
  : >"$log"
  ip netns exec "$1" hostapd -B -t -f "$log" /run/lab/radius.conf || fail "no RADIUS server: $(cat "$log")"
}

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
