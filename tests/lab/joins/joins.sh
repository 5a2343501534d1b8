# Who joins whom, within the machine: clients of others join this project's access point, on its main network and on that
# for guests, and this project's client joins access points of others. What comes of each goes to the logs as cells.tsv, a
# line each; lab/joins/table.awk says what stands where.
# shellcheck shell=bash

# What is to be run, from the host: ROLES, PROTECTIONS, BANDS, NETWORKS, CLIENTS, POINTS and OURS; and PATIENCE, the seconds
# after which nothing is to be hoped for.
eval "$LAB_PLAN"

readonly MAIN=home VISITORS=visitors
readonly CELLS=$LOGS/cells.tsv
readonly said=/run/lab/client.log served=/run/lab/access-point.log watched=/run/lab/peer.watch

# What the supplicant calls them; where both are on offer, either will do.
declare -rA KEY_MANAGEMENT=(
  [open]=NONE/NONE [wep]='NONE/WEP-40 NONE/WEP-104' [wpa]=WPA-PSK/TKIP [wpa2]=WPA2-PSK/CCMP [mixed]=WPA2-PSK/CCMP
)
declare -a values=()
role='' peer='' network='' limit='' PREPARED=''

secret() {
  case $protection in
    wep) printf 'deux croiss..' ;;
    peap) printf "peter's secret" ;;
    ttls) printf "tina's \$ecret" ;;
    *) printf 'deux croissants' ;;
  esac
}

user() {
  case $protection in peap) printf peter ;; ttls) printf tina ;; esac
}

has_users() {
  [[ $protection == @(peap|ttls) ]]
}

# ---- What a peer does not do -----------------------------------------------------------------------------------------

# The message by which the peer tells that it does not do this, as an extended regular expression; "-" if it has no
# setting for it; nothing if it is to work.
known_limit() {
  awk -F '\t' -v role="$role" -v peer="$peer" -v protection="$protection" '
    !/^#/ && $1 == role && $2 == peer && index(" " $3 " ", " " protection " ") { print $4; exit }' "$LAB/joins/limits"
}

# The line in which it has said so.
refusal() {
  grep -hE -e "$limit" "$said" "$served" /run/lab/theirs.syslog | head -n 1
}

is_refused() {
  [[ $limit && $(refusal) ]]
}

# ---- A cell of the table ---------------------------------------------------------------------------------------------

# begin_cell: the others' machine has nothing of the time before; false if the peer has no setting for this.
begin_cell() {
  limit=$(known_limit)
  if [[ $limit == - ]]; then
    write_cell none '' ''
    return 1
  fi
  fresh theirs
  : >"$said"
  : >"$served"
  : >/run/lab/theirs.syslog
}

# end_cell: keeps what was said.
end_cell() {
  cat "$served" "$said" /run/lab/theirs.syslog >"$LOGS/$role.$peer.$protection.$band.$network.log"
}

write_cell() {  # OUTCOME MILLISECONDS WORDS
  local words
  words=$(printf '%s\n' "$3" | sed 's/\x1b\[[0-9;]*m//g' | tr -s '\t\n' ' ')
  words=${words% }
  printf '%s\t%s\t%s\t%s\t%s\t%s\t%s\t%s\n' "$role" "$peer" "$protection" "$band" "$network" "$1" "$2" "$words" >>"$CELLS"
  printf '%6.0f s  %-12s  %-14s  %-5s  %-3s GHz  %-6s  %s%s%s\n' "$(uptime_seconds)" "$role" "$peer" "$protection" \
    "$band" "$network" "$1" "${2:+ in $2 ms}" "${words:+: $words}"
}

# ---- A client --------------------------------------------------------------------------------------------------------

# prepares APPLIANCE PEER VERB: the peer's files are there, and the bus runs; false if its own programs refuse that, and
# what they said is in PREPARED.
prepares() {
  PREPARED=$(peer "$1" "$2" "${values[@]}" "$3" 2>&1) || return
  ! has "$2" Bus || start_bus "$1"
}

# starts APPLIANCE PEER LOG VERB: the peer runs, as its script does for this verb; what it says goes to the log.
starts() {
  { peer "$1" "$2" "${values[@]}" "$4" "${WATCH##*/lab/products}" start "$GROUPS_OF_ALL/peer" >"$3" 2>&1 || :; } &
  disown # how it ends is no news
}

# await_watcher: until it has seen all, or the peer has said that it does not do this.
await_watcher() {
  [[ ! $limit ]] || while kill -0 "$WATCHER" 2>/dev/null; do
    # It may have ended meanwhile.
    ! is_refused || kill "$WATCHER" 2>/dev/null || :
    sleep 0.2
  done
  wait "$WATCHER"
}

