# Networks that are on the air at some hours of the week only.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

# is_off_now SWITCH-KEY SCHEDULE-KEY: whether the schedule is switched on, and keeps its network off the air at this
# hour. A schedule has a digit for each hour of the week, beginning with Sunday's first: 0 is off.
is_off_now() {
	is_on "$1" || return 1
	hours=$(setting "$2") || exit 1
	now=$(date '+%w %H') || fail 'cannot tell the hour of the week'
	day=${now% *} hour=${now#* }
	digit=$(printf '%s' "$hours" | cut -c $((day * 24 + ${hour#0} + 1))) || fail "cannot follow the schedule $2"
	[ "$digit" = 0 ]
}

# An interface that is down is off the air; the daemon puts its network back when it comes up.
apply_main_schedule() { # INTERFACE
	turn=up
	if is_off_now wifi_sched_enabled wifi_sched; then turn=down; fi
	attempt "cannot switch $1 $turn" ip link set dev "$1" "$turn"
}

# A note stands while the schedule starts an access point anew. If the start fails, nothing is on the air any more, and
# the note makes the next hour try again.
lateness() { # INTERFACE
	printf '%s/late-%s' "$state" "$1"
}

note_lateness() { # INTERFACE
	put "$(lateness "$1")" </dev/null
}

is_late() { # INTERFACE
	[ -e "$(lateness "$1")" ]
}

forget_lateness() { # INTERFACE
	remove_files "$(lateness "$1")"
}

# guest_is_late INTERFACE: whether the guest network is on the air and should not be, or the other way round. The daemon
# cannot add or remove a network while it runs, so it has to be started anew then.
guest_is_late() {
	if guest_is_on "$1"; then ! is_there "$guest_interface"; else is_there "$guest_interface"; fi
}
