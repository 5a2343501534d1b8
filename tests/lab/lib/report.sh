# Messages of a script, and its end when something is not as it should be.
# shellcheck shell=bash

# Where the steps are told: standard output, unless a script sends them elsewhere.
exec {STEPS}>&1

# The seconds since the machine was switched on.
uptime_seconds() {
  local seconds
  read -r seconds _ </proc/uptime
  printf '%s' "$seconds"
}

# say TEXT...: tells a step.
say() {
  printf '%6s  %s\n' "$(uptime_seconds)" "$*" >&"$STEPS"
}

# say_words TEXT WORD...: tells a step that a command takes, with the words as a shell has to be given them.
say_words() {
  local words
  printf -v words ' %q' "${@:2}"
  say "$1$words"
}

# show: passes on what it reads, set off from the steps.
show() {
  sed 's/^/        | /' >&"$STEPS"
}

# The line of the script that is being run, as FILE:LINE.
place_in_script() {
  local frame
  for ((frame = 1; frame < ${#BASH_SOURCE[@]}; frame++)); do
    [[ ${BASH_SOURCE[frame]} == "$SCRIPT" ]] || continue
    printf '%s:%s' "${SCRIPT#"$HOST"}" "${BASH_LINENO[frame - 1]}"
    return
  done
}

# fail TEXT: ends the script, unmet.
fail() {
  trap - ERR
  printf '\nFAILED at %s\n%s\n\n' "$(place_in_script)" "$*" >&2
  exit 1
}
