# Networks that are on the air at some hours of the week only.
# shellcheck shell=sh
# shellcheck disable=SC2034,SC2154  # what the other parts use, and set

# read_schedules INTERFACE: reads at once what the hour's run goes by.
read_schedules() {
	known_settings='wifi_sched_enabled wifi_sched guest_net_sched_enable guest_net_sched'
	# shellcheck disable=SC2086  # words
	ask access-point $known_settings -- check "$hostapd_files-$1-guest.info" enable yes -- \
		check "$hostapd_files-$1.info" enable yes || : # they are off
	into setting_wifi_sched_enabled setting_wifi_sched setting_guest_net_sched_enable setting_guest_net_sched has_guests \
		is_switched_on
	known_guests=$1
}

# is_off_now SWITCH-KEY SCHEDULE-KEY: whether the schedule is switched on, and keeps its network off the air at this
# hour. A schedule has a digit for each hour of the week, beginning with Sunday's first: 0 is off.
is_off_now() {
	is_on "$1" || return 1
	read_setting "$2"
	hours=$answer
	now=$(date '+%w %H') || fail 'cannot tell the hour of the week'
	day=${now% *} hour=${now#* }
	passed=$((day * 24 + ${hour#0}))
	while [ $passed -gt 0 ]; do
		hours=${hours#?} passed=$((passed - 1))
	done
	case $hours in 0*) ;; *) return 1 ;; esac
}

# Whether the main network's interface is to be up or down at this hour: an interface that is down is off the air, and the
# daemon puts its network back when it comes up. It is decided once for each run, since the hour may change meanwhile.
turn=up

decide_on_main() {
	turn=up
	if is_off_now wifi_sched_enabled wifi_sched; then turn=down; fi
}

turn_main() { # INTERFACE
	is_switched "$1" "$turn" || attempt "cannot switch $1 $turn" ip link set dev "$1" "$turn"
}

is_switched() { # INTERFACE up|down
	read -r flags <"/sys/class/net/$1/flags" || return 1
	case $2,$((flags & 1)) in up,1 | down,0) ;; *) return 1 ;; esac
}

# A note stands while the schedule starts an access point anew. If the start fails, nothing is on the air any more, and
# the note makes the next hour try again.
lateness=$state/late # with -INTERFACE behind it

note_lateness() { # INTERFACE
	note "$lateness-$1" ''
}

is_late() { # INTERFACE
	[ -e "$lateness-$1" ]
}

forget_lateness() { # INTERFACE
	remove_files "$lateness-$1"
}

# guest_is_late INTERFACE: whether the guest network is on the air and should not be, or the other way round. The daemon
# cannot add or remove a network while it runs, so it has to be started anew then.
guest_is_late() {
	if guest_is_on "$1"; then ! is_there "$guest_interface"; else is_there "$guest_interface"; fi
}
