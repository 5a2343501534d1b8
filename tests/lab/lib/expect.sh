# Expectations of a scenario. One that is not met ends the scenario, and shows the expected and the seen value.
# shellcheck shell=bash

# expect_same WHAT EXPECTED SEEN
expect_same() {
  [[ $2 == "$3" ]] || fail "$1 is not as expected:
$(differences "$2" "$3")"
}

differences() {  # EXPECTED SEEN
  # Exits with 1 for what differs, which is what it is asked about.
  diff -U 99 --label expected <(printf '%s\n' "$1") --label seen <(printf '%s\n' "$2") || (($? == 1))
}

# expect_output: what the last command printed is what stands on standard input.
expect_output() {
  expect_same 'the output' "$(cat)" "$OUTPUT"
}

# expect_line LINE: the last command printed that line, among others.
expect_line() {
  grep -qxF -e "$1" <<<"$OUTPUT" || fail "the output lacks the line
  $1
it is
$OUTPUT"
}

# expect_no_line REGEX: the last command printed no line that the extended regular expression matches.
expect_no_line() {
  ! grep -qE -e "$1" <<<"$OUTPUT" || fail "the output should have no line that matches
  $1
it is
$OUTPUT"
}

# expect_file NAME PATH: a file of the appliance holds what stands on standard input.
expect_file() {
  expect_same "$2 on $1" "$(cat)" "$(inside "$1" cat "$2")"
}

# expect_mode NAME PATH MODE: a file of the appliance has these permissions.
expect_mode() {
  expect_same "the mode of $2 on $1" "$3" "$(inside "$1" stat -c %a "$2")"
}

# expect_message NAME TEXT: the appliance's system log has a line with that text.
expect_message() {
  grep -qF -e "$2" "$LOGS/$1.syslog" || fail "the system log of $1 lacks
  $2
it has
$(cat "$LOGS/$1.syslog")"
}
