# Bridges, as their network-script files describe them.
# shellcheck shell=sh
# shellcheck disable=SC2034,SC2154  # what the other parts use, and set

script_value() { # KEY INTERFACE
	value_of "$1" "$scripts/ifcfg-$2"
}

values_of_bridge='nat at-boot static address mask member hardware-address'
known_bridge='' # the bridge whose values are in the variables that know_bridge fills

# know_bridge BRIDGE: reads what its file says, unless that is known; $described is empty where it describes no bridge.
know_bridge() {
	[ "$known_bridge" != "$1" ] || return 0
	described=''
	# shellcheck disable=SC2086  # words
	if ask bridge "$1" $values_of_bridge; then described=yes; fi
	into nat at_boot static address mask primary hardware
	known_bridge=$1
}

is_bridge() { # NAME
	know_bridge "$1"
	[ -n "$described" ]
}

is_nat() { # BRIDGE
	is_bridge "$1" && is_yes "$nat" "bridge $1 nat"
}

comes_up_at_boot() { # BRIDGE
	is_bridge "$1" && is_yes "$at_boot" "bridge $1 at-boot"
}

is_there() { # INTERFACE
	[ -e "/sys/class/net/$1" ]
}

# make_bridge BRIDGE [undoable]: makes the bridge with its address and its first member, if that one is wired; a
# wireless member comes in when its access point starts. Without its first member the bridge is made all the same, and
# that is a failure. A new bridge that is undoable has noted what give_wire_back needs.
make_bridge() {
	is_bridge "$1" || fail "$scripts/ifcfg-$1 describes no bridge"
	undoable=${2-}
	if is_there "$1"; then undoable=''; fi
	plan_bridge "$1" "$hardware"
	missing='' routes=''
	if [ -n "$primary" ] && ! is_wireless "$primary"; then
		if is_there "$primary"; then
			[ -z "$undoable" ] || note_wire "$primary" "$1"
			[ "$static" != yes ] || recall_routes "$1" "$primary"
			plan_member "$primary" "$1"
		else
			missing=yes
		fi
	fi
	if [ "$static" = yes ]; then
		set_address "$1" "$address/$mask"
		move_routes "$1" "$routes"
		remove_files "$state/routes-$1"
	else
		lease_address "$1"
	fi
	[ -z "$missing" ] || fail "there is no interface '$primary' for the bridge $1"
}

# make_bridge_of_boot NAME DEADLINE: makes the bridge of that network-script file, if it is one that comes up at boot.
# A first member that is not there yet is waited for until the deadline, which is in seconds since the machine's start.
make_bridge_of_boot() {
	is_name "$1" || return 0
	read_bridge_of_boot "$1"
	if is_file_of_interface "$1" && is_bridge "$1" && comes_up_at_boot "$1" && ! waits_for_access_point "$1"; then
		[ -z "$primary" ] || await $(($2 - $(uptime_seconds))) is_there "$primary"
		make_bridge "$1"
	fi
}

read_bridge_of_boot() { # NAME
	# shellcheck disable=SC2086  # words
	ask file "$scripts/ifcfg-$1" DEVICE -- bridge "$1" $values_of_bridge || : # something is missing
	into device nat at_boot static address mask primary hardware
	described=$nat known_bridge=$1
}

# waits_for_access_point BRIDGE: whether the bridge exists for an access point alone, and that one is switched off.
waits_for_access_point() {
	know_bridge "$1"
	[ -n "$primary" ] && [ -e "$hostapd_files-$primary.info" ] && ! is_enabled "$hostapd_files-$primary.info"
}

# is_file_of_interface NAME: whether ifcfg-NAME is that interface's file, and not a backup copy of a file. The $device in
# the file decides. In a file without one, a name with a dot has to be a VLAN's, with a number behind the dot.
is_file_of_interface() {
	case $device,$1 in
	"$1,$1") return 0 ;;
	,*. | ,*.*[!0-9.]* | ?*,*) return 1 ;;
	esac
}

uptime_seconds() {
	read -r seconds _ </proc/uptime && printf '%s' "${seconds%.*}"
}

