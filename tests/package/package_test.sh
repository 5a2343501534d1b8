#!/usr/bin/env bash
# package_test.sh DIRECTORY [SUITE]: what the packages in that directory do to a Debian system of their own; with a
# suite, what becomes of them when that system is upgraded to the Debian of that name. Says `ok` or `not ok` and what it
# is about, in a line each; fails if anything did.
#
# The system is made by mmdebstrap, of the Debian archives that this machine uses, and kept beside the packages for the
# time. It has compilers and what the packages depend on, and nothing of ours. While it is looked at, it has no network:
# what an upgrade of the system takes is fetched before.
set -euo pipefail

here=$(dirname "$(realpath "$0")")
readonly here later=$here/../support/later-package
# shellcheck source=tests/support/checks.sh
. "$here/../support/checks.sh"
# shellcheck source=tests/package/system.sh
. "$here/system.sh"

readonly users_settings=(
  /usr/mero/etc/wireless.conf
  /usr/mero/etc/wireless_ap.conf
  /etc/hostapd/hostapd-wlan0.info
  /etc/dhcpd/dhcpd-lbr0-lbr0.conf
  /etc/sysconfig/network-scripts/ifcfg-lbr0
)

# What the kit says that cannot be installed.
readonly refusal='this kit refuses to be installed'

# ---- The packages -----------------------------------------------------------------------------------------------

names() { (cd "$root/tmp/packages" && printf '%s\n' *.deb | sed 's/_.*//'); }

# The same packages, of a later version, and as the first release had them; and the kit of one that cannot be installed.
make_other_versions() {
  local package
  for package in "$root"/tmp/packages/*.deb; do
    "$later" "$package" "$root/tmp/upgrades"
    "$here/released-package" "$package" "$root/tmp/released"
  done
  "$later" "$root"/tmp/packages/merowireless-appliance_*.deb "$root/tmp/failing" "\$a echo '$refusal' >&2; exit 1"
}

# The tools as Debian 13 has them, which says /usr/sbin where Debian 12 says /sbin: of a later version.
make_later_tools() {
  local work=$root/tmp/work package
  package=$(echo "$root"/srv/tools/*.deb)
  dpkg-deb --raw-extract "$package" "$work"
  if [[ -d $work/sbin ]]; then
    mv "$work/sbin" "$work/usr/"
    sed -i 's,  sbin/,  usr/sbin/,' "$work/DEBIAN/md5sums"
  fi
  sed -Ei 's/^(Version: .*)/\1+later/' "$work/DEBIAN/control"
  mkdir "$root/tmp/later-tools"
  dpkg-deb --root-owner-group -Znone --build "$work" "$root/tmp/later-tools/${package##*/}" >/dev/null
  rm -r "$work"
}

