# The unit that joins at start-up, run by systemd itself: neither its restart nor its failure nor its end costs the
# appliance its network.
# Plain only
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas
inside nas tee /var/lib/key >/dev/null <<<'deux croissants'
on nas merowireless save cafe --key-file /var/lib/key

boots nas

daemons() {
  processes_of nas | grep -E '/(wpa_supplicant|busybox udhcpc) '
}

# The program's process, by the number that it has in the appliance; nothing while there is none.
keeper() {
  processes_of nas | awk '/merowireless autoconnect --keep/ { print $1 }'
}

started_again() {
  [[ $(keeper) && $(keeper) != "$killed" ]]
}

expect_connection_untouched() {  # WHAT
  expect_same "the daemons after $1" "$before" "$(daemons)"
  expect_station cafe nas
  expect_reachable nas 10.2.0.1
}

say '-- the adapter comes'
unit nas start "$ADAPTER"
within 40 inside nas grep -qs '^connected to cafe as 10\.2\.0\.' /run/told || fail 'the unit has not joined the network'
before=$(daemons)
expect_same 'the number of daemons' 2 "$(wc -l <<<"$before")"

say '-- the unit is restarted, killed and stopped'
unit nas restart "$KEEPER"
expect_connection_untouched 'the restart'
killed=$(keeper)
unit nas kill --kill-whom=main --signal=KILL "$KEEPER"
within 20 started_again || fail 'the unit is not started again'
expect_connection_untouched 'the failure'
unit nas stop "$KEEPER"
expect_connection_untouched 'the end'
expect_same 'programs that keep the connection' '' "$(keeper)"
