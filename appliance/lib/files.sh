# What the files say, and where they are.
# shellcheck shell=sh
# shellcheck disable=SC2034  # the other parts use them

settings_reader=/usr/mero/sbin/mero-settings
scripts=/etc/sysconfig/network-scripts
adapter_info=/tmp/wireless.info
state=/var/run/rc.network

# ask REQUEST...: what settings hold, in $answer, as the library reads them. False when something is missing, or not as
# checked. Settings that cannot be read end the script: an empty answer is neither on nor off.
ask() {
	answer=$("$settings_reader" "$@")
	case $? in
	0) ;;
	1) return 1 ;;
	*) fail "cannot read settings: $*" ;;
	esac
}

# says_yes REQUEST...: the same for something that is yes or no; false when it is missing.
says_yes() {
	ask "$@" || return 1
	case $answer in
	yes) ;;
	no) return 1 ;;
	*) fail "neither yes nor no, but '$answer': $*" ;;
	esac
}

# value_of KEY FILE: what a key/value file holds for a key, without quotes; empty when there is neither.
value_of() {
	if ask file "$2" "$1"; then printf '%s' "$answer"; fi
}

# is_enabled FILE: whether a key/value file switches on what it is about.
is_enabled() {
	ask check "$1" enable yes
}

# setting KEY: of the access point, for the adapter that is plugged in.
setting() {
	ask access-point "$1" || fail "cannot read the setting $1"
	printf '%s' "$answer"
}

# is_on KEY: whether such a setting is a number other than 0.
is_on() {
	ask access-point "$1" || fail "cannot read the setting $1"
	case $answer in
	0) return 1 ;;
	'' | *[!0-9-]*) fail "the setting $1 is '$answer', which is no number" ;;
	esac
}

# put FILE: replaces a file by what it reads. Nobody sees a half of it, and nobody but root the whole.
put() {
	(umask 077 && cat >"$1.new") || fail "cannot write $1.new"
	attempt "replace $1" mv -f "$1.new" "$1"
}
