#!/bin/sh
# ConnMan, with a supplicant and its own DHCP client and server: connman(8), connman-service.config(5), connman.conf(5).
# Title: ConnMan
# Bus
# Join: connman wpasupplicant
# Access point: connman wpasupplicant
# Channel: 1
set -eu

case $1 in
knows)
	mkdir -p /var/lib/connman
	printf '[WiFi]\nEnable=true\n' >/var/lib/connman/settings
	printf '[service_home]\nType=wifi\nName=%s\nPassphrase=%s\n' "$NAME" "$PASSPHRASE" >/var/lib/connman/home.config
	;;
offers)
	mkdir -p /var/lib/connman /etc/connman
	printf '[General]\nPersistentTetheringMode=true\n' >/etc/connman/main.conf
	printf '[WiFi]\nEnable=true\nTethering=true\nTethering.Identifier=%s\nTethering.Passphrase=%s\n' "$NAME" \
		"$PASSPHRASE" >/var/lib/connman/settings
	;;
joins | serves)
	wpa_supplicant -u -s -O "DIR=/run/wpa_supplicant GROUP=netdev" &
	exec connmand -n
	;;
scans)
	connmanctl scan wifi
	connmanctl services
	;;
esac
