# The other use of a wireless interface: a station of somebody else's access point.
# shellcheck shell=sh

supplicant_run=/var/run/wpa_supplicant.pid

# end_client INTERFACE: ends the supplicant and the DHCP client, and removes the addresses.
end_client() {
	plan_end_of_client "$1"
	run_plan
}

plan_end_of_client() { # INTERFACE
	end_daemon wpa_supplicant "$supplicant_run"
	end_lease "$1"
	plan_no_addresses "$1"
}

# An interface for client use is in the state of a freshly plugged one: without addresses, down, and of the type
# "managed". Nothing is done for an adapter that was pulled.

take_down() { # INTERFACE
	is_there "$1" || return 0
	attempt "cannot take $1 down" ip link set dev "$1" down
}

make_client() { # INTERFACE
	is_there "$1" || return 0
	attempt "cannot make $1 a client's" iw dev "$1" set type managed
}
