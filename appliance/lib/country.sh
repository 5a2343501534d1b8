# The country whose rules the radio is to keep to.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

country_settings=/usr/mero/etc/wireless_country.conf

# expect_country: others than the management program may have written $country, and it becomes a line of the access-point
# daemon's configuration.
expect_country() {
	case $country in
	'' | [A-Z][A-Z]) ;;
	*) fail "$country_settings has a country that is none" ;;
	esac
}

# keep_to_country: has the kernel keep to the country's rules. Without them it allows what is allowed everywhere, so a
# failure keeps nobody from using the adapter. $country is known with the adapter.
keep_to_country() {
	[ -n "$known_adapter" ] || country=$(value_of country "$country_settings") || return 0
	(expect_country) && [ -n "$country" ] || return 0
	said=$(iw reg set "$country" 2>&1) || {
		warn "cannot set the country $country: $said"
		return
	}
	await 1 has_rules_of "$country" || warn "the kernel does not keep to the rules of $country"
}

# has_rules_of COUNTRY: whether the kernel keeps to them; it begins a moment after it was told, or not at all. Those of a
# radio that has its own stand behind those that hold for all.
has_rules_of() {
	regulations=$(iw reg get 2>/dev/null) || return 1
	while read -r word which _; do
		[ "$word" = country ] || continue
		[ "$which" = "$1:" ]
		return
	done <<-END
		$regulations
	END
	return 1
}
