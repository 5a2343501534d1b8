# The DHCP servers, one for each bridge; each also answers names.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

# serve_addresses BRIDGE: ends the server, and starts it anew if its .info file enables it.
serve_addresses() {
	end_dnsmasq "$1"
	is_enabled "$dhcp_files-$1-$1.info" || return 0
	is_there "$1" || return 0
	start_dnsmasq "$1" "$dhcp_files-$1-$1.conf"
}

serve_guest_addresses() {
	[ -n "$guests" ] || return 0
	put "$state/dnsmasq-$guest_bridge.conf" <<-END
		interface=$guest_bridge
		dhcp-range=$guest_range
		dhcp-option=option:router,$guest_address
		dhcp-option=option:dns-server,$guest_address
		dhcp-authoritative
	END
	end_dnsmasq "$guest_bridge"
	start_dnsmasq "$guest_bridge" "$state/dnsmasq-$guest_bridge.conf"
}

# If another program of the machine has the port for names, the server gives out addresses only.
start_dnsmasq() { # BRIDGE CONFIGURATION
	said=$(run_dnsmasq "$1" "$2" 2>&1) && return
	case $said in
	*'failed to create listening socket for port 53'* | *'failed to create listening socket for '*'ddress already in use'*)
		warn "no names are answered on $1: $said"
		attempt "cannot serve addresses on $1" run_dnsmasq "$1" "$2" --port=0
		;;
	*) fail "cannot serve addresses on $1: $said" ;;
	esac
}

# --no-ping: a ping to see whether an address is free would keep every client waiting for 3 s.
run_dnsmasq() { # BRIDGE CONFIGURATION [OPTION...]
	bridge=$1 file=$2
	shift 2
	ask file "$file" dhcp-leasefile || set -- "$@" "--dhcp-leasefile=$state/dnsmasq-$bridge.leases"
	dnsmasq --conf-file="$file" --pid-file="$(dnsmasq_pid "$bridge")" --bind-interfaces --except-interface=lo \
		--no-ping "$@" && chown -h 0:0 "$(dnsmasq_pid "$bridge")"
}

end_dnsmasq() { # BRIDGE
	end_daemon dnsmasq "$(dnsmasq_pid "$1")"
}

dnsmasq_pid() { # BRIDGE
	printf '%s/dnsmasq-%s.pid' "$state" "$1"
}
