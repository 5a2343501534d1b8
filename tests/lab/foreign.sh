# A machine with another processor than the host's, on the host: its files are those of a Debian system of that
# architecture, since it can run none of the host's, and the project's come out of the packages. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2034,SC2154  # what `lab` uses and sets

foreign_needs=(busybox=busybox mmdebstrap=mmdebstrap qemu-system-aarch64=qemu-system-arm readelf=binutils)
[[ $EUID -eq 0 ]] || foreign_needs+=(newuidmap=uidmap) # for mmdebstrap
readonly -a foreign_needs

# The packages were unpacked, and none of their scripts was run: what these would have made, as far as it is needed.
complete_system() {  # DIRECTORY
  cp "$1/usr/share/base-passwd/passwd.master" "$1/etc/passwd"
  cp "$1/usr/share/base-passwd/group.master" "$1/etc/group"
  echo 'dnsmasq:x:101:65534::/var/lib/misc:/usr/sbin/nologin' >>"$1/etc/passwd"
  echo 'netdev:x:101:' >>"$1/etc/group"
  echo '127.0.0.1 localhost' >"$1/etc/hosts"
  rm -rf "$1/var/run"
  ln -s /run "$1/var/run"
  ln -sf mawk "$1/usr/bin/awk"
  [[ -e $1/usr/bin/sh ]] || ln -s dash "$1/usr/bin/sh"
  ln -sf regulatory.db-debian "$1/usr/lib/firmware/regulatory.db"
  ln -sf regulatory.db.p7s-debian "$1/usr/lib/firmware/regulatory.db.p7s"
}

make_system() (
  printf 'lab: unpacking a Debian system (%s, %s)\n' "$suite" "$arch" >&2
  trap 'rm -rf "$system.new" "$system.tar"' EXIT
  rm -rf "$system.new" "$system.tar"
  mkdir -p "$system.new"
  make_debian "$suite" "$system.tar" --variant=extract --architectures="$arch" --include='?essential' \
    --include="$(system_includes)" "${debian_lean[@]}" --hook-dir=/usr/share/mmdebstrap/hooks/merged-usr ||
    die "a Debian system ($suite, $arch) cannot be unpacked, of the archives of this machine's apt:" \
      'what mmdebstrap says is above'
  tar -x -C "$system.new" --exclude='./dev/*' -f "$system.tar"
  complete_system "$system.new"
  mv "$system.new" "$system"
)

# All that the system is made of.
system_origin() {
  debian_origin "$suite" && system_includes && printf '%s\n' "${debian_lean[@]}" &&
    declare -f make_debian make_system complete_system
}

# What scenarios use, and what our packages depend on.
system_includes() {
  { printf '%s\n' "${needs[@]#*=}"; dependencies_of_packages; } | sort -u | paste --serial --delimiters=,
}

# Leaves the directory of the machine's files in `system`.
prepare_system() {
  local made_of
  compgen -G "$packages/merowireless-appliance_*_$arch.deb" >/dev/null ||
    die "$packages has no packages: ./run package --arch $arch makes them"
  # Another system is made when what it is made of is another.
  made_of=$(system_origin) || die "nothing tells where a Debian system ($suite, $arch) comes from"
  system=$work/system-$suite-$arch-$(cksum <<<"$made_of" | cut -d ' ' -f 1)
  mkdir -p "$work"
  (
    flock 9
    [[ -d $system ]] || make_system
  ) 9>"$work/system.lock"
}

# The libraries that a program of the system loads, by their paths there.
foreign_libraries() {  # FILE
  local name
  local -a files=("$system$1") found
  local -A seen=()
  while ((${#files[@]} > 0)); do
    mapfile -t found < <(readelf --dynamic --program-headers --wide "${files[@]}" 2>/dev/null |
      sed -nE 's/.*(Shared library: \[|interpreter: )([^]]*)\].*/\2/p')
    files=()
    for name in "${found[@]##*/}"; do
      [[ ! ${seen[$name]-} ]] || continue
      seen[$name]=1
      name=$(compgen -G "$system/lib/$name" || compgen -G "$system/lib/*-linux-gnu*/$name") || continue
      files+=("$name")
    done
    ((${#files[@]} == 0)) || printf '%s\n' "${files[@]#"$system"}"
  done
}

# The project's files, as the packages have them.
unpack_packages() {  # DIRECTORY
  local package
  for package in libmerowireless-core1 merowireless merowireless-appliance; do
    dpkg-deb --extract "$packages/${package}"_*_"$arch".deb "$1" || die "$package for $arch cannot be unpacked"
  done
}
