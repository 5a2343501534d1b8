# Losses of power: an appliance has its settings on a disk whose writes are recorded, and then that disk as losses of
# power would have left it. Everything happens within the appliance, by guest/power.
# shellcheck shell=bash

power() {  # NAME WORD...
  inside "$1" bash /run/power/power "${@:2}"
}

# settings_on NAME FILE-SYSTEM: the appliance's settings are on such a disk, and calls are recorded from now on.
settings_on() {
  say "$1: settings on $2"
  inside "$1" mkdir -p /run/power
  inside "$1" tee /run/power/power <"$LAB/guest/power" >/dev/null
  power "$1" begin "$2"
}

# recorded NAME COMMAND...: a command that changes settings succeeds; what is there then has to be there after each loss
# of power that follows.
recorded() {
  on "$@"
  power "$1" returned "${@:2}"
}

# records_settings NAME: everything that writes settings does so, but for what needs the air.
records_settings() {
  local home=(essid=home bssid=02:00:00:00:00:01 auth=WPA2PSK encrypt=AES ip=DHCP)
  recorded "$1" mero-call save "${home[@]}" key='deux croissants'
  recorded "$1" mero-call save essid=cafe bssid=02:00:00:00:00:02 auth=OPEN encrypt=NONE ip=DHCP
  recorded "$1" merowireless edit cafe --dns 192.0.2.1
  inside "$1" sh -c 'merowireless export --secrets /run/power/document 2>/dev/null'
  recorded "$1" merowireless import /run/power/document # which has nothing new
  recorded "$1" mero-call save "${home[@]}" key='trois croissants'
  recorded "$1" merowireless import /run/power/document
  recorded "$1" merowireless forget home
  recorded "$1" merowireless country DE
  recorded "$1" merowireless country none
  recorded "$1" mero-call ifconfig wlan0 ip=10.1.0.5 mask=255.255.255.0
  recorded "$1" /usr/mero/sbin/udhcpc.lease servers wlan0 '192.0.2.1 192.0.2.2'
  recorded "$1" mero-call ap-save ssid=home encryption=2 wpa_passphrase='deux croissants' wpa=2 wpa_encrypt_type=2 \
    channel=6
  recorded "$1" /usr/mero/sbin/udhcpc.lease left wlan0
}

# records_access_point NAME: the access point that is saved comes and goes, for good and until the mode is changed.
records_access_point() {
  recorded "$1" mero-call ap-enable
  recorded "$1" mero-call mode client
  recorded "$1" mero-call ap-disable
}

# loses_power_anywhere NAME STEP SEEDS MENDED: the recording ends, and one of STEP losses of power is tried: at each place
# with nothing of what followed on the disk, and with some of it, by as many seeds. Where a file that is written in
# place is damaged, the access point is enabled, MENDED times at most.
loses_power_anywhere() {
  local result
  power "$1" end
  result=$(power "$1" try "${@:2}") || fail "this is left by a loss of power:
$result"
  say "$result"
}
