# The other use of a wireless interface: a station of somebody else's access point.
# shellcheck shell=sh

# end_client INTERFACE: ends what joins networks and leases addresses there.
end_client() {
	end_daemon wpa_supplicant /var/run/wpa_supplicant.pid
	end_lease "$1"
	remove_addresses "$1"
}

# An interface that is a client's is as it is when it has just been plugged in: without addresses, down, and of the
# kind "managed". One that was pulled is nobody's.

take_down() { # INTERFACE
	is_there "$1" || return 0
	attempt "cannot take $1 down" ip link set dev "$1" down
}

make_client() { # INTERFACE
	is_there "$1" || return 0
	attempt "cannot make $1 a client's" iw dev "$1" set type managed
}
