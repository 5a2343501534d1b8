# The machine that boots a Debian system of its own, on the host: its disk, and the archive that its apt installs our
# packages from. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what `lab` sets

# shellcheck source=tests/support/debian.sh
. "$lab/../support/debian.sh"

readonly packages=$build/packages${foreign:+-$foreign}

# What the lab needs of the host for such a machine, besides its other needs. Who is not root makes a system in a
# namespace of users.
debian_needs=(dpkg-scanpackages=dpkg-dev mke2fs=e2fsprogs mmdebstrap=mmdebstrap)
[[ $EUID -eq 0 ]] || debian_needs+=(newuidmap=uidmap)
readonly -a debian_needs

# Besides what our packages depend on. The lab's own programs in it need some of these.
readonly -a system_packages=(busybox dbus kmod libnl-genl-3-200 systemd-resolved systemd-sysv udev wireless-regdb)

# What a Debian system does by itself now and then, and is nothing of ours; and what only a scenario about it starts.
readonly -a idle_units=(apt-daily-upgrade.timer apt-daily.timer dpkg-db-backup.timer e2scrub_all.timer
  e2scrub_reap.service fstrim.timer getty@tty1.service proc-sys-fs-binfmt_misc.automount systemd-pstore.service
  systemd-resolved.service)

# ---- Its disk ------------------------------------------------------------------------------------------------------------

dependencies_of_packages() {
  local package
  for package in "$packages"/*.deb; do dpkg-deb --field "$package" Depends; done |
    tr ',' '\n' | sed -E 's/^ *([^ ]+).*/\1/; /mero/d; /^$/d' | sort -u
}

# Run by mmdebstrap as the system's root: the last touches, and the disk, which is left in the system for a moment.
finishing() {
  cat <<'END'
set -eu
cd "$1"
echo nas >etc/hostname
printf '127.0.0.1 localhost\n127.0.1.1 nas\n' >etc/hosts
echo 0123456789abcdef0123456789abcdef >etc/machine-id
echo 'deb [trusted=yes] file:/var/lib/lab/archive ./' >etc/apt/sources.list
rm -rf etc/apt/sources.list.d/* etc/resolv.conf var/lib/apt/lists/* var/cache/apt/*.bin
mkdir -p lib/modules var/lib/lab
# What mmdebstrap takes away again later.
rm -f usr/sbin/policy-rc.d
[ ! -e sbin/start-stop-daemon.REAL ] || mv sbin/start-stop-daemon.REAL sbin/start-stop-daemon
for unit in $IDLE_UNITS; do ln -sf /dev/null "etc/systemd/system/$unit"; done
# A start would make etc/resolv.conf a link to a file of systemd-resolved's, which runs only where a scenario starts it.
mkdir -p etc/tmpfiles.d
ln -s /dev/null etc/tmpfiles.d/systemd-resolve.conf
# Of the system without what is mounted in it now. The mount here ends with what made it.
work=$(mktemp -d "$1.XXXXXX")
trap 'rm -rf "$work"' EXIT
trap 'exit 1' HUP INT TERM
mkdir "$work/system"
unshare --mount sh -euc 'mount --bind . "$1/system"; mke2fs -q -t ext4 -d "$1/system" "$1/disk" 768M' disk "$work"
mv "$work/disk" ./disk
END
}

make_disk() (  # SUITE DISK
  printf 'lab: making a Debian system (%s)\n' "$1" >&2
  include=$({ printf '%s\n' "${system_packages[@]}"; dependencies_of_packages; } | paste --serial --delimiters=,)
  new=$2.new sparse=$2.sparse
  trap 'rm -f "$new" "$sparse"' EXIT
  rm -f "$work/$1"-[0-9]*.disk{,.new,.sparse}
  IDLE_UNITS=${idle_units[*]} make_debian "$1" - --format=null --variant=minbase --include="$include" "${debian_lean[@]}" \
    --customize-hook="$(finishing)" --customize-hook="download /disk '$new'" ||
    die "a Debian system ($1) cannot be made, of the archives of this machine's apt: what mmdebstrap says is above"
  cp --sparse=always "$new" "$sparse"
  mv "$sparse" "$2"
)

# All that the disk is made of.
disk_origin() {  # SUITE
  debian_origin "$1" && dependencies_of_packages &&
    printf '%s\n' "${system_packages[@]}" "${idle_units[@]}" "${debian_lean[@]}" &&
    declare -f make_debian make_disk finishing
}

# Leaves the machine's disk in `disk`; what is written there in a run is gone with it. Another system is made when what
# it is made of is another, and by one lab at a time.
prepare_disk() {
  local made_of
  made_of=$(disk_origin "$suite") || die "nothing tells where a Debian system ($suite) comes from"
  disk=$work/$suite-$(cksum <<<"$made_of" | cut -d ' ' -f 1).disk
  mkdir -p "$work"
  (
    flock 9
    [[ -e $disk ]] || make_disk "$suite" "$disk"
  ) 9>"$work/$suite-disk.lock"
}

# ---- The archive ---------------------------------------------------------------------------------------------------------

# As anybody would make one for some packages: `now` has ours, `later` the same of a later version.
make_archive() {  # DIRECTORY
  local archive=$1 package
  mkdir -p "$archive/now" "$archive/later"
  for package in "$packages"/*.deb; do
    [[ $package == *-dbgsym_* ]] || cp "$package" "$archive/now/"
  done
  for package in "$archive"/now/*.deb; do
    "$lab/../support/later-package" "$package" "$archive/later" || die "no later version of $package can be made"
  done
  for package in now later; do
    (cd "$archive/$package" && dpkg-scanpackages . >Packages 2>/dev/null) || die 'the archive of packages cannot be made'
  done
}

prepare_debian() {
  local need
  [[ ! $foreign ]] || die "a machine that boots a Debian system has the host's processor: MERO_LAB_ARCH cannot be $arch"
  for need in "${debian_needs[@]}"; do
    type -P "${need%%=*}" >/dev/null || die "Debian packages are missing: apt-get install ${debian_needs[*]#*=}"
  done
  compgen -G "$packages/merowireless-appliance_*.deb" >/dev/null || die "$packages has no packages: ./run package makes them"
  prepare_disk
}