# The same measure as that of the build: what a program loads.
libraries_are_small() {
  local libraries=("$root"/usr/lib/*/libmero*.so.*.*)
  [[ ${#libraries[@]} -eq 3 ]] && "$here/../abi/size_test.sh" strip readelf 102400 "${libraries[@]}" >/dev/null
}

# What Debian's own compiler options ask for of its release. The libraries go without some of it, to be small.
is_hardened() {
  local marks=() flags
  flags=$(inside env DEB_BUILD_MAINT_OPTIONS=hardening=+all dpkg-buildflags --get CXXFLAGS)
  [[ $flags != *-fcf-protection* ]] || marks=(--control-flow)
  "$here/hardening" "${marks[@]}" "$root"/usr/lib/*/libmero*.so.*.* "$root"/usr/bin/merowireless \
    "$root"/usr/sbin/iwlist "$root"/usr/mero/sbin/mero-settings >&2
}

has_no_network() {
  [[ $(inside ls /sys/class/net) == lo && $(inside ip -brief link) == lo\ * ]]
}

scan_says_that_there_is_no_adapter() {
  local status=0 said
  said=$(inside merowireless scan 2>&1) || status=$?
  echo "merowireless scan: exit status $status: $said" >&2
  [[ $status -eq 3 && $said == 'merowireless: '*adapter* && $said != *$'\n'* ]]
}

iwlist_passes_on() {
  [[ $(inside iwlist --help 2>&1) == *frequency* ]]
}

iwlist_lists() {
  [[ $(inside iwlist wlan0 scanning mero 2>&1) == 'iwlist: '* ]]
}

loses_listing_tool() { # COMMAND...
  quietly "$@" && ! iwlist_lists 2>/dev/null
}

# Whoever brings the ordinary tool, ours stays where the library looks for it.
listing_tool_outlasts() { # COMMAND...
  quietly "$@" && iwlist_lists && iwlist_passes_on
}

settings_are_told() {
  [[ $(inside /usr/mero/sbin/mero-settings access-point guest_net_lan_block) == 1 ]]
}

completes_in_bash() {
  quietly inside bash -c '. /usr/share/bash-completion/completions/merowireless && complete -p merowireless'
}

# The example, built by a command in a directory of its own, runs: here it ends with 1, as whenever it finds no network.
builds_and_runs() { # PROGRAM COMMAND
  local status=0
  rm -rf "$root/tmp/example"
  cp -r "$root/usr/share/doc/libmerowireless-core-dev/examples/scan-one" "$root/tmp/example"
  quietly inside sh -c "cd /tmp/example && $2" || return
  inside "/tmp/example/$1" || status=$?
  [[ $status -eq 1 ]]
}

readonly restart_of_program=' try-restart mero-wireless-autoconnect.service'

# Whether systemd was asked for something in the last change, by a pattern.
asked_for() { grep -qE -- "$1" "$root/tmp/asked"; }

# The program is what has a network joined, and finds the connection as it was.
only_the_program_is_started_anew() {
  asked_for daemon-reload && asked_for "$restart_of_program\$" &&
    ! grep -vE -- "$restart_of_program\$" "$root/tmp/asked" | grep -E ' (stop|restart|try-restart|kill) ' >&2
}

has_changelogs() {
  local package
  for package in "${ours[@]}"; do
    zgrep -q '^# Changelog' "$root/usr/share/doc/$package/changelog.gz" || return
  done
}

# As `cmake --install` with another prefix would have them.
is_found_elsewhere() {
  local wanted=/tmp/elsewhere/usr/include/merowireless-core directory found
  mkdir "$root/tmp/elsewhere"
  inside dpkg --listfiles libmerowireless-core-dev | sed -n 's,^/\(.*/\(include\|pkgconfig\)/.*\.[a-z]*\)$,\1,p' |
    tar --create --directory "$root" --files-from - | tar --extract --directory "$root/tmp/elsewhere"
  directory=$(cd "$root" && echo tmp/elsewhere/usr/lib/*/pkgconfig)
  found=$(inside env PKG_CONFIG_PATH="/$directory" pkg-config --variable=includedir libmerowireless-core)
  [[ $(inside realpath "$found") == "$wanted" ]]
}

readonly autoconnect=/etc/systemd/system/mero-wireless@wlan0.service.wants/mero-wireless-autoconnect.service

# As `systemctl enable` does.
enable_autoconnect() {
  mkdir "$root${autoconnect%/*}"
  ln -s "/lib/systemd/system/${autoconnect##*/}" "$root$autoconnect"
}

autoconnect_is_enabled() { [[ -L $root$autoconnect ]]; }
autoconnect_is_not_enabled() { ! autoconnect_is_enabled; }

# Files of the library's own: a note, and what it writes for every connection.
readonly note=/var/tmp/.wireless_current_connection connection=/usr/mero/etc/wpa_supplicant.conf

write_own_files() { touch "$root$note" "$root$connection"; }

note_stays_for_another_architecture() {
  quietly inside env DPKG_MAINTSCRIPT_PACKAGE_REFCOUNT=2 \
    sh -c '/var/lib/dpkg/info/libmerowireless-core1:*.postrm remove' && [[ -e $root$note ]]
}

note_is_gone() { [[ ! -e $root$note ]]; }

write_settings() {
  local file
  for file in "${users_settings[@]}"; do echo "the user's $file" >"$root$file"; done
}

settings_are_kept() {
  local file
  for file in "${users_settings[@]}"; do
    grep -qFx "the user's $file" "$root$file" || return 1
  done
}

version_of_kit() {
  # shellcheck disable=SC2016  # the field is dpkg's
  inside dpkg-query --show --showformat '${Version}' merowireless-appliance
}

is_upgraded() { [[ $(version_of_kit) == *+later ]]; }
is_of_release() { [[ $(version_of_kit) == 0.1.0 ]]; }
is_later_than_release() { ! is_of_release; }

# A process that the kit's scripts take for an access point's daemon.
start_daemon() {
  local tries
  mkdir -p "$root/run/rc.network"
  cp "$root/bin/sleep" "$root/tmp/hostapd"
  chroot "$root" /tmp/hostapd 600 &
  daemon=$!
  echo "$daemon" >"$root/run/rc.network/hostapd-wlan0.pid"
  for ((tries = 0; tries < 1000; tries++)); do
    if [[ $(<"$root/proc/$daemon/comm") == hostapd ]]; then return; fi
    kill -0 "$daemon" || break
    sleep 0.01
  done
  echo 'what is to be taken for a daemon does not run' >&2
  return 1
}

daemon_has_ended() { [[ ! -e $root/proc/$daemon ]]; }

# ---- What somebody has put in the way ---------------------------------------------------------------------------

# Where anyone may put things, and what is busy to whoever removes it.
readonly in_the_way=(/tmp/wireless.info /var/tmp/.wireless_connecting "$note") busy=/var/tmp/.wireless_ap_connecting

put_things_in_the_way() {
  mkdir -p "$root${in_the_way[0]}" "$root/run/rc.network"
  echo "somebody's" >"$root${in_the_way[0]}/thesis"
  echo "somebody's" >"$root/var/tmp/diary"
  ln -sf diary "$root${in_the_way[1]}"
  rm -f "$root${in_the_way[2]}"
  mkfifo "$root${in_the_way[2]}"
  touch "$root$busy"
  mount --bind /dev/null "$root$busy"
  echo 'rubbish; exit' >"$root/run/rc.network/hostapd-wlan0.pid"
}

# It comes as a link, which leads elsewhere from here.
break_start_script() {
  rm "$root/etc/rc.network"
  printf '#!/bin/sh\nfi\n' >"$root/etc/rc.network"
  chmod 755 "$root/etc/rc.network"
}

take_them_away() {
  umount "$root$busy"
  rm -r "$root${in_the_way[0]}"
}

things_are_kept() {
  [[ $(<"$root${in_the_way[0]}/thesis") == "somebody's" && $(<"$root/var/tmp/diary") == "somebody's" ]]
}

# It fails at its last step before files are replaced.
failing_upgrade_is_undone() {
  local said
  if said=$(inside sh -c 'dpkg --install /tmp/failing/*.deb' 2>&1) || [[ $said != *"$refusal"* ]]; then
    printf '%s\n' "$said" >&2
    return 1
  fi
  is_installed && ! is_upgraded
}

is_installed() {
  # shellcheck disable=SC2016  # the field is dpkg's
  [[ $(inside dpkg-query --show --showformat '${db:Status-Status}' merowireless-appliance) == installed ]]
}

# A script of the version that is there may fail: the later one's is run in its place.
upgrades_from_broken_scripts() {
  local script
  for script in prerm postrm; do
    sed -i '1a exit 1' "$root/var/lib/dpkg/info/merowireless-appliance.$script"
  done
  install_from upgrades && is_upgraded && is_installed
}

removal_tells() { # TEXT...
  local said text
  said=$(inside apt-get --yes -o Dpkg::Use-Pty=0 remove "${ours[@]}" 2>&1) || {
    printf '%s\n' "$said" >&2
    return 1
  }
  for text; do
    [[ $said == *"$text"* ]] || {
      printf 'nothing tells: %s\n%s\n' "$text" "$said" >&2
      return 1
    }
  done
}

# Files that there are now and were not, or the reverse, or that are others: the settings, and what a pattern names.
only_settings_are_new() { # [PATTERN]
  diff <(printf '%s\n' "${users_settings[@]#/}" | sort) \
    <(files | diff "$root/tmp/before" - | sed -nE 's/^[<>] (\S+) .*/\1/p' | grep -vE "${1:-^$}" | sort -u) >&2
}

# As whoever runs the machine does it: the answers to questions are those that come first.
upgrade_system() { # SUITE
  rm -f "$root"/etc/apt/sources.list.d/*
  debian_archives "$1" >"$root/etc/apt/sources.list" && debian_files_for_apt "$root" &&
    quietly inside_online "${apt_get[@]}" update && apt_online -o Dpkg::Options::=--force-confold full-upgrade
}

is_of_suite() { # SUITE
  [[ $(<"$root/etc/os-release") == *"VERSION_CODENAME=$1"* ]]
}

tools_are_reinstalled() { apt_online install --reinstall wireless-tools; }

# What there is besides the kit's: nothing is left of the old system's.
one_ordinary_tool_is_aside() { # [NAME]
  local aside=("$root"/usr/sbin/iwlist.*)
  [[ ${#aside[@]} -eq 1 && ${aside[0]} == */"${1:-iwlist.ordinary}" ]]
}

