# Whether the program says what is so.
# shellcheck shell=bash

# expect_no_lie NAME: what the program says of an appliance's connection, access point, radio and known networks is what
# the kernel, the daemons and the settings say.
expect_no_lie() {
  local look readings differences status
  for ((look = 1; look <= 20; look++)); do
    status=0
    readings=$(inside "$1" sh -c "$(<"$LAB/guest/readings")" readings </dev/null)
    differences=$(awk -f "$LAB/lib/truth.awk" <<<"$readings") || status=$?
    # What has changed while it was looked at is looked at again.
    ((status == 2)) || break
  done
  ((status == 0)) || fail "the program does not say what is so on $1, at look $look:
$differences
All that was said:
$readings"
}

# does NAME COMMAND...: a command of the program succeeds, and the program says what is so afterwards.
does() {
  on "$1" merowireless "${@:2}"
  expect_no_lie "$1"
}

# does_not NAME STATUS COMMAND...: it ends with that status, and the program says what is so afterwards.
does_not() {
  ends_with "$@"
  expect_no_lie "$1"
}
