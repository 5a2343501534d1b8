# Two appliances make a cell by themselves, open or with WEP, and reach each other.
# Limit: 400 s
# shellcheck shell=bash
# shellcheck disable=SC2016  # nothing in a name or a key is to be expanded

appliance nas
appliance other

# meet ESSID ENCRYPTION [KEY=VALUE...]: one appliance starts a cell, the other sees it and joins, and they talk; then
# both leave.
meet() {
  local cell=(essid="$1" opmode=ADHOC encrypt="$2" "${@:3}")
  on nas mero-call adhoc "${cell[@]}"
  expect_line result=0
  on nas mero-call ifconfig wlan0 ip=10.9.0.1 mask=255.255.255.0
  expect_output <<<result=0
  within 20 sees "$1" || fail "the cell $1 is not seen"
  on other mero-call get essid "$1"
  [[ $OUTPUT == *" encrypt=$2" ]] || fail "the cell is not protected by $2"
  # Connecting to a cell is joining it.
  on other mero-call connect "${cell[@]}"
  expect_line result=0
  on other mero-call ifconfig wlan0 ip=10.9.0.2 mask=255.255.255.0
  expect_output <<<result=0
  within 20 same_cell || fail 'they are not in the same cell'
  expect_reachable nas 10.9.0.2
  expect_reachable other 10.9.0.1
  on nas mero-call status
  expect_output <<'END'
result=6
status=CONNECTED_ADHOC
END
  leaves nas
  leaves other
  on nas mero-call status
  expect_output <<'END'
result=4
status=DISCONNECTED
END
}

sees() {  # ESSID
  inside other mero-call scan renew >/dev/null
  inside other mero-call get essid "$1" >/dev/null
}

cell_of() {  # NAME
  ip netns exec "$1" iw dev wlan0 link | awk '$1 == "Joined" { print $3 }'
}

same_cell() {
  [[ $(cell_of nas) && $(cell_of nas) == "$(cell_of other)" ]]
}

say '-- an open cell, whose name means to be a command'
meet '$(touch /tmp/pwned);reboot' NONE

say '-- WEP, with a key of characters and one of digits'
meet barn WEP key='t&r$e'
meet 'l'\''étable "1"' WEP key=00112233445566778899aabbcc

# The program has no words for it.
if through_functions; then
  say '-- what a cell cannot be'
  fails_on nas mero-call adhoc essid=field opmode=MANAGED encrypt=NONE
  expect_message nas 'is not Adhoc mode.'
  fails_on nas mero-call adhoc essid=field opmode=ADHOC encrypt=AES
  expect_message nas 'Adhoc mode does not support encryption [AES].'
  expect_nothing_left nas
fi
