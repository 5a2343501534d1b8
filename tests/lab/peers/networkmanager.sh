#!/bin/sh
# NetworkManager, with a supplicant, its own DHCP client, and dnsmasq as a server: NetworkManager.conf(5),
# nm-settings-keyfile(5).
# Title: NetworkManager
# Bus
# Join: network-manager wpasupplicant
# Access point: network-manager wpasupplicant dnsmasq-base nftables
set -eu

protection() {
	case $PROTECTION in
	open) ;;
	wep) printf '[wifi-security]\nkey-mgmt=none\nwep-key0=%s\nwep-key-type=1\n' "$PASSPHRASE" ;;
	wpa | wpa2 | mixed) printf '[wifi-security]\nkey-mgmt=wpa-psk\npsk=%s\n' "$PASSPHRASE" ;;
	peap | ttls)
		printf '[wifi-security]\nkey-mgmt=wpa-eap\n[802-1x]\neap=%s;\nidentity=%s\npassword=%s\n' "$PROTECTION" \
			"$USER_NAME" "$PASSPHRASE"
		case $PROTECTION in peap) echo 'phase2-auth=mschapv2' ;; *) echo 'phase2-autheap=mschapv2' ;; esac
		;;
	esac
}

# What an access point of its own is told of WPA, since it would offer all that it can.
versions() {
	case $PROTECTION in
	wpa) printf 'proto=wpa;\npairwise=tkip;\ngroup=tkip;\n' ;;
	wpa2) printf 'proto=rsn;\npairwise=ccmp;\ngroup=ccmp;\n' ;;
	mixed) printf 'proto=wpa;rsn;\npairwise=tkip;ccmp;\ngroup=tkip;\n' ;;
	esac
}

connection() { # MODE ADDRESSING, and more settings of the radio on standard input
	profile=/etc/NetworkManager/system-connections/$NAME.nmconnection
	mkdir -p "${profile%/*}"
	{
		printf '[connection]\nid=%s\nuuid=%s\ntype=wifi\n' "$NAME" 6f1d0c35-3c07-4a3e-8f52-6ad1c5a0e7b1
		printf '[wifi]\nmode=%s\nssid=%s\n' "$1" "$NAME"
		cat
		protection
		[ "$1" != ap ] || versions
		printf '[ipv4]\nmethod=%s\n[ipv6]\nmethod=auto\n' "$2"
	} >"$profile"
	chmod 600 "$profile"
	# As long as it may write there, it waits for udev to tell of the interface.
	mount -o remount,bind,ro /sys
}

case $1 in
knows) connection infrastructure auto </dev/null ;;
offers)
	case $BAND in 5) letters='a' ;; *) letters='bg' ;; esac
	printf 'band=%s\nchannel=%s\n' "$letters" "$CHANNEL" | connection ap shared
	;;
joins | serves)
	wpa_supplicant -u -s -O "DIR=/run/wpa_supplicant GROUP=netdev" &
	exec NetworkManager --no-daemon
	;;
scans) nmcli device wifi list --rescan yes ;;
esac
