# A RADIUS server: hostapd has one of its own.
# shellcheck shell=bash

# radius_server NAME [KEY OPTION]: starts one beside an access point or an appliance, on its loopback interface. Its users are
# peter, by PEAP, and tina, by TTLS. Its certificate has a key that is made soon, or another kind, as openssl calls it.
radius_server() {
  local log=$LOGS/radius
  say "RADIUS server beside $1"
  openssl req -x509 -newkey "${2:-ec}" -pkeyopt "${3:-ec_paramgen_curve:prime256v1}" -noenc -days 30 -subj /CN=radius \
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
