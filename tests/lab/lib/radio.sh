# The radios of the machine. Each has a network namespace to itself, where its interface is wlan0.
# shellcheck shell=bash

declare -A RADIO_OF=()

# give_radio NAME: makes a network namespace of that name, with a radio in it.
give_radio() {
  local radio=phy${#RADIO_OF[@]}
  [[ ! $PART ]] || {
    make_radio "$1"
    return
  }
  [[ -d /sys/class/ieee80211/$radio/device/net ]] || fail "no radio is left for $1: the lab has $RADIOS"
  put_radio "$1" "$radio"
  RADIO_OF[$1]=$radio
}

put_radio() {  # NAME RADIO
  local name=$1 radio=$2 interface
  interface=$(ls "/sys/class/ieee80211/$radio/device/net")
  ip netns add "$name"
  iw phy "$radio" set netns name "$name"
  ip -n "$name" -batch - <<<"link set lo up
    link set $interface name wlan0"
}

# unplug NAME, plug NAME: an appliance's adapter is pulled, and plugged in again; nobody has told the appliance yet.
unplug() {
  say "the adapter of $1: pulled"
  ip netns exec "$1" iw phy "${RADIO_OF[$1]}" set netns 1
}

plug() {
  say "the adapter of $1: plugged in"
  iw phy "${RADIO_OF[$1]}" set netns name "$1"
}

# address_of NAME: the hardware address of an access point or an appliance.
address_of() {
  ip -n "$1" -brief link show wlan0 | awk '{ print $3 }'
}

# set_signal NAME DBM: how strongly a radio that is on the air is heard by every other.
set_signal() {
  local transmit_power
  transmit_power=$(ip netns exec "$1" iw dev wlan0 info | awk '$1 == "txpower" { print int($2) }')
  # The kernel takes a negative number only as the unsigned one of the same bits.
  printf '%u\n' $(($2 - transmit_power)) >"/sys/kernel/debug/ieee80211/${RADIO_OF[$1]}/hwsim/rx_rssi"
}
