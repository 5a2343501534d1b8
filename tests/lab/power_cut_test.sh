#!/bin/bash
# power_cut_test.sh POWER-CUT
#
# What the program that makes disks as losses of power leave them promises, by a log of writes that is made here.
set -euo pipefail
cut=$1
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
cd "$work"

number() {  # BYTES NUMBER
  local i
  # shellcheck disable=SC2059  # the format is the number
  for ((i = 0; i < $1; i++)); do printf "\\x$(printf %x $(($2 >> 8 * i & 255)))"; done
}

fill() {  # BYTES
  head -c "$1" /dev/zero
}

blocks() {  # COUNT LETTER
  fill $((4096 * $1)) | tr '\0' "$2"
}

entry() {  # BLOCK BLOCKS FLAGS [MARK]
  number 8 $(($1 * 8))
  number 8 $(($2 * 8))
  number 8 "$3"
  number 8 $((${#4}))
  printf '%s' "$4"
  fill $((512 - 32 - ${#4}))
}

{
  number 8 0x6a736677736872
  number 8 1
  number 8 8
  number 4 512
  fill $((512 - 28))
  entry 0 1 0 '' && blocks 1 A
  entry 0 0 1 ''
  entry 0 0 8 1
  entry 1 2 0 '' && blocks 2 B
  entry 0 1 0 '' && blocks 1 C
  entry 3 1 2 '' && blocks 1 D
  entry 0 0 1 ''
  entry 0 1 4 ''
} >log
truncate -s $((4 * 4096)) first

# disk PLACE WAY SEED: the disk, a letter a block.
disk() {
  "$cut" make log first disk "$@"
  [[ $(stat -c %s disk) -eq 16384 ]]
  tr '\0' 0 <disk | fold -w 4096 | tr -s A-D0 | tr -d '\n'
}

expect() {  # EXPECTED SEEN WHAT
  [[ $1 == "$2" ]] || {
    printf '%s: expected\n%s\nseen\n%s\n' "$3" "$1" "$2"
    exit 1
  }
}

expect '2 - 0
3 1 3
6 1 0
7 1 1' "$("$cut" list log)" 'the places'

expect 'A000' "$(disk 2 none 0)" 'what was flushed'
expect 'A000' "$(disk 3 none 0)" 'nothing of what follows'
expect 'CBBD' "$(disk 7 none 0)" 'all of it'
expect '0BBD' "$(disk 8 none 0)" 'what was given up'
some='' torn=''
for seed in {1..20}; do
  some+=$(disk 3 some "$seed")$'\n'
  torn+=$(disk 3 torn "$seed")$'\n'
done
expect "$(disk 3 torn 20)" "${torn: -5:4}" 'the same seed'
expect '' "$(printf %s "$some" | grep -vE '^[AC](00|BB)[0D]$')" 'some of what follows'
[[ $some == *A* && $some == *C* && $some == *00* && $some == *BB* && $some == *D* ]]
expect '' "$(printf %s "$torn" | grep -vE '^[AC][0B][0B][0D]$')" 'torn writes'
[[ $torn == *0B* && $torn == *B0* ]]

# judged NAME SEEN BEFORE AFTER: what is said of a file; '-' is none.
judged() {
  local directory text
  for directory in seen before after; do
    shift
    rm -rf "$directory"
    mkdir -p "$directory/$(dirname "$name")"
    text=$1
    # shellcheck disable=SC2059  # it has line feeds
    [[ $text == - ]] || printf "$text" >"$directory/$name"
  done
  { "$cut" judge seen before after 2>&1 && echo whole || echo lost; } | sed -E '/^(old|new|between)/s/ [0-9a-f]+$//'
}

while IFS='|' read -r name seen before after expected; do
  expect "$expected" "$(judged "$name" "$seen" "$before" "$after" | xargs)" "$name: $seen of $before and $after"
done <<'END'
usr/mero/etc/wireless.conf|a\n|a\n|b\n|old whole
usr/mero/etc/wireless.conf|b\n|a\n|b\n|new whole
usr/mero/etc/wireless.conf|-|a\n|-|new whole
usr/mero/etc/wireless.conf||-|a\n|between whole
usr/mero/etc/wireless.conf||a\n|b\n|usr/mero/etc/wireless.conf is neither the old one nor the new one between lost
usr/mero/etc/wireless.conf|-|a\n|b\n|usr/mero/etc/wireless.conf is neither the old one nor the new one between lost
usr/mero/etc/.wireless.conf.new|a|-|-|old left whole
etc/hostapd/hostapd-wlan0.info.qyxwvutsrq|a|-|-|old left whole
etc/hostapd/hostapd-wlan0-host.conf|a|ab\n|b\n|old damaged whole
etc/hostapd/hostapd-wlan0-guest.info|-|ab\n|b\n|old damaged whole
etc/hostapd/hostapd-wlan0.info||a=1\n|a=2\n|etc/hostapd/hostapd-wlan0.info has lost a between lost
etc/dhcpd/x.conf|a=2\nb=1\n|a=1\nb=1\n|a=2\nb=2\n|between whole
etc/dhcpd/x.conf|a=2\n|a=1\nb=1\n|a=2\n|new whole
etc/dhcpd/x.conf|a=2\nb=|a=1\nb=1\n|a=2\nb=2\n|etc/dhcpd/x.conf does not end etc/dhcpd/x.conf has a line that never was between lost
etc/dhcpd/x.conf|a=1\na=1\nb=2\n|a=1\nb=1\n|a=2\nb=2\n|etc/dhcpd/x.conf has a line twice between lost
etc/dhcpd/x.conf|-|a=1\nb=1\n|a=2\nb=2\n|etc/dhcpd/x.conf is gone between lost
END

if "$cut" list first >/dev/null 2>said; then exit 1; fi
expect 'power-cut: this is no log of writes' "$(<said)" 'what is no log'
head -c 3000 log >short
if "$cut" list short >/dev/null 2>said; then exit 1; fi
expect 'power-cut: the log is cut short' "$(<said)" 'a log that is cut short'