# That it passes on does not tell: the kit has to be gone.
ordinary_tool_is_back() {
  local ordinary=("$root"/usr/sbin/iwlist.*)
  [[ ! -e ${ordinary[0]} && ! $(inside dpkg --verify wireless-tools) ]] && iwlist_passes_on && nothing_is_diverted
}

# Every name of the kit's that is left would be one that no package can ever have.
nothing_is_diverted() {
  local diverted
  diverted=$(inside dpkg-divert --list merowireless-appliance)
  [[ ! $diverted ]] || {
    printf '%s\n' "$diverted" >&2
    return 1
  }
}

look_at_upgrade() { # ARCHIVE DIRECTORY SUITE
  local ours
  enter_system "$1" "$2"
  mapfile -t ours < <(names)
  check 'the packages can be installed' install_from packages
  write_settings
  check 'the system can be upgraded with the packages on it' upgrade_system "$3"
  check 'the upgrade of the system has taken place' is_of_suite "$3"
  check 'the packages are still installed' is_installed
  check 'the listing tool is still ours' listing_tool_outlasts true
  check 'the ordinary listing tool is the new one alone' one_ordinary_tool_is_aside
  check 'the listing tool stays when wireless-tools is installed again' listing_tool_outlasts tools_are_reinstalled
  check 'nothing here can touch the network of this machine' has_no_network
  check 'a scan without an adapter says so' scan_says_that_there_is_no_adapter
  check 'settings are kept' settings_are_kept
  check 'the packages can be installed again' install_from packages --reinstall
  check 'the listing tool is ours after that' listing_tool_outlasts true
  check 'the packages can be removed' apt remove "${ours[@]}"
  check 'the ordinary listing tool is back, and nothing is diverted' ordinary_tool_is_back

  [[ $failures -eq 0 ]]
}

