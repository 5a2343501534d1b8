# The guest network: a network of its own on the same radio, in a bridge of its own.
# shellcheck shell=sh
# shellcheck disable=SC2034  # the other parts use them

guest_interface=gwlan
guest_bridge=gbr
guest_address=10.1.15.1
guest_subnet=10.1.15.0/24
guest_range=10.1.15.2,10.1.15.254,255.255.255.0,86400

# guest_is_on INTERFACE: whether there is a guest network, and it is on the air at this hour.
guest_is_on() {
	is_enabled "/etc/hostapd/hostapd-$1-guest.info" &&
		[ -f "/etc/hostapd/hostapd-$1-guest.conf" ] &&
		! is_off_now guest_net_sched_enable guest_net_sched
}

# Without an address of its own, the guest network gets the one behind the radio's.
guest_configuration() { # INTERFACE
	sed '/^bssid=$/d' "/etc/hostapd/hostapd-$1-guest.conf"
}

make_guest_bridge() {
	create_bridge "$guest_bridge" ''
	set_address "$guest_bridge" "$guest_address/24"
}

remove_guest_bridge() {
	end_dnsmasq "$guest_bridge"
	remove_bridge "$guest_bridge"
}
