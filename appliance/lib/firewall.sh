# What passes between the networks: address translation for bridges that have it, and what guests may reach.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

forwarding=/proc/sys/net/ipv4/ip_forward
forwarding_before=$state/ip_forward

set_firewall() { # INTERFACE BRIDGE
	if ! is_nat "$2" && ! guest_is_on "$1"; then
		clear_firewall
		return
	fi
	text=$(rules "$1" "$2") || exit 1
	said=$(printf '%s\n' "$text" | nft -f - 2>&1) || fail "cannot set the rules between networks: $said"
	forward
}

clear_firewall() {
	# Added first, since what is missing cannot be deleted.
	said=$(printf 'add table inet mero_ap\ndelete table inet mero_ap\n' | nft -f - 2>&1) ||
		fail "cannot remove the rules between networks: $said"
	stop_forwarding
}

forward() {
	[ -e "$forwarding_before" ] || put "$forwarding_before" <"$forwarding"
	echo 1 >"$forwarding" || fail 'cannot pass traffic on between networks'
}

# Somebody else may have traffic passed on as well.
stop_forwarding() {
	[ -e "$forwarding_before" ] || return 0
	cat "$forwarding_before" >"$forwarding" || fail 'cannot stop passing traffic on between networks'
	rm -f "$forwarding_before"
}

# All of it takes the place of what was there in one step.
rules() { # INTERFACE BRIDGE
	echo 'add table inet mero_ap'
	echo 'delete table inet mero_ap'
	echo 'table inet mero_ap {'
	if is_nat "$2"; then translation "$2" "$(subnet_of "$2")"; fi
	if guest_is_on "$1"; then
		translation "$guest_bridge" "$guest_subnet"
		guest_rules
	fi
	echo '}'
}

translation() { # BRIDGE SUBNET
	cat <<-END
		chain translate-$1 {
			type nat hook postrouting priority srcnat; policy accept;
			ip saddr $2 oifname != "$1" masquerade
		}
	END
}

# subnet_of BRIDGE: its network as ADDRESS/BITS, which the kernel knows by now.
subnet_of() {
	ip -4 route show dev "$1" proto kernel scope link | awk '{ print $1; exit }'
}

# Guests get addresses and names, and an answer to a ping. What else of the appliance, of the networks around it, and of
# those beyond they reach is set.
guest_rules() {
	lan=$(verdict guest_net_lan_block) || exit 1
	internet=$(verdict guest_net_internet_block) || exit 1
	cat <<-END
		set local-networks {
			type ipv4_addr; flags interval; auto-merge
			elements = { $(local_networks) }
		}
		chain guest-input {
			type filter hook input priority filter; policy accept;
			iifname != "$guest_bridge" accept
			ct state established,related accept
			udp dport { 53, 67 } accept
			tcp dport 53 accept
			icmp type echo-request ip daddr $guest_address accept
	END
	if is_on guest_net_access_ds; then echo 'meta nfproto ipv4 accept'; fi
	if is_on guest_net_allow_http; then echo 'meta nfproto ipv4 tcp dport { 80, 443 } accept'; fi
	cat <<-END
			reject
		}
		chain guest-forward {
			type filter hook forward priority filter; policy accept;
			iifname != "$guest_bridge" accept
			ct state established,related accept
			meta nfproto ipv6 reject
			ip daddr @local-networks $lan
			$internet
		}
	END
}

# Private networks, and whatever the appliance is on itself.
local_networks() {
	{
		printf '%s\n' 10.0.0.0/8 172.16.0.0/12 192.168.0.0/16 169.254.0.0/16
		ip -4 route show proto kernel scope link | awk '{ print $1 }'
	} | paste -s -d ,
}

verdict() { # KEY
	if is_on "$1"; then echo reject; else echo accept; fi
}
