# A router that goes off and comes back, an adapter that is pulled, an access point and a cell meanwhile: the program
# that keeps the connection has the appliance back within the time that the manual states, and disturbs nothing.
# Plain only
# Limit: 600 s
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas
plug_in nas
inside nas tee /var/lib/key >/dev/null <<<'deux croissants'
on nas merowireless save cafe --key-file /var/lib/key
switch_off cafe

# A scan of all channels takes the kernel of Debian 13 3.4 s, where that of 12 takes 1.3.
patience=8 pause=5 attempt=30
lines=$LOGS/nas.keep
: >"$lines"
inside nas merowireless autoconnect --keep --patience $patience --longest-pause $pause >>"$lines" 2>&1 &
keeper=$!

# told LINES: the program has told so many changes.
told() {
  (($(wc -l <"$lines") == $1))
}

# is_back LINES: the access point has the appliance as a station, the kernel has its address and its way out, and the
# program says so in its last line, which is the one of that number.
is_back() {
  station cafe nas && told "$1" &&
    [[ $(tail -n 1 "$lines") == "connected to cafe as $(address_in nas)" && $(ipv4_of nas) == 10.2.0.1??/24 ]] &&
    [[ $(default_routes nas) == 'default via 10.2.0.1 '* ]]
}

# comes_back LINES SECONDS
comes_back() {
  local began=${EPOCHREALTIME/./}
  within "$2" is_back "$1" || fail "it is not back after $2 s; it says
$(cat "$lines")
and its address is '$(ipv4_of nas)'"
  say "back after $(((${EPOCHREALTIME/./} - began) / 1000000)) s"
  expect_reachable nas 10.2.0.1
}

supplicant() {
  inside nas cat /run/wpa_supplicant.pid
}

say '-- it is switched on before its router'
within $attempt told 1 || fail 'no attempt has failed'
expect_same 'the reason' 1 "$(grep -c '^merowireless: none of the known networks could be joined: ' "$lines")"
switch_on cafe
comes_back 2 $((pause + attempt))

say '-- the router is off for a moment: the supplicant finds it again'
first=$(supplicant)
switch_off cafe
within 5 no_station cafe nas
sleep 1
switch_on cafe
comes_back 2 15
expect_same 'the supplicant' "$first" "$(supplicant)"

say '-- the router is off for longer'
switch_off cafe
within $((patience + 10)) told 3 || fail 'nothing is said of the loss'
expect_same 'what it says' 'the connection to cafe is lost, and a known network is joined anew' "$(tail -n 1 "$lines")"
switch_on cafe
comes_back 4 $((pause + attempt))

say '-- an access point is set up: it is left alone'
on nas merowireless ap set --ssid home --encryption wpa2 --key-file /var/lib/key --channel 11
on nas merowireless ap enable
sleep $((patience + pause + 2))
on nas merowireless ap status --porcelain
expect_output <<<'on-air	home	yes	wlan0	home		11	2462	0	no'
expect_same "the kind of nas's interface" AP "$(radio_type nas)"
expect_same 'what it says' "waiting while the adapter is an access point's" "$(tail -n 1 "$lines")"
expect_same 'supplicants' '' "$(processes_of nas | grep wpa_supplicant || :)"

say '-- and ends'
on nas merowireless ap disable
comes_back 6 $((pause + attempt))

say '-- the adapter is pulled, and plugged in again'
unplug nas
on nas /usr/mero/hotplug/usb.wireless.function remove
within 10 told 7 || fail 'nothing is said of the adapter'
expect_same 'what it says' 'waiting until an adapter is plugged in' "$(tail -n 1 "$lines")"
plug nas
plug_in nas
comes_back 8 $((pause + attempt))

say '-- somebody makes a cell, which the driver takes seconds to begin: it is left alone'
on nas merowireless adhoc bench
within 20 told 10 || fail "it disturbs the cell: $(cat "$lines")"
expect_same 'what it says' 'waiting while the adapter looks for the others of its ad-hoc cell
connected to bench without an address' "$(tail -n 2 "$lines")"
expect_same "the kind of nas's interface" IBSS "$(radio_type nas)"
on nas merowireless connect cafe

say '-- it is ended, and the connection stays'
inside nas pkill -TERM -x merowireless
status=0
wait $keeper || status=$?
expect_same 'its exit status' 0 $status
sleep 1
expect_station cafe nas
expect_reachable nas 10.2.0.1
expect_nothing_inherited nas
