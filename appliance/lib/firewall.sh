# Traffic between the networks: address translation for NAT bridges, and the networks that guests may reach.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

forwarding=/proc/sys/net/ipv4/ip_forward
forwarding_before=$state/ip_forward
guest_rights=$state/guest-rights

# The forwarding switch is noted before anything else is done: while the note exists, there may be rules to remove.
set_firewall() { # BRIDGE
	if ! is_nat "$1" && [ -z "$guests" ]; then
		clear_firewall
		return
	fi
	text=$(rules "$1") || exit 1
	rights=$(rights_of_guests) || exit 1
	first=''
	if [ ! -s "$forwarding_before" ]; then
		first=yes
		before=''
		read -r before <"$forwarding" # a switch tells its one digit, and nothing behind it
		[ -n "$before" ] || cannot_read "$forwarding"
		note "$forwarding_before" "$before"
	fi
	said=$(set_rules "$text") || {
		[ -z "$first" ] || rm -f "$forwarding_before" # none stand
		fail "cannot set the rules between networks: $said"
	}
	note_guest_rights "$rights"
	echo 1 >"$forwarding" || fail 'cannot pass traffic on between networks'
}

# Without the note there are no rules, and nft is not run: it may not be installed. The forwarding switch gets its
# former value back, since others may need it on.
clear_firewall() {
	[ -s "$forwarding_before" ] || return 0
	read -r before <"$forwarding_before" || cannot_read "$forwarding_before"
	echo "$before" >"$forwarding" || fail 'cannot stop passing traffic on between networks'
	said=$(set_rules '') || fail "cannot remove the rules between networks: $said"
	remove_files "$guest_rights" "$forwarding_before"
}

# has_rules: whether those that were set are there still. Who loads other rules may have removed all that there were, or
# what is in their table; with each set of them an address is translated. Where that cannot be told, nobody is thrown off for it.
has_rules() {
	[ -s "$forwarding_before" ] || return 0
	said=$(nft list table inet mero_ap 2>&1) || {
		case $said in *'Error: No such file'*) return 1 ;; esac
		warn "cannot tell whether the rules between networks are there: $said"
		return 0
	}
	case $said in *masquerade*) ;; *) return 1 ;; esac
}

# rights_of_guests: prints what the settings let guests reach, or keep them from; nothing for a start without guests.
rights_of_guests() {
	[ -n "$guests" ] || return 0
	for key in guest_net_lan_block guest_net_access_ds guest_net_internet_block guest_net_allow_http; do
		if is_on "$key"; then echo "$key=yes"; else echo "$key=no"; fi
	done
}

# note_guest_rights TEXT: notes what the rules were made of, so that others can tell whether the settings say the same
# still. Without guests there is no note.
note_guest_rights() {
	if [ -z "$1" ]; then
		remove_files "$guest_rights"
		return
	fi
	note "$guest_rights" "$1"
}

# set_rules TEXT: replaces all rules by the text's in one step, and prints what nft says. The table is added first,
# since a missing one cannot be deleted.
set_rules() {
	nft -f - 2>&1 <<-END
		add table inet mero_ap
		delete table inet mero_ap
		$1
	END
}

rules() { # BRIDGE
	echo 'table inet mero_ap {'
	if is_nat "$1"; then
		subnet_of "$1"
		translation "$1" "$subnet"
	fi
	if [ -n "$guests" ]; then
		translation "$guest_bridge" "$guest_subnet"
		guest_rules
	fi
	echo '}'
}

translation() { # BRIDGE SUBNET
	echo "chain translate-$1 {
		type nat hook postrouting priority srcnat; policy accept;
		ip saddr $2 oifname != \"$1\" masquerade
	}"
}

networks='' # those that the appliance has an address in, each as ADDRESS/BITS@INTERFACE, where they are known

# plan_networks: they are told among what the planned commands say. take_networks takes them from there.
plan_networks() {
	plan 'cannot tell the networks around the appliance' 'route show proto kernel scope link'
}

take_networks() {
	networks=''
	while read -r network dev interface _; do
		[ "$dev" != dev ] || networks="$networks $network@$interface"
	done <<-END
		$said
	END
}

know_networks() {
	[ -z "$networks" ] || return 0
	plan_networks
	run_plan
	take_networks
}

# subnet_of BRIDGE: puts its network into $subnet. The bridge has its address by now, so the kernel has the route.
subnet_of() {
	know_networks
	subnet=''
	for network in $networks; do
		case $subnet,$network in ,*"@$1") subnet=${network%@*} ;; esac
	done
	[ -n "$subnet" ] || fail "$1 has no address, and so no network to translate"
}

# Guests always get addresses, names, and an answer to a ping. Settings decide whether they reach the rest of the
# appliance, the local networks, and the internet.
guest_rules() {
	local_networks=$(local_networks) || exit 1
	lan=$(verdict guest_net_lan_block) || exit 1
	internet=$(verdict guest_net_internet_block) || exit 1
	echo "set local-networks {
			type ipv4_addr; flags interval; auto-merge
			elements = { $local_networks }
		}
		chain guest-input {
			type filter hook input priority filter; policy accept;
			iifname != \"$guest_bridge\" accept
			ct state established,related accept
			udp dport 67 accept
			ip daddr $guest_address udp dport 53 accept
			ip daddr $guest_address tcp dport 53 accept
			icmp type echo-request ip daddr $guest_address accept"
	if is_on guest_net_access_ds; then echo 'meta nfproto ipv4 accept'; fi
	if is_on guest_net_allow_http; then echo 'meta nfproto ipv4 tcp dport { 80, 443 } accept'; fi
	echo "reject
		}
		chain guest-forward {
			type filter hook forward priority filter; policy accept;
			iifname != \"$guest_bridge\" accept
			ct state established,related accept
			meta nfproto ipv6 reject
			ip daddr @local-networks $lan
			$internet
		}"
}

# local_networks: prints the private networks, and those that the appliance has an address in.
local_networks() {
	know_networks
	printf 10.0.0.0/8,100.64.0.0/10,172.16.0.0/12,192.168.0.0/16,169.254.0.0/16
	for network in $networks; do printf ',%s' "${network%@*}"; done
}

verdict() { # KEY
	if is_on "$1"; then echo reject; else echo accept; fi
}
