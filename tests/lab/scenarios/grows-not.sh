# Many joins, changes of the mode and access points later, an appliance has no more of anything: memory, descriptors,
# processes, files, sockets, addresses, routes and rules.
# Limit: 600 s
# Plain only
# shellcheck shell=bash

readonly rounds=${ROUNDS:-3}

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas
plug_in nas

join() {
  joins nas cafe essid=cafe bssid="$(address_of cafe)" auth=WPA2PSK encrypt=AES key='deux croissants'
  on nas mero-call ifconfig wlan0 ip=DHCP
  on nas mero-call disconnect
}

serve_for_a_moment() {
  serves nas ssid=home encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
    guest_net_enable=1 guest_net_ssid=visitors
}

change_modes() {
  on nas mero-call mode client
  on nas mero-call mode ap
}

# Each round has five joins, two changes of the mode, and one access point.
round() {
  local n
  for n in 1 2 3 4 5; do join; done
  serve_for_a_moment
  change_modes
  serves_no_more nas
}

say '-- a first time, after which there is what is made once'
round
before=$(amounts_of nas)

say "-- and $rounds times more"
for ((n = 1; n <= rounds; n++)); do
  round
  say "$n of $rounds"
done
expect_nothing_grown nas "$before"
