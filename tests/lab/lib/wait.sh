# Waiting for what takes a moment.
# shellcheck shell=bash

# within SECONDS COMMAND...: waits until the command succeeds; false when it has not in that time.
within() {
  local deadline=$((${EPOCHREALTIME/./} + $1 * 1000000))
  shift
  until "$@"; do
    ((${EPOCHREALTIME/./} < deadline)) || return 1
    sleep 0.1
  done
}

# gone PATH: true once there is no such file.
gone() {
  [[ ! -e $1 ]]
}