plan_bridge() { # BRIDGE HARDWARE-ADDRESS, which may be empty
	is_there "$1" || plan "cannot make the bridge $1" "link add name $1 type bridge"
	[ -z "$2" ] || plan "cannot give $1 the address $2" "link set dev $1 address $2"
	plan "cannot bring $1 up" "link set dev $1 up"
}

is_wireless() { # INTERFACE
	[ -e "/sys/class/net/$1/phy80211" ] || [ -e "/sys/class/net/$1/wireless" ]
}

# A member of a bridge has no addresses: the bridge has them.
plan_member() { # INTERFACE BRIDGE
	end_lease "$1"
	plan "cannot bring $1 into $2" "link set dev $1 master $2"
	plan_no_addresses "$1"
	plan "cannot bring $1 up" "link set dev $1 up"
}

# routes_of INTERFACE [default]: puts its routes into $routes, a line each, as ip takes them: it prints conditions of a route
# too.
routes_of() {
	said=$(ip -4 route show ${2:+"$2"} dev "$1") || fail "cannot tell the routes of $1"
	routes=''
	set -f
	while read -r line; do
		words=''
		for word in $line; do
			case $word in
			dead | linkdown | notify | offload | pervasive | rt_offload | rt_offload_failed | rt_trap | trap | unresolved) ;;
			*) words="$words$word " ;;
			esac
		done
		[ -z "$words" ] || routes=$routes$words$newline
	done <<-END
		$said
	END
	set +f
}

# recall_routes BRIDGE INTERFACE: puts the default routes that the interface has, or had in a run that has not come to its
# end, into $routes, and notes them: as a member the interface loses them.
recall_routes() {
	routes_of "$2" default
	[ ! -s "$state/routes-$1" ] || while read -r line; do
		case $newline$routes in *"$newline$line $newline"*) ;; *) routes="$routes$line $newline" ;; esac
	done <"$state/routes-$1"
	[ -z "$routes" ] || note "$state/routes-$1" "${routes%"$newline"}"
}

# move_routes BRIDGE TEXT: gives the bridge the default routes that its first member had, a line each. What the kernel
# refuses, such as a gateway in another subnet, cannot be had, and is reported. What could not be asked for is a failure,
# but none before the other routes have been moved.
move_routes() {
	unmoved=''
	[ -n "$2" ] || return 0
	routes_of "$1" default
	while read -r line; do
		[ -n "$line" ] || continue
		case $newline$routes in *"$newline$line $newline"*) continue ;; esac
		add_route "$1" "$line" && continue
		text="cannot route over $1 as before, '$line': $said"
		if is_refusal; then warn "$text"; else unmoved=${unmoved:-$text}; fi
	done <<-END
		$2
	END
	[ -z "$unmoved" ] || fail "$unmoved"
}

# add_route INTERFACE WORDS: adds a route; from another address than before where the interface has not that one.
# shellcheck disable=SC2086  # words
add_route() {
	said=$(ip -4 route add $2 dev "$1" 2>&1) && return
	case $2 in *' src '*) ;; *) return 1 ;; esac
	source=${2#* src } source=${source%% *}
	said=$(ip -4 route add ${2%% src *} ${2#* src "$source"} dev "$1" 2>&1)
}

# is_refusal: whether what ip has $said is the kernel's last word.
is_refusal() {
	case $said in
	*'annot allocate memory'* | *'o buffer space'*) return 1 ;;
	'RTNETLINK answers: '* | 'Error: '*) ;;
	*) return 1 ;;
	esac
}

# note_wire INTERFACE BRIDGE: notes the addresses, the routes and the lease of an interface before it becomes the first
# member of a new bridge. give_wire_back restores them if the start fails. The number tells the interface from another
# one that has its name later.
note_wire() {
	leased=no
	if daemon_of busybox "$lease_run-$1.pid"; then leased=yes; fi
	{ read -r number <"/sys/class/net/$1/ifindex"; } 2>/dev/null || fail "cannot tell the number of $1"
	ip -4 address save dev "$1" >"$state/wire-$2.addresses" || fail "cannot note the addresses of $1"
	routes_of "$1"
	note "$state/wire-$2.routes" "${routes%"$newline"}"
	note "$state/wire-$2" "$1 $number $leased"
}

