# A guest network beside the main one: guests are kept from each other, from the LAN, and from what else is forbidden.
# Limit: 600 s
# shellcheck shell=bash

appliance nas
appliance guest
appliance other
wire world nas
# The LAN, and behind it the rest of the world.
ip -n world -batch - <<<'address add 192.168.7.1/24 dev eth0
  address add 203.0.113.1/32 dev lo'
ip -n nas -batch - <<<'address add 192.168.7.2/24 dev eth0
  route add default via 192.168.7.1'
plug_in nas
inside nas mkdir -p /etc.defaults
inside nas tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'
# What the appliance offers by HTTP, and on another port.
inside nas mkdir /tmp/www
inside nas tee /tmp/www/index.html >/dev/null <<<welcome
inside nas busybox httpd -p 80 -h /tmp/www
inside nas busybox httpd -p 8080 -h /tmp/www

# visits NAME: joins the guest network and gets an address there.
visits() {
  joins "$1" nas essid=visitors bssid="$(guest_bssid)" auth=WPA2PSK encrypt=AES key='come on in'
  on "$1" mero-call ifconfig wlan0 ip=DHCP
  [[ $(ipv4_of "$1") == 10.1.15.*/24 ]] || fail "the address of $1 is $(ipv4_of "$1")"
  expect_reachable "$1" 10.1.15.1
}

guest_bssid() {
  ip -n nas -brief link show gwlan | awk '{ print $3 }'
}

# on_air INTERFACE...: these are the interfaces with a channel, and no others.
on_air() {
  [[ $(ip netns exec nas iw dev | awk '$1 == "Interface" { name = $2 } $1 == "channel" { print name }' | sort | xargs) == "$*" ]]
}

reads() {  # NAME PORT
  ip netns exec "$1" timeout 3 bash -c "exec 3<>/dev/tcp/10.1.15.1/$2 && printf 'GET / HTTP/1.0\r\n\r\n' >&3 && cat <&3" \
    2>/dev/null | grep -qx welcome
}

expect_reads() {  # NAME PORT
  reads "$1" "$2" || fail "$1 does not get at port $2 of nas"
}

expect_does_not_read() {  # NAME PORT
  ! reads "$1" "$2" || fail "$1 gets at port $2 of nas"
}

say '-- guests reach the internet, not the LAN, and nothing of the appliance but its pages'
serves nas ssid=home encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 channel=6 \
  ieee80211n_wireless_width=1 guest_net_enable=1 guest_net_ssid=visitors guest_net_encryption=2 \
  guest_net_wpa_passphrase='come on in' guest_net_wpa=2 guest_net_wpa_encrypt_type=2 \
  guest_net_max_num_sta=2 ap_isolate=1 guest_net_lan_block=1 guest_net_access_ds=0 guest_net_internet_block=0 \
  guest_net_allow_http=1
visits guest
expect_reachable guest 203.0.113.1
expect_unreachable guest 192.168.7.1
expect_unreachable guest 192.168.7.2
expect_unreachable guest 10.1.14.1
expect_reads guest 80
expect_does_not_read guest 8080
expect_reads nas 8080

say '-- guests do not reach each other'
visits other
expect_unreachable guest "$(address_in other)"
expect_unreachable other "$(address_in guest)"
leaves other

say '-- the main network is another one'
guest_of nas other essid=home auth=WPA2PSK encrypt=AES key='deux croissants'
expect_reachable other 192.168.7.1
expect_unreachable guest "$(address_in other)"
leaves other

say '-- off the air for this hour, while the main network stays, and the other way round'
never=$(printf '%0168d' 0)
always=${never//0/1}
on nas mero-call ap-save guest_net_sched="$never" guest_net_sched_enable=1
on nas /etc/rc.network schedule wlan0
within 2 no_station nas guest || fail 'the guest is still there'
within 5 on_air wlan0 || fail 'the main network alone should be on the air'
leaves guest
on nas mero-call ap-save guest_net_sched="$always" wifi_sched="$never" wifi_sched_enabled=1
on nas /etc/rc.network schedule wlan0
within 5 on_air gwlan || fail 'the guest network alone should be on the air'
visits guest
leaves guest
on nas mero-call ap-save wifi_sched="$always"
on nas /etc/rc.network schedule wlan0
within 5 on_air gwlan wlan0 || fail 'both networks should be on the air'
guest_of nas other essid=home auth=WPA2PSK encrypt=AES key='deux croissants'
leaves other

say '-- the other way round: the LAN and all of the appliance, but not the internet'
serves nas guest_net_lan_block=0 guest_net_access_ds=1 guest_net_internet_block=1 guest_net_allow_http=0 ap_isolate=0
visits guest
expect_reachable guest 192.168.7.1
expect_unreachable guest 203.0.113.1
expect_reads guest 8080
leaves guest

say '-- what they may reach is told to wait until it is so'
waits() { inside nas merowireless ap status --porcelain | cut -f 10; }
expect_same 'whether settings wait' no "$(waits)"
on nas merowireless ap set --guest-net-internet-block no
expect_same 'whether settings wait' yes "$(waits)"
on nas merowireless ap enable
expect_same 'whether settings wait' no "$(waits)"

say '-- without it'
serves nas guest_net_enable=0
fails_on nas test -e /sys/class/net/gwlan
fails_on nas test -e /sys/class/net/gbr
on nas mero-call ap-disable
expect_same 'the addresses of nas' 'eth0 192.168.7.2/24' "$(addresses_of nas)"
