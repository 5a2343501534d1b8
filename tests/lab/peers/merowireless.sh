#!/bin/sh
# This project's management program.
# Title: ours, by the program
# Join: libmerowireless-core1 merowireless-appliance merowireless
# Access point: libmerowireless-core1 merowireless-appliance merowireless
set -eu

encryption() {
	case $PROTECTION in peap | ttls) echo eap ;; *) echo "$PROTECTION" ;; esac
}

# set_ap OPTION...: the settings of the main network and those that are given.
set_ap() {
	[ "$(encryption)" != eap ] || set -- "$@" --auth-server-addr "$RADIUS"
	[ "$PROTECTION" = open ] || set -- "$@" --key-stdin
	printf '%s\n' "$PASSPHRASE" | merowireless ap set --ssid "$NAME" --encryption "$(encryption)" --band "$BAND" \
		--channel "$CHANNEL" ${WIDTH:+--ieee80211n-wireless-width "$WIDTH"} "$@"
}

set_with_guests() {
	set -- --guest-net-enable yes --guest-net-ssid "$GUESTS" --guest-net-encryption "$PROTECTION"
	if [ "$PROTECTION" != open ]; then
		printf '%s\n' "$PASSPHRASE" >/root/guests.key
		set -- "$@" --guest-net-key-file /root/guests.key
	fi
	set_ap "$@"
}

case $1 in
knows)
	# Without an address it is on the air.
	[ "$PROTECTION" = open ] || set -- "$@" --key-stdin
	[ -z "$ADDRESS" ] || set -- "$@" --bssid "$ADDRESS" --security "$PROTECTION"
	shift
	printf '%s\n' "$PASSPHRASE" | merowireless save "$NAME" "$@"
	;;
joins) exec merowireless autoconnect ;;
leaves) merowireless disconnect ;;
offers)
	/usr/mero/hotplug/usb.wireless.function add
	if [ -n "${GUESTS-}" ]; then set_with_guests; else set_ap; fi
	;;
serves) exec merowireless ap enable ;;
retires) merowireless ap disable ;;
scans) merowireless scan --renew ;;
esac
