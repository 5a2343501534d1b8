# The program that makes the calls: mero-call, which calls the library's functions, or program-call, which runs the
# management program.
# shellcheck shell=bash

# through_functions: true when the calls go to the library's functions, and false when the program is run instead, for
# the places where it does otherwise on purpose.
through_functions() {
  [[ ! $LAB_PROGRAM ]]
}

# ends_with NAME STATUS COMMAND...: on an appliance, a command of the program ends with that status, and gives its reason
# on the standard error output alone, which is kept in ERRORS.
ends_with() {
  local status=0
  say_words "$1$ merowireless" "${@:3}"
  inside "$1" merowireless "${@:3}" >"$LOGS/$1.output" 2>"$LOGS/$1.errors" || status=$?
  ERRORS=$(<"$LOGS/$1.errors")
  show <<<"$ERRORS"
  expect_same "the status of $3" "$2" "$status"
  expect_same "the output of $3" '' "$(<"$LOGS/$1.output")"
  grep -q '^merowireless: .*: ' <<<"$ERRORS" || fail "no reason is given: $ERRORS"
}
