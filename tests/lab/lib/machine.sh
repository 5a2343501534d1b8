# A machine that boots a Debian system of its own: nas, which is the machine itself, with its adapter. A script about it
# consists of functions: `air`, which is run before systemd in each boot, and `boot_1`, `boot_2` and so on.
# shellcheck shell=bash

readonly ADAPTER_ADDRESS=02:00:00:00:00:00

# The words about appliances are about the machine, too, if they take no system log and no layers.
if [[ $PART ]]; then
  # shellcheck disable=SC2034,SC2154  # indices are names
  INIT_OF[nas]=1
  [[ -e /run/netns/nas ]] || ip netns attach nas 1
fi

radio_tool() {
  "$HOST$LAB_BUILD/tests/lab/lab-radio" "$@"
}

# make_radio NAME: makes a network namespace with a radio in it, of which the machine's udev hears nothing.
make_radio() {
  radio_tool make "$1"
  ip netns add "$1"
  iw phy "$1" set netns name "$1"
  ip netns exec "$1" iw phy "$1" interface add wlan0 type managed
  ip -n "$1" link set lo up
  # shellcheck disable=SC2034  # what other words use
  RADIO_OF[$1]=$1
}

# pull_adapter, plug_adapter: the machine's adapter goes and comes, as udev has it from the kernel.
pull_adapter() {
  say "the adapter: pulled"
  radio_tool pull "$(basename "$(readlink -f /sys/class/net/wlan0/phy80211)")"
}

plug_adapter() {
  say "the adapter: plugged in"
  radio_tool plug adapter "$ADAPTER_ADDRESS"
}

# reboots: the machine starts again, and the script goes on with its function for the next boot.
reboots() {
  say 'the machine: starts again'
  journalctl --boot --output short-monotonic >"$LOGS/journal.${PART#boot_}"
  touch /run/lab/reboot
  rm /var/lib/lab/started
  systemctl reboot --no-block
}

# has_started: the machine has started all that it starts.
has_started() {
  systemctl is-system-running --wait >/dev/null ||
    fail "the machine has not started well: $(systemctl --failed --no-legend; systemctl list-jobs)"
}

# unit_is UNIT STATE: true if systemd has it in that state.
unit_is() {
  [[ $(systemctl is-active "$1") == "$2" ]]
}

expect_unit() {  # UNIT STATE
  unit_is "$@" || fail "$1 should be $2: $(systemctl status --no-pager "$1")"
}

# takes_archive NAME: the machine's apt installs from the packages of that archive from now on.
takes_archive() {
  rm -rf /var/lib/lab/archive
  cp -r "$HOST$LAB_ARCHIVE/$1" /var/lib/lab/archive
  apt update
}

apt() {
  say_words 'apt-get' "$@"
  DEBIAN_FRONTEND=noninteractive DEBCONF_NOWARNINGS=yes apt-get --quiet=2 --option Dpkg::Use-Pty=0 \
    --option Dpkg::Progress-Fancy=0 "$@" 2>&1 | sed '/^(Reading database/d' | show
}

# tell_time WHAT: that is there now.
tell_time() {
  say "$1 after $(uptime_seconds) s"
}

# What the boot took, and what of that is ours.
show_boot_times() {
  {
    systemd-analyze time
    systemd-analyze blame | grep mero
  } | show
}

# expect_quiet_journal: in this boot nobody has told a warning or worse that is not among known_warnings; the kernel's are
# not looked at.
expect_quiet_journal() {
  local told
  told=$(journalctl --boot --priority warning --output short --no-hostname --quiet)
  # shellcheck disable=SC2154  # the script's
  told=$(grep -vE "^.{15} kernel: ${known_warnings:+|$known_warnings}" <<<"$told" || (($? == 1)))
  expect_same 'the warnings in the journal' '' "$told"
}
