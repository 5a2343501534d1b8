#!/bin/bash
# debian_test.sh CASE
#
# What debian.sh promises to those who make Debian systems for tests, and enter them.
set -euo pipefail
support=$(realpath "$(dirname "$0")")
work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
# shellcheck source=tests/support/debian.sh
. "$support/debian.sh"

# Has apt tell of the archives that it is told of here.
apt_knows() { # LINE...
  printf '%s\n' "$@" >"$work/archives"
  apt-get() { cat "$work/archives"; }
  debian_suite() { echo bookworm; }
}

# The archive of a system that consists of busybox, under all of its names.
make_small_system() {
  local root=$work/root applet
  mkdir -p "$root"/{bin,dev,etc,proc,sys}
  cp "$(type -P busybox)" "$root/bin/busybox"
  for applet in $(busybox --list); do [[ -e $root/bin/$applet ]] || ln -s busybox "$root/bin/$applet"; done
  { ldd "$root/bin/busybox" | grep -o '/[^ ]*' || :; } | while read -r file; do # a static one needs none
    mkdir -p "$root${file%/*}"
    cp -L "$file" "$root$file"
  done
  tar --create --file "$work/system.tar" --directory "$root" .
  mkdir "$work/lent"
}

needs_root() {
  if [[ $EUID -ne 0 ]]; then
    echo 'only root enters a system'
    exit 77
  fi
}

case $1 in
  suite) # with those of security and of updates
    apt_knows 'deb http://archive bookworm main' 'deb http://archive bookworm-updates main' \
      'deb http://archive bookworm main' 'deb http://security bookworm-security main'
    debian_archives trixie | diff - <(printf '%s\n' 'deb http://archive trixie main' \
      'deb http://archive trixie-updates main' 'deb http://security trixie-security main')
    ;;
  unknown) # A system was made of nothing, and mmdebstrap said what it was missing.
    apt_knows
    : >"$work/archives"
    if debian_archives trixie >"$work/out" 2>"$work/said"; then
      echo 'there are archives'
      exit 1
    fi
    [[ ! -s $work/out ]]
    grep -q 'run apt-get update$' "$work/said"
    ;;
  kept) # until something else is to be in it
    make_debian() { shift && echo "$*" >>"$work/made" && echo "$*" >"$1"; }
    first=$(debian_root "$work/kept" small bookworm amd64 one two)
    [[ $(debian_root "$work/kept" small bookworm amd64 two one) == "$first" ]]
    other=$(debian_root "$work/kept" large bookworm amd64 one)
    second=$(debian_root "$work/kept" small bookworm amd64 one)
    [[ $(wc -l <"$work/made") -eq 3 && -e $second && -e $other && ! -e $first ]]
    grep -q -- '--include=one,two' "$work/made"
    ;;
  entered)
    needs_root
    make_small_system
    # shellcheck disable=SC2016  # for the shell inside
    said=$(FOREIGN=1 in_debian "$work/system.tar" -b "$work/lent" /srv/lent sh -c 'touch /srv/lent/seen; ls /; env | sort
      readlink /proc/self/ns/pid >/srv/lent/processes; unshare -U -r id -u
      read -r line && echo "$line"; exit 7' <<<'what it reads' 2>&1) || status=$?
    diff - <(printf '%s\n' "$said") <<'END'
bin
dev
etc
lib
lib64
proc
srv
sys
DEBIAN_FRONTEND=noninteractive
HOME=/root
LC_ALL=C.UTF-8
PATH=/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin
PWD=/
SHLVL=1
0
what it reads
END
    [[ $status -eq 7 && -e $work/lent/seen && $(<"$work/lent/processes") != "$(readlink /proc/self/ns/pid)" ]]
    ;;
  left) # Whoever is killed takes the machine along.
    needs_root
    make_small_system
    mkfifo "$work/lent/lives"
    # shellcheck disable=SC2016  # for the shells
    bash -c '. "$0" && in_debian "$1" -b "$2" /srv sh -c "exec 3>/srv/lives && echo yes >&3 && sleep 600"; :' \
      "$support/debian.sh" "$work/system.tar" "$work/lent" &
    {
      read -r lives
      kill -KILL $!
      timeout 20 cat # until nobody holds the other end
    } <"$work/lent/lives"
    [[ $lives == yes && -z $(ls -A "$work/system") ]]
    if grep "$work" /proc/mounts; then exit 1; fi
    ;;
esac
