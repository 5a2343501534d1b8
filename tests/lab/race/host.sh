# The race, on the host: what is to be run, what it takes, and the tables. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what `lab` sets

race_usage() {
  cat <<END
Usage: lab race [-n ROUNDS] [-o FILE] [WORD...]

Measures the library beside others, in one machine, and prints tables: medians of so many rounds (3 unless told), with
the least and the most. -o keeps what was measured, one start a line, separated by tabs.

A word takes the others of its kind out; all of a kind run if none of it is given:
  join, ap                 what is done: joining a network, being an access point
  alone, eight             what else is on the air: nothing, eight access points
  2.4, 5                   the band, in GHz
  $(peers | xargs)
                           who does it
END
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

race() {
  local rounds=3 output='' figures=$work/logs/race/figures.tsv events airs bands names limit outcome known
  local -a words=()
  known="join ap alone eight 2.4 5 $(peers | xargs)"
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
  bands=$(chosen '2.4 5' "${words[@]}") names=$(chosen "$(peers | xargs)" "${words[@]}")

  prepare
  fetch_all_peers
  # shellcheck disable=SC2034  # for the machine
  printf -v plan 'EVENTS=%q AIRS=%q BANDS=%q CONTENDERS=%q ROUNDS=%q' "$events" "$airs" "$bands" "$names" "$rounds"
  # shellcheck disable=SC2086
  limit=$((300 + 240 * rounds * $(wc -w <<<"$events") * $(wc -w <<<"$airs") * $(wc -w <<<"$bands") * $(wc -w <<<"$names")))
  run_script race "$lab/race/race.sh" $limit cat
  # What was measured until a machine came to grief is kept, too.
  [[ ! $output || ! -e $figures ]] || cp "$figures" "$output"
  [[ $outcome == PASS ]] || die "the race: $outcome; its logs are in $work/logs/race"
  # shellcheck disable=SC2086  # names of contenders are single words
  sizes $names >>"$figures"
  [[ ! $output ]] || cp "$figures" "$output"
  tables "$figures"
}

tables() {  # FIGURES
  awk -v titles="$(titles)" -f "$lab/race/tables.awk" "$1" | sed 's/ *$//'
}
