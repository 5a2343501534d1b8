# Where /etc/resolv.conf leads to systemd-resolved's stub, a lease's name servers stand in the stub until that is written anew.
# Debian
# On request
# Plain only
# Limit: 1200 s
# shellcheck shell=bash

air() {
  access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
  serve cafe 10.2.0
}

boot_1() {
  has_started
  systemctl unmask systemd-resolved
  systemctl start systemd-resolved
  ln -sf ../run/systemd/resolve/stub-resolv.conf /etc/resolv.conf
  takes_archive now
  apt install merowireless merowireless-appliance

  say '-- the server of a lease stands behind resolved itself, which knows nothing of it'
  echo 'deux croissants' >/var/lib/lab/key
  on nas merowireless connect cafe --key-file /var/lib/lab/key
  expect_servers $'127.0.0.53\n10.2.0.1'
  expect_same 'what resolved knows of wlan0' '' "$(resolvectl dns wlan0 | sed 's/^Link [0-9]* (wlan0)://')"

  say '-- resolved writes its file anew'
  systemctl restart systemd-resolved
  expect_servers 127.0.0.53

  say '-- the network is left'
  on nas merowireless connect cafe
  expect_servers $'127.0.0.53\n10.2.0.1'
  on nas merowireless disconnect
  expect_servers 127.0.0.53
}

expect_servers() {  # SERVER...
  expect_same 'where /etc/resolv.conf leads' ../run/systemd/resolve/stub-resolv.conf "$(readlink /etc/resolv.conf)"
  expect_same 'the name servers' "$1" "$(sed -n 's/^nameserver //p' /etc/resolv.conf)"
}
