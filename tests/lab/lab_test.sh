#!/bin/bash
# lab_test.sh CASE
#
# What the lab promises of its work on the host. Its functions are those of `lab`; no machine runs.
set -euo pipefail
scratch=$(mktemp -d)
trap 'rm -r "$scratch"' EXIT
export MERO_BUILD=$scratch/build MERO_LAB_DEBIAN=trixie
case $1 in
  killed) export MERO_LAB_ARCH=amd64 ;;
  foreign-*)
    MERO_LAB_ARCH=$(dpkg --print-architecture | sed 's/arm64/amd64/; t; s/.*/arm64/')
    export MERO_LAB_ARCH
    ;;
esac
# shellcheck source=tests/lab/lab
. "$(dirname "$(realpath "$0")")/lab" list >/dev/null

# Debian's archives, as far as these cases need them.
debian_archives() { echo "deb http://archive $1 main"; }
debian_settings() { :; }
dependencies_of_packages() { echo busybox; }

# Puts a program before those of the machine.
program() {  # NAME, and the script on standard input
  mkdir -p "$scratch/bin"
  cat >"$scratch/bin/$1"
  chmod +x "$scratch/bin/$1"
  PATH=$scratch/bin:$PATH
}

# Makes a disk, slowly, where mmdebstrap is told to leave it.
make_slow_disk() {  # SUITE - OPTION...
  local place=${!#}
  place=${place#*\'}
  place=${place%\'}
  echo made >>"$scratch/made"
  echo half >"$place"
  sleep 0.5
  echo whole >"$place"
}

case $1 in
  disk) # Two labs that began at once made one disk twice, and one of them took it when it was not whole.
    make_debian() { make_slow_disk "$@"; }
    (prepare_disk && cp "$disk" "$scratch/one") 2>/dev/null &
    (prepare_disk && cp "$disk" "$scratch/two") 2>/dev/null
    wait $!
    [[ $(cat "$scratch/made" "$scratch/one" "$scratch/two" | xargs) == 'made whole whole' ]]
    prepare_disk
    first=$disk
    # It was kept when it was to come from elsewhere.
    debian_archives() { echo "deb http://elsewhere $1 main"; }
    prepare_disk 2>/dev/null
    second=$disk
    debian_settings() { echo 'Acquire::http::Proxy "http://proxy:3142";'; }
    prepare_disk 2>/dev/null
    [[ $second != "$first" && $disk != "$second" && ! -e $first && ! -e $second && -e $disk ]]
    ;;
  failing-disk)
    make_debian() { make_slow_disk "$@" && return 1; }
    if (prepare_disk) 2>/dev/null; then exit 1; fi
    [[ -z $(find "$work" -name '*.disk*') ]]
    ;;
  hook) # Made beside the system, under a name that anybody could know and make before.
    [[ $EUID -eq 0 ]] || exit 77
    program mke2fs <<'STUB'
#!/bin/bash
disk=${*: -2:1}
echo "$disk" >"$SCRATCH/disk"
test -d "$(dirname "$disk")/system/etc" && exit 1
STUB
    export SCRATCH=$scratch IDLE_UNITS=one.timer
    mkdir -p "$scratch/system"/{etc/{apt,systemd/system},usr/sbin,sbin}
    ln -s "$scratch/theirs" "$scratch/system.disk"
    if sh -c "$(finishing)" hook "$scratch/system" 2>/dev/null; then exit 1; fi
    # It left its mount and its files when the disk could not be made.
    if grep "$scratch" /proc/mounts; then exit 1; fi
    [[ $(<"$scratch/disk") != "$scratch/system.disk" && ! -e $(dirname "$(<"$scratch/disk")") ]]
    ;;
  killed) # QEMU went on until its time was over, and what it had started from stayed.
    for qemu in qemu-system-{x86_64,aarch64}; do
      program "$qemu" <<'STUB'
