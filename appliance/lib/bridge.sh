# Bridges, as their network-script files describe them.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

script_value() { # KEY INTERFACE
	value_of "$1" "$scripts/ifcfg-$2"
}

is_bridge() { # NAME
	ask bridge "$1" nat
}

is_nat() { # BRIDGE
	says_yes bridge "$1" nat
}

comes_up_at_boot() { # BRIDGE
	says_yes bridge "$1" at-boot
}

is_there() { # INTERFACE
	[ -e "/sys/class/net/$1" ]
}

# make_bridge BRIDGE: the bridge with its first member, which is wired, and its address. A wireless member comes in when
# its access point starts.
make_bridge() {
	ask bridge "$1" hardware-address member static address mask || fail "$scripts/ifcfg-$1 describes no bridge"
	{
		IFS= read -r hardware
		IFS= read -r primary
		IFS= read -r static
		IFS= read -r address
		IFS= read -r mask
	} <<-END
		$answer
	END
	create_bridge "$1" "$hardware"
	if [ -n "$primary" ] && ! is_wireless "$primary"; then join_bridge "$primary" "$1"; fi
	if [ "$static" = yes ]; then set_address "$1" "$address/$mask"; else lease_address "$1"; fi
}

create_bridge() { # BRIDGE HARDWARE-ADDRESS, which may be empty
	is_there "$1" || attempt "make the bridge $1" ip link add name "$1" type bridge
	[ -z "$2" ] || attempt "give $1 the address $2" ip link set dev "$1" address "$2"
	attempt "bring $1 up" ip link set dev "$1" up
}

is_wireless() { # INTERFACE
	[ -e "/sys/class/net/$1/phy80211" ] || [ -e "/sys/class/net/$1/wireless" ]
}

# A member has no addresses of its own: the bridge has them.
join_bridge() { # INTERFACE BRIDGE
	expect_interface "$1"
	end_lease "$1"
	attempt "bring $1 into $2" ip link set dev "$1" master "$2"
	attempt "remove the addresses of $1" ip -4 address flush dev "$1"
	attempt "bring $1 up" ip link set dev "$1" up
}

# set_address INTERFACE ADDRESS/MASK: the only one. What has it already keeps the routes that go with it.
set_address() {
	end_lease "$1"
	attempt "give $1 the address $2" ip address replace "$2" broadcast + dev "$1"
	[ "$(ip -4 -oneline address show dev "$1" | wc -l)" -gt 1 ] || return 0
	attempt "remove the addresses of $1" ip -4 address flush dev "$1"
	attempt "give $1 the address $2" ip address add "$2" broadcast + dev "$1"
}

# The client goes on in the background when no server has answered yet.
lease_address() { # INTERFACE
	[ -z "$(daemon_of busybox "$(lease_pid "$1")")" ] || return 0
	attempt "lease an address for $1" busybox udhcpc -b -S -i "$1" -p "$(lease_pid "$1")" -t 2 -T 2 \
		-s /usr/mero/sbin/udhcpc.lease
}

# end_lease INTERFACE: ends the client, and gives back what one has leased, also one that ended by itself.
end_lease() {
	end_daemon busybox "$(lease_pid "$1")"
	[ ! -x /usr/mero/sbin/udhcpc.lease ] || /usr/mero/sbin/udhcpc.lease left "$1" ||
		warn "what $1 had leased is not all given back"
}

lease_pid() { # INTERFACE
	printf '/var/run/udhcpc-%s.pid' "$1"
}

# leave_bridge INTERFACE BRIDGE: takes the interface out. The bridge stays where it comes up at boot, for its other
# members.
leave_bridge() {
	if [ -e "/sys/class/net/$2/brif/$1" ]; then
		attempt "take $1 out of $2" ip link set dev "$1" nomaster
	fi
	if ! comes_up_at_boot "$2" || ! has_members "$2"; then remove_bridge "$2"; fi
}

has_members() { # BRIDGE
	[ -n "$(ls "/sys/class/net/$1/brif" 2>/dev/null)" ]
}

remove_bridge() { # BRIDGE
	end_lease "$1"
	[ -e "/sys/class/net/$1/bridge" ] || return 0
	attempt "remove the bridge $1" ip link delete dev "$1" type bridge
}
