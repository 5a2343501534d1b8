# The access-point daemon.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

control=/var/run/hostapd

# start_hostapd INTERFACE: starts it. await_access_point waits until it is on the air.
start_hostapd() {
	configuration=$hostapd_run-$1.conf log=$hostapd_run-$1.log pid=$hostapd_run-$1.pid
	write_configuration "$1" "$configuration"
	make_named_files
	note "$log" ''
	announce_daemon "$pid"
	said=$(run_hostapd "$pid" "$configuration" "$log" 2>&1) || {
		rm -f "$pid"
		reason=$(reason_in "$log" "$said")
		fail "cannot start the access point on $1: $reason"
	}
}

# Anyone in range can make the daemon log a line with each frame, so the log is limited to 1 MiB.
run_hostapd() ( # PIDFILE CONFIGURATION LOG
	trap '' XFSZ
	ulimit -f 2048
	hostapd -B -t -f "$3" -P "$1" "$2"
)

end_hostapd() { # INTERFACE
	end_daemon hostapd "$hostapd_run-$1.pid"
	end_stray_hostapd "$1"
}

# end_stray_hostapd INTERFACE: ends a daemon that its pid file does not name, as after a start with a full disk.
end_stray_hostapd() {
	for process in /proc/[0-9]*; do
		name='' words=''
		read -r name 2>/dev/null <"$process/comm" # in vain where it has just ended
		[ "$name" = hostapd ] || continue
		read -r words 2>/dev/null <"$process/cmdline" # which has no line feed, and whose null bytes are left out
		case $words in *"$hostapd_run-$1.conf"*) ;; *) continue ;; esac
		if is_daemon hostapd "${process#/proc/}" && is_ours "$process"; then
			note "$hostapd_run-$1.pid" "${process#/proc/}"
			end_daemon hostapd "$hostapd_run-$1.pid"
		fi
	done
}

# is_ours PROCESS: whether root runs it, and it has this machine's files and network, and not those of a container. Any
# user can run a process with the daemon's name, also one with root's rights; to end it may take seconds.
is_ours() {
	user=''
	while read -r key value _; do
		[ "$key" != Uid: ] || user=$value
	done 2>/dev/null <"$1/status"
	# shellcheck disable=SC3013  # the shell knows it
	[ "$user" = 0 ] && [ "$1/root" -ef /proc/self/root ] && [ "$1/ns/net" -ef /proc/self/ns/net ]
}

# forget_configuration INTERFACE: removes the daemon's files, which hold secrets.
forget_configuration() {
	remove_files "$hostapd_run-$1.conf" "$hostapd_run-$1.log"
}

# Writes the daemon's configuration: the main network's file, the country and, for a start with guests, the guest
# network's file, whose empty "bssid=" is left out: the daemon then gives it the address that follows the radio's own.
write_configuration() { # INTERFACE FILE
	host=$hostapd_files-$1-host.conf guest=''
	[ -s "$host" ] || fail "$host is missing or empty"
	[ -z "$guests" ] || guest=$hostapd_files-$1-guest.conf
	learn_capabilities "$1"
	lines=$(sed '/^bssid=$/d' "$host" ${guest:+"$guest"}) || cannot_read "$host${guest:+ or $guest}"
	make_configuration
	note "$2" "$content"
}

# make_configuration: makes the daemon's $content out of the files' $lines. Features that the card lacks are left out,
# since the daemon does not start with them. A main network that is off at this hour starts without its beacon, and gets
# it when its interface, which is taken down then, comes up.
make_configuration() {
	bits=$ht_of_2ghz content='' told=''
	[ "$turn" = up ] || content=start_disabled=1$newline
	case $newline$lines$newline in *"${newline}hw_mode=a$newline"*) bits=$ht_of_5ghz ;; esac
	begin_network
	set -f
	IFS=$newline
	for line in $lines; do
		case $line in
		bss=*)
			expect_protection
			begin_network
			tell_country
			;;
		ieee80211n=* | require_ht=*) [ -n "$bits" ] || continue ;;
		ht_capab=*) leave_out_what_is_lacking || continue ;;
		esac
		note_protection
		content=$content$line$newline
	done
	unset IFS
	set +f
	expect_protection
	tell_country
	content=${content%"$newline"}
}

