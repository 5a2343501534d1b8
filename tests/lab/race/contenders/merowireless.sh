#!/bin/sh
# This project's management program.
# Title: ours, by the program
# Join: libmerowireless-core1 merowireless-appliance merowireless
# Access point: libmerowireless-core1 merowireless-appliance merowireless
set -eu

case $1 in
knows) printf '%s\n' "$PASSPHRASE" | merowireless save "$NAME" --bssid "$ADDRESS" --security wpa2 --key-stdin ;;
joins) exec merowireless autoconnect ;;
leaves) merowireless disconnect ;;
offers)
	/usr/mero/hotplug/usb.wireless.function add
	printf '%s\n' "$PASSPHRASE" | merowireless ap set --ssid "$NAME" --encryption wpa2 --key-stdin --band "$BAND" \
		--channel "$CHANNEL" --ieee80211n-wireless-width 20
	;;
serves) exec merowireless ap enable ;;
retires) merowireless ap disable ;;
scans) merowireless scan --renew ;;
esac
