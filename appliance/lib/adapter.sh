# The wireless adapter: its interface, its name, and whether it is used as an access point.
# shellcheck shell=sh
# shellcheck disable=SC2034,SC2154  # what the other parts use, and set

# adapter: prints the first wireless interface by name; false when there is none. The guests' interface does not count,
# since it is a second one on the same radio.
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

known_adapter='' # the interface of the adapter that know_adapter has read about

# know_adapter INTERFACE: reads at once what decides on an adapter that is plugged in: its $section, the radio's switch,
# the country, its access point, and the bridge of that. Where one cannot be read nothing is known, and each is read by
# whoever needs it, so that what goes without it is done all the same.
know_adapter() {
	device=$(readlink -f "/sys/class/net/$1/device") || return 0
	answer=$(
		read_name "$device" || exit
		exec "$settings_reader" section-name -- access-point unblock -- file "$country_settings" country -- \
			check "$hostapd_files-$1.info" enable yes -- file "$scripts/ifcfg-$1" BRIDGE 2>/dev/null
	)
	[ $? -le 1 ] || return 0
	into section setting_unblock country is_access_point bridge
	[ -n "$section" ] || return 0
	known_adapter=$1 known_settings=unblock
}

# read_name DEVICE: makes what the adapter is called the standard input.
read_name() {
	for file in "$1/../product" "$1/product"; do
		[ -s "$file" ] || continue
		exec <"$file"
		return
	done
	numbers=$(numbers_of "$1") || return
	exec <<-END
		$numbers
	END
}

# PRODUCT names the adapter's section in the access point's settings.
note_adapter() { # INTERFACE
	[ "$known_adapter" = "$1" ] || section=$(section_of "$1") || exit 1
	put "$adapter_info" "INTERFACE=\"$1\"
PRODUCT=\"$section\"" 644
}

# Most USB adapters have a name. Other adapters are known by the numbers of vendor and model, or by their driver.
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

# The kernel knows nothing of it after a boot, or of a radio that is new.
block_if_switched_off() { # INTERFACE
	read_setting unblock
	[ "$answer" = no ] || return 0
	for switch in "/sys/class/net/$1/phy80211"/rfkill*/soft; do
		[ ! -e "$switch" ] || said=$( (echo 1 >"$switch") 2>&1) || fail "cannot block the radio of $1: $said"
	done
}

can_be_access_point() { # INTERFACE
	read -r phy <"/sys/class/net/$1/phy80211/name" && iw phy "$phy" info | awk '
		/Supported interface modes:/ { inside = 1; next }
		inside && $1 != "*" { exit }
		inside && $2 == "AP" { found = 1 }
		END { exit !found }'
}

# access_point_is INTERFACE yes|no: whether an access point has been set up there and is switched on (yes) or off (no).
access_point_is() {
	case $known_adapter,$2 in
	"$1,yes") [ "$is_access_point" = yes ] ;;
	*) ask check "$hostapd_files-$1.info" enable "$2" ;;
	esac
}

set_access_point() { # INTERFACE yes|no
	put "$hostapd_files-$1.info" "enable=\"$2\""
}
