# Daemons, by their pid files: the processes that a machine lists may not include them.
# shellcheck shell=sh

# daemon_of NAME PIDFILE: the process of a pid file, if it is still one of that name.
daemon_of() {
	pid=''
	[ -s "$2" ] && read -r pid <"$2"
	case $pid in '' | *[!0-9]*) return 1 ;; esac
	read -r name 2>/dev/null <"/proc/$pid/comm" || return 1
	[ "$name" = "$1" ] && printf '%s' "$pid"
}

# announce_daemon PIDFILE: an empty pid file stands for a daemon that is being started, and has not written it yet.
announce_daemon() {
	put "$1" </dev/null
}

await_pid() { # PIDFILE
	tries=20
	while [ $tries -gt 0 ] && [ -e "$1" ] && [ ! -s "$1" ]; do
		sleep 0.1
		tries=$((tries - 1))
	done
}

# end_daemon NAME PIDFILE: ends it, and waits until it has.
end_daemon() {
	await_pid "$2"
	for signal in TERM KILL; do
		ended=$(daemon_of "$1" "$2") || break
		kill -s "$signal" "$ended" 2>/dev/null # in vain where it has just ended by itself
		tries=50
		while [ $tries -gt 0 ] && [ -d "/proc/$ended" ]; do
			sleep 0.1
			tries=$((tries - 1))
		done
	done
	! daemon_of "$1" "$2" >/dev/null || fail "cannot end $1 (process $ended)"
	attempt "remove $2" rm -f "$2"
}