#!/bin/bash
while [[ $1 != -pidfile ]]; do shift; done
echo $$ >"$2"
echo $$ >"$MERO_BUILD/qemu"
exec sleep 600
STUB
    done
    gather_initramfs() { mkdir "$1" && touch "$1/init"; }
    (
      trap - EXIT
      disk='' run_script one script 300 cat
    ) &
    until [[ -s $MERO_BUILD/qemu ]]; do sleep 0.1; done
    qemu=$(<"$MERO_BUILD/qemu")
    [[ -e $work/start/one/files.cpio ]]
    kill -TERM $!
    wait $! && exit 1
    for ((tries = 0; tries < 100; tries++)); do
      kill -0 "$qemu" 2>/dev/null || break
      sleep 0.1
    done
    ((tries < 100)) || {
      kill "$qemu"
      exit 1
    }
    [[ ! -e $work/start/one ]]
    ;;
  archive) # A lab took the archive of packages away from under another's machine.
    make_archive() { mkdir -p "$1/now"; }
    gather_initramfs() { mkdir "$1" && touch "$1/init"; }
    boot() { ls "$1" && echo PASS >"$2/result"; }
    disk=a run_script one script 300 cat >"$scratch/seen"
    grep -qx archive "$scratch/seen"
    [[ $outcome == PASS && ! -e $work/start/one ]]
    ;;
  lists) # apt-get ended with 0 when it could reach nothing, and the lab said that apt does not know the kernel.
    debian_suite() { echo bookworm; } # the host's own lists are not fetched
    debian_archives() { echo "deb [trusted=yes] http://127.0.0.1:9 $1 main"; }
    declare -a suite_options
    if (find_archives) 2>"$scratch/said"; then exit 1; fi
    grep -q "^lab: the lists of Debian's archives (trixie) could not be fetched$" "$scratch/said"
    ;;
  kernel) # One that had been unpacked before a scenario needed a module was kept, without it.
    find_archives() { :; }
    kernel_package() { echo linux-image; }
    apt-get() { echo fetched >>"$scratch/fetched" && touch one.deb; }
    unpack_package() { :; }
    mkdir -p "$work"/kernel-{trixie,trixie-1/lib,trixie-arm64-1,bookworm-1}
    for list in one one two; do
      kernel_files() { echo "$list"; }
      take_suite trixie
      prepare_kernel 2>/dev/null
      [[ -e $kernel/one.deb ]]
      kept=(kernel-bookworm-1 "${kernel##*/}" kernel-trixie-arm64-1 kernel-trixie.lock)
      [[ $(find "$work" -mindepth 1 -maxdepth 1 -printf '%f\n' | LC_ALL=C sort) == "$(printf '%s\n' "${kept[@]}")" ]]
    done
    [[ $(wc -l <"$scratch/fetched") -eq 2 ]]
    ;;
  iwlist) # The lab took our own listing tool for the ordinary one, which called itself without end.
    system=$scratch/system
    program_file() { echo /usr/sbin/iwlist; }
    mkdir -p "$system"/{sbin,usr/sbin}
    for file in /usr/sbin/iwlist /usr/sbin/iwlist.ordinary /sbin/iwlist.distrib; do
      touch "$system$file"
      [[ $(ordinary_iwlist) == "$system$file" ]]
    done
    ;;
  foreign-system) # When it could not be made, its archive stayed; it was kept when it was to come from elsewhere.
    mkdir -p "$packages"
    touch "$packages/merowireless-appliance_1_$arch.deb"
    complete_system() { :; }
    make_debian() { echo half >"$2"; }
    prepare_system 2>/dev/null & # where a failure ends it
    if wait $!; then exit 1; fi
    [[ $(ls "$work") == system.lock ]]
    make_debian() { tar -c -f "$2" --files-from /dev/null; }
    prepare_system 2>/dev/null
    first=$system
    debian_archives() { echo "deb http://elsewhere $1 main"; }
    prepare_system 2>/dev/null
    [[ $system != "$first" && -d $system ]]
    ;;
  peers) # When apt knew no package, an empty tree was kept for all; versions that had been replaced were kept.
    # shellcheck source=tests/lab/peers.sh
    . "$lab/peers.sh"
    apt-get() {
      case $* in
        *' install '*) [[ $version ]] && echo "Inst one ($version Debian:12 [amd64])" ;;
        *) echo "${!#}" >>"$scratch/fetched" && sleep 0.3 && touch one.deb ;;
      esac
    }
    dpkg-deb() { tar -c --files-from /dev/null; }
    version=1
    fetch_peers one two 2>/dev/null & # two at once unpacked into one directory
    fetch_peers one two 2>/dev/null
    wait $!
    version=''
    status=0
    (fetch_peers one && :) 2>/dev/null || status=$?
    [[ $status -eq 2 && $(<"$unpacked/packages") == 'one two' ]]
    version=2
    fetch_peers one two 2>/dev/null
    [[ $(xargs <"$scratch/fetched") == 'one=1 one=2' ]]
    ;;
  joins | race) # An hour's attempts, or measurements, were lost with the machine.
    # shellcheck source=tests/lab/peers.sh
    . "$lab/peers.sh"
    # shellcheck source=/dev/null
    . "$lab/$1/host.sh"
    prepare() { :; }
    fetch_all_peers() { :; }
    run_script() { outcome=killed && mkdir -p "$work/logs/$1" && echo seen | tee "$work/logs/$1"/{cells,figures}.tsv; }
    if ("$1" -o "$scratch/kept" 2.4) >/dev/null 2>&1; then exit 1; fi
    [[ $(<"$scratch/kept") == seen ]]
    ;;
  journal) # It was quiet when it could not be read, or when a scenario knew no warnings.
    PART=''
    shopt -s inherit_errexit # as in the machine
    # shellcheck source=tests/lab/lib/machine.sh
    . "$lab/lib/machine.sh"
    expect_same() { [[ $2 == "$3" ]] || exit 3; }
    journalctl() { printf '%s\n' "${lines[@]}"; }
    quiet() { # prints the status that looking at the journal ends with
      local status=0
      (expect_quiet_journal) & # where a failure ends it
      wait $! || status=$?
      echo "$status"
    }
    lines=('Nov 22 12:00:00 kernel: a warning' 'Nov 22 12:00:00 one[1]: two')
    known_warnings='' && [[ $(quiet) -eq 3 ]]
    known_warnings='one\[1\]: (two|three)$' && [[ $(quiet) -eq 0 ]]
    lines=('') && [[ $(quiet) -eq 0 ]]
    journalctl() { return 1; }
    [[ $(quiet) -eq 1 ]]
    ;;
  *)
    echo "there is no case $1"
    exit 2
    ;;
esac
