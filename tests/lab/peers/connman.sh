#!/bin/sh
# ConnMan, with a supplicant and its own DHCP client and server: connman(8), connman-service.config(5), connman.conf(5),
# connmanctl(1).
# Title: ConnMan
# Bus
# Join: connman wpasupplicant
# Access point: connman wpasupplicant
# Channel: 1
set -eu

protection() {
	case $PROTECTION in
	open) echo 'Security=none' ;;
	wep) printf 'Security=wep\nPassphrase=%s\n' "$PASSPHRASE" ;;
	wpa | wpa2 | mixed) printf 'Passphrase=%s\n' "$PASSPHRASE" ;;
	peap) printf 'EAP=peap\nPhase2=MSCHAPV2\nIdentity=%s\nPassphrase=%s\n' "$USER_NAME" "$PASSPHRASE" ;;
	ttls) printf 'EAP=ttls\nPhase2=EAP-MSCHAPV2\nIdentity=%s\nPassphrase=%s\n' "$USER_NAME" "$PASSPHRASE" ;;
	esac
}

technology_is_there() {
	connmanctl technologies | grep -q '^  Type = wifi'
}

case $1 in
knows)
	mkdir -p /var/lib/connman
	printf '[WiFi]\nEnable=true\n' >/var/lib/connman/settings
	printf '[service_home]\nType=wifi\nName=%s\n%s\n' "$NAME" "$(protection)" >/var/lib/connman/home.config
	;;
offers)
	mkdir -p /var/lib/connman /etc/connman
	printf '[General]\nPersistentTetheringMode=true\n' >/etc/connman/main.conf
	printf '[WiFi]\nEnable=true\n' >/var/lib/connman/settings
	# Without a passphrase it is asked for when it runs.
	[ "$PROTECTION" = open ] || printf 'Tethering=true\nTethering.Identifier=%s\nTethering.Passphrase=%s\n' "$NAME" \
		"$PASSPHRASE" >>/var/lib/connman/settings
	;;
joins | serves)
	wpa_supplicant -u -s -O "DIR=/run/wpa_supplicant GROUP=netdev" &
	if [ "$1,$PROTECTION" = serves,open ]; then
		connmand -n &
		until technology_is_there; do sleep 0.05; done
		connmanctl tether wifi on "$NAME"
		wait
	fi
	exec connmand -n
	;;
scans)
	connmanctl scan wifi
	connmanctl services
	;;
esac
