# Appliances: each is a stock Debian system in namespaces of its own, with a radio and what the project ships.
# shellcheck shell=bash

declare -A INIT_OF=()
OUTPUT=''

# appliance NAME: switches an appliance on; returns once it is up.
appliance() {
  say "appliance $1"
  give_radio "$1"
  start_appliance "$1"
}

start_appliance() {  # NAME
  local name=$1 note=/run/lab/$1.init
  ip netns exec "$name" unshare --mount --pid --uts --ipc --fork "$LAB/guest/appliance" "$name" "$note" &
  within 20 test -s "$note" || fail "appliance $name does not start"
  INIT_OF[$name]=$(<"$note")
  within 20 test -S "/proc/${INIT_OF[$name]}/root/dev/log" || fail "appliance $name does not come up"
}

# loses_power NAME: an appliance goes from one moment to the next. What it has on its disk stays, and nothing else: its
# processes, its files in memory, and all that its kernel knew of the network are gone.
loses_power() {
  local note=/run/lab/$1.init init parent
  say "appliance $1: no power"
  init=$(<"$note")
  read -r _ _ _ parent _ <"/proc/$init/stat"
  kill -KILL "$parent" "$init"
  within 10 gone "/proc/$init" || fail "appliance $1 does not go"
  rm "$note"
  ip netns delete "$1"
  within 10 test -e "/sys/class/ieee80211/${RADIO_OF[$1]}" || fail "the radio of $1 does not come back"
}

# has_power NAME: it is switched on again.
has_power() {
  say "appliance $1: power"
  put_radio "$1" "${RADIO_OF[$1]}"
  start_appliance "$1"
}

# inside NAME COMMAND...: runs a command in an appliance. It inherits nothing of this script but the standard
# descriptors, so that what a daemon holds is not the script's.
inside() {
  nsenter --target "${INIT_OF[$1]}" --mount --pid --uts --ipc --net "${@:2}" {STEPS}>&-
}

# on NAME COMMAND...: runs a command in an appliance and keeps what it prints in OUTPUT; it has to succeed.
on() {
  run_on "$@" || fail "on $1, this should succeed, and exits with status $?: ${*:2}"
}

# fails_on NAME COMMAND...: as `on`, for a command that has to fail.
fails_on() {
  ! run_on "$@" || fail "on $1, this should fail, and succeeds: ${*:2}"
}

run_on() {  # NAME COMMAND...
  local status=0
  say_words "$1\$" "${@:2}"
  OUTPUT=$(inside "$@") || status=$?
  [[ ! $OUTPUT ]] || show <<<"$OUTPUT"
  return $status
}
