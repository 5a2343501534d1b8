# A long week in the cupboard: whatever happens to the router, the power, the adapter, the settings and the wire, the
# appliance is back on its network without a hand, within the time that the manual states.
# Plain only
# On request
# Limit: 1500 s
# shellcheck shell=bash

readonly patience=3 longest=8 MANUAL=$LAB/../../docs/man/merowireless.1

access_point cafe ssid=cafe channel=6 signal=-60 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas
inside nas tee /var/lib/key >/dev/null <<<'deux croissants'
inside nas tee /var/lib/wrong >/dev/null <<<'trois croissants'
on nas merowireless save cafe --key-file /var/lib/key

# ---- The bounds, by what the manual states -----------------------------------------------------------------------------

# stated TEXT: the number of seconds that the manual gives in the line behind this one.
stated() {
  local seconds
  seconds=$(grep -xF -A 1 ".It $1" "$MANUAL" | sed -n '2s/^\([0-9]\+\) seconds.*/\1/p')
  [[ $seconds ]] || fail "the manual states no time: $1"
  printf '%s' "$seconds"
}

supplicant=$(stated 'the supplicant')
first=$(stated 'the first pause')
attempt=$(stated 'an attempt')
vain=$(stated 'an attempt in vain')
readonly supplicant first attempt vain

# ---- What is seen ------------------------------------------------------------------------------------------------------

TABLE=()

# An emulated processor has enough to do: what the kernel tells in a file is asked for first.
is_back() {  # ACCESS-POINT
  [[ $(<"/proc/${INIT_OF[nas]}/root/sys/class/net/wlan0/operstate") == up ]] &&
    station "$1" nas && [[ $(ipv4_of nas) == 10.2.0.1??/24 ]] && default_routes nas | grep -q '^default via 10\.2\.0\.1 dev wlan0 '
}

# back ACCESS-POINT BOUND EVENT: it is back within so many seconds, and says so.
back() {
  local began=${EPOCHREALTIME/./} took
  within "$2" is_back "$1" || fail "after this, it is not back within $2 s: $3
$(inside nas cat /run/told)"
  took=$(((${EPOCHREALTIME/./} - began) / 100000))
  printf -v took '%d.%d' $((took / 10)) $((took % 10))
  say "back after $took s, of $2: $3"
  TABLE+=("$(printf '%-62s %6s %4s' "$3" "$took" "$2")")
  expect_reachable nas 10.2.0.1
  expect_no_lie nas
}

