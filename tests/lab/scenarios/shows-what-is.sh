# What the program shows is what the kernel tells at that moment.
# Plain only
# shellcheck shell=bash

access_point home ssid=home channel=6 signal=-60 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point cafe ssid=cafe channel=1 signal=-40
serve home 10.2.0
appliance nas
inside nas tee /var/lib/home.key >/dev/null <<<'deux croissants'

# What the kernel has heard: the address and the name of each, the strongest first.
heard() {
  ip netns exec nas iw dev wlan0 scan dump | awk '
    /^BSS / { address = toupper(substr($2, 1, 17)) }
    $1 == "signal:" { signal = $2 }
    $1 == "SSID:" { print signal, address, $2 }' | sort -rn | cut -d ' ' -f 2-
}

# expect_shown NAME...: the last output, of a scan, has these networks, and they are what the kernel has heard.
expect_shown() {
  expect_same 'what is shown' "$(printf '%s\n' "$@")" "$(cut -f 1 <<<"$OUTPUT")"
  expect_same 'what is shown, and what was heard' "$(heard)" "$(awk -F '\t' 'NF { print $7, $1 }' <<<"$OUTPUT")"
}

say '-- the first scan scans'
on nas merowireless scan --porcelain
expect_shown cafe home

say '-- what was heard just now is shown at once, and what is old is not'
access_point late ssid=late channel=11 signal=-80
on nas merowireless scan --porcelain
expect_shown cafe home
sleep 31
on nas merowireless scan --cached --porcelain
expect_shown ''
on nas merowireless scan --porcelain
expect_shown cafe home late

say '-- a watcher sees the addresses that the interface has, and when, and no step on the way to them'
inside nas sh -c 'exec merowireless watch --porcelain >/var/lib/watched 2>&1 </dev/null' &
within 5 inside nas test -s /var/lib/watched || fail 'nothing is watched'
on nas merowireless connect home --key-file /var/lib/home.key
lease=$(ipv4_of nas)
within 5 inside nas grep -q "${lease%/24}" /var/lib/watched || fail 'the lease is not seen'
on nas merowireless address 10.2.0.5 --mask 255.255.255.0
expect_address nas 10.2.0.5/24
within 5 inside nas grep -q '10\.2\.0\.5	' /var/lib/watched || fail 'the address is not seen'
inside nas pkill -INT -x merowireless
on nas cat /var/lib/watched
expect_same 'the addresses that were seen' "$(printf '%s\n' '' "${lease%/24} 255.255.255.0" '10.2.0.5 255.255.255.0' | sort)" \
  "$(cut -f 7,8 <<<"$OUTPUT" | tr -s '\t' ' ' | sed 's/^ $//' | sort -u)"
expect_no_line '[^Z]$'

say '-- the network that is joined, and one that is known'
on nas merowireless save cafe
on nas merowireless scan --porcelain
expect_shown cafe home late
joined=$(ip netns exec nas iw dev wlan0 link | awk '/^Connected to/ { print toupper($3) }')
expect_same 'which are joined, and known' "$(printf '%s\n' 'no yes' 'yes yes' 'no no')" \
  "$(cut -f 9,10 <<<"$OUTPUT" | tr '\t' ' ')"
expect_same 'the address of the one that is joined' "$joined" "$(awk -F '\t' '$9 == "yes" { print $7 }' <<<"$OUTPUT")"
on nas merowireless disconnect

say '-- an access point goes on the air, and stays there'
plug_in nas
on nas merowireless ap set --ssid office --encryption wpa2 --key-file /var/lib/home.key --channel 11
on nas merowireless ap enable
fails_on nas merowireless scan --renew
expect_same "the kind of nas's interface" AP "$(radio_type nas)"
on nas merowireless ap disable
