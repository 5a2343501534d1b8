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

# make_bridge BRIDGE [undoable]: makes the bridge with its address and its first member, if that one is wired; a
# wireless member comes in when its access point starts. Without its first member the bridge is made all the same, and
# that is a failure. A new bridge that is undoable has noted what give_wire_back needs.
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
	undoable=${2-}
	if is_there "$1"; then undoable=''; fi
	create_bridge "$1" "$hardware"
	missing='' routes=''
	if [ -n "$primary" ] && ! is_wireless "$primary"; then
		if is_there "$primary"; then
			routes=$(ip -4 route show default dev "$primary") || fail "cannot tell the routes of $primary"
			[ -z "$undoable" ] || note_wire "$primary" "$1"
			join_bridge "$primary" "$1"
		else
			missing=yes
		fi
	fi
	if [ "$static" = yes ]; then
		set_address "$1" "$address/$mask"
		move_routes "$1" "$routes"
	else
		lease_address "$1"
	fi
	[ -z "$missing" ] || fail "there is no interface '$primary' for the bridge $1"
}

# make_bridge_of_boot NAME DEADLINE: makes the bridge of that network-script file, if it is one that comes up at boot.
# A first member that is not there yet is waited for until the deadline, which is in seconds since the machine's start.
make_bridge_of_boot() {
	if is_file_of_interface "$1" && is_bridge "$1" && comes_up_at_boot "$1" && ! waits_for_access_point "$1"; then
		await_first_member "$1" "$2"
		make_bridge "$1"
	fi
}

# waits_for_access_point BRIDGE: whether the bridge exists for an access point alone, and that one is switched off.
waits_for_access_point() {
	member=$(script_value PRIMARY "$1") || exit 1
	[ -n "$member" ] && [ -e "$hostapd_files-$member.info" ] && ! is_enabled "$hostapd_files-$member.info"
}

# is_file_of_interface NAME: whether ifcfg-NAME is that interface's file, and not a backup copy of a file. The DEVICE in
# the file decides. In a file without DEVICE, a name with a dot has to be a VLAN's, with a number behind the dot.
is_file_of_interface() {
	is_name "$1" || return 1
	device=$(script_value DEVICE "$1") || exit 1
	case $device,$1 in
	"$1,$1") return 0 ;;
	,*. | ,*.*[!0-9.]* | ?*,*) return 1 ;;
	esac
}

await_first_member() { # BRIDGE DEADLINE
	primary=$(script_value PRIMARY "$1") || exit 1
	[ -n "$primary" ] || return 0
	while ! is_there "$primary" && [ "$(uptime_seconds)" -lt "$2" ]; do sleep 0.1; done
}

uptime_seconds() {
	read -r seconds _ </proc/uptime && printf '%s' "${seconds%.*}"
}

create_bridge() { # BRIDGE HARDWARE-ADDRESS, which may be empty
	is_there "$1" || attempt "cannot make the bridge $1" ip link add name "$1" type bridge
	[ -z "$2" ] || attempt "cannot give $1 the address $2" ip link set dev "$1" address "$2"
	attempt "cannot bring $1 up" ip link set dev "$1" up
}

is_wireless() { # INTERFACE
	[ -e "/sys/class/net/$1/phy80211" ] || [ -e "/sys/class/net/$1/wireless" ]
}

# A member of a bridge has no addresses: the bridge has them.
join_bridge() { # INTERFACE BRIDGE
	end_lease "$1"
	attempt "cannot bring $1 into $2" ip link set dev "$1" master "$2"
	remove_addresses "$1"
	attempt "cannot bring $1 up" ip link set dev "$1" up
}

# move_routes BRIDGE TEXT: gives the bridge the default routes that its first member had, a line each.
move_routes() {
	while read -r line; do
		[ -n "$line" ] || continue
		# shellcheck disable=SC2086  # words
		said=$(ip -4 route add $line dev "$1" 2>&1) || warn "cannot route over $1 as before, '$line': $said"
	done <<-END
		$2
	END
}

# note_wire INTERFACE BRIDGE: notes the addresses, the routes and the lease of an interface before it becomes the first
# member of a new bridge. give_wire_back restores them if the start fails.
note_wire() {
	leased=''
	[ -z "$(daemon_of busybox "$(lease_pid "$1")")" ] || leased=yes
	ip -4 address save dev "$1" >"$state/wire-$2.addresses" || fail "cannot note the addresses of $1"
	ip -4 route save dev "$1" >"$state/wire-$2.routes" || fail "cannot note the routes of $1"
	printf '%s %s\n' "$1" "$leased" | put "$state/wire-$2"
}

