# The country is what the kernel keeps to, what the access point tells and what the program shows; and so are channels.
# Plain only
# Rules of countries
# Limit: 600 s
# shellcheck shell=bash

appliance nas
appliance guest
plug_in nas

kernels() {
  ip netns exec nas iw reg get | awk '$1 == "country" { print substr($2, 1, 2); exit }'
}

test_kernels() {  # COUNTRY
  [[ $(kernels) == "$1" ]]
}

# expect_country COUNTRY KERNEL IN-FORCE: that is what the program tells, and the kernel agrees.
expect_country() {
  local line
  line=$(inside nas merowireless country --porcelain)
  expect_same 'the country' "$1"$'\t'"$2"$'\t\t'"$3" "$line"
  expect_same 'what the kernel keeps to' "$2" "$(kernels)"
}

# The channel's state, as iw tells it: nothing, "(disabled)", "(no IR)" ...
state_of() {  # MEGAHERTZ
  ip netns exec nas iw phy "${RADIO_OF[nas]}" info |
    sed -nE "s/.* $1(\.0)? MHz [^(]*\([^)]* dBm\) *//p; s/.* $1(\.0)? MHz .*(\(disabled\))/\2/p"
}

# use_of MEGAHERTZ: the same in the program's words.
use_of() {
  case $(state_of "$1") in
    '') echo all ;;
    *disabled*) echo none ;;
    *'no IR'*) echo listening ;;
    *radar*) echo after-radar ;;
  esac
}

# tells NAME: the country that the access point of that name tells, as another radio hears it.
tells() {
  ip -n guest link set wlan0 up
  ip netns exec guest iw dev wlan0 scan freq "$(ip netns exec nas iw dev wlan0 info |
    awk '$1 == "channel" { print substr($3, 2) }')" flush | awk -v name="$1" '
    $1 == "SSID:" { ssid = $2 } $1 == "Country:" && ssid == name { print $2 }'
}

# refuses STATUS TEXT COMMAND...: a command of the program ends with that status, and gives that reason.
refuses() {
  ends_with nas "$1" "${@:3}"
  [[ $ERRORS == *"$2"* ]] || fail "this should be said: $2"
}

# row CHANNEL: what the program tells of it in $picture: networks, strongest, load, use, quietest.
row() {
  awk -F '\t' -v channel="$1" '$2 == channel { print $3, $4, $5, $6, $7 }' <<<"$picture"
}

pending() {
  inside nas merowireless ap status --porcelain | cut -f 10
}

say '-- without a country'
expect_country '' 00 ''
expect_same 'channel 13' '(no IR)' "$(state_of 2472)"
refuses 2 'this radio may not use channel 13 without a country' ap set --channel 13

say '-- one that there is not'
refuses 2 'the kernel knows no rules for UK' country UK
expect_country '' 00 ''

say '-- one that there is'
on nas merowireless country de
expect_output <<<'the country is DE'
expect_country DE DE yes
expect_file nas /usr/mero/etc/wireless_country.conf <<<'country="DE"'
expect_same 'channel 13' '' "$(state_of 2472)"
on nas rm /lib/firmware/regulatory.db
refuses 1 'the kernel has no rules for UK, and its database of rules cannot be read' country UK
expect_country DE DE yes
on nas merowireless ap set --ssid office --encryption open --channel 13
on nas merowireless ap enable
expect_output <<<'the access point office is enabled'
expect_same 'whether settings wait' no "$(pending)"
expect_same 'the country that is told' DE "$(tells office)"

say '-- while the access point is on the air'
refuses 8 'channel 13 may not be used in US, and is in use' country US
expect_country DE DE yes
expect_same 'the type' AP "$(radio_type nas)"
on nas merowireless country FR
# shellcheck disable=SC2016  # the program says so
expect_output <<<'the country is FR; `merowireless ap enable` has the access point tell of it'
expect_country FR FR yes
expect_same 'whether settings wait' yes "$(pending)"
expect_same 'the country that is told' DE "$(tells office)"
on nas merowireless ap enable
expect_same 'whether settings wait' no "$(pending)"
expect_same 'the country that is told' FR "$(tells office)"

say '-- after another start of the kernel, as far as it knows'
on nas merowireless ap disable
on nas iw reg set 00
within 5 test_kernels 00
expect_country FR 00 no
plug_in nas
expect_country FR FR yes

say '-- on a channel of radars'
on nas merowireless ap set --band 5 --channel 52
on nas merowireless ap enable
expect_output <<<'the access point office is enabled, and waits until channel 52 is known to be free of radar'
on nas merowireless ap disable

say '-- none again'
on nas merowireless country none
expect_output <<<'no country is set'
expect_country '' 00 ''

say '-- in a network that tells of another country'
access_point cafe ssid=cafe channel=1 country_code=US ieee80211d=1
on nas merowireless country FR
expect_country FR FR yes

say '-- channel by channel'
access_point kiosk ssid=kiosk channel=6 signal=-60
picture=$(inside nas merowireless channels --renew --porcelain)
show <<<"$picture"
expect_same 'how many networks there are' "$(ip netns exec nas iw dev wlan0 scan dump | grep -c '^BSS')" \
  "$(awk -F '\t' '{ count += $3 } END { print count }' <<<"$picture")"
expect_same 'channel 6' '1 -60' "$(row 6 | cut -d ' ' -f 1,2)"
expect_same 'channel 11' '0  0 all yes' "$(row 11)"
expect_same 'channel 36' '0  0 all yes' "$(row 36)"
expect_same 'channel 52' '0  0 after-radar no' "$(row 52)"
for channel in 1:2412 13:2472 14:2484 36:5180 100:5500 165:5825; do
  told=$(row "${channel%:*}" | awk '{ print $(NF - 1) }')
  expect_same "the use of channel $channel" "$(use_of "${channel#*:}")" "$told"
done
on nas merowireless ap set --band 2.4 --channel auto
# shellcheck disable=SC2016  # the program says so
expect_line 'saved with channel 11, the quietest; `merowireless ap enable` puts the settings on the air'

say '-- joined'
on nas merowireless connect --no-address cafe
within 5 test_kernels US || fail 'the kernel does not listen to the access point'
expect_country FR US no
