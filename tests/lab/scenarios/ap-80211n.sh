# 802.11n, with 20 and 40 MHz, on both bands, on a channel that is chosen; stations without it, and one too many.
# Limit: 500 s
# shellcheck shell=bash

appliance nas
appliance guest
appliance late
plug_in nas

# expect_channel CHANNEL WIDTH: where the appliance is on the air; both may be patterns.
expect_channel() {
  local channel
  channel=$(ip netns exec nas iw dev wlan0 info | sed -n 's/.*channel \([0-9]*\) .*width: \([0-9]*\) MHz.*/\1 \2/p')
  # shellcheck disable=SC2053  # patterns they are
  [[ $channel == $1\ $2 ]] || fail "the appliance should be on channel $1 with $2 MHz, and is on $channel"
}

# The station is sent to by 802.11n, whose rates are called MCS.
guest_uses_80211n() {
  networks_of nas | grep 'tx bitrate:.*MCS' >/dev/null
}

open=(auth=OPEN encrypt=NONE)

say '-- 20 MHz on 2.4 GHz'
serves nas ssid=n encryption=0 hw_mode=12 ieee80211n=1 ieee80211n_wireless_width=1 channel=6
expect_channel 6 20
guest_of nas guest essid=n "${open[@]}"
guest_uses_80211n || fail 'the station is not sent to by 802.11n'
leaves guest

say '-- 40 MHz on 2.4 GHz'
serves nas ieee80211n_wireless_width=3
expect_channel 6 40
on nas grep ^ht_capab= /run/rc.network/hostapd-wlan0.conf
expect_output <<<'ht_capab=[SHORT-GI-20][SHORT-GI-40][HT40-]'
guest_of nas guest essid=n "${open[@]}"
leaves guest

say '-- 40 MHz on 5 GHz'
serves nas ssid=five encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 hw_mode=1 channel=36
expect_channel 36 40
guest_of nas guest essid=five auth=WPA2PSK encrypt=AES key='deux croissants'
leaves guest

say '-- 802.11n alone, with one station at most'
serves nas ssid=n encryption=0 hw_mode=8 channel=1 ieee80211n_wireless_width=1 max_num_sta=1
expect_channel 1 20
guest_of nas guest essid=n "${open[@]}"
refused late essid=n bssid="$(address_of nas)" "${open[@]}"
expect_no_station nas late
expect_station nas guest
leaves guest

say '-- no 802.11n'
serves nas ssid=g hw_mode=4 ieee80211n=0 max_num_sta=256
guest_of nas guest essid=g "${open[@]}"
! guest_uses_80211n || fail 'the station is sent to by 802.11n'
leaves guest

say '-- a channel of its own choice, with what width it has room for'
serves nas ssid=any channel=0 ieee80211n=1 ieee80211n_wireless_width=3
expect_channel '[1-9]*' '[24]0'
guest_of nas guest essid=any "${open[@]}"
leaves guest
serves_no_more nas