forget_wire() { # BRIDGE [FILE]
	remove_files "$state/wire-$1" "$state/wire-$1.addresses" "$state/wire-$1.routes" "${2-}"
}

# give_wire_back BRIDGE: removes the bridge, and gives its first member back what note_wire has noted.
give_wire_back() {
	read -r wire leased <"$state/wire-$1" || cannot_read "$state/wire-$1"
	end_dnsmasq "$1"
	remove_bridge "$1"
	said=$(ip address restore <"$state/wire-$1.addresses" 2>&1) || fail "cannot give $wire its addresses back: $said"
	said=$(ip route restore <"$state/wire-$1.routes" 2>&1) || fail "cannot give $wire its routes back: $said"
	[ -z "$leased" ] || lease_address "$wire"
	forget_wire "$1"
}

# set_address INTERFACE ADDRESS/MASK: sets the interface's only address. An interface that has it already keeps it, and
# so the routes that depend on it.
set_address() {
	end_lease "$1"
	attempt "cannot give $1 the address $2" ip address replace "$2" broadcast + dev "$1"
	addresses=$(ip -4 -oneline address show dev "$1") || fail "cannot tell the addresses of $1"
	case $addresses in *"$newline"*) ;; *) return 0 ;; esac
	remove_addresses "$1"
	attempt "cannot give $1 the address $2" ip address add "$2" broadcast + dev "$1"
}

remove_addresses() { # INTERFACE
	is_there "$1" || return 0
	attempt "cannot remove the addresses of $1" ip -4 address flush dev "$1"
}

lease_script=/usr/mero/sbin/udhcpc.lease

# The client goes on in the background when no server has answered yet. A client that a server keeps busy is ended.
lease_address() { # INTERFACE
	[ -z "$(daemon_of busybox "$(lease_pid "$1")")" ] || return 0
	attempt "cannot lease an address for $1" timeout -k 2 20 busybox udhcpc -b -S -i "$1" -p "$(lease_pid "$1")" -t 2 \
		-T 2 -s "$lease_script"
}

# end_lease INTERFACE: ends the DHCP client, and gives its lease back, also that of a client that had ended by itself.
end_lease() {
	end_daemon busybox "$(lease_pid "$1")"
	[ ! -x "$lease_script" ] || "$lease_script" left "$1" ||
		warn "what $1 had leased is not all given back"
}

lease_pid() { # INTERFACE
	printf '/var/run/udhcpc-%s.pid' "$1"
}

# ---- The bridge of an access point --------------------------------------------------------------------------------

# A note says which bridge an access point was put into: when the access point ends, its interface's file may already
# name another bridge, or none.
bridge_note() { # INTERFACE
	printf '%s/bridge-%s' "$state" "$1"
}

note_bridge() { # INTERFACE BRIDGE
	put "$(bridge_note "$1")" <<-END
		$2
	END
}

# was_started INTERFACE: whether an access point was started there, and not ended.
was_started() {
	[ -s "$(bridge_note "$1")" ]
}

forget_bridge() { # INTERFACE
	remove_files "$(bridge_note "$1")"
}

# bridge_of INTERFACE: prints the bridge that its access point was put into. Without a note, that is the bridge that the
# interface is a member of.
bridge_of() {
	note=$(bridge_note "$1")
	if [ -s "$note" ]; then
		read -r noted <"$note" && printf '%s' "$noted"
	elif [ -e "/sys/class/net/$1/master" ]; then
		master=$(readlink "/sys/class/net/$1/master") || fail "cannot tell the bridge of $1"
		if is_bridge "${master##*/}"; then printf '%s' "${master##*/}"; fi
	fi
}

leave_bridge() { # INTERFACE BRIDGE
	[ -e "/sys/class/net/$2/brif/$1" ] || return 0
	attempt "cannot take $1 out of $2" ip link set dev "$1" nomaster
}

# give_up_bridge BRIDGE [undo]: removes the bridge, unless it comes up at boot and has other members, whom it may serve.
# With "undo", a bridge that was made for the start that failed goes in any case.
give_up_bridge() {
	if [ -n "${2-}" ] && [ -e "$state/wire-$1" ]; then
		give_wire_back "$1"
	elif comes_up_at_boot "$1" && has_members "$1"; then
		serve_addresses "$1"
	else
		end_dnsmasq "$1"
		remove_bridge "$1"
	fi
}

has_members() { # BRIDGE
	for member in "/sys/class/net/$1/brif"/*; do
		[ ! -e "$member" ] || return 0
	done
	return 1
}

remove_bridge() { # BRIDGE
	end_lease "$1"
	[ -e "/sys/class/net/$1/bridge" ] || return 0
	attempt "cannot remove the bridge $1" ip link delete dev "$1" type bridge
}
