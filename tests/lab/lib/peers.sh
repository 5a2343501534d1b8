# Peers: this project's programs and those of others, which join a network or are an access point on an appliance. Each is
# driven by its own script, lab/peers/NAME.sh.
# shellcheck shell=bash

readonly WATCH=/run/lab/products/usr/bin/peer-watch GROUPS_OF_ALL=/sys/fs/cgroup
readonly QUIET_FREQUENCY=5805

peer_file() {  # PEER
  printf '%s/peers/%s.sh' "$LAB" "$1"
}

# has PEER KEY: its file says so in a line.
has() {
  grep -q "^# $2\(:\|$\)" "$(peer_file "$1")"
}

channel_in() {  # BAND
  case $1 in 2.4) printf 6 ;; 5) printf 36 ;; esac
}

# peer APPLIANCE PEER KEY=VALUE... VERB [COMMAND...]: runs a peer's own script in an appliance, behind the command if there
# is one. The values are its environment.
peer() {
  local appliance=$1 name=$2 script
  local -a values=()
  script=$(<"$(peer_file "$2")")
  shift 2
  while [[ $1 == *=* ]]; do
    values+=("$1")
    shift
  done
  inside "$appliance" "${@:2}" env "${values[@]}" sh -c "$script" "$name" "$1" </dev/null
}

# fresh APPLIANCE: it has just been switched on for the first time, and its radio has heard nothing.
fresh() {
  loses_power "$1"
  rm -rf "/run/lab/$1.layers"
  restore_interface "/sys/class/ieee80211/${RADIO_OF[$1]}"
  has_power "$1"
  disown # its end is no news
  cp -a /dev/rfkill "/proc/${INIT_OF[$1]}/root/dev/"
  forget_networks "$1"
  inside "$1" mount -t cgroup2 cgroup2 "$GROUPS_OF_ALL"
}

# Some take the interface away, and make one of their own.
restore_interface() {  # RADIO
  local interface
  [[ ! -d $1/device/net ]] || for interface in "$1"/device/net/*; do iw dev "${interface##*/}" del; done
  iw phy "${1##*/}" interface add wlan0 type managed
}

# A scan can have the kernel forget what it heard before, and is over soon where nobody is.
forget_networks() {  # NAME
  ip -n "$1" link set wlan0 up
  ip netns exec "$1" iw dev wlan0 scan freq $QUIET_FREQUENCY flush >/dev/null
  [[ ! $(ip netns exec "$1" iw dev wlan0 scan dump) ]] || fail "the radio of $1 still knows of networks"
  ip -n "$1" link set wlan0 down
}

start_bus() {  # APPLIANCE
  grep -q '^messagebus:' "/proc/${INIT_OF[$1]}/root/etc/passwd" ||
    inside "$1" tee -a /etc/passwd >/dev/null <<<'messagebus:x:999:999::/:/bin/false'
  inside "$1" mkdir -p /run/dbus
  inside "$1" dbus-uuidgen --ensure=/etc/machine-id
  inside "$1" "${WATCH##*/lab/products}" start "$GROUPS_OF_ALL/bus" dbus-daemon --system --nofork --nopidfile \
    >/run/lab/bus.log 2>&1 &
  within 10 inside "$1" test -S /run/dbus/system_bus_socket || fail "no bus: $(</run/lab/bus.log)"
}

members() {  # GROUP
  cat "$GROUPS_OF_ALL/$1/cgroup.procs"
}

is_empty() {  # GROUP
  [[ ! $(members "$1") ]]
}

end_members() {  # GROUP
  # One that has ended meanwhile is no mistake.
  members "$1" | xargs -r kill 2>/dev/null || :
  within 5 is_empty "$1" || echo 1 >"$GROUPS_OF_ALL/$1/cgroup.kill"
  within 5 is_empty "$1" || fail "this does not end: $(members "$1" | xargs)"
}

# told FILE WHAT: the number behind that word; nothing if it was not told.
told() {
  awk -v what="$2" '$1 == what { print $2 }' "$1"
}

# watch FILE COMMAND...: a watcher, whose word goes to the file; its process is $WATCHER.
watch() {
  : >"$1"
  "${@:2}" >"$1" 2>&1 &
  # shellcheck disable=SC2034  # for who waits for it
  WATCHER=$!
  within 10 grep -q '^watching$' "$1" || fail "it cannot be watched: $(<"$1")"
}
