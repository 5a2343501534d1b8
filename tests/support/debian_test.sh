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
  debian_trust() { :; }
  debian_suite() { echo bookworm; }
}

# An archive on this machine that calls itself by the name of its suite.
make_archive() { # DIRECTORY SUITE CODENAME
  local architecture release=$1/dists/$2 packages
  architecture=$(dpkg --print-architecture)
  packages=main/binary-$architecture/Packages
  mkdir -p "$release/${packages%/*}"
  printf 'Package: nothing\nVersion: 1\nArchitecture: all\nFilename: nothing\nSize: 0\n' >"$release/$packages"
  printf '%s\n' 'Origin: Debian' "Suite: $2" "Codename: $3" "Architectures: $architecture" 'Components: main' \
    'Date: Sun, 22 Nov 2026 12:00:00 UTC' 'SHA256:' \
    " $(sha256sum <"$release/$packages" | cut -d ' ' -f 1) $(wc -c <"$release/$packages") $packages" >"$release/Release"
}

# Has apt be that of a machine whose files of settings and sources are in a directory.
apt_is_that_of() { # DIRECTORY
  mkdir -p "$1"/etc/apt/{apt.conf,preferences,sources.list}.d "$1"/var/lib/{apt/lists/partial,dpkg} "$1/var/cache/apt"
  : >"$1/var/lib/dpkg/status"
  printf 'Dir "%s";\nDir::State::status "%s";\nAPT::Sandbox::User "";\n' "$1" "$1/var/lib/dpkg/status" >"$1/apt.conf"
  export APT_CONFIG=$1/apt.conf
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
    apt_knows '/a.list:1 http://archive bookworm main' '/a.list:1 http://archive bookworm-updates main' \
      '/a.list:2 http://archive bookworm main' '/a.list:3 http://security bookworm-security main'
    debian_archives trixie | diff - <(printf '%s\n' 'deb http://archive trixie main' \
      'deb http://archive trixie-updates main' 'deb http://security trixie-security main')
    # Lists of another suite that the machine has too went unchanged into the system.
    apt_knows '/a.list:1 http://archive bookworm main' '/a.list:2 http://archive sid main' \
      '/a.list:3 http://bookworm/archive sid main'
    debian_archives trixie | diff - <(echo 'deb http://archive trixie main')
    ;;
  foreign) # and where it has no others, the system would have been one of that suite.
    apt_knows '/a.list:1 http://archive sid main'
    if debian_archives trixie >"$work/out" 2>"$work/said"; then
      echo 'there are archives'
      exit 1
    fi
    [[ ! -s $work/out ]]
    grep -qx "this machine's apt has no list of the packages of Debian bookworm: run apt-get update" "$work/said"
    ;;
  sources) # A machine that called its suite oldstable got no other; what its sources said of trust was lost.
    make_archive "$work/archive" oldstable bookworm
    make_archive "$work/security" oldstable-security bookworm-security
    apt_is_that_of "$work/apt"
    line="arch=$(dpkg --print-architecture) trusted=yes  check-valid-until=no"
    printf '%s\n' '# ours' "deb [ $line ] file:$work/archive oldstable main" >"$work/apt/etc/apt/sources.list"
    printf '%s\n' '# and' '' 'Types: deb' '# by hand' "URIs: file:$work/security" 'Suites: oldstable-security' \
      'Components: main' 'Trusted: yes' >"$work/apt/etc/apt/sources.list.d/security.sources"
    apt-get --quiet=2 update
    debian_archives trixie | diff - <(
      echo "deb [trusted=yes check-valid-until=no] file:$work/archive/ trixie main"
      echo "deb [trusted=yes] file:$work/security/ trixie-security main"
    )
    ;;
  settings) # A machine that reaches archives through a proxy alone made no system. Those of apt 3 are its own affair.
    apt_knows '/a.list:1 http://archive bookworm main'
    apt_is_that_of "$work/apt"
    printf '%s\n' 'Acquire::http::Proxy "http://proxy:3142";' 'Acquire::Check-Valid-Until "false";' \
      'Acquire::Languages "none";' 'APT::Get::Assume-Yes "true";' \
      'Acquire::Snapshots::URI::Override::Label::Debian "https://snapshots/";' >"$work/apt/etc/apt/apt.conf.d/50ours"
    mmdebstrap() { cat >/dev/null && printf '%s\n' "$@" | grep Acquire | sort >"$work/settings"; }
    make_debian trixie "$work/system"
    # Others could read the password of a proxy in it.
    [[ $(stat -c %a "$work/system") == 600 ]]
    diff "$work/settings" - <<'END'