# tell_country: adds, once, what the daemon is told of the country, and, with it, of the radars of 5 GHz.
tell_country() {
	[ -z "$told" ] && [ -n "$country" ] || return 0
	told=yes
	content=${content}country_code=$country${newline}ieee80211d=1$newline
	case $newline$lines$newline in
	*"${newline}hw_mode=a$newline"*) content=${content}ieee80211h=1$newline ;;
	esac
}

leave_out_what_is_lacking() {
	[ -n "$bits" ] || return 1
	lacks 0x0020 '[SHORT-GI-20]'
	lacks 0x0040 '[SHORT-GI-40]'
	lacks 0x0400 '[DELAYED-BA]'
	lacks 0x0800 '[MAX-AMSDU-7935]'
	lacks 0x0002 '[HT40+]'
	lacks 0x0002 '[HT40-]'
}

lacks() { # BIT FEATURE
	case $((bits & $1)),$line in 0,*"$2"*) line=${line%%"$2"*}${line#*"$2"} ;; esac
}

begin_network() {
	secret='' wpa='' wep='' wep_key=''
}

note_protection() {
	case $line in
	wep_default_key=*) wep=yes ;;
	wep_key0=*) wep_key=yes ;;
	wpa_passphrase=* | wpa_key_mgmt=*) secret=yes ;;
	wpa=[1-3]) wpa=yes ;;
	esac
}

# expect_protection: ends the script when the configuration of a network asks for protection, but has no key or no
# version of WPA: the daemon would run such a network as an open one.
expect_protection() {
	case $wep,$wep_key,$secret,$wpa in
	yes,,* | *,yes,) fail 'a network would be open that is to be protected: its key or its version of WPA is none' ;;
	esac
}

# learn_capabilities INTERFACE: puts the card's 802.11n capabilities in both bands into variables, as the numbers that the
# driver gives; nothing for a card without.
learn_capabilities() {
	ht_of_2ghz='' ht_of_5ghz='' band=''
	read -r phy 2>/dev/null <"/sys/class/net/$1/phy80211/name" || fail "$1 is no wireless interface"
	said=$(iw phy "$phy" info) || fail "cannot tell the capabilities of $1"
	set -f
	IFS=$newline
	for line in $said; do
		case $band$line in
		*"	Band "*:) band=${line#*Band } ;;
		"1:		Capabilities: "*) ht_of_2ghz=${line#*: } band='' ;;
		"2:		Capabilities: "*) ht_of_5ghz=${line#*: } band='' ;;
		esac
	done
	unset IFS
	set +f
}

# The daemon does not start when a file that it is told to read is missing.
make_named_files() {
	set -f
	IFS=$newline
	for line in $content; do
		case $line in
		wpa_psk_file=?*) [ -e "${line#*=}" ] || put "${line#*=}" '' ;;
		esac
	done
	unset IFS
	set +f
}

# The daemon goes into the background before it has chosen a channel, so its start alone does not say that it works.
await_access_point() { # INTERFACE
	await 2 is_written "$hostapd_run-$1.pid"
	await 30 is_decided "$1"
	case $outcome in
	ENABLED | DFS) ;;
	*)
		reason=$(reason_in "$hostapd_run-$1.log")
		fail "the access point on $1 does not come up: $reason"
		;;
	esac
	daemon_of hostapd "$hostapd_run-$1.pid" || fail "the access point on $1 has not noted its process"
}

# is_decided INTERFACE: whether the daemon is on the air, or will not be; it may have to scan first. It may also have to
# listen for radar, for a minute or more, and comes up by itself then. It is asked only if its log does not tell its state.
is_decided() {
	outcome=''
	while read -r _ whose what is change _; do
		[ "$whose $what $is" != "$1: interface state" ] || outcome=${change#*->}
	done <"$hostapd_run-$1.log"
	[ -n "$outcome" ] || outcome=$(hostapd_cli -p "$control" -i "$1" status 2>/dev/null)
	case $outcome in
	*state=ENABLED*) outcome=ENABLED ;;
	*state=DFS*) outcome=DFS ;;
	*state=DISABLED*) outcome=DISABLED ;;
	esac
	case $outcome in
	ENABLED | DFS | DISABLED) ;;
	*) ! daemon_of hostapd "$hostapd_run-$1.pid" ;;
	esac
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
