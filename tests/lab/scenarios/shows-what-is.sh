# What the program shows is what the kernel tells at that moment.
# Plain only
# shellcheck shell=bash

access_point home ssid=home channel=6 signal=-60 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
access_point cafe ssid=cafe channel=1 signal=-40
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

say '-- an access point goes on the air, and stays there'
plug_in nas
on nas merowireless ap set --ssid office --encryption wpa2 --key-file /var/lib/home.key --channel 11
on nas merowireless ap enable
fails_on nas merowireless scan --renew
expect_same "the kind of nas's interface" AP "$(radio_type nas)"
on nas merowireless ap disable
