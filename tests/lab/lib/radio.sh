# The radios of the machine. Each has a network namespace to itself, where its interface is wlan0.
# shellcheck shell=bash

declare -A RADIO_OF=()

# give_radio NAME: makes a network namespace of that name, with a radio in it.
give_radio() {
  local name=$1 radio=phy${#RADIO_OF[@]} interface
  [[ -d /sys/class/ieee80211/$radio/device/net ]] || fail "no radio is left for $name: the lab has $RADIOS"
  interface=$(ls "/sys/class/ieee80211/$radio/device/net")
  ip netns add "$name"
  iw phy "$radio" set netns name "$name"
  ip -n "$name" -batch - <<<"link set lo up
    link set $interface name wlan0"
  RADIO_OF[$name]=$radio
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
