# What the files say, and where they are.
# shellcheck shell=sh
# shellcheck disable=SC2034  # the other parts use them

scripts=/etc/sysconfig/network-scripts
settings=/usr/mero/etc/wireless_ap.conf
adapter_info=/tmp/wireless.info
state=/var/run/rc.network

# value_of KEY FILE: what a key/value file holds for a key, without quotes; empty when there is neither.
value_of() {
	[ -f "$2" ] || return 0
	sed -n "
		/^[[:space:]]*$1[[:space:]]*=/{
			s/^[^=]*=[[:space:]]*//
			s/[[:space:]]*\$//
			s/^\"\(.*\)\"\$/\1/
			s/^'\(.*\)'\$/\1/
			h
		}
		\${
			g
			p
		}" "$2"
}

# setting KEY DEFAULT: a setting of the adapter that is plugged in.
setting() {
	found=$(SECTION=$(value_of PRODUCT "$adapter_info") KEY=$1 awk '
		function trimmed(text) { gsub(/^[ \t]+|[ \t\r]+$/, "", text); return text }
		BEGIN { section = tolower(trimmed(ENVIRON["SECTION"])); key = ENVIRON["KEY"] }
		/^[ \t]*\[.*\][ \t\r]*$/ {
			header = trimmed($0)
			inside = !seen && tolower(trimmed(substr(header, 2, length(header) - 2))) == section
			seen = seen || inside
			next
		}
		inside && (equals = index($0, "=")) && trimmed(substr($0, 1, equals - 1)) == key {
			value = substr($0, equals + 1)
			found = 1
		}
		END { if (found) print "=" value }' "$settings" 2>/dev/null)
	if [ -n "$found" ]; then printf '%s' "${found#=}"; else printf '%s' "$2"; fi
}

# is_on KEY DEFAULT: whether a setting is a number other than 0.
is_on() {
	number=$(setting "$1" "$2")
	[ "$number" != 0 ] && [ -n "$number" ]
}

# put FILE: replaces a file by what it reads. Nobody sees a half of it, and nobody but root the whole.
put() {
	(umask 077 && cat >"$1.new") || fail "cannot write $1.new"
	attempt "replace $1" mv -f "$1.new" "$1"
}
