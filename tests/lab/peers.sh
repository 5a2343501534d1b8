# What both the race and the joins take, on the host: the peers' packages, fetched and unpacked, and the layer of their
# files in the machine. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what `lab` sets

readonly unpacked=$work/peers
readonly bus_packages='dbus dbus-bin dbus-daemon dbus-system-bus-common'

peers() {
  basename -a -s .sh "$lab"/peers/*.sh
}

# header FILE KEY: what its line "# KEY: ..." says.
header() {
  sed -n "s/^# $2: //p" "$1"
}

# The title of each, behind its name and a tab.
titles() {
  local name
  for name in $(peers); do
    printf '%s\t%s\n' "$name" "$(header "$lab/peers/$name.sh" Title)"
  done
}

# The words of one kind among those that were given; all of the kind if there is none.
chosen() {  # "WORD..." GIVEN...
  local word found=''
  for word in $1; do
    [[ " ${*:2} " != *" $word "* ]] || found+=" $word"
  done
  printf '%s' "${found:-$1}"
}

# ---- What it takes -----------------------------------------------------------------------------------------------------

# packages_of PEER KEY: those that its line of that key names, with the bus.
packages_of() {
  local file=$lab/peers/$1.sh named
  named=$(header "$file" "$2")
  [[ ! $named ]] || printf '%s %s' "$named" "$(sed -n "s/^# Bus$/$bus_packages/p" "$file")"
}

# own_dependencies PACKAGE: what a package of the project depends on, in the words of debian/control; nothing for one of
# Debian's.
own_dependencies() {
  awk -v package="$1" '
    $1 == "Package:" { this = $2 == package }
    /^[^ ]/ { depends = $1 == "Depends:"; sub(/^Depends:/, "") }
    this && depends { gsub(/[, ]+/, "\n"); print }' "$lab/../../debian/control" | grep '^[a-z]' || :
}

is_own() {  # PACKAGE
  grep -qx "Package: $1" "$lab/../../debian/control"
}

# The packages of Debian's that peers consist of. The project's own are built, and stand for what they need.
peer_packages() {  # PEER...
  local name package
  for name; do
    for package in $(packages_of "$name" '\(Join\|Access point\)'); do
      if is_own "$package"; then own_dependencies "$package"; else printf '%s\n' "$package"; fi
    done
  done | sort -u
}

# The packages that are missing for these, with their versions, as apt knows; what there is stays as it is.
missing_packages() {  # PACKAGE...
  local plan
  plan=$(apt-get -qq -s --no-install-recommends install "$@") || die "apt does not know $*: run apt-get update"
  awk '$1 == "Inst" && $3 !~ /^\[/ { print $2 "=" substr($3, 2) }' <<<"$plan"
}

# Nothing is installed: no daemon starts here, and no setting of the host's changes.
fetch_peers() (  # PACKAGE...
  new=$unpacked.new
  mkdir -p "$work"
  exec 9>"$unpacked.lock"
  flock 9
  missing=$(missing_packages "$@") || exit
  [[ ! -f $unpacked/missing || $(<"$unpacked/packages") != "$*" || $(<"$unpacked/missing") != "$missing" ]] || return 0
  rm -rf "$new"
  mkdir -p "$new/root" "$new/packages.d"
  if [[ $missing ]]; then
    printf 'lab: fetching %s\n' "${missing//$'\n'/ }" >&2
    # shellcheck disable=SC2086  # names and versions are single words
    (cd "$new/packages.d" && apt-get -qq -o APT::Sandbox::User="$(id -un)" download $missing >&2) ||
      die "these could not be downloaded: ${missing//$'\n'/ }"
    for package in "$new"/packages.d/*.deb; do
      dpkg-deb --fsys-tarfile "$package" | tar -x -C "$new/root" --transform 's,^\./\(s\?bin\|lib\),./usr/\1,' ||
        die "$package could not be unpacked"
    done
  fi
  printf '%s' "$*" >"$new/packages"
  printf '%s' "$missing" >"$new/missing"
  rm -rf "$unpacked"
  mv "$new" "$unpacked"
)

fetch_all_peers() {
  # shellcheck disable=SC2046  # names are single words
  fetch_peers $(peer_packages $(peers))
}

# ---- The layer ---------------------------------------------------------------------------------------------------------

# Where a file is really, of those directories that lead elsewhere since /usr is all there is.
merged() {
  sed -E 's,^\.?/?(bin|sbin|lib|lib64)/,usr/\1/,; s,^\.?/,,'
}

needless() {
  grep -vE '^usr/(include|lib/(systemd|udev)|share/(bug|doc|doc-base|info|lintian|locale|man))/' || : # there may be none left
}

# take_over ROOT DIRECTORY: copies those files of a root, named on standard input, that anyone may read.
take_over() {
  local file
  merged | needless | sort -u | while read -r file; do
    [[ -f $1/$file && -r $1/$file ]] || continue
    mkdir -p "$2/${file%/*}"
    cp --no-dereference --remove-destination "$1/$file" "$2/$file"
  done
}

# The libraries of the host's that the programs and libraries in some directories are linked with.
libraries_of() {  # LAYER DIRECTORY...
  # shellcheck disable=SC2016  # for the shell of each file
  find "${@:2}" -type f \( -perm -u+x -o -name '*.so*' \) -print0 |
    LD_LIBRARY_PATH=$1/usr/lib/x86_64-linux-gnu xargs -0 -n 1 sh -c 'ldd "$1" 2>/dev/null || :' ldd |
    grep -o '/[^ ]*' | grep -v "^$1" | sort -u
}

# The peers' files, in memory as those of the project are, and not those that access points and scripts use: two who
# map one file share its memory.
pack_peers() {  # DIRECTORY PRODUCTS
  local file directory
  pack_frequent "$1"
  # shellcheck disable=SC2046  # names of packages are single words
  dpkg -L $(installed_packages) | take_over '' "$1"
  (cd "$unpacked/root" && find . ! -type d) | take_over "$unpacked/root" "$1"
  libraries_of "$1" "$1/usr" "$2/usr" | while read -r file; do
    directory=$1$(readlink -f "$(dirname "$file")")
    mkdir -p "$directory"
    cp -L "$file" "$directory/"
  done
}

installed_packages() {
  # shellcheck disable=SC2046  # names of packages are single words
  dpkg-query -W -f '${db:Status-Status} ${Package}\n' $(<"$unpacked/packages") 2>/dev/null | sed -n 's/^installed //p'
}