look_at_installation() {
  check 'the packages can be installed' install_from packages
  check 'bridges are made at once' asked_for ' start mero-network.service'
  check 'an adapter that is there already is told of' asked_for '^udevadm trigger --action=add .*wlan'
  check 'no network is joined by itself unless that is asked for' autoconnect_is_not_enabled
  check 'the changelog is there' has_changelogs
  check 'the libraries load less than 100 KiB together' libraries_are_small
  check 'what is built is hardened as the release wants it' is_hardened
  check 'nothing here can touch the network of this machine' has_no_network
  check 'a scan without an adapter says so in one sentence, and exits with 3' scan_says_that_there_is_no_adapter
  check 'the listing tool has its own form' iwlist_lists
  check 'the listing tool passes the others on' iwlist_passes_on
  check 'the kit tells what settings hold' settings_are_told
  check 'bash completes the program' completes_in_bash
}

look_at_example() {
  # shellcheck disable=SC2016  # for the shell in the system
  local cc='scan_one.c -o scan-one $(pkg-config --cflags --libs libmerowireless-core)'
  check 'the example builds with pkg-config and runs' builds_and_runs scan-one "cc -Wall -Wextra -Werror $cc"
  check 'the example builds as C++ and runs' builds_and_runs scan-one "c++ -Wall -Wextra -Werror -x c++ $cc"
  check 'the example builds with CMake and runs' builds_and_runs build/scan-one 'cmake -B build && cmake --build build'
  check 'pkg-config finds the headers where they are moved to' is_found_elsewhere
}

