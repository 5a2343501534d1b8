# The wireless adapter: which it is, and what it is to be used for.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

# The first one by name; false when there is none.
adapter() {
	for phy in /sys/class/net/*/phy80211; do
		[ -e "$phy" ] || return 1
		interface=${phy%/phy80211}
		printf '%s' "${interface##*/}"
		return
	done
}

# PRODUCT names the adapter's section in the access point's settings.
note_adapter() { # INTERFACE
	put "$adapter_info" <<-END
		INTERFACE="$1"
		PRODUCT="$(product_of "$1" | tr -d '[:cntrl:]"[]')"
	END
	attempt "let programs read $adapter_info" chmod 644 "$adapter_info"
}

# A USB adapter has a name, mostly; others are known by their numbers, or by what drives them.
product_of() { # INTERFACE
	device=$(readlink -f "/sys/class/net/$1/device")
	for file in "$device/../product" "$device/product"; do
		[ ! -s "$file" ] || { cat "$file" && return; }
	done
	if [ -s "$device/../idVendor" ]; then
		printf '%s:%s\n' "$(cat "$device/../idVendor")" "$(cat "$device/../idProduct")"
	elif [ -s "$device/vendor" ]; then
		printf '%s:%s\n' "$(sed s/^0x// "$device/vendor")" "$(sed s/^0x// "$device/device")"
	else
		basename "$(readlink -f "$device/driver")"
	fi
}

can_be_access_point() { # INTERFACE
	iw phy "$(cat "/sys/class/net/$1/phy80211/name")" info | awk '
		/Supported interface modes:/ { inside = 1; next }
		inside && $1 != "*" { exit }
		inside && $2 == "AP" { found = 1 }
		END { exit !found }'
}

# access_point_is INTERFACE yes|no: whether an access point has been set up there, and is to run or not.
access_point_is() {
	ask check "/etc/hostapd/hostapd-$1.info" enable "$2"
}

set_access_point() { # INTERFACE yes|no
	printf 'enable="%s"\n' "$2" | put "/etc/hostapd/hostapd-$1.info"
}
