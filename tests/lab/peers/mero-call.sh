#!/bin/sh
# This project's functions, called by a program of one call.
# Title: ours, by a call
# Join: libmerowireless-core1 merowireless-appliance
# Access point: libmerowireless-core1 merowireless-appliance
set -eu

# protection [PREFIX]: what a network's settings say of its protection, one a line.
protection() {
	prefix=${1-}
	wpa='' cipher='' encryption=2
	case $PROTECTION in
	open) encryption=0 ;;
	wep) encryption=1 ;;
	wpa) wpa=1 cipher=1 ;;
	wpa2) wpa=2 cipher=2 ;;
	mixed) wpa=3 cipher=3 ;;
	peap | ttls) encryption=3 wpa=2 cipher=2 ;;
	esac
	echo "${prefix}encryption=$encryption"
	case $encryption in
	1) echo "${prefix}wep_key0=$PASSPHRASE" ;;
	2) echo "${prefix}wpa_passphrase=$PASSPHRASE" ;;
	3) printf 'auth_server_addr=%s\nauth_server_shared_secret=%s\n' "$RADIUS" "$PASSPHRASE" ;;
	esac
	[ -z "$wpa" ] || printf '%s\n' "${prefix}wpa=$wpa" "${prefix}wpa_encrypt_type=$cipher"
}

settings() {
	case $BAND in 5) hw_mode=1 ;; *) hw_mode=4 ;; esac
	printf '%s\n' "ssid=$NAME" "hw_mode=$hw_mode" "channel=$CHANNEL"
	[ -z "${WIDTH-}" ] || echo ieee80211n_wireless_width=1
	protection
	[ -n "${GUESTS-}" ] || return 0
	printf '%s\n' guest_net_enable=1 "guest_net_ssid=$GUESTS"
	protection guest_net_
}

case $1 in
knows)
	if [ -n "$ADDRESS" ]; then
		mero-call save essid="$NAME" bssid="$ADDRESS" auth=WPA2PSK encrypt=AES key="$PASSPHRASE" ip=DHCP
	else
		mero-call scan renew >/dev/null
		record=$(mero-call get essid "$NAME" | sed 1d)
		eval "mero-call save $record opmode=MANAGED" 'key="$PASSPHRASE" ip=DHCP'
	fi
	;;
joins) exec mero-call autoconnect ;;
leaves) mero-call disconnect ;;
offers)
	/usr/mero/hotplug/usb.wireless.function add
	settings | xargs -d '\n' mero-call ap-save
	;;
serves) exec mero-call ap-enable ;;
retires) mero-call ap-disable ;;
scans) mero-call scan renew ;;
esac