--aptopt=Acquire::AllowDowngradeToInsecureRepositories "0";
--aptopt=Acquire::AllowInsecureRepositories "0";
--aptopt=Acquire::AllowWeakRepositories "0";
--aptopt=Acquire::Check-Valid-Until "false";
--aptopt=Acquire::http::Proxy "http://proxy:3142";
END
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
  kept) # until something else is to be in it, or it comes from elsewhere
    apt_knows '/a.list:1 http://archive bookworm main'
    make_debian() { shift && echo "$*" >>"$work/made" && echo "$*" >"$1"; }
    first=$(debian_root "$work/kept" small bookworm amd64 one two)
    [[ $(debian_root "$work/kept" small bookworm amd64 two one) == "$first" ]]
    other=$(debian_root "$work/kept" large bookworm amd64 one)
    second=$(debian_root "$work/kept" small bookworm amd64 one)
    [[ $(wc -l <"$work/made") -eq 3 && -e $second && -e $other && ! -e $first ]]
    grep -q -- '--include=one,two' "$work/made"
    [[ $(debian_root "$work/kept" small bookworm amd64 one) == "$second" ]]
    apt_knows '/a.list:1 http://elsewhere bookworm main'
    third=$(debian_root "$work/kept" small bookworm amd64 one)
    debian_settings() { echo 'Acquire::http::Proxy "http://proxy:3142";'; }
    fourth=$(debian_root "$work/kept" small bookworm amd64 one)
    [[ $third != "$second" && $fourth != "$third" ]]
    # One that could not be made took the last one along.
    make_debian() { return 1; }
    if debian_root "$work/kept" small bookworm amd64 three; then exit 1; fi
    [[ -e $fourth ]]
    ;;
  files) # An archive with a key of its own was there when the system was made, and unknown within.
    mkdir -p "$work"/system/etc/apt/apt.conf.d "$work/own"
    for name in key second authority secret kept; do echo "our $name" >"$work/own/$name"; done
    chmod 600 "$work/own/secret"
    printf '%s\n' "deb [trusted=yes signed-by=$work/own/key,$work/own/second,$work/own/kept] http://archive trixie main" \
      "deb [signed-by=$work/own/none] http://archive trixie main" '# signed-by=/etc/passwd' \
      >"$work/system/etc/apt/sources.list"
    printf '%s\n' "Acquire::https::CaInfo \"$work/own/authority\";" "Acquire::https::archive::SslKey \"$work/own/secret\";" \
      'Acquire::http::Proxy "http://proxy:3142";' >"$work/system/etc/apt/apt.conf.d/99mmdebstrap"
    mkdir -p "$work/system$work/own"
    echo "the system's" >"$work/system$work/own/kept"
    debian_files_for_apt "$work/system"
    (cd "$work/system$work/own" && grep -H . ./* | sort && stat -c '%n %a' secret) | diff - <(
      printf '%s\n' './authority:our authority' "./kept:the system's" './key:our key' './second:our second' \
        './secret:our secret' 'secret 600'
    )
    [[ ! -e $work/system/etc/passwd ]]
    ;;
  entered)
    needs_root
    make_small_system
    # shellcheck disable=SC2016  # for the shell inside
    said=$(FOREIGN=1 in_debian "$work/system.tar" -b "$work/lent" /srv/lent sh -c 'touch /srv/lent/seen; ls / | grep -v lib64; env | sort
      readlink /proc/self/ns/pid >/srv/lent/processes; unshare -U -r id -u
      read -r line && echo "$line"; exit 7' <<<'what it reads' 2>&1) || status=$?
    diff - <(printf '%s\n' "$said") <<'END'
bin
dev
etc
lib
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
