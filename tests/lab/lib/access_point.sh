# Access points: each is a namespace with a radio and Debian's hostapd.
# shellcheck shell=bash

# access_point NAME SETTING...: puts an access point on the air. The settings are lines of hostapd.conf, as they are,
# but for two: ssid=NAME, of any bytes, and signal=DBM, how strongly the others hear it.
access_point() {
  local name=$1 setting
  shift
  say_words "access point $name:" "$@"
  give_radio "$name"
  hostapd_conf "$@" >"/run/lab/$name.conf"
  switch_on "$name"
  for setting; do
    [[ $setting != signal=* ]] || set_signal "$name" "${setting#*=}"
  done
}

# The configuration file for some settings; what they say goes before what is usual.
hostapd_conf() {  # SETTING...
  local setting
  printf '%s\n' interface=wlan0 driver=nl80211 hw_mode=g channel=1
  for setting; do
    case $setting in
      ssid=*) printf 'ssid2=%s\n' "$(printf %s "${setting#*=}" | hex)" ;;
      signal=*) ;;
      *) printf '%s\n' "$setting" ;;
    esac
  done
}

hex() {
  od -An -v -tx1 | tr -d ' \n'
}

# switch_on NAME: starts an access point that was switched off; returns once it is on the air.
switch_on() {
  local log=$LOGS/$1.hostapd
  : >"$log"
  ip netns exec "$1" hostapd -B -t -f "$log" -P "/run/lab/$1.pid" "/run/lab/$1.conf" ||
    fail "hostapd refuses to serve $1: $(cat "$log")"
  within 10 grep -q AP-ENABLED "$log" || fail "access point $1 is not on the air: $(cat "$log")"
}

# switch_off NAME: takes an access point off the air.
switch_off() {
  say "access point $1: off"
  kill "$(<"/run/lab/$1.pid")"
  within 10 gone "/run/lab/$1.pid" || fail "access point $1 does not stop"
}
