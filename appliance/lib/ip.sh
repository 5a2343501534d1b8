# Commands of ip, which are planned first, and then run in one process.
# shellcheck shell=sh
# shellcheck disable=SC2154  # what the other parts set

commands='' complaints='' # a line for each command, and for what cannot be done without it

# plan TEXT COMMAND: adds a command of ip to those that run_plan runs. The script ends with the text if it fails.
plan() {
	complaints=$complaints$1$newline commands=$commands$2$newline
}

# run_plan: runs the commands that are planned, in their order, and puts into $said what they say. At the first one that
# fails, the script ends with its text and with the reason.
run_plan() {
	[ -n "$commands" ] || return 0
	said=$(printf '%s' "$commands" | ip -4 -oneline -batch - 2>&1) || fail_plan
	commands='' complaints=''
}

# ip tells the number of the line that has failed. If it does not understand a command it only names the wrong word.
fail_plan() {
	reason=${said%%"${newline}Command failed -:"*} reason=${reason##*"$newline"}
	failed='' wrong=''
	case $said in
	*"Command failed -:"*) failed=${said##*Command failed -:} ;;
	*\"*\"*) wrong=${said%\"*} wrong=${wrong##*\"} ;;
	esac
	number=0
	while [ -n "$commands" ]; do
		number=$((number + 1)) complaint=${complaints%%"$newline"*} command=${commands%%"$newline"*}
		[ "$number" != "$failed" ] || break
		case " $command " in *" ${wrong:-$newline} "*) break ;; esac
		complaints=${complaints#*"$newline"} commands=${commands#*"$newline"}
	done
	fail "$complaint: ${reason:-ip ended with a failure}"
}
