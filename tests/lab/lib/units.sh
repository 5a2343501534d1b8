# The units of the kit, run by systemd itself in namespaces within those of an appliance.
# shellcheck shell=bash

readonly KEEPER=mero-wireless-autoconnect.service ADAPTER=mero-wireless@wlan0.service

# boots NAME [OPTION...]: starts systemd with units that need nothing of a whole system. No device is announced in a
# namespace, so the adapter's unit stands for itself: `unit NAME start $ADAPTER` is what plugging it in comes to, and the
# unit that keeps the connection, which has these options, comes and goes with it. What that tells is in /run/told. From now
# on what happens inside the appliance happens beside systemd, in whose namespace the numbers of processes hold.
boots() {
  local name=$1 units=/run/systemd/system
  write_file "$name" $units/lab.target <<'END'
[Unit]
DefaultDependencies=no
END
  write_file "$name" $units/$ADAPTER <<'END'
[Unit]
DefaultDependencies=no
[Service]
Type=oneshot
RemainAfterExit=yes
ExecStart=/usr/mero/hotplug/usb.wireless.function add
ExecStop=/usr/mero/hotplug/usb.wireless.function remove
END
  write_file "$name" $units/$KEEPER.d/lab.conf <<END
[Unit]
DefaultDependencies=no
[Service]
StandardOutput=append:/run/told
StandardError=append:/run/told
END
  (($# == 1)) || write_file "$name" $units/$KEEPER.d/options.conf <<END
[Service]
ExecStart=
ExecStart=/usr/bin/merowireless autoconnect --keep ${*:2}
END
  inside "$name" mkdir $units/$ADAPTER.wants
  inside "$name" ln -s /lib/systemd/system/$KEEPER $units/$ADAPTER.wants/

  say "$name: systemd"
  inside "$name" mount -t cgroup2 cgroup2 /sys/fs/cgroup
  inside "$name" unshare --pid --cgroup --mount --fork --mount-proc env container=lab \
    /lib/systemd/systemd --system --unit=lab.target --log-target=console --show-status=no \
    >"$LOGS/$name.systemd" 2>&1 </dev/null &
  within 20 inside "$name" test -S /run/systemd/private || fail "systemd does not start: $(<"$LOGS/$name.systemd")"
  # shellcheck disable=SC2004  # its indices are names
  INIT_OF[$name]=$(pgrep -n -f '^/lib/systemd/systemd --system')
}

# unit NAME COMMAND [OPTION...] UNIT: has the appliance's systemd do that.
unit() {
  say "$1: systemctl ${*:2}"
  nsenter --target "${INIT_OF[$1]}" --all systemctl "${@:2}" {STEPS}>&-
}

# write_file NAME PATH: puts what stands on standard input into a file of the appliance's.
write_file() {
  inside "$1" mkdir -p "${2%/*}"
  inside "$1" tee "$2" >/dev/null
}
