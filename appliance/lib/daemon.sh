# Daemons, by their pid files.
# shellcheck shell=sh

# daemon_of NAME PIDFILE: prints the process of a pid file, if that process still runs and has that name.
daemon_of() {
	pid=''
	[ -s "$2" ] && read -r pid <"$2"
	case $pid in '' | *[!0-9]*) return 1 ;; esac
	is_daemon "$1" "$pid" && printf '%s' "$pid"
}

is_daemon() { # NAME PID
	name='' condition=''
	[ ! -r "/proc/$2/status" ] || while read -r key value _; do
		case $key in
		Name:) name=$value ;;
		State:) condition=$value && break ;;
		esac
	done 2>/dev/null <"/proc/$2/status"
	case $name,$condition in
	*,[ZX]) return 1 ;; # nobody has waited for it
	"$1",*) ;;
	*) return 1 ;;
	esac
}

# announce_daemon PIDFILE: makes an empty pid file, which stands for a daemon that starts and has not written it yet.
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
	remove_files "$2"
}
