# The state directory: notes, pid files and configurations of what runs. Only root may write to it, since the scripts
# trust its files, and since whoever holds its lock keeps all other runs waiting.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

lock=$state/lock

# own_state: makes sure that the directory exists and is root's, and that no other user has made, or may open, a file in
# it. Whatever else stood in its place is moved aside.
own_state() {
	[ -e "$state" ] || [ -L "$state" ] || make_state
	foreign=$(foreign_entries 0) || fail "cannot tell what of $state is root's"
	[ -z "$foreign" ] || make_own
}

make_own() {
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

# Everything but plain files of root's with one name each is removed, and so is a lock that others may open: they may
# already hold it, for ever.
remove_foreign_entries() {
	adopt_pid_files
	foreign=$(foreign_entries 1 -exec rm -rf --one-file-system -- '{}' +) ||
		fail "cannot remove what is not root's from $state"
	foreign=$(printf '%s' "${foreign% }" | tr -c '[:print:]' '?')
	[ -z "$foreign" ] || warn "removed from $state what was not root's alone: $foreign"
}

# foreign_entries DEPTH [WHAT-ELSE-TO-DO-WITH-THEM...]: prints the names of what is not root's alone. With the depth 0 that
# may be the directory itself, which is looked at first: if it is root's, nobody else changes what is found in it.
foreign_entries() {
	depth=$1
	shift
	find "$state" -mindepth "$depth" -maxdepth 1 '(' -path "$state" '(' ! -type d -o ! -user 0 -o ! -perm 700 ')' -o \
		! -path "$state" '(' ! -type f -o ! -user 0 -o -links +1 -o -name lock -perm /077 ')' ')' -printf '%f ' "$@"
}

# A DHCP server gives its pid file to the user that it runs as, and a start gives the file back to root. Starts of
# former versions did not: this does it for servers that still run, so that their pid files are not removed.
adopt_pid_files() {
	for file in "$state"/dnsmasq-*.pid; do
		daemon_of dnsmasq "$file" || continue
		if tr '\0' '\n' <"/proc/$daemon/cmdline" | grep -qxF -e "--pid-file=$file"; then
			attempt "cannot keep $file to root" chown -h 0:0 "$file"
		fi
	done
}

# lock_state: waits until no other run holds the lock, and keeps it open as descriptor 9. Commands are run with 9
# closed, since a daemon that they start must not hold the lock.
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
