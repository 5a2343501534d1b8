# A scan lists what is in range, with its security; a renewed one finds newcomers; what is saved is known from then on.
# shellcheck shell=bash

access_point square ssid='open square'  channel=1  signal=-40
access_point cafe   ssid='Café du coin' channel=6  signal=-50 ieee80211n=1 \
  wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point office ssid=office         channel=36 signal=-60 hw_mode=a \
  wpa=3 wpa_passphrase='the old printer' wpa_pairwise='TKIP CCMP' rsn_pairwise='TKIP CCMP'
access_point shy    ssid='not told'     channel=6  signal=-30 ignore_broadcast_ssid=1
appliance nas

# The program does not show it.
mode=''
through_functions && mode=' opmode=AUTO'
square="essid='open square' bssid=$(address_of square) channel=1 signal=-40$mode"
square+=' protocol=11b/g auth=OPEN encrypt=NONE'
cafe="essid='Café du coin' bssid=$(address_of cafe) channel=6 signal=-50$mode"
cafe+=' protocol=11b/g/n auth=WPA2PSK encrypt=AES'
office="essid=office bssid=$(address_of office) channel=36 signal=-60$mode"
office+=' protocol=11a auth=WPA2PSK encrypt=TKIP+AES'

say '-- what is in range'
on nas mero-call scan renew
expect_output <<END
result=0
$square
$cafe
$office
END

say '-- one of them, by name and by address'
on nas mero-call get essid 'Café du coin'
expect_output <<END
result=1
$cafe
END
on nas mero-call get bssid "$(address_of office)"
expect_output <<END
result=1
$office
END
fails_on nas mero-call get essid 'not told'
expect_output <<<result=0

say '-- a newcomer'
access_point newcomer ssid="it's new" channel=11 signal=-70 hw_mode=b
on nas mero-call scan last
expect_no_line "it.*s new"
on nas mero-call scan renew
expect_output <<END
result=0
$square
$cafe
$office
essid=$'it\\'s new' bssid=$(address_of newcomer) channel=11 signal=-70$mode protocol=11b auth=OPEN encrypt=NONE
END

say '-- saved, and known'
on nas mero-call save essid='Café du coin' bssid="$(address_of cafe)" opmode=MANAGED auth=WPA2PSK encrypt=AES \
  key='deux croissants' ip=DHCP
on nas mero-call enum-by-time
saved_at=$(inside nas sed -n 's/^\tACCESS_TIME=//p' /usr/mero/etc/wireless.conf)
if through_functions; then
  expect_output <<END
result=0
essid='Café du coin' bssid=$(address_of cafe) channel=0 signal=0 opmode=MANAGED protocol=unknown auth=WPA2PSK encrypt=AES\
 key='deux croissants' user= ip=DHCP mask= gateway= none_bssid=0 atime=$saved_at
END
else
  # The program shows nothing that cannot be saved.
  expect_output <<END
result=0
essid='Café du coin' bssid=$(address_of cafe) opmode=MANAGED auth=WPA2PSK encrypt=AES\
 key='deux croissants' ip=DHCP mask= gateway= atime=$saved_at
END
fi
expect_mode nas /usr/mero/etc/wireless.conf 600
expect_message nas 'Scan 1: success.'
