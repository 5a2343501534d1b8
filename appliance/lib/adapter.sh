# The wireless adapter: which it is, and what it is to be used for.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

# The first one by name, but for the guests' interface, which is a second one on the same radio; false when there is
# none.
adapter() {
	for phy in /sys/class/net/*/phy80211; do
		interface=${phy%/phy80211} interface=${interface##*/}
		if [ -e "$phy" ] && [ "$interface" != "$guest_interface" ]; then
			printf '%s' "$interface"
			return
		fi
	done
	return 1
}

# PRODUCT names the adapter's section in the access point's settings.
note_adapter() { # INTERFACE
	section=$(section_of "$1") || exit 1
	put "$adapter_info" 644 <<-END
		INTERFACE="$1"
		PRODUCT="$section"
	END
}

# A USB adapter has a name, mostly; others are known by their numbers, or by what drives them.
section_of() { # INTERFACE
	device=$(readlink -f "/sys/class/net/$1/device") || fail "cannot tell which adapter $1 is"
	for file in "$device/../product" "$device/product"; do
		if [ -s "$file" ] && ask section-name <"$file"; then
			printf '%s' "$answer"
			return
		fi
	done
	numbers=$(numbers_of "$device") || exit 1
	ask section-name <<-END || fail "the adapter $1 has neither a name nor numbers"
		$numbers
	END
	printf '%s' "$answer"
}

numbers_of() { # DEVICE
	vendor='' model=''
	if [ -s "$1/../idVendor" ]; then
		read -r vendor <"$1/../idVendor" && read -r model <"$1/../idProduct"
	elif [ -s "$1/vendor" ]; then
		read -r vendor <"$1/vendor" && read -r model <"$1/device"
	fi
	if [ -n "$model" ]; then
		printf '%s:%s' "${vendor#0x}" "${model#0x}"
	elif [ -e "$1/driver" ]; then
		driver=$(readlink -f "$1/driver") || fail "cannot tell what drives $1"
		printf '%s' "${driver##*/}"
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
