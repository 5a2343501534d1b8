#!/bin/sh
# The daemons themselves: a supplicant, whose own tool starts busybox's DHCP client once it has joined; hostapd and a
# DHCP server.
# Title: bare daemons
# Client: wpa_supplicant
# Join: wpasupplicant busybox iproute2
# Access point: hostapd dnsmasq-base iproute2
set -eu

# The lines of a network's block that its protection asks for.
protection() {
	case $PROTECTION in
	open) echo 'key_mgmt=NONE' ;;
	wep) printf 'key_mgmt=NONE\nwep_key0="%s"\n' "$PASSPHRASE" ;;
	wpa | wpa2 | mixed) printf 'psk="%s"\n' "$PASSPHRASE" ;;
	peap | ttls)
		printf 'key_mgmt=WPA-EAP\nidentity="%s"\npassword="%s"\n' "$USER_NAME" "$PASSPHRASE"
		case $PROTECTION in
		peap) printf 'eap=PEAP\nphase2="auth=MSCHAPV2"\n' ;;
		ttls) printf 'eap=TTLS\nphase2="autheap=MSCHAPV2"\n' ;;
		esac
		;;
	esac
}

case $1 in
knows)
	cat >/etc/wpa_supplicant.conf <<-END
		ctrl_interface=/run/wpa_supplicant
		network={
		ssid="$NAME"
		$(protection)
		}
	END
	# shellcheck disable=SC2016  # for the scripts
	printf '#!/bin/sh\n%s\n' '[ "$2" != CONNECTED ] || exec busybox udhcpc -b -i "$1" -s /etc/leased' >/etc/joined
	cat >/etc/leased <<-'END'
		#!/bin/sh
		[ "$1" = bound ] || [ "$1" = renew ] || exit 0
		ip address replace "$ip/$mask" broadcast + dev "$interface"
		ip route replace default via "$router" dev "$interface"
		echo "nameserver $dns" >/etc/resolv.conf
	END
	chmod 755 /etc/joined /etc/leased
	;;
joins)
	wpa_supplicant -B -D nl80211 -i wlan0 -c /etc/wpa_supplicant.conf
	exec wpa_cli -i wlan0 -a /etc/joined
	;;
offers)
	case $BAND in 5) hw_mode=a ;; *) hw_mode=g ;; esac
	cat >/etc/hostapd.conf <<-END
		interface=wlan0
		driver=nl80211
		hw_mode=$hw_mode
		channel=$CHANNEL
		ieee80211n=1
		wmm_enabled=1
		ssid=$NAME
		wpa=2
		wpa_key_mgmt=WPA-PSK
		rsn_pairwise=CCMP
		wpa_passphrase=$PASSPHRASE
	END
	;;
serves)
	hostapd -B /etc/hostapd.conf
	ip address add 10.1.14.1/24 dev wlan0
	# Before it offers an address it would ask whether somebody has it, which takes 3 s.
	exec dnsmasq --keep-in-foreground --conf-file=/dev/null --interface=wlan0 --bind-interfaces --no-ping \
		--dhcp-authoritative --dhcp-range=10.1.14.2,10.1.14.254
	;;
scans) iw dev wlan0 scan ;;
esac
