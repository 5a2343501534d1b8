#!/bin/sh
# NetworkManager, with a supplicant, its own DHCP client, and dnsmasq as a server: NetworkManager.conf(5),
# nm-settings-keyfile(5).
# Title: NetworkManager
# Bus
# Join: network-manager wpasupplicant
# Access point: network-manager wpasupplicant dnsmasq-base nftables
set -eu

connection() { # MODE ADDRESSING, and more settings of the radio on standard input
	profile=/etc/NetworkManager/system-connections/$NAME.nmconnection
	mkdir -p "${profile%/*}"
	{
		printf '[connection]\nid=%s\nuuid=%s\ntype=wifi\n' "$NAME" 6f1d0c35-3c07-4a3e-8f52-6ad1c5a0e7b1
		printf '[wifi]\nmode=%s\nssid=%s\n' "$1" "$NAME"
		cat
		printf '[wifi-security]\nkey-mgmt=wpa-psk\npsk=%s\n' "$PASSPHRASE"
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
