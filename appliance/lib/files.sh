# Paths, reading of settings, and writing of files.
# shellcheck shell=sh
# shellcheck disable=SC2034  # the other parts use them

settings_reader=/usr/mero/sbin/mero-settings
scripts=/etc/sysconfig/network-scripts
hostapd_files=/etc/hostapd/hostapd # with -INTERFACE-host.conf, -INTERFACE-guest.conf, -INTERFACE[-guest].info behind it
dhcp_files=/etc/dhcpd/dhcpd # with -BRIDGE-BRIDGE.conf and -BRIDGE-BRIDGE.info behind it
adapter_info=/tmp/wireless.info
state=/var/run/rc.network
hostapd_run=$state/hostapd # with -INTERFACE.conf, -INTERFACE.log and -INTERFACE.pid behind it
dnsmasq_run=$state/dnsmasq # with -BRIDGE.conf, -BRIDGE.leases and -BRIDGE.pid behind it
lease_run=/var/run/udhcpc # with -INTERFACE.pid behind it
newline='
'

# ask REQUEST...: asks mero-settings, which reads as the library does, and puts what it prints into $answer. False when
# a value is missing, or a check has failed. Settings that cannot be read end the script, since "no answer" must not be
# taken for "off"; so the answer is a variable, and not the output of a subshell.
ask() {
	answer=$("$settings_reader" "$@")
	case $? in
	0) ;;
	1) return 1 ;;
	*) fail "cannot read settings: $*" ;;
	esac
}

# into NAME...: puts the lines of $answer into variables.
into() {
	rest=$answer$newline
	for variable; do
		line=${rest%%"$newline"*} rest=${rest#*"$newline"}
		eval "$variable=\$line"
	done
}

# is_yes TEXT REQUEST: whether the answer to a request is "yes".
is_yes() {
	case $1 in
	yes) ;;
	no) return 1 ;;
	*) fail "neither yes nor no, but '$1': $2" ;;
	esac
}

# value_of KEY FILE: prints a key's value in a key/value file, without quotes; nothing when there is no key, or no file.
value_of() {
	if ask file "$2" "$1"; then printf '%s' "$answer"; fi
}

# is_enabled FILE: whether a key/value file has enable="yes".
is_enabled() {
	ask check "$1" enable yes
}

known_settings='' # the keys of those that are in variables, setting_KEY

# read_setting KEY: puts a setting of the access point, for the adapter that is plugged in, into $answer.
read_setting() {
	case " $known_settings " in
	*" $1 "*) eval "answer=\$setting_$1" ;;
	*) ask access-point "$1" || fail "cannot read the setting $1" ;;
	esac
}

# is_on KEY: whether such a setting is a number other than 0.
is_on() {
	read_setting "$1"
	case $answer in
	0) return 1 ;;
	'' | *[!0-9-]*) fail "the setting $1 is '$answer', which is no number" ;;
	esac
}

# cannot_read FILE: ends the script when a file that it needs cannot be read.
cannot_read() {
	fail "cannot read $1"
}

# remove_files FILE...: removes those that are there. A failure is told of the first one.
remove_files() {
	for file; do
		shift
		if [ -e "$file" ] || [ -L "$file" ]; then set -- "$@" "$file"; fi
	done
	[ $# -eq 0 ] || attempt "cannot remove $1" rm -f "$@"
}

# put FILE TEXT [MODE]: replaces a file by the text and a line feed, or by nothing, in one step. The mode is 600 by
# default. In a directory like /tmp anybody may have put a link or a file in the way: that is neither followed nor
# written to, and the new file is made under a name that nobody can foresee. It is flushed, but for one in /tmp, which
# does not outlast a boot.
put() {
	new=$(mktemp "$1.XXXXXXXXXX" 2>&1) || fail "cannot write $1: $new"
	printf '%s' "${2:+$2$newline}" >"$new" || give_up "$new" "cannot write $1"
	[ -z "${3-}" ] || chmod "$3" "$new" || give_up "$new" "cannot write $1"
	if [ -d "$1" ] && [ ! -L "$1" ]; then set_aside "$1"; fi
	case $1 in /tmp/*) flush=true ;; *) flush=sync ;; esac
	said=$($flush "$new" 2>&1) || give_up "$new" "cannot write $1: $said"
	said=$(mv -fT "$new" "$1" 2>&1) || give_up "$new" "cannot replace $1: $said"
	said=$($flush "${1%/*}" 2>&1) || warn "$1 may be the old one again after a power cut: $said"
}

give_up() { # NEW-FILE TEXT
	rm -f "$1"
	fail "$2"
}

# note FILE TEXT: writes the text and a line feed, or nothing, into a file of the state directory, with the mode 600. The
# directory is root's alone, so that the file needs no other name first. What is told by a text is not told by a file that
# is empty, as a run leaves it that is killed here.
note() {
	umask 077
	write_note "$@" 2>/dev/null || said=$(write_note "$@" 2>&1) || {
		[ ! -f "$1" ] || rm -f "$1"
		fail "cannot write $1: ${said##*: }"
	}
	umask 022
}

write_note() {
	printf '%s' "${2:+$2$newline}" >"$1"
}

# set_aside PATH: renames a file or directory that is in the way, so that nothing of it is lost.
set_aside() {
	aside=$(mktemp -u "$1.foreign-XXXXXX") || fail "cannot move $1 aside"
	attempt "cannot move $1 aside" mv -T "$1" "$aside"
	warn "$1 was in the way, and is $aside now"
}
