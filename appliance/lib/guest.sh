# The guest network: a network of its own on the same radio, in a bridge of its own.
# shellcheck shell=sh
# shellcheck disable=SC2034,SC2154  # the other parts use them, or set them

guest_interface=gwlan
guest_bridge=gbr
guest_address=10.1.15.1
guest_subnet=10.1.15.0/24
guest_range=10.1.15.2,10.1.15.254,255.255.255.0,86400

# Whether a start includes the guest network: "yes" or empty. It is decided once for each start, since the scheduled
# hour may change between the setting of the guests' rules and the start of their network.
guests=''

decide_on_guests() { # INTERFACE
	guests=''
	if guest_is_on "$1"; then guests=yes; fi
}

# guest_is_on INTERFACE: whether there is a guest network, and it is on the air at this hour.
guest_is_on() {
	know_guests "$1"
	[ "$has_guests" = yes ] &&
		[ -f "$hostapd_files-$1-guest.conf" ] &&
		! is_off_now guest_net_sched_enable guest_net_sched
}

known_guests='' # the interface whose guests $has_guests is about

know_guests() { # INTERFACE
	[ "$known_guests" != "$1" ] || return 0
	ask check "$hostapd_files-$1-guest.info" enable yes || :
	into has_guests
	known_guests=$1
}

# set_guest_bridge: makes the bridge for a start with guests, and removes it for one without.
set_guest_bridge() {
	if [ -n "$guests" ]; then make_guest_bridge; else remove_guest_bridge; fi
}

make_guest_bridge() {
	plan_bridge "$guest_bridge" ''
	set_address "$guest_bridge" "$guest_address/24"
}

remove_guest_bridge() {
	end_dnsmasq "$guest_bridge"
	remove_bridge "$guest_bridge"
	remove_files "$dnsmasq_run-$guest_bridge.conf"
}
