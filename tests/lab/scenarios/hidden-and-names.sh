# A hidden network is joined, one of two access points of a name, and networks whose names and keys mean to be more.
# Limit: 400 s
# shellcheck shell=bash
# shellcheck disable=SC2016  # nothing in a name or a key is to be expanded

say '-- a hidden network'
access_point shy  ssid='not told' channel=1 ignore_broadcast_ssid=1 wpa=2 wpa_passphrase='deux croissants' \
  rsn_pairwise=CCMP
appliance nas
shy=(essid='not told' auth=WPA2PSK encrypt=AES key='deux croissants')
# The program has to be told where to find what hides.
through_functions || shy+=(bssid="$(address_of shy)")
joins nas shy "${shy[@]}"
leaves nas

say '-- of two access points of one name, the one with the saved address, and whichever is stronger'
access_point near ssid=home channel=1  signal=-40
access_point far  ssid=home channel=11 signal=-70
far=(essid=home bssid="$(address_of far)" auth=OPEN encrypt=NONE)
joins nas far "${far[@]}"
expect_no_station near nas
leaves nas
joins nas near "${far[@]}" none_bssid=1
expect_no_station far nas
leaves nas

say '-- names and keys of all kinds of characters'
names=('  "A" & '\''B'\'' \ $HOME; #é ' '$(touch /tmp/pwned)' ';reboot' '"' '`touch /tmp/pwned`')
keys=('say "é"; it'\''s \n $HOME #1 ' '"""""""" #' '$(reboot)`reboot`' "' || reboot '" ';touch /tmp/pwned')
# The program takes ASCII alone for a passphrase.
through_functions || keys[0]=${keys[0]//é/e}
for index in "${!names[@]}"; do
  access_point "name$index" ssid="${names[index]}" channel=6 wpa=2 wpa_passphrase="${keys[index]}" rsn_pairwise=CCMP
done
for index in "${!names[@]}"; do
  joins nas "name$index" essid="${names[index]}" bssid="$(address_of "name$index")" auth=WPA2PSK encrypt=AES \
    key="${keys[index]}"
  # In between stands what the program learns from a scan.
  expect_same 'the record of the connection' "${names[index]}
$(address_of "name$index" | tr a-f A-F)" "$(inside nas sed -n '1p;$p' /var/tmp/.wireless_current_connection)"
  leaves nas
done

say '-- a name that would be a line of the configuration'
refused nas essid=$'home"\n\tssid="home' auth=OPEN encrypt=NONE
# The program does not try what is not in range.
through_functions && expect_message nas 'A name or secret with a line feed cannot be configured.'
expect_nothing_left nas