# lets_pass APPLIANCE [INTERFACE]: its access point, or that network of it, has a station whose traffic passes.
lets_pass() {
  if (($# > 1)); then ip netns exec "$1" iw dev "$2" station dump; else networks_of "$1"; fi |
    grep 'authorized:.*yes' >/dev/null
}

has_no_station() {  # APPLIANCE
  ! lets_pass "$1"
}

# How the supplicant of an appliance is connected.
key_management() {  # APPLIANCE
  inside "$1" wpa_cli -i wlan0 status | awk -F = '
    $1 == "key_mgmt" { management = $2 }
    $1 == "pairwise_cipher" { cipher = $2 }
    END { print management "/" cipher }'
}

# client APPLIANCE PEER ACCESS-POINT [INTERFACE PREFIX]: the peer joins, on an appliance, the access point on another one:
# the network of that interface, whose addresses begin so.
client() {
  local started pinged
  within 30 has_no_station "$3" || fail "a station of $3 is still there"
  if ! prepares "$1" "$2" knows; then
    write_cell failed '' "$PREPARED"
    return
  fi
  watch "$watched" ip netns exec "$1" "$WATCH" join "$PATIENCE"
  starts "$1" "$2" "$said" joins
  await_watcher || :
  started=$(told "$said" start) pinged=$(told "$watched" ping)
  if [[ $pinged && $2 == "$OURS" && " ${KEY_MANAGEMENT[$protection]} " != *" $(key_management "$1") "* ]]; then
    write_cell failed '' "it is protected otherwise than it was asked for: $(key_management "$1")"
  elif [[ $pinged ]] && lets_pass "${@:3:2}" && [[ $(addresses_of "$1") == *" ${5-}"* ]]; then
    write_cell joined $(((pinged - started + 500) / 1000)) ''
  elif is_refused; then
    write_cell refused '' "$(refusal)"
  else
    # Of what was watched for, this was seen.
    write_cell failed '' "no further than: $(sed 's/ .*//' "$watched" | xargs)"
  fi
}

# ---- Clients of others -----------------------------------------------------------------------------------------------

# Both networks come at once; that for guests knows no users.
put_up_ours() {
  values=(NAME="$MAIN" PROTECTION="$protection" BAND="$band" CHANNEL="$(channel_in "$band")")
  if has_users; then
    values+=(PASSPHRASE='between us' RADIUS=127.0.0.1)
  else
    values+=(PASSPHRASE="$(secret)" GUESTS="$VISITORS")
  fi
  say "our access point: $protection, $band GHz"
  peer nas "$OURS" "${values[@]}" offers >"$said" 2>&1 || fail "our access point is not set up: $(<"$said")"
  peer nas "$OURS" "${values[@]}" serves >"$said" 2>&1 || fail "our access point is not on the air: $(<"$said")"
}

client_of_ours() {  # NAME INTERFACE PREFIX
  begin_cell || return 0
  values=(NAME="$1" PROTECTION="$protection" USER_NAME="$(user)" PASSPHRASE="$(secret)" ADDRESS='' BAND="$band")
  client theirs "$peer" nas "${@:2}"
  end_cell
}

others_join_ours() {
  role=client
  put_up_ours
  for peer in $CLIENTS; do
    for network in $NETWORKS; do
      case $network in
        main) client_of_ours $MAIN wlan0 10.1.14. ;;
        guests) has_users || client_of_ours $VISITORS gwlan 10.1.15. ;;
      esac
    done
  done
}

# ---- Access points of others -----------------------------------------------------------------------------------------

is_on_air() {
  prepares theirs "$peer" offers || fail "the access point of $peer is not set up: $PREPARED"
  watch "$watched" "$WATCH" beacon hwsim0 $MAIN "$PATIENCE"
  starts theirs "$peer" "$served" serves
  await_watcher
}

ours_joins_others() {
  role=point network=main
  for peer in $POINTS; do
    [[ $band == 2.4 ]] || ! has "$peer" Channel || continue
    begin_cell || continue
    values=(NAME="$MAIN" PROTECTION="$protection" PASSPHRASE="$(secret)" ADDRESS='' BAND="$band"
      CHANNEL="$(channel_in "$band")")
    if is_on_air; then
      fresh ours
      client ours "$OURS" theirs
    elif is_refused; then
      write_cell refused '' "$(refusal)"
    else
      write_cell failed '' 'it is not on the air'
    fi
    end_cell
  done
}

# ----------------------------------------------------------------------------------------------------------------------

# What the others' machine says is read all the time, and to write it on the host takes messages.
touch /run/lab/theirs.syslog "$LOGS/theirs.syslog"
mount --bind /run/lab/theirs.syslog "$LOGS/theirs.syslog"
mount -t cgroup2 cgroup2 "$GROUPS_OF_ALL"
mkdir "$GROUPS_OF_ALL"/{peer,bus}
ip link set hwsim0 up
appliance nas
disown
appliance theirs
disown
if [[ " $ROLES " == *' points '* ]]; then
  appliance ours
  disown
fi
# With the kind of key that most servers have.
[[ $PROTECTIONS != *@(peap|ttls)* ]] || radius_server nas rsa rsa_keygen_bits:2048
inside nas mkdir -p /etc.defaults
inside nas tee /etc.defaults/meroinfo.conf >/dev/null <<<'support_pci_wifi="yes"'

for kind in $ROLES; do
  for band in $BANDS; do
    for protection in $PROTECTIONS; do
      case $kind in
        clients) others_join_ours ;;
        points) ours_joins_others ;;
      esac
    done
  done
  [[ $kind != clients ]] || peer nas "$OURS" retires || fail 'our access point is not taken down'
done
umount "$LOGS/theirs.syslog"