look_at_upgrades() {
  write_settings
  write_own_files
  enable_autoconnect
  check 'the packages can be installed again' install_from packages --reinstall
  check 'settings are kept when packages are installed again' settings_are_kept
  check 'the packages can be upgraded' install_from upgrades
  check 'the upgrade has taken place' is_upgraded
  check 'an upgrade leaves the network as it is, and starts the program anew' only_the_program_is_started_anew
  check 'an upgrade leaves joining a network by itself enabled' autoconnect_is_enabled
  check 'settings are kept in an upgrade' settings_are_kept
  check 'the listing tool still passes on after an upgrade' iwlist_passes_on
  check 'the listing tool stays when wireless-tools is installed again' \
    listing_tool_outlasts inside sh -c 'dpkg --install /srv/tools/*.deb'
  check 'the listing tool stays when wireless-tools becomes that of Debian 13' \
    listing_tool_outlasts inside sh -c 'dpkg --install /tmp/later-tools/*.deb'
  check 'the listing tool stays when that is installed again' \
    listing_tool_outlasts inside sh -c 'dpkg --install /tmp/later-tools/*.deb'
}

look_at_removal() {
  check "the libraries' notes stay while they are there for another architecture" note_stays_for_another_architecture
  start_daemon
  check 'the packages can be removed' apt remove "${ours[@]}"
  check "the libraries' notes go with them" note_is_gone
  check 'what joins networks by itself ends when the program is removed' \
    asked_for 'systemctl stop mero-wireless-autoconnect\.service'
  check 'units of adapters end when the kit is removed' asked_for 'systemctl stop mero-wireless@\*\.service'
  check 'settings are kept when packages are removed' settings_are_kept
  check 'access points end when the kit is removed' daemon_has_ended
  check 'the ordinary listing tool is back, and nothing is diverted' ordinary_tool_is_back
  check 'until packages are purged, nothing but settings and notes of systemd is left' \
    only_settings_are_new "^(etc|var/lib)/systemd/|^${connection#/}\$"
  check 'the packages can be purged' quietly inside dpkg --purge "${ours[@]}"
  check 'settings are kept when packages are purged' settings_are_kept
  check 'when packages are purged, nothing but settings is left' only_settings_are_new
}

