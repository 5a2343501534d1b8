# What the program says of the access point, the mode and the radio is what the kernel says, whatever was done before.
# Plain only
# shellcheck shell=bash

access_point cafe ssid=cafe channel=1
serve cafe 10.2.0
appliance nas
appliance guest
plug_in nas

# expect_truth STATE: that is what the program says of the access point, and the rest is as the kernel tells it.
expect_truth() {
  local info line
  local -a said
  line=$(inside nas merowireless ap status --porcelain)
  say "the access point is $1: $line"
  IFS=$'\x1f' read -r -a said <<<"${line//$'\t'/$'\x1f'}"
  info=$(ip netns exec nas iw dev wlan0 info)
  expect_same 'the state' "$1" "${said[0]}"
  if [[ $1 == off ]]; then
    expect_same 'the type' managed "$(radio_type nas)"
    return
  fi
  expect_same 'the type' AP "$(radio_type nas)"
  expect_same 'the name on the air' "$(awk '$1 == "ssid" { print $2 }' <<<"$info")" "${said[4]-}"
  [[ $1 == on-air ]] || return 0
  expect_same 'the channel' "$(awk '$1 == "channel" { print $2, substr($3, 2) }' <<<"$info")" "${said[6]} ${said[7]}"
  expect_same 'the stations' "$(stations)" "${said[8]}"
  pending=${said[9]}
}

stations() {
  ip netns exec nas iw dev wlan0 station dump | awk '$1 == "Station" { count++ } END { print count + 0 }'
}

# ends_with STATUS TEXT COMMAND...: a command of the program ends with that status, and says that on standard error.
ends_with() {
  local status=0 errors
  say_words 'nas$ merowireless' "${@:3}"
  errors=$(inside nas merowireless "${@:3}" 2>&1 >/dev/null) || status=$?
  show <<<"$errors"
  expect_same "the status of ${*:3}" "$1" "$status"
  [[ $errors == *"$2"* ]] || fail "this should be said: $2"
}

block() {
  inside nas sh -c 'cat /sys/class/net/wlan0/phy80211/rfkill*/soft'
}

say '-- a mode that would only end the connection, and a channel that is not to be used'
on nas merowireless save cafe
on nas merowireless connect cafe
ends_with 2 'no access point is enabled, and the change would only end a connection' mode ap
expect_station cafe nas
on nas merowireless mode client
expect_output <<<"the adapter is a client's already"
expect_station cafe nas
ends_with 2 'tells the country; it may use 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11,' \
  ap set --channel 13
expect_truth off

say '-- the radio, off and on again, with the connection'
on nas merowireless radio off
within 2 no_station cafe nas || fail 'it is still a station'
expect_same 'the block of the kernel' 1 "$(block)"
ends_with 6 'the radio is switched off' connect cafe
say '-- and plugged in anew meanwhile, when the kernel has no block of it yet'
inside nas sh -c 'echo 0 | tee /sys/class/net/wlan0/phy80211/rfkill*/soft >/dev/null'
plug_in nas
expect_same 'the block of the kernel' 1 "$(block)"
on nas merowireless radio on
expect_output <<<'the radio is on, and connected to cafe'
expect_same 'the block of the kernel' 0 "$(block)"
expect_station cafe nas
expect_address nas '10.2.0.*'
on nas merowireless disconnect

say '-- on the air, with a station, and with settings that are not on the air yet'
on nas touch /var/tmp/.wireless_ap_connecting
expect_truth off
on nas merowireless ap set --ssid office --encryption open --channel 11
on nas merowireless ap enable
expect_truth on-air
expect_same 'whether settings wait' no "$pending"
guest_of nas guest essid=office auth=OPEN encrypt=NONE
expect_truth on-air
on nas merowireless ap set --ssid bureau --bridge br0
expect_truth on-air
expect_same 'whether settings wait' yes "$pending"
ends_with 1 'could not be enabled, and the one that was on the air is there again' ap enable
expect_truth on-air
expect_same 'whether settings wait' yes "$pending"

say '-- the mode, to and fro'
on nas merowireless mode ap
expect_output <<<"the adapter is an access point's already: office is on the air on channel 11"
on nas merowireless mode client
expect_truth off
on nas merowireless mode ap
expect_output <<<"the adapter is an access point's now: office is on the air on channel 11"
expect_truth on-air

say '-- the radio, off and on again, with the access point'
on nas merowireless radio off
expect_truth off
expect_same 'the block of the kernel' 1 "$(block)"
ends_with 6 'the radio is switched off' ap enable
on nas merowireless radio on
expect_output <<<'the radio is on, and office is on the air on channel 11'
expect_truth on-air

say '-- off by its schedule, from the first moment on'
inside nas sh -c 'printf "%0168d" 0 >/var/lib/never; printf "%0168d" 0 | tr 0 1 >/var/lib/always'
on nas merowireless ap disable
on nas merowireless ap set --bridge lbr0 --wifi-sched /var/lib/never --ieee80211n-wireless-width 20
# What a start does besides takes as long as on a slow machine.
inside nas tee /usr/local/sbin/dnsmasq >/dev/null <<<$'#!/bin/sh\nsleep 1; touch /run/slow; exec /usr/sbin/dnsmasq "$@"'
inside nas chmod 755 /usr/local/sbin/dnsmasq
ip link set hwsim0 up
/run/lab/products/usr/bin/peer-watch beacon hwsim0 bureau 10 >/run/lab/beacon 2>&1 &
watcher=$!
within 10 grep -qx watching /run/lab/beacon || fail 'nobody listens to the air'
on nas merowireless ap enable
expect_output <<<'the access point bureau is enabled, and is off the air at this hour, by its schedule'
expect_truth off-by-schedule
inside nas rm /run/slow /usr/local/sbin/dnsmasq
! wait "$watcher" || fail 'the access point was on the air at an hour that its schedule has it off'

say '-- and on at the hour that has it on'
/run/lab/products/usr/bin/peer-watch beacon hwsim0 bureau 10 >/run/lab/beacon 2>&1 &
watcher=$!
within 10 grep -qx watching /run/lab/beacon || fail 'nobody listens to the air'
on nas merowireless ap set --wifi-sched /var/lib/always
on nas /etc/rc.network schedule wlan0
wait "$watcher" || fail 'the access point is not on the air at an hour that its schedule has it on'
expect_truth on-air
on nas merowireless ap set --wifi-sched off
# shellcheck disable=SC2016  # for the appliance's shell
on nas sh -c 'merowireless ap enable & for try in $(seq 99); do
  case $(merowireless ap status --porcelain) in setting-up*) echo seen; break ;; esac; done; wait'
expect_line seen
expect_truth on-air
expect_same 'whether settings wait' no "$pending"

say '-- without its adapter'
unplug nas
ends_with 3 'no adapter is plugged in' ap status
ends_with 3 'no adapter is plugged in' mode client
