# The unit that joins at start-up, run by systemd itself: neither its restart nor its failure nor its end costs the
# appliance its network.
# Plain only
# shellcheck shell=bash

access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
serve cafe 10.2.0
appliance nas
plug_in nas
inside nas tee /var/lib/key >/dev/null <<<'deux croissants'
on nas merowireless save cafe --key-file /var/lib/key

# write PATH: puts what stands on standard input into a file of the appliance's.
write() {
  inside nas mkdir -p "${1%/*}"
  inside nas tee "$1" >/dev/null
}

# Units that need nothing of a whole system. No device is announced in a namespace, so the adapter's unit stands for
# itself.
units=/run/systemd/system
unit=mero-wireless-autoconnect.service
write $units/lab.target <<'END_OF_UNIT'
[Unit]
DefaultDependencies=no
END_OF_UNIT
write $units/mero-wireless@wlan0.service <<'END_OF_UNIT'
[Unit]
DefaultDependencies=no
[Service]
Type=oneshot
RemainAfterExit=yes
ExecStart=/usr/mero/hotplug/usb.wireless.function add
ExecStop=/usr/mero/hotplug/usb.wireless.function remove
END_OF_UNIT
write $units/$unit.d/lab.conf <<'END_OF_UNIT'
[Unit]
DefaultDependencies=no
[Service]
StandardOutput=append:/run/told
StandardError=append:/run/told
END_OF_UNIT

say 'systemd, in namespaces within those of the appliance'
inside nas mount -t cgroup2 cgroup2 /sys/fs/cgroup
inside nas unshare --pid --cgroup --mount --fork --mount-proc env container=lab \
  /lib/systemd/systemd --system --unit=lab.target --log-target=console --show-status=no >"$LOGS/nas.systemd" 2>&1 </dev/null &
within 20 inside nas test -S /run/systemd/private || fail "systemd does not start: $(<"$LOGS/nas.systemd")"
manager=$(pgrep -f '^/lib/systemd/systemd --system')

systemd() {  # COMMAND [OPTION...]
  say "systemctl $* $unit"
  nsenter --target "$manager" --all systemctl "$@" $unit {STEPS}>&-
}

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
systemd start
within 40 inside nas grep -qs '^connected to cafe as 10\.2\.0\.' /run/told || fail 'the unit has not joined the network'
before=$(daemons)
expect_same 'the number of daemons' 2 "$(wc -l <<<"$before")"

say '-- the unit is restarted, killed and stopped'
systemd restart
expect_connection_untouched 'the restart'
killed=$(keeper)
systemd kill --kill-whom=main --signal=KILL
within 20 started_again || fail 'the unit is not started again'
expect_connection_untouched 'the failure'
systemd stop
expect_connection_untouched 'the end'
expect_same 'programs that keep the connection' '' "$(keeper)"
