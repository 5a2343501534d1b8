#!/usr/bin/env bash
# foreign_test.sh DIRECTORY ARCHITECTURE: whether the packages in that directory, which were made on a machine of another
# architecture, are for that one throughout. Says `ok` or `not ok` and what it is about, in a line each; fails if
# anything did. Nothing of them is run.
set -euo pipefail
export LC_ALL=C # what readelf says is looked at

here=$(dirname "$(realpath "$0")")
readonly here directory=$1 architecture=$2
readonly symbols=$here/../../debian/libmerowireless-core1.symbols
readonly -a names=(libmerowireless-core1 libmerowireless-core-dev merowireless merowireless-appliance)

# What a file for that processor says of itself.
case $architecture in
  arm64) machine=AArch64 flags='' triplet=aarch64-linux-gnu ;;
  armhf) machine=ARM flags='hard-float ABI' triplet=arm-linux-gnueabihf ;;
  *)
    echo "foreign_test.sh: nothing is known of files for $architecture" >&2
    exit 2
    ;;
esac

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT
# shellcheck source=tests/support/checks.sh
. "$here/../support/checks.sh"

packages() { printf '%s\n' "${names[@]/#/"$directory/"}" | sed "s/\$/_*_$architecture.deb/"; }

are_complete() {
  local pattern
  while read -r pattern; do
    compgen -G "$pattern" >/dev/null || { echo "there is no $pattern" >&2 && return 1; }
  done < <(packages)
}

unpack() {
  local package
  mkdir "$work/control"
  for package in "$directory"/*.deb; do
    dpkg-deb --extract "$package" "$work/files"
    dpkg-deb --control "$package" "$work/control/$(basename "${package%%_*}")"
  done
}

say_their_architecture() {
  local package
  for package in "$directory"/*.deb; do
    [[ $(dpkg-deb --field "$package" Architecture) == "$architecture" ]] || { echo "$package" >&2 && return 1; }
  done
}

# Programs and libraries, and what debuggers know of them.
machine_files() {
  find "$work/files" -type f -exec sh -c 'head -c 4 "$1" | grep -q ELF && echo "$1"' sh {} ';'
}

are_for_their_processor() {
  local file said files
  mapfile -t files < <(machine_files)
  # Three libraries, three programs, and what debuggers know of each; some of that may stand apart.
  [[ ${#files[@]} -ge 12 ]] || { printf '%s\n' "${files[@]}" >&2 && return 1; }
  for file in "${files[@]}"; do
    said=$(readelf --file-header "$file" 2>/dev/null) # it misses the segments of what only debuggers read
    [[ $said =~ Machine:\ +$machine$'\n' && $said == *"$flags"* ]] || { echo "$file: $said" >&2 && return 1; }
  done
}

are_hardened() {
  local files
  mapfile -t files < <(machine_files | grep -v /debug/)
  "$here/hardening" "${files[@]}" >&2
}

# What the linker would have taken of the machine itself is no library of that processor's: the loader is one.
load_with_their_loader() {
  local program
  for program in usr/bin/merowireless usr/sbin/iwlist usr/mero/sbin/mero-settings; do
    readelf --program-headers "$work/files/$program" | grep -qE 'interpreter: /lib/ld-linux-(aarch64|armhf)\.so\.' ||
      { echo "$program" >&2 && return 1; }
  done
}

# Directories of libraries, and paths in what a build wrote, bear the name of an architecture.
name_no_other() {
  local found
  found=$({ cd "$work" && find files -name '*-linux-gnu*' && find control -type f -exec cat {} + &&
    find files/usr/lib files/usr/share files/usr/mero -type f -not -path '*/debug/*' -exec strings {} +; } |
    grep -oE '(^|[^a-z0-9_])[a-z0-9_]+-linux-gnu[a-z0-9]*' | grep -vE "(^|[^a-z0-9_])$triplet\$" | sort -u) || :
  [[ ! $found ]] || { printf 'it names %s\n' "$found" >&2 && return 1; }
}

# The same names as of any other architecture: those that are promised.
export_what_is_promised() {
  local library promised
  promised=$(sed -n 's/^ \([A-Za-z0-9_]*\)@Base .*/\1/p' "$symbols" | sort)
  diff <(printf '%s\n' "$promised") <(for library in "$work/files/usr/lib/$triplet"/libmero*.so.*.*; do
    readelf --dyn-syms --wide "$library" | awk '$7 ~ /^[0-9]+$/ && $5 == "GLOBAL" { print $8 }'
  done | sort) >&2 &&
    diff <(grep -oE '^ [A-Za-z0-9_]+@Base' "$symbols" | sort) \
      <(grep -oE '^ [A-Za-z0-9_]+@Base' "$work/control/libmerowireless-core1/symbols" | sort) >&2
}

check "all packages for $architecture are there" are_complete
[[ $failures -eq 0 ]] || exit 1
unpack
check "they say that they are for $architecture" say_their_architecture
check "their programs and libraries are for $machine" are_for_their_processor
check 'their programs and libraries are hardened' are_hardened
check "their programs are loaded by the loader of $architecture" load_with_their_loader
check "they name no architecture but $triplet" name_no_other
check 'their libraries export what is promised, and nothing else' export_what_is_promised

[[ $failures -eq 0 ]]