# told PATTERN: the last line that the unit has told begins so.
told() {
  local lines file=/proc/${INIT_OF[nas]}/root/run/told
  [[ -e $file ]] || return 1
  mapfile -t lines <"$file"
  # shellcheck disable=SC2053  # a pattern it is
  ((${#lines[@]} > 0)) && [[ ${lines[-1]} == $1* ]]
}

lost() {
  within $((patience + 10)) told 'the connection to cafe is lost, and a known network is joined anew' ||
    fail "nothing is said of the loss: $(inside nas cat /run/told)"
}

# A day later by the wall's clock, which time servers set now and then, and batteries lose.
next_day() {
  say "-- $1"
  date -s "$(date -d '+1 day' '+%F %T')" >/dev/null
}

# ---- The week ----------------------------------------------------------------------------------------------------------

say '-- Monday: it is switched on'
boots nas --patience $patience --longest-pause $longest
unit nas start "$ADAPTER"
back cafe "$attempt" 'switched on'

next_day 'Tuesday: the router is off for a moment'
switch_off cafe
within 5 no_station cafe nas
sleep 1
switch_on cafe
back cafe "$supplicant" 'the router was off for a moment'

say '-- and for longer'
switch_off cafe
lost
sleep $((2 * longest))
switch_on cafe
back cafe $((longest + vain + attempt)) 'the router was off for long'

say '-- and another access point of the network takes its place, and gives it back'
access_point attic ssid=cafe channel=11 signal=-70 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve attic 10.2.0
switch_off cafe
within 5 no_station cafe nas
back attic "$supplicant" 'another access point of the network took its place'
switch_on cafe
switch_off attic
within 5 no_station attic nas
back cafe "$supplicant" 'that one is off again'

next_day 'Wednesday: no power, and the router takes longer to start'
switch_off cafe
loses_power nas
has_power nas
boots nas --patience $patience --longest-pause $longest
unit nas start "$ADAPTER"
within $((vain + 10)) told 'merowireless: none of the known networks' || fail "no attempt has failed: $(inside nas cat /run/told)"
switch_on cafe
back cafe $((longest + vain + attempt)) 'the power was off, and the router came later'

next_day 'Thursday: the adapter is pulled, and plugged in again'
unplug nas
unit nas stop "$ADAPTER"
sleep 1
plug nas
unit nas start "$ADAPTER"
back cafe "$attempt" 'the adapter was pulled'

say '-- and an access point in between'
on nas merowireless ap set --ssid office --encryption wpa2 --key-file /var/lib/key --channel 11
on nas merowireless ap enable
expect_no_lie nas
within 5 told "waiting while the adapter is an access point's" || fail "it does not wait: $(inside nas cat /run/told)"
sleep $((patience + longest))
expect_no_lie nas
expect_same "the kind of nas's interface" AP "$(radio_type nas)"
on nas merowireless ap disable
back cafe $((first + attempt)) 'an access point was on the air'

next_day 'Friday: a wrong secret is saved, which is found when the router has been off'
on nas merowireless save cafe --key-file /var/lib/wrong
expect_station cafe nas
switch_off cafe
lost
switch_on cafe
within $((2 * (longest + vain))) told 'merowireless: *does not accept the secret' || fail "the secret is not refused: $(inside nas cat /run/told)"
expect_no_lie nas
on nas merowireless save cafe --key-file /var/lib/key
back cafe $((first + vain + attempt)) 'a wrong secret was saved, and mended'

# pretend ADDRESS: the pretender, open, bears this address.
pretend() {
  switch_off pretender
  ip -n pretender -batch - <<<"link set wlan0 down
    link set wlan0 address $1"
  switch_on pretender
}

next_day 'Saturday: a pretender is on the air while the router is off'
access_point pretender ssid=cafe channel=1 signal=-30
serve pretender 10.66.0
own=$(address_of pretender)
switch_off cafe
pretend "$(address_of cafe)"
lost
sleep $((2 * longest))
expect_no_station pretender nas
expect_no_lie nas
pretend "$own"
switch_on cafe
back cafe $((longest + vain + attempt)) 'a pretender is on the air'
switch_off pretender

next_day 'Sunday: a wire, which is pulled and plugged in'
wire office nas
ip -n office address add 192.0.2.1/24 dev eth0

wire_plugged() {
  ip -n office link set eth0 up
  ip -n nas address replace 192.0.2.9/24 dev eth0
  ip -n nas route replace default via 192.0.2.1
}

# Whoever looks after the wire takes away what led through it.
wire_pulled() {
  ip -n office link set eth0 down
  ip -n nas address flush dev eth0
}

# expect_ways GATEWAY...: the ways out, the one that is taken first.
expect_ways() {
  expect_same 'the ways out' "$(printf '%s\n' "$@")" "$(default_routes nas | awk '{ print $3 }')"
}

supplicants() {
  processes_of nas | grep -E '/wpa_supplicant '
}

before=$(supplicants)
wire_plugged
expect_ways 192.0.2.1 10.2.0.1
expect_no_lie nas
wire_pulled
expect_ways 10.2.0.1
back cafe 1 'the wire was pulled'
wire_plugged
expect_ways 192.0.2.1 10.2.0.1
expect_same 'the supplicants' "$before" "$(supplicants)"

say '-- and the router is off, with the wire there'
switch_off cafe
lost
expect_same 'the way out that is taken' 192.0.2.1 "$(default_routes nas | awk 'NR == 1 { print $3 }')"
switch_on cafe
back cafe $((longest + vain + attempt)) 'the router was off, beside a wire'
expect_ways 192.0.2.1 10.2.0.1

say '-- the week'
show <<<"$(printf '%-62s %6s %4s\n' event 'back after' bound)"
show < <(printf '%s\n' "${TABLE[@]}")
