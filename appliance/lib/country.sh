# The country whose rules the radio is to keep to.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

country_settings=/usr/mero/etc/wireless_country.conf

# country: prints its two letters; nothing where none is set. Others than the management program may have written them,
# and they become a line of the access-point daemon's configuration.
country() {
	country=$(value_of country "$country_settings") || exit 1
	case $country in
	'' | [A-Z][A-Z]) printf '%s' "$country" ;;
	*) fail "$country_settings has a country that is none" ;;
	esac
}

# keep_to_country: has the kernel keep to the country's rules. Without them it allows what is allowed everywhere, so a
# failure keeps nobody from using the adapter.
keep_to_country() {
	country=$(country) && [ -n "$country" ] || return 0
	said=$(iw reg set "$country" 2>&1) || {
		warn "cannot set the country $country: $said"
		return
	}
	await_rules_of "$country" || warn "the kernel does not keep to the rules of $country"
}

# The kernel follows a moment later, or not at all.
await_rules_of() { # COUNTRY
	tries=10
	until has_rules_of "$1"; do
		tries=$((tries - 1))
		[ $tries -gt 0 ] || return 1
		sleep 0.1
	done
}

# Those of a radio that has its own stand behind those that hold for all.
has_rules_of() { # COUNTRY
	iw reg get 2>/dev/null | awk -v country="$1:" '$1 == "country" { found = $2 == country; exit } END { exit !found }'
}

# country_lines BAND: prints what the access-point daemon is told of the country, and, with it, of the radars of 5 GHz.
country_lines() {
	country=$(country) || exit 1
	[ -n "$country" ] || return 0
	printf 'country_code=%s\nieee80211d=1\n' "$country"
	[ "$1" != 2 ] || echo ieee80211h=1
}
