# Who joins whom, on the host: what is to be run, and the table. Part of `lab`.
# shellcheck shell=bash
# shellcheck disable=SC2154  # what `lab` sets

readonly protections='open wep wpa wpa2 mixed peap ttls'

joins_usage() {
  cat <<END
Usage: lab joins [-o FILE] [WORD...]
       lab joins -t FILE

Has clients of others join our access point, and our client join access points of others, in one machine, and prints a
table in Markdown: each has joined when the kernel on the side of the access point lets the station's traffic pass, and a
ping is answered over an address by DHCP. -o keeps what was seen, one attempt a line, separated by tabs, and -t prints the
table of what was kept. Exits with 1 if one failed that is to succeed.

A word takes the others of its kind out; all of a kind run if none of it is given:
  clients, points          clients on our access point, access points for our client
  open, wep, wpa, wpa2, mixed, peap, ttls
                           how the network is protected
  2.4, 5                   the band, in GHz
  main, guests             the network of our access point
  $(others | xargs)
                           whose client or access point it is
  mero-call                ours by a call of each function, not by the management program
END
}

is_of_others() {  # PEER
  local package
  for package in $(packages_of "$1" Join); do
    ! is_own "$package" || return
  done
}

others() {
  local name
  for name in $(peers); do
    ! is_of_others "$name" || printf '%s\n' "$name"
  done
}

# The access points of the lab's scenarios are hostapd, so that here are those of others.
others_points() {
  others | grep -vx bare
}

joins() {
  local output='' known roles bands networks clients points ours=merowireless limit outcome
  local -a words=()
  known="clients points $protections 2.4 5 main guests $(others | xargs) mero-call"
  while (($#)); do
    case $1 in
      -o | -t)
        (($# > 1)) || die "the option $1 needs a value: see 'lab joins --help'"
        if [[ $1 == -t ]]; then
          joins_table "$2"
          return
        fi
        output=$2
        shift
        ;;
      -h | --help) joins_usage && return ;;
      mero-call) ours=mero-call ;;
      *)
        [[ " $known " == *" $1 "* ]] || die "there is no word '$1': see 'lab joins --help'"
        words+=("$1")
        ;;
    esac
    shift
  done
  roles=$(chosen 'clients points' "${words[@]}") bands=$(chosen '2.4 5' "${words[@]}")
  networks=$(chosen 'main guests' "${words[@]}") clients=$(chosen "$(others | xargs)" "${words[@]}")
  points=$(others_points | grep -Fx "$(xargs -n 1 <<<"$clients")" | xargs) || : # there may be none left

  prepare
  fetch_all_peers
  # shellcheck disable=SC2034  # for the machine
  printf -v plan 'ROLES=%q BANDS=%q NETWORKS=%q PROTECTIONS=%q CLIENTS=%q POINTS=%q OURS=%q PATIENCE=30' "$roles" "$bands" "$networks" \
    "$(chosen "$protections" "${words[@]}")" "$clients" "$points" "$ours"
  limit=$((300 + 120 * $(wc -w <<<"$bands") * $(wc -w <<<"$clients $points") * 7 * 2))
  run_script joins "$lab/joins/joins.sh" $limit cat
  # What was seen until a machine came to grief is kept, too.
  [[ ! $output || ! -e $work/logs/joins/cells.tsv ]] || cp "$work/logs/joins/cells.tsv" "$output"
  [[ $outcome == PASS ]] || die "who joins whom: $outcome; its logs are in $work/logs/joins"
  printf '\n'
  joins_table "$work/logs/joins/cells.tsv"
  ! cut -f 6 "$work/logs/joins/cells.tsv" | grep -qx failed
}

# A peer's client may be known by another name.
client_titles() {
  local name title
  for name in $(peers); do
    title=$(header "$lab/peers/$name.sh" Client)
    printf '%s\t%s\n' "$name" "${title:-$(header "$lab/peers/$name.sh" Title)}"
  done
}

joins_table() {  # CELLS
  awk -v titles="$(client_titles)" -v limits="$lab/joins/limits" -f "$lab/joins/table.awk" "$1"
}