forget_wire() { # BRIDGE [FILE...]
	bridge=$1
	shift
	remove_files "$state/wire-$bridge" "$state/wire-$bridge.addresses" "$state/wire-$bridge.routes" "$@"
}

# give_wire_back BRIDGE: removes the bridge, and gives its first member back what note_wire has noted, unless that one is
# gone, or somebody has given it something else since. That it is to be given back is noted first: a step may fail, and
# what was done before it is not somebody else's when all are taken again.
give_wire_back() {
	read -r wire number leased bare <"$state/wire-$1" || cannot_read "$state/wire-$1"
	end_dnsmasq "$1"
	if [ -z "$bare" ] && is_bare "$wire" "$1"; then
		bare=bare
		note "$state/wire-$1" "$wire $number $leased $bare"
	fi
	remove_bridge "$1"
	if has_number "$wire" "$number"; then
		[ -z "$bare" ] || restore_wire "$wire" "$1"
		[ "$leased" != yes ] || lease_address "$wire"
	fi
	forget_wire "$1" "$state/routes-$1"
}

# is_bare INTERFACE BRIDGE: whether it is what a start makes of it: in that bridge, or in none and without an address.
is_bare() {
	[ ! -e "/sys/class/net/$2/brif/$1" ] || return 0
	if [ -e "/sys/class/net/$1/master" ] || ! is_there "$1"; then return 1; fi
	said=$(ip -4 -oneline address show dev "$1" 2>&1) || fail "cannot tell the addresses of $1: $said"
	[ -z "$said" ]
}

has_number() { # INTERFACE NUMBER
	{ read -r index <"/sys/class/net/$1/ifindex"; } 2>/dev/null && [ "$index" = "$2" ]
}

restore_wire() { # INTERFACE BRIDGE
	attempt "cannot bring $1 up" ip link set dev "$1" up
	said=$(ip address restore <"$state/wire-$2.addresses" 2>&1) || fail "cannot give $1 its addresses back: $said"
	restore_routes "$1" "$state/wire-$2.routes" direct
	restore_routes "$1" "$state/wire-$2.routes" ''
}

# restore_routes INTERFACE FILE KIND: adds those that lead to neighbours, or those by way of one, which have to be neighbours
# by then. Some are there with the addresses already.
restore_routes() {
	while read -r line; do
		case " $line " in
		'  ') continue ;;
		*' via '*) kind='' ;;
		*) kind=direct ;;
		esac
		[ "$kind" = "$3" ] || continue
		# shellcheck disable=SC2086  # words
		said=$(ip -4 route add $line dev "$1" 2>&1) && continue
		case $said in *'File exists'*) continue ;; esac
		is_refusal || fail "cannot give $1 its routes back: $said"
		warn "cannot give $1 its route back, '$line': $said"
	done <"$2"
}

# set_address INTERFACE ADDRESS/MASK: sets the interface's only address. An interface that has it already keeps it, and
# so the routes that depend on it.
set_address() {
	case $2 in *[!0-9./]*) fail "cannot give $1 the address $2: it is none" ;; esac
	end_lease "$1"
	plan "cannot give $1 the address $2" "address replace $2 broadcast + dev $1"
	plan "cannot tell the addresses of $1" "address show dev $1"
	plan_networks
	run_plan
	take_networks
	case $said in *" inet "*" inet "*) ;; *) return 0 ;; esac
	networks=''
	plan_no_addresses "$1"
	plan "cannot give $1 the address $2" "address add $2 broadcast + dev $1"
	run_plan
}

plan_no_addresses() { # INTERFACE
	! is_there "$1" || plan "cannot remove the addresses of $1" "address flush dev $1"
}

lease_script=/usr/mero/sbin/udhcpc.lease

