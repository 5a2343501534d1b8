# Failures: told where people and programs look for them, and the end of the script.
# shellcheck shell=sh

# fail TEXT: ends the script.
fail() {
	printf '%s: %s\n' "${0##*/}" "$1" >&2
	logger -t "${0##*/}" -p daemon.err -- "$1"
	exit 1
}

# warn TEXT: tells of what does not keep the rest from working.
warn() {
	printf '%s: %s\n' "${0##*/}" "$1" >&2
	logger -t "${0##*/}" -p daemon.warning -- "$1"
}

# attempt WHAT COMMAND...: runs a command; one that fails ends the script, with what it said.
attempt() {
	what=$1
	shift
	said=$("$@" 2>&1) || fail "cannot $what: ${said:-$1 ended with status $?}"
}

# expect_name NAME: a name that is put into paths and rules is an interface's, or empty.
expect_name() {
	case $1 in
	'') ;;
	*[!A-Za-z0-9_.-]* | .* | -* | ????????????????*) fail "'$1' is no name of an interface" ;;
	esac
}

expect_interface() { # INTERFACE
	[ -e "/sys/class/net/$1" ] || fail "there is no interface '$1'"
}
