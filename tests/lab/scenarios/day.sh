# A day of an administrator: after every command, the program says what the kernel, the daemons and the settings say.
# Plain only
# Limit: 900 s
# shellcheck shell=bash

access_point home ssid=home channel=1 wpa=2 wpa_passphrase='the old printer' rsn_pairwise=CCMP
access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point park ssid=park channel=11
serve home 10.1.0
serve cafe 10.2.0
appliance nas
appliance guest

inside nas tee /var/lib/home.key >/dev/null <<<'the old printer'
inside nas tee /var/lib/cafe.key >/dev/null <<<'deux croissants'
inside nas tee /var/lib/wrong.key >/dev/null <<<'trois croissants'

say '-- in the morning'
expect_no_lie nas
plug_in nas
expect_no_lie nas
does nas radio
does nas country
does nas scan
does nas channels
does nas save home --key-file /var/lib/home.key
does nas save park
does nas save cafe --key-file /var/lib/wrong.key

say '-- here and there'
does nas connect home
expect_station home nas
does_not nas 5 connect cafe
expect_station home nas
does nas save cafe --key-file /var/lib/cafe.key
does nas connect cafe
expect_station cafe nas
does nas connect park --no-address
does nas disconnect
does nas forget cafe
does nas connect cafe --key-file /var/lib/cafe.key
does nas share --svg /var/lib/cafe.svg
does nas disconnect
does nas edit park --auto no
does nas edit home --priority 5
does nas autoconnect
expect_station home nas
does nas edit home --priority 0
does nas connect cafe
inside nas merowireless connect home >/dev/null 2>&1 &
first=$!
within 5 inside nas test -e /var/tmp/.wireless_connecting || fail 'the first does not begin'
does_not nas 8 connect cafe
wait $first
expect_no_lie nas
expect_station home nas
does nas address 10.1.0.5 --mask 255.255.255.0
does nas gateway 10.1.0.1
does nas address DHCP
switch_off home
within 10 no_station home nas
sleep 2
expect_no_lie nas
does_not nas 4 connect nowhere
does nas disconnect

say '-- an access point'
does nas ap set --ssid office --encryption wpa2 --key-file /var/lib/home.key --channel auto
does nas ap enable
guest_of nas guest essid=office auth=WPA2PSK encrypt=AES key='the old printer'
expect_no_lie nas
does nas ap status
does nas ap stations
does nas ap kick "$(address_of guest)"
expect_no_lie nas
does nas share ap --svg /var/lib/office.svg
does_not nas 8 connect cafe
does_not nas 8 scan --renew
does nas ap set --ssid bureau --channel 6
does nas ap enable
expect_no_lie nas
does nas mode client
does nas mode ap
does nas radio off
does nas radio on
does nas ap disable
does_not nas 2 mode ap

say '-- the radio and the adapter'
does nas connect cafe
does nas radio off
does_not nas 6 connect cafe
does nas radio on
expect_station cafe nas
unplug nas
expect_no_lie nas
on nas /usr/mero/hotplug/usb.wireless.function remove
expect_no_lie nas
does_not nas 3 connect cafe
plug nas
plug_in nas
expect_no_lie nas
does nas connect cafe
inside nas sh -c 'echo 1 | tee /sys/class/net/wlan0/phy80211/rfkill*/soft >/dev/null'
expect_no_lie nas
does nas radio on

say '-- a cell, and the end of the day'
does nas adhoc bench
does nas disconnect
does nas forget park
does nas forget home
does nas known