# The client goes on in the background when no server has answered yet. A client that a server keeps busy is ended.
lease_address() { # INTERFACE
	run_plan
	networks=''
	daemon_of busybox "$lease_run-$1.pid" ||
		attempt "cannot lease an address for $1" timeout -k 2 20 busybox udhcpc -b -S -i "$1" -p "$lease_run-$1.pid" \
			-t 2 -T 2 -s "$lease_script"
}

# end_lease INTERFACE: ends the DHCP client, and gives its lease back, also that of a client that had ended by itself.
end_lease() {
	end_daemon busybox "$lease_run-$1.pid"
	[ ! -x "$lease_script" ] || has_no_lease "$1" || "$lease_script" left "$1" ||
		warn "what $1 had leased is not all given back"
}

# Mostly there is none. The script finds that out without another program, and so without a process when it is read here.
has_no_lease() ( # INTERFACE
	set -- none "$1"
	# shellcheck source=/dev/null
	. "$lease_script"
)

# ---- The bridge of an access point --------------------------------------------------------------------------------

# A note says which bridge an access point was put into: when the access point ends, its interface's file may already
# name another bridge, or none. And whether its start has come to its end, since a start may be killed.
bridge_note=$state/bridge # with -INTERFACE behind it

note_bridge() { # INTERFACE BRIDGE [begun]
	note "$bridge_note-$1" "$2${3:+ $3}"
}

# is_finished INTERFACE: whether the start of its access point has come to its end.
is_finished() {
	noted='' condition=''
	[ -e "$bridge_note-$1" ] || return 0
	read -r noted condition <"$bridge_note-$1" && [ -z "$condition" ]
}

# is_begun BRIDGE: whether an access point's start in that bridge has not come to its end.
is_begun() {
	for file in "$bridge_note"-*; do
		noted='' condition=''
		[ ! -s "$file" ] || read -r noted condition <"$file"
		[ "$noted $condition" != "$1 begun" ] || return 0
	done
	return 1
}

# is_running INTERFACE: whether its access point is on the air, started to the end, and its rules stand. Its bridge is in
# $noted.
is_running() {
	daemon_of hostapd "$hostapd_run-$1.pid" && is_finished "$1" || return 1
	has_rules || {
		warn "somebody has removed the rules between networks: $1 is started anew"
		return 1
	}
}

# undo_killed_start BRIDGE: gives the wire back what it had before a start that was killed, since the next one would take
# what is left for what it was. Notes of a start that has come to its end are of nothing any more.
undo_killed_start() {
	if ! is_begun "$1"; then
		forget_wire "$1"
	elif [ -s "$state/wire-$1" ]; then
		give_wire_back "$1"
	fi
}

# was_started INTERFACE: whether an access point was started there, and not ended.
was_started() {
	[ -s "$bridge_note-$1" ]
}

forget_bridge() { # INTERFACE
	remove_files "$bridge_note-$1"
}

# bridge_of INTERFACE: puts the bridge that its access point was put into into $noted; nothing where there is none. Without
# a note, that is the bridge that the interface is a member of.
bridge_of() {
	noted=''
	if was_started "$1"; then
		read -r noted _ <"$bridge_note-$1" || cannot_read "$bridge_note-$1"
		return
	fi
	for master in /sys/class/net/*/brif/"$1"; do
		master=${master#/sys/class/net/} master=${master%%/*}
		if is_there "$master" && is_bridge "$master"; then noted=$master; fi
	done
}

leave_bridge() { # INTERFACE BRIDGE
	[ -e "/sys/class/net/$2/brif/$1" ] || return 0
	attempt "cannot take $1 out of $2" ip link set dev "$1" nomaster
}

# give_up_bridge BRIDGE: removes the bridge, unless it comes up at boot and has other members, whom it may serve. One that
# was made for a start that has not come to its end goes in any case.
give_up_bridge() {
	if [ -s "$state/wire-$1" ] && is_begun "$1"; then
		give_wire_back "$1"
		return
	fi
	if comes_up_at_boot "$1" && has_members "$1"; then
		serve_addresses "$1"
		forget_wire "$1"
	else
		end_dnsmasq "$1"
		remove_bridge "$1"
		forget_wire "$1" "$state/routes-$1"
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
