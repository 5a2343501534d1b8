# Messages on standard error and in the system log, and the end of a script that fails.
# shellcheck shell=sh

# fail TEXT: reports a failure, and ends the script.
fail() {
	printf '%s: %s\n' "${0##*/}" "$1" >&2
	logger -t "${0##*/}" -p daemon.err -- "$1"
	exit 1
}

# warn TEXT: reports something that does not keep the rest from working.
warn() {
	printf '%s: %s\n' "${0##*/}" "$1" >&2
	logger -t "${0##*/}" -p daemon.warning -- "$1"
}

# attempt TEXT COMMAND...: runs a command. If it fails, the script ends with that text, and with what the command said.
attempt() {
	complaint=$1
	shift
	said=$("$@" 2>&1) || fail "$complaint: ${said:-$1 ended with status $?}"
}

# is_name TEXT: whether it is a name of an interface that can safely stand in paths and rules.
is_name() {
	case $1 in
	'' | *[!A-Za-z0-9_.-]* | .* | -* | ????????????????*) return 1 ;;
	esac
}

expect_name() { # NAME, which may be empty
	[ -z "$1" ] || is_name "$1" || fail "'$1' is no name of an interface"
}

expect_interface() { # INTERFACE
	[ -e "/sys/class/net/$1" ] || fail "there is no interface '$1'"
}
