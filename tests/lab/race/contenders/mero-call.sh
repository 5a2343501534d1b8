#!/bin/sh
# This project's functions, called by a program of one call.
# Title: ours, by a call
# Join: libmerowireless-core1 merowireless-appliance
# Access point: libmerowireless-core1 merowireless-appliance
set -eu

case $1 in
knows) mero-call save essid="$NAME" bssid="$ADDRESS" auth=WPA2PSK encrypt=AES key="$PASSPHRASE" ip=DHCP ;;
joins) exec mero-call autoconnect ;;
leaves) mero-call disconnect ;;
offers)
	/usr/mero/hotplug/usb.wireless.function add
	case $BAND in 5) hw_mode=1 ;; *) hw_mode=4 ;; esac
	mero-call ap-save ssid="$NAME" encryption=2 wpa_passphrase="$PASSPHRASE" wpa=2 wpa_encrypt_type=2 \
		hw_mode=$hw_mode channel="$CHANNEL" ieee80211n_wireless_width=1
	;;
serves) exec mero-call ap-enable ;;
retires) mero-call ap-disable ;;
scans) mero-call scan renew ;;
esac
