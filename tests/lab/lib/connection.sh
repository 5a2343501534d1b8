# Connections: how an appliance joins, what it runs meanwhile, and what has to be gone afterwards.
# shellcheck shell=bash

# joins NAME ACCESS-POINT KEY=VALUE...: an appliance connects, with these values, and is then a station of that access
# point, past whatever that demands.
joins() {
  local began=${EPOCHREALTIME/./}
  on "$1" mero-call connect "${@:3}"
  # Each poll begins with a second's sleep.
  say "joined within $(((${EPOCHREALTIME/./} - began) / 1000000)) polls"
  # The supplicant's messages are there too: Debian's shell does not know the redirection that keeps them away.
  expect_line result=0
  expect_station "$2" "$1"
  expect_nothing_inherited "$1"
}

# refused NAME KEY=VALUE...: an appliance connects, with these values, in vain.
refused() {
  fails_on "$1" mero-call connect "${@:2}"
  expect_line result=-1
}

# leaves NAME: an appliance disconnects, and nothing of the connection is left.
leaves() {
  on "$1" mero-call disconnect
  expect_nothing_left "$1"
}

# station ACCESS-POINT NAME: the appliance is a station of that access point, on any of its networks, and its traffic
# passes.
station() {
  networks_of "$1" | awk -v address="$(address_of "$2")" '
    $1 == "Station" { this = $2 == address }
    this && $1 == "authorized:" && $2 == "yes" { found = 1 }
    END { exit !found }'
}

networks_of() {  # ACCESS-POINT
  local interface
  for interface in $(ip netns exec "$1" iw dev | awk '$1 == "Interface" { print $2 }'); do
    ip netns exec "$1" iw dev "$interface" station dump
  done
}

expect_station() {  # ACCESS-POINT NAME
  within 2 station "$1" "$2" || fail "$2 is no station of $1"
}

no_station() {  # ACCESS-POINT NAME
  ! station "$@"
}

expect_no_station() {  # ACCESS-POINT NAME
  no_station "$1" "$2" || fail "$2 is a station of $1"
}

# processes_of NAME: the processes of an appliance but for its own, the first one and the system log; each as its pid
# there and its command line.
processes_of() {
  local directory words
  for directory in /proc/"${INIT_OF[$1]}"/root/proc/[0-9]*; do
    words=$(tr '\0' ' ' <"$directory/cmdline")
    case $words in
      '' | *guest/appliance* | *syslogd*) ;;
      *) printf '%s %s\n' "${directory##*/}" "$words" ;;
    esac
  done
}

# expect_processes NAME: these command lines, and no others, stand on standard input, in alphabetical order.
expect_processes() {
  expect_same "what runs on $1" "$(cat)" "$(processes_of "$1" | sed 's/^[0-9]* //; s/ $//' | sort)"
  expect_nothing_inherited "$1"
}

# The process is a daemon: it holds nothing of the process that started it, no file, no terminal and no end of a pipe.
# Logs and leases are its own.
expect_nothing_inherited() {  # NAME
  local process _ held
  while read -r process _; do
    held=$(descriptors_of "$1" "$process")
    [[ $(head -n 3 <<<"$held" | sort -u) == /dev/null ]] || fail "a daemon of $1 keeps standard descriptors:
$held"
    ! grep -qvE '^(/dev/null|/run/rc\.network/.*|(socket|pipe|anon_inode):.*)$' <<<"$held" || fail "a daemon of $1 keeps files open:
$held"
  done < <(processes_of "$1")
}

descriptors_of() {  # NAME PID
  local directory=/proc/${INIT_OF[$1]}/root/proc/$2/fd
  find "$directory" -type l -printf '%f %l\n' | sort -n | cut -d ' ' -f 2-
}

# transient_files NAME: what an appliance has in directories that were empty when it was switched on, and what is half
# written anywhere.
transient_files() {
  local root=/proc/${INIT_OF[$1]}/root
  (
    cd "$root" || exit
    find run tmp var/tmp ! -type d ! -path run/syslogd.pid
    find usr/mero etc -name '*.new'
  ) | sort
}

nothing_runs() {  # NAME
  [[ ! $(processes_of "$1") ]]
}

# expect_nothing_left NAME: no daemon, address, route, marker, record or half-written file is left of a connection.
expect_nothing_left() {
  within 2 nothing_runs "$1" || fail "this still runs on $1: $(processes_of "$1")"
  expect_same "the addresses of $1" '' "$(ipv4_of "$1")"
  expect_same "the routes of $1" '' "$(ip -n "$1" route)"
  expect_same "what lies about on $1" '' "$(transient_files "$1")"
}
