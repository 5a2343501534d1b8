# The DHCP servers, one for each bridge; each also answers names.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

# serve_addresses BRIDGE: ends the server, and starts it anew if its .info file enables it.
serve_addresses() {
	end_dnsmasq "$1"
	know_server "$1"
	[ "$serves" = yes ] && is_there "$1" || return 0
	start_dnsmasq "$1" "$dhcp_files-$1-$1.conf" "$leases"
}

known_server='' # the bridge whose server these are about: whether it $serves, and the file of its $leases

know_server() { # BRIDGE
	[ "$known_server" != "$1" ] || return 0
	ask check "$dhcp_files-$1-$1.info" enable yes -- file "$dhcp_files-$1-$1.conf" dhcp-leasefile || :
	into serves leases
	known_server=$1
}

serve_guest_addresses() {
	[ -n "$guests" ] || return 0
	note "$dnsmasq_run-$guest_bridge.conf" "interface=$guest_bridge
dhcp-range=$guest_range
dhcp-option=option:router,$guest_address
dhcp-option=option:dns-server,$guest_address
dhcp-authoritative"
	end_dnsmasq "$guest_bridge"
	start_dnsmasq "$guest_bridge" "$dnsmasq_run-$guest_bridge.conf" ''
}

# If another program of the machine has the port for names, the server gives out addresses only.
start_dnsmasq() { # BRIDGE CONFIGURATION LEASES, which may be empty
	said=$(run_dnsmasq "$@" 2>&1) && return
	case $said in
	*'failed to create listening socket for port 53'* | *'failed to create listening socket for '*'ddress already in use'*)
		warn "no names are answered on $1: $said"
		attempt "cannot serve addresses on $1" run_dnsmasq "$@" --port=0
		;;
	*) fail "cannot serve addresses on $1: $said" ;;
	esac
}

# --no-ping: a ping to see whether an address is free would keep every client waiting for 3 s.
run_dnsmasq() { # BRIDGE CONFIGURATION LEASES [OPTION...]
	bridge=$1 file=$2 leases=$3
	shift 3
	[ -n "$leases" ] || set -- "$@" "--dhcp-leasefile=$dnsmasq_run-$bridge.leases"
	dnsmasq --conf-file="$file" --pid-file="$dnsmasq_run-$bridge.pid" --bind-interfaces --except-interface=lo \
		--no-ping "$@" && chown -h 0:0 "$dnsmasq_run-$bridge.pid"
}

end_dnsmasq() { # BRIDGE
	end_daemon dnsmasq "$dnsmasq_run-$1.pid"
}
