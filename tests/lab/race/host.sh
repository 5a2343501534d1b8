# The race, on the host: what is to be run, what it takes, and the tables. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what `lab` sets

readonly peers=$work/peers
readonly bus_packages='dbus dbus-bin dbus-daemon dbus-system-bus-common'

race_usage() {
  cat <<END
Usage: lab race [-n ROUNDS] [-o FILE] [WORD...]

Measures the library beside others, in one machine, and prints tables: medians of so many rounds (3 unless told), with
the least and the most. -o keeps what was measured, one start a line, separated by tabs.

A word takes the others of its kind out; all of a kind run if none of it is given:
  join, ap                 what is done: joining a network, being an access point
  alone, eight             what else is on the air: nothing, eight access points
  2.4, 5                   the band, in GHz
  $(contenders | xargs)
                           who does it
END
}

contenders() {
  basename -a -s .sh "$lab"/race/contenders/*.sh
}

# header FILE KEY: what its line "# KEY: ..." says.
header() {
  sed -n "s/^# $2: //p" "$1"
}

# ---- What it takes -----------------------------------------------------------------------------------------------------

# packages_of CONTENDER KEY: those that its line of that key names, with the bus.
packages_of() {
  local file=$lab/race/contenders/$1.sh named
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

# The packages of Debian's that the contenders consist of. The project's own are built, and stand for what they need.
race_packages() {  # CONTENDER...
  local name package
  for name; do
    for package in $(packages_of "$name" '\(Join\|Access point\)'); do
      if is_own "$package"; then own_dependencies "$package"; else printf '%s\n' "$package"; fi
    done
  done | sort -u
}

# The packages that are missing for these, as apt knows; what there is stays as it is.
missing_packages() {  # PACKAGE...
  local plan
  plan=$(apt-get -qq -s --no-install-recommends install "$@") || die "apt does not know $*: run apt-get update"
  awk '$1 == "Inst" && $3 !~ /^\[/ { print $2 }' <<<"$plan"
}

# Nothing is installed: no daemon starts here, and no setting of the host's changes.
fetch_peers() {  # PACKAGE...
  local new=$peers.new package
  local -a missing
  [[ ! -f $peers/packages || $(<"$peers/packages") != "$*" ]] || return 0
  mapfile -t missing < <(missing_packages "$@")
  rm -rf "$new" "$peers"
  mkdir -p "$new/root" "$new/packages.d"
  if ((${#missing[@]} > 0)); then
    printf 'lab: fetching %s\n' "${missing[*]}" >&2
    (cd "$new/packages.d" && apt-get -qq -o APT::Sandbox::User="$(id -un)" download "${missing[@]}" >&2) ||
      die "these could not be downloaded: ${missing[*]}"
    for package in "$new"/packages.d/*.deb; do
      dpkg-deb --fsys-tarfile "$package" | tar -x -C "$new/root" --transform 's,^\./\(s\?bin\|lib\),./usr/\1,' ||
        die "$package could not be unpacked"
    done
  fi
  printf '%s' "$*" >"$new/packages"
  mv "$new" "$peers"
}

fetch_contenders() {
  # shellcheck disable=SC2046  # names are single words
  fetch_peers $(race_packages $(contenders))
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

# The contenders' files, in memory as those of the project are, and not those that access points and scripts use: two who
# map one file share its memory.
pack_contenders() {  # DIRECTORY PRODUCTS
  local file directory
  pack_frequent "$1"
  # shellcheck disable=SC2046  # names of packages are single words
  dpkg -L $(installed_packages) | take_over '' "$1"
  (cd "$peers/root" && find . ! -type d) | take_over "$peers/root" "$1"
  libraries_of "$1" "$1/usr" "$2/usr" | while read -r file; do
    directory=$1$(readlink -f "$(dirname "$file")")
    mkdir -p "$directory"
    cp -L "$file" "$directory/"
  done
}

installed_packages() {
  # shellcheck disable=SC2046  # names of packages are single words
  dpkg-query -W -f '${db:Status-Status} ${Package}\n' $(<"$peers/packages") 2>/dev/null | sed -n 's/^installed //p'
}

# ---- Installed size ----------------------------------------------------------------------------------------------------

# The packages that Debian counts to any system.
usual_packages() {
  apt-cache dumpavail | awk '$1 == "Package:" { name = $2 } $1 == "Priority:" && $2 ~ /^(required|important)$/ { print name }'
}

# whole_of PACKAGE...: these, and all that they depend on.
whole_of() {
  apt-get -qq -s --no-install-recommends -o Dir::State::status=/dev/null install "$@" |
    awk '$1 == "Inst" { print $2 }' | sort -u
}

# The KiB of some packages of Debian's, as they say themselves.
sizes_of() {  # PACKAGE...
  if (($#)); then apt-cache show --no-all-versions "$@"; fi | awk '$1 == "Installed-Size:" { sum += $2 } END { print sum + 0 }'
}

own_component() {  # PACKAGE
  case $1 in
    libmerowireless-core1) echo libraries ;;
    merowireless) echo program ;;
    merowireless-appliance) echo appliance ;;
    *) die "there is no component for the package $1" ;;
  esac
}

# The packages whose libraries the files of a directory are linked with.
linked_packages() {  # DIRECTORY
  local file
  libraries_of "$1" "$1" | while read -r file; do
    # Some are known by the path that they had before /usr was all there is.
    dpkg-query -S "$file" 2>/dev/null || dpkg-query -S "${file#/usr}" 2>/dev/null || dpkg-query -S "/usr$file" 2>/dev/null || :
  done | cut -d : -f 1 | sort -u
}

# size_of PACKAGE...: the KiB of these, and the KiB that they bring to a system that has the usual packages, which are
# in `usual`, with all that these depend on in `whole`.
size_of() {
  local package built=0
  local -a named=() needed=() brought
  for package; do
    if is_own "$package"; then
      rm -rf "$work/race.size"
      install_component "$build" "$(own_component "$package")" "$work/race.size"
      built=$((built + $(du -s -k --apparent-size "$work/race.size" | cut -f 1)))
      # shellcheck disable=SC2207  # names of packages are single words
      needed+=($(own_dependencies "$package") $(linked_packages "$work/race.size"))
      rm -rf "$work/race.size"
    else
      named+=("$package")
    fi
  done
  # shellcheck disable=SC2086  # names of packages are single words
  mapfile -t brought < <(comm -13 <(printf '%s\n' "$whole") <(whole_of $usual "${named[@]}" "${needed[@]}"))
  printf '%d %d\n' $((built + $(sizes_of "${named[@]}"))) $((built + $(sizes_of "${brought[@]}")))
}

# A line for each contender and event: size, the contender, the event, the KiB of what its file names, and of all.
sizes() {  # CONTENDER...
  local name key packages usual whole
  local -A size=()
  usual=$(usual_packages)
  # shellcheck disable=SC2086  # names of packages are single words
  whole=$(whole_of $usual)
  for name; do
    for key in Join 'Access point'; do
      packages=$(packages_of "$name" "$key")
      [[ $packages ]] || continue
      # shellcheck disable=SC2086
      [[ ${size[$packages]-} ]] || size[$packages]=$(size_of $packages)
      # shellcheck disable=SC2086
      printf 'size\t%s\t%s\t%s\t%s\n' "$name" "$(event_of "$key")" ${size[$packages]}
    done
  done
}

event_of() {  # KEY
  case $1 in Join) echo join ;; *) echo ap ;; esac
}

# ---- The race ----------------------------------------------------------------------------------------------------------

# The words of one kind among those that were given; all of the kind if there is none.
chosen() {  # "WORD..." GIVEN...
  local word found=''
  for word in $1; do
    [[ " ${*:2} " != *" $word "* ]] || found+=" $word"
  done
  printf '%s' "${found:-$1}"
}

race() {
  local rounds=3 output='' events airs bands names limit outcome known
  local -a words=()
  known="join ap alone eight 2.4 5 $(contenders | xargs)"
  while (($#)); do
    case $1 in
      -n | -o)
        (($# > 1)) || die "the option $1 needs a value: see 'lab race --help'"
        if [[ $1 == -n ]]; then rounds=$2; else output=$2; fi
        shift
        ;;
      -h | --help) race_usage && return ;;
      *)
        [[ " $known " == *" $1 "* ]] || die "the race has no word '$1': see 'lab race --help'"
        words+=("$1")
        ;;
    esac
    shift
  done
  [[ $rounds =~ ^[1-9][0-9]*$ ]] || die "this is no number of rounds: '$rounds'"
  events=$(chosen 'join ap' "${words[@]}") airs=$(chosen 'alone eight' "${words[@]}")
  bands=$(chosen '2.4 5' "${words[@]}") names=$(chosen "$(contenders | xargs)" "${words[@]}")

  prepare
  fetch_contenders
  # shellcheck disable=SC2034  # for the machine
  printf -v race 'EVENTS=%q AIRS=%q BANDS=%q CONTENDERS=%q ROUNDS=%q' "$events" "$airs" "$bands" "$names" "$rounds"
  # shellcheck disable=SC2086
  limit=$((300 + 240 * rounds * $(wc -w <<<"$events") * $(wc -w <<<"$airs") * $(wc -w <<<"$bands") * $(wc -w <<<"$names")))
  run_script race "$lab/race/race.sh" $limit cat
  [[ $outcome == PASS ]] || die "the race: $outcome; its logs are in $work/logs/race"
  # shellcheck disable=SC2086  # names of contenders are single words
  sizes $names >>"$work/logs/race/figures.tsv"
  [[ ! $output ]] || cp "$work/logs/race/figures.tsv" "$output"
  tables "$work/logs/race/figures.tsv"
}

titles() {
  local name
  for name in $(contenders); do
    printf '%s\t%s\n' "$name" "$(header "$lab/race/contenders/$name.sh" Title)"
  done
}

tables() {  # FIGURES
  awk -v titles="$(titles)" -f "$lab/race/tables.awk" "$1" | sed 's/ *$//'
}
