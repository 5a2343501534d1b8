# The access-point daemon.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

control=/var/run/hostapd

start_hostapd() { # INTERFACE
	configuration=$state/hostapd-$1.conf log=$state/hostapd-$1.log
	write_configuration "$1" "$configuration"
	make_named_files "$configuration"

	put "$log" </dev/null
	announce_daemon "$(hostapd_pid "$1")"
	said=$(run_hostapd "$1" "$configuration" "$log" 2>&1) || {
		rm -f "$(hostapd_pid "$1")"
		reason=$(reason_in "$log" "$said")
		fail "cannot start the access point on $1: $reason"
	}
	await_pid "$(hostapd_pid "$1")"
	await_access_point "$1" "$log"
	daemon_of hostapd "$(hostapd_pid "$1")" >/dev/null || fail "the access point on $1 has not noted its process"
}

# Anyone in range can make the daemon log a line with each frame, so the log is limited to 1 MiB.
run_hostapd() ( # INTERFACE CONFIGURATION LOG
	trap '' XFSZ
	ulimit -f 2048
	hostapd -B -t -f "$3" -P "$(hostapd_pid "$1")" "$2"
)

end_hostapd() { # INTERFACE
	end_daemon hostapd "$(hostapd_pid "$1")"
	end_stray_hostapd "$1"
}

# end_stray_hostapd INTERFACE: ends a daemon that its pid file does not name, as after a start with a full disk.
end_stray_hostapd() {
	for process in /proc/[0-9]*; do
		if is_daemon hostapd "${process#/proc/}" && is_ours "$process" &&
			grep -qF "$state/hostapd-$1.conf" "$process/cmdline" 2>/dev/null; then
			printf '%s\n' "${process#/proc/}" | put "$(hostapd_pid "$1")"
			end_daemon hostapd "$(hostapd_pid "$1")"
		fi
	done
}

# is_ours PROCESS: whether root runs it, and it has this machine's files and network, and not those of a container. Any
# user can run a process with the daemon's name, also one with root's rights; to end it may take seconds.
is_ours() {
	grep -qs '^Uid:[^0-9]*0[^0-9]' "$1/status" && [ "$(belongings_of "$1")" = "$(belongings_of /proc/self)" ]
}

belongings_of() { # PROCESS
	stat -Lc %d:%i "$1/root" "$1/ns/net" 2>/dev/null
}

# forget_configuration INTERFACE: removes the daemon's files, which hold secrets, and half-written ones.
forget_configuration() {
	remove_files "$state/hostapd-$1.conf" "$state/hostapd-$1.conf".* "$state/hostapd-$1.log" "$state/hostapd-$1.log".*
}

hostapd_pid() { # INTERFACE
	printf '%s/hostapd-%s.pid' "$state" "$1"
}

# Writes the daemon's configuration: the main network's file, the country and, for a start with guests, the guest
# network's file. Features that the card lacks are left out, since the daemon does not start with them.
write_configuration() { # INTERFACE FILE
	host=$hostapd_files-$1-host.conf
	[ -s "$host" ] || fail "$host is missing or empty"
	band=$(band_of "$host") || exit 1
	unable=$(what_is_unable "$1" "$band") || exit 1
	networks=$(sed "$unable" "$host") || cannot_read "$host"
	there=$(country_lines "$band") || exit 1
	networks=$networks${there:+$newline$there}
	if [ -n "$guests" ]; then
		second=$(guest_configuration "$1") || exit 1
		networks=$networks$newline$second
	fi
	expect_protection "$networks"
	put "$2" <<-END
		$networks
	END
}

# expect_protection TEXT: ends the script when the configuration of a network asks for protection, but has no key or no
# version of WPA: the daemon would run such a network as an open one.
expect_protection() {
	printf '%s\n' "$1" | awk '
		function judge() { if ((wep && !key) || (secret && !wpa)) open = 1; wep = key = secret = wpa = 0 }
		/^bss=/ { judge() }
		/^wep_default_key=/ { wep = 1 }
		/^wep_key0=/ { key = 1 }
		/^wpa_passphrase=|^wpa_key_mgmt=/ { secret = 1 }
		/^wpa=[1-3]$/ { wpa = 1 }
		END { judge(); exit open }' || fail 'a network would be open that is to be protected: its key or its version of WPA is none'
}

band_of() { # CONFIGURATION
	mode=$(sed -n 's/^hw_mode=//p' "$1") || cannot_read "$1"
	if [ "$mode" = a ]; then echo 2; else echo 1; fi
}

# what_is_unable INTERFACE BAND: prints a program for sed that takes the features that the card lacks out of a
# configuration.
what_is_unable() {
	bits=$(ht_capabilities "$1" "$2") || exit 1
	if [ -z "$bits" ]; then
		echo '/^ieee80211n=/d; /^ht_capab=/d; /^require_ht=/d'
		return
	fi
	lacks "$bits" 0x0020 '\[SHORT-GI-20\]'
	lacks "$bits" 0x0040 '\[SHORT-GI-40\]'
	lacks "$bits" 0x0400 '\[DELAYED-BA\]'
	lacks "$bits" 0x0800 '\[MAX-AMSDU-7935\]'
	lacks "$bits" 0x0002 '\[HT40[+-]\]'
}

lacks() { # BITS BIT PATTERN
	[ $(($1 & $2)) -ne 0 ] || echo "/^ht_capab=/s/$3//"
}

# Prints the card's 802.11n capabilities in a band, as the number that the driver gives; nothing for a card without.
ht_capabilities() { # INTERFACE BAND
	phy=$(cat "/sys/class/net/$1/phy80211/name") || fail "$1 is no wireless interface"
	said=$(iw phy "$phy" info) || fail "cannot tell the capabilities of $1"
	awk -v band="Band $2:" '
		$1 == "Band" { inside = ($0 ~ band) }
		inside && $1 == "Capabilities:" { print $2; exit }' <<-END || fail "cannot tell the capabilities of $1"
		$said
	END
}

# The daemon does not start when a file that it is told to read is missing.
make_named_files() { # CONFIGURATION
	files=$(sed -n 's/^wpa_psk_file=//p' "$1") || cannot_read "$1"
	while IFS= read -r file; do
		[ -z "$file" ] || [ -e "$file" ] || put "$file" </dev/null
	done <<-END
		$files
	END
}

# The daemon goes into the background before it has chosen a channel, so its start alone does not say that it works.
await_access_point() { # INTERFACE LOG
	tries=300
	while [ $tries -gt 0 ]; do
		case $(hostapd_cli -p "$control" -i "$1" status 2>/dev/null | sed -n 's/^state=//p') in
		ENABLED) return ;;
		DFS) return ;; # listens for radar, for a minute or more, and comes up by itself
		DISABLED) break ;;
		esac
		daemon_of hostapd "$(hostapd_pid "$1")" >/dev/null || break
		sleep 0.1
		tries=$((tries - 1))
	done
	reason=$(reason_in "$2")
	fail "the access point on $1 does not come up: $reason"
}

# reason_in LOG [TEXT]: prints the line in which a daemon gives the reason of its failure, without the time.
reason_in() {
	{
		cat "$1"
		printf '%s\n' "${2-}"
	} | awk '
		{ sub(/^[0-9]+\.[0-9]+: /, "") }
		tolower($0) ~ /line [0-9]+:|fail|error|invalid|unable|could not|does not|not (allowed|configured|found|supported)|in use/ {
			print
			found = 1
			exit
		}
		NF { last = $0 }
		END { if (!found) print last }'
}
