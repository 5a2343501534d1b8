#!/bin/sh
# iwd, with its own DHCP client and server: iwd(8), iwd.config(5), iwd.network(5), iwd.ap(5).
# Title: iwd
# Bus
# Join: iwd
# Access point: iwd
set -eu

configure() {
	mkdir -p /etc/iwd /var/lib/iwd/ap
	printf '[General]\nEnableNetworkConfiguration=true\n' >/etc/iwd/main.conf
}

# Of a network with WEP it keeps no file.
know() {
	case $PROTECTION in
	open) echo >"/var/lib/iwd/$NAME.open" ;;
	wpa | wpa2 | mixed) printf '[Security]\nPassphrase=%s\n' "$PASSPHRASE" >"/var/lib/iwd/$NAME.psk" ;;
	peap | ttls)
		method=PEAP
		[ "$PROTECTION" = peap ] || method=TTLS
		cat >"/var/lib/iwd/$NAME.8021x" <<-END
			[Security]
			EAP-Method=$method
			EAP-Identity=$USER_NAME
			EAP-$method-Phase2-Method=MSCHAPV2
			EAP-$method-Phase2-Identity=$USER_NAME
			EAP-$method-Phase2-Password=$PASSPHRASE
		END
		;;
	esac
}

until_true() {
	until "$@"; do sleep 0.05; done
}

# It makes an interface of its own, whose name it chooses.
device() {
	for device in /sys/class/net/wl*; do echo "${device##*/}"; done
}

device_is_there() {
	iwctl device list | grep -q "$(device)"
}

scan_is_over() {
	! iwctl station "$(device)" show | grep -q 'Scanning *yes'
}

network_is_listed() {
	iwctl station "$(device)" get-networks | grep -q "$NAME"
}

case $1 in
knows)
	configure
	know
	;;
joins)
	[ "$PROTECTION" = wep ] || exec /usr/libexec/iwd
	/usr/libexec/iwd &
	until_true device_is_there
	until_true network_is_listed
	iwctl --passphrase "$PASSPHRASE" station "$(device)" connect "$NAME"
	wait
	;;
offers)
	configure
	{
		printf '[General]\nChannel=%s\n[IPv4]\nAddress=10.1.14.1\n' "$CHANNEL"
		[ "$PROTECTION" = open ] || printf '[Security]\nPassphrase=%s\n' "$PASSPHRASE"
	} >"/var/lib/iwd/ap/$NAME.ap"
	;;
serves)
	/usr/libexec/iwd &
	until_true device_is_there
	iwctl device "$(device)" set-property Mode ap
	iwctl ap "$(device)" start-profile "$NAME"
	wait
	;;
scans)
	iwctl station "$(device)" scan
	until_true scan_is_over
	iwctl station "$(device)" get-networks
	;;
esac
