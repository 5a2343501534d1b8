# An adapter that is brought up scans at once, and once; whoever asks meanwhile waits for all of it; nobody is disturbed.
# shellcheck shell=bash

declare -A SCANS=()

# Has the kernel tell of the scans on an appliance, from now on.
follow_scans() {  # NAME
  nsenter --target "${INIT_OF[$1]}" --net iw event >"/run/lab/$1.events" {STEPS}>&- &
  within 5 listens $! || fail "nobody follows the scans of $1"
  SCANS[$1]=0
}

# listens PID: whether a process hears what the kernel tells by its generic sockets, 16 of their kinds.
listens() {
  awk -v process="$1" '$2 == 16 && $3 % 2 ^ 22 == process && $4 !~ /^0+$/ { found = 1 } END { exit !found }' \
    "/proc/$1/net/netlink"
}

started_scans() {  # NAME
  grep -c 'scan started' "/run/lab/$1.events" || :
}

# expect_scans NAME COUNT: so many have begun since the last look.
expect_scans() {
  local all=$((SCANS[$1] + $2))
  expect_same "the scans of $1" "$all" "$(started_scans "$1")"
  SCANS[$1]=$all
}

scan_has_begun() {  # NAME
  (($(started_scans "$1") > SCANS[$1]))
}

# Has somebody else scan on an appliance; returns once that scan is under way.
begin_scan() {  # NAME [WORD OF IW...]
  inside "$1" iw dev wlan0 scan trigger "${@:2}" >/dev/null
  within 2 scan_has_begun "$1" || fail "no scan begins on $1"
}

expect_no_message() {  # NAME TEXT
  ! grep -qF "$2" "$LOGS/$1.syslog" || fail "$1 has reported: $2"
}

access_point square ssid=square channel=1  signal=-40
access_point office ssid=office channel=11 signal=-50
serve office 10.2.0
appliance nas
follow_scans nas

# Each row of the lists in which the two are.
mode=''
through_functions && mode=' opmode=AUTO'
square="essid=square bssid=$(address_of square) channel=1 signal=-40$mode protocol=11b/g auth=OPEN encrypt=NONE"
office="essid=office bssid=$(address_of office) channel=11 signal=-50$mode protocol=11b/g auth=OPEN encrypt=NONE"

say '-- an adapter that was down: the first reading has everything, the second agrees, and one scan is enough for both'
on nas mero-call scan last
expect_output <<END
result=0
$square
$office
END
expect_message nas 'Scan 0: result is un-stable.'
expect_message nas 'Scan 1: success.'
expect_no_message nas 'no scan result'
expect_scans nas 1

say '-- one that is up does not scan for being brought up again'
on nas mero-call scan last
expect_line "$square"
expect_scans nas 0

say '-- nor one that was down for a moment, and has heard of networks'
inside nas ip link set wlan0 down
on nas mero-call scan last
expect_line "$square"
expect_scans nas 0

say '-- while somebody else scans, a reading waits for what that finds'
access_point newcomer ssid=newcomer channel=11 signal=-60
begin_scan nas
on nas /sbin/iwlist wlan0 scanning mero
expect_line "11   newcomer                         $(address_of newcomer)    -60 11b/g     NONE"
expect_scans nas 1

say '-- and who asks for a scan takes that one'
begin_scan nas
on nas /sbin/iwlist wlan0 scanning
expect_line '                    ESSID:"newcomer"'
expect_scans nas 1

say '-- unless that one does not go over all channels'
begin_scan nas freq 2412 passive
on nas /sbin/iwlist wlan0 scanning
expect_line '                    ESSID:"newcomer"'
expect_scans nas 2

say '-- with nobody scanning it is a scan of its own'
on nas /sbin/iwlist wlan0 scanning
expect_line '                    ESSID:"newcomer"'
expect_scans nas 1

say '-- a connection stays as it is'
joins nas office bssid="$(address_of office)" essid=office auth=OPEN encrypt=NONE
SCANS[nas]=$(started_scans nas)
on nas mero-call scan last
expect_scans nas 0
expect_station office nas
leaves nas

# What the supplicant needs to know it has from the look at one channel, which it takes for a scan of its own.
say '-- from nothing to a connection, the program has the radio go over all channels once'
appliance shelf
plug_in shelf
follow_scans shelf
on shelf mero-call save essid=office bssid="$(address_of office)" auth=OPEN encrypt=NONE ip=10.2.0.7 mask=255.255.255.0
on shelf merowireless autoconnect
expect_station office shelf
on shelf sed -n 's/.*scan finished: \([0-9 ]*\),.*/\1/p' <"/run/lab/shelf.events"
expect_same 'how often it went over all channels' 1 "$(grep -c '[0-9] [0-9]' <<<"$OUTPUT")"
expect_same 'the channels that it looked at again' 2462 "$(grep -v '[0-9] [0-9]' <<<"$OUTPUT")"
on shelf mero-call disconnect
expect_line result=0

say '-- an access point comes up beside a scan that has just begun'
inside shelf ip link set wlan0 up
SCANS[shelf]=$(started_scans shelf)
begin_scan shelf
serves shelf ssid=shelf channel=6
guest_of shelf nas essid=shelf auth=OPEN encrypt=NONE
