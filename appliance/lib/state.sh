# The directory of what runs. It is root's alone: what stands in it is believed, and its lock keeps other runs waiting.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

lock=$state/lock

# own_state: the directory is there, root's, and holds nothing that anybody else has made or may open, whatever stood
# there before.
own_state() {
	[ -e "$state" ] || [ -L "$state" ] || make_state
	owner=$(stat -c '%u %F' "$state") || fail "cannot tell whose $state is"
	if [ "$owner" != '0 directory' ]; then
		set_aside "$state"
		make_state
	fi
	attempt "cannot keep $state to root" chmod 700 "$state"
	remove_foreign_entries
}

make_state() {
	attempt "cannot make $state" mkdir -p -m 700 "$state"
}

# Root's are plain files of one name each. A lock that was open to others may be held by them for ever.
remove_foreign_entries() {
	foreign=$(foreign_entries) || fail "cannot tell what of $state is root's"
	[ -n "$foreign" ] || return 0
	adopt_pid_files
	foreign=$(foreign_entries -exec rm -rf --one-file-system -- '{}' +) ||
		fail "cannot remove what is not root's from $state"
	foreign=$(printf '%s' "${foreign% }" | tr -c '[:print:]' '?')
	[ -z "$foreign" ] || warn "removed from $state what was not root's alone: $foreign"
}

foreign_entries() { # WHAT-ELSE-TO-DO-WITH-THEM...
	find "$state" -mindepth 1 -maxdepth 1 '(' ! -type f -o ! -user 0 -o -links +1 -o -name lock -perm /077 ')' \
		-printf '%f ' "$@"
}

# A server gives its pid file to the user that it runs as. Those of servers that run with them are root's here, as their
# start makes them, and were not always.
adopt_pid_files() {
	for file in "$state"/dnsmasq-*.pid; do
		server=$(daemon_of dnsmasq "$file") || continue
		if tr '\0' '\n' <"/proc/$server/cmdline" | grep -qxF -e "--pid-file=$file"; then
			attempt "cannot keep $file to root" chown -h 0:0 "$file"
		fi
	done
}

# lock_state: waits until no other run holds the lock, and keeps it open as descriptor 9. Whoever runs the commands
# closes that for them: daemons must not hold the lock.
lock_state() {
	waited_in_vain=75 # no status of flock's own
	umask 077
	while command exec 9>>"$lock" || fail "cannot open $lock"; do
		flock -w 60 -E $waited_in_vain 9
		case $? in
		0) ;;
		"$waited_in_vain") fail "another run takes too long, and holds $lock" ;;
		*) fail "cannot lock $lock" ;;
		esac
		# shellcheck disable=SC3013  # the shell knows it
		if [ "$lock" -ef /proc/self/fd/9 ]; then break; fi # not one that has been replaced meanwhile
	done
	umask 022
}
