# Daemons, by their pid files.
# shellcheck shell=sh

# daemon_of NAME PIDFILE: puts the process of a pid file into $daemon, if that process still runs and has that name.
daemon_of() {
	daemon=''
	[ -s "$2" ] && read -r daemon <"$2"
	case $daemon in '' | *[!0-9]*) return 1 ;; esac
	is_daemon "$1" "$daemon"
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

# await SECONDS CONDITION WORD...: waits until the condition is true, and is false when it does not become so in time.
# Most of what is waited for takes a few hundredths of a second: the first pauses are short.
await() {
	left=$(($1 * 100)) pause=1
	shift
	until "$@"; do
		[ "$left" -gt 0 ] || return 1
		sleep 0.0$pause
		left=$((left - pause))
		[ $pause -eq 8 ] || pause=$((2 * pause))
	done
}

# announce_daemon PIDFILE: makes an empty pid file, which stands for a daemon that starts and has not written it yet.
announce_daemon() {
	note "$1" ''
}

# is_written PIDFILE: whether no daemon is announced there that still has to write it.
is_written() {
	[ ! -e "$1" ] || [ -s "$1" ]
}

# end_daemon NAME PIDFILE: ends it, and waits until it has.
end_daemon() {
	await 2 is_written "$2"
	for signal in TERM KILL; do
		daemon_of "$1" "$2" || break
		kill -s "$signal" "$daemon" 2>/dev/null # in vain where it has just ended by itself
		await 5 has_ended "$1" "$daemon"
	done
	! daemon_of "$1" "$2" || fail "cannot end $1 (process $daemon)"
	remove_files "$2"
}

has_ended() { # NAME PID
	! is_daemon "$1" "$2"
}