# Among what somebody has put in the way.
look_at_packages_among_things() {
  check 'the packages can be installed after all' install_from packages
  put_things_in_the_way
  check 'an upgrade that fails is undone, whatever lies about' failing_upgrade_is_undone
  check 'the packages can be upgraded from broken ones, whatever lies about' upgrades_from_broken_scripts
  check 'the listing tool passes on after all that' iwlist_passes_on
  break_start_script
  check 'the packages can be removed, whatever lies about, and tell of what stays' removal_tells \
    "rm: cannot remove '${in_the_way[0]}'" "rm: cannot remove '$busy'" \
    'the access point or the client on wlan0 may still run'
  check 'what somebody has put in the way is kept' things_are_kept
  check 'the ordinary listing tool is back after all, and nothing is diverted' ordinary_tool_is_back
  check 'the packages can be purged, whatever lies about' quietly inside dpkg --purge "${ours[@]}"
  take_them_away
  check 'the packages can be purged once more' quietly inside dpkg --purge "${ours[@]}"
  rm "$root$busy" "$root/var/tmp/diary"
  check 'nothing but settings is left after all' only_settings_are_new
}

# The first release knew one name of the listing tool.
look_at_release() {
  check 'the tools can be those of this system again' quietly inside sh -c 'dpkg --install /srv/tools/*.deb'
  check 'the packages of the first release can be installed' install_from released
  check 'apt takes these packages for later ones' install_from packages
  check 'the upgrade from the first release has taken place' is_later_than_release
  check 'the listing tool is ours after that' listing_tool_outlasts true
  check 'the packages can be removed after that' apt remove "${ours[@]}"
  check 'the ordinary listing tool is back after that, and nothing is diverted' ordinary_tool_is_back

  check 'the first release can be installed once more' install_from released
  check 'the listing tool of the first release is lost when wireless-tools becomes that of Debian 13' \
    loses_listing_tool inside sh -c 'dpkg --install /tmp/later-tools/*.deb'
  check 'an upgrade from there that fails is undone' failing_upgrade_is_undone
  check 'the ordinary listing tool is there after that' iwlist_passes_on
  check 'an upgrade brings the listing tool back' install_from packages
  check 'the listing tool is ours again' listing_tool_outlasts true
  check 'one ordinary listing tool is aside' one_ordinary_tool_is_aside

  check 'the first release can be had back' install_from released --allow-downgrades
  check 'the first release is back' is_of_release
  check 'the ordinary listing tool is where the first release looks for it' one_ordinary_tool_is_aside iwlist.distrib
  check 'an upgrade from there that fails is undone, too' failing_upgrade_is_undone
  check 'the ordinary listing tool is still where the first release looks for it' \
    one_ordinary_tool_is_aside iwlist.distrib
  check 'an upgrade from there can be made' install_from packages
  check 'the ordinary listing tool is where it is looked for now' one_ordinary_tool_is_aside
  check 'the first release can be had back once more' install_from released --allow-downgrades
  check 'the first release can be removed' apt remove "${ours[@]}"
  check 'the ordinary listing tool is back after the first release, and nothing is diverted' ordinary_tool_is_back
}

look_at_packages() { # ARCHIVE DIRECTORY
  local ours
  enter_system "$1" "$2"
  make_other_versions
  make_later_tools
  mapfile -t ours < <(names)
  pretend_systemd
  files >"$root/tmp/before"
  look_at_installation
  look_at_example
  look_at_upgrades
  look_at_removal
  look_at_packages_among_things
  look_at_release
  [[ $failures -eq 0 ]]
}

# The second form is the first process of the machine that the first makes. The system stands beside its archive, since
# that directory stays when the machine has ended: nobody else may put another system there.
case $#,${1:-} in
1,* | 2,*)
  outside=/dev/null
  [[ $# -eq 1 ]] || outside=/proc/self/ns/net
  archive=$(kept_system "$1")
  setpriv --pdeathsig KILL unshare --mount --net --pid --fork --kill-child "$0" "$archive" "$1" "${2:-}" 9<"$outside"
  ;;
3,*)
  trap 'exit 130' INT TERM # otherwise a first process does not hear them
  root=${1%.tar}
  if [[ $3 ]]; then look_at_upgrade "$1" "$2" "$3"; else look_at_packages "$1" "$2"; fi
  ;;
*)
  echo "usage: $0 DIRECTORY [SUITE]" >&2
  exit 2
  ;;
esac
