# The race, within the machine: each contender joins the same network, and puts the same access point on the air, alone
# and among others, on both bands, as on its first start and as on its second. What is measured goes to the logs as
# figures.tsv, a line each time; lab/race/host.sh says what stands where.
# shellcheck shell=bash

# What is to be run, from the host: EVENTS, AIRS, BANDS, CONTENDERS and ROUNDS.
eval "$LAB_PLAN"

readonly NETWORK=home SECRET='deux croissants' PATIENCE=60 SETTLING=2
readonly FIGURES=$LOGS/figures.tsv
readonly -a NEIGHBOUR_CHANNELS=(1 1 6 6 11 36 40 149)
readonly said=/run/lab/contender.log

declare -A FIGURE

# contender VERB [COMMAND...]: runs a contender's own script in the appliance, behind the command if there is one.
contender() {
  peer nas "$name" NAME="$NETWORK" PASSPHRASE="$SECRET" PROTECTION=wpa2 ADDRESS="$access_point_address" BAND="$band" \
    CHANNEL="$(channel_in "$band")" WIDTH=20 "$@"
}

# Where a contender's access point is heard; some know one channel alone.
frequency() {
  if has "$name" Channel; then
    printf '%d' $((2407 + 5 * $(sed -n 's/^# Channel: //p' "$(peer_file "$name")")))
  else
    case $band in 2.4) printf 2437 ;; 5) printf 5180 ;; esac
  fi
}

mode() {
  case $band in 2.4) printf g ;; 5) printf a ;; esac
}

microseconds() {
  printf '%s' "${EPOCHREALTIME/./}"
}

# ---- What is read of a contender -------------------------------------------------------------------------------------

# memory GROUP: the KiB of its processes, each page by its share.
memory() {
  local process
  for process in $(members "$1"); do
    cat "/proc/$process/smaps_rollup" || : # it may have ended meanwhile
  done | awk '$1 == "Pss:" { sum += $2 } END { print sum + 0 }'
}

# The microseconds of its processes, those that have ended too.
processor_time() {  # GROUP
  awk '$1 == "usage_usec" { print $2 }' "$GROUPS_OF_ALL/$1/cpu.stat"
}

last_process() {
  inside nas cat /proc/loadavg | awk '{ print $5 }'
}

# since FILE WHAT: the microseconds from the start to what was told.
since() {
  local time
  time=$(told "$1" "$2")
  [[ ! $time ]] || printf '%s' $((time - started))
}

# The contender runs, as its script does for this verb. What it says is in memory: to write a log takes messages to the
# host.
start() {  # VERB
  processor_before=$(processor_time contender)
  bus_before=$(processor_time bus)
  contender "$1" "${WATCH##*/lab/products}" start "$GROUPS_OF_ALL/contender" >"$said" 2>&1 &
  starter=$!
}

read_start() {
  started=$(told "$said" start)
  [[ $started ]] || fail "$name does not start: $(<"$said")"
}

# Two seconds after it has come to its end, it is at rest.
settle() {
  sleep $SETTLING
  FIGURE[started]=$(($(last_process) - $(told "$said" last)))
  FIGURE[processes]=$(members contender | wc -l)
  FIGURE[memory]=$(memory contender)
  FIGURE[bus_memory]=$(memory bus)
  FIGURE[processor]=$(($(processor_time contender) - processor_before))
  FIGURE[bus_processor]=$(($(processor_time bus) - bus_before))
}

# The contender's list of networks, made afresh, has to have the one.
scan() {
  local began list
  began=$(microseconds)
  if list=$(contender scans timeout $PATIENCE 2>&1) && [[ $list == *"$NETWORK"* ]]; then
    FIGURE[scan]=$(($(microseconds) - began))
  else
    say "$name does not list the network: $list"
  fi
}

stop() {  # VERB
  contender "$1" >/dev/null 2>&1 || say "$name: $1 fails"
  end_members contender
  # It may have been ended before it had.
  wait "$starter" || :
  cp "$said" "$LOGS/$label.log"
  restore_state
}

# What the next start finds: an interface that is down, and the contender's own files.
restore_state() {
  local interface
  for interface in $(ip netns exec nas iw dev | awk '$1 == "Interface" && $2 != "wlan0" { print $2 }'); do
    ip netns exec nas iw dev "$interface" del
  done
  ip netns exec nas iw dev wlan0 info >/dev/null 2>&1 || ip netns exec nas iw phy "${RADIO_OF[nas]}" interface add wlan0 type managed
  ip -n nas link set wlan0 down
  ip -n nas address flush dev wlan0
  ip netns exec nas iw dev wlan0 set type managed
}

write_figures() {  # EVENT STATE ROUND
  local figure
  (($3 > 0)) || return 0
  {
    printf '%s\t%s\t%s\t%s\t%s\t%s' "$1" "$air" "$band" "$2" "$name" "$3"
    for figure in beacon authorized address ping processes started memory bus_memory processor bus_processor scan; do
      printf '\t%s' "${FIGURE[$figure]--}"
    done
    printf '\n'
  } >>"$FIGURES"
  printf '%6.0f s  %-4s %-5s %-3s %-4s round %s  %-14s %s\n' "$(uptime_seconds)" "$1" "$air" "$band" "$2" "$3" "$name" \
    "$(in_milliseconds "${FIGURE[ping]-}")"
}

in_milliseconds() {  # MICROSECONDS
  if [[ $1 ]]; then printf '%d ms' $((($1 + 500) / 1000)); else printf 'did not get there'; fi
}

# ---- Joining ---------------------------------------------------------------------------------------------------------

join_once() {  # STATE ROUND
  local watched=/run/lab/join.watch label=join.$name.$air.$band.$1 starter started what
  local processor_before bus_before
  FIGURE=()
  watch "$watched" ip netns exec nas "$WATCH" join $PATIENCE
  start joins
  wait "$WATCHER" || say "$name has not joined: $(<"$watched")"
  read_start
  for what in authorized address ping; do FIGURE[$what]=$(since "$watched" $what); done
  settle
  scan
  stop leaves
  write_figures join "$1" "$2"
}

# has_its_starts TO-PREPARE ONCE ROUND: a contender's first start and its second, on an appliance that is new to it; a
# practice round has no second.
has_its_starts() {
  fresh nas
  contender "$1" >/run/lab/prepared.log 2>&1 || fail "$name cannot be prepared: $(</run/lab/prepared.log)"
  ! has "$name" Bus || start_bus nas
  "$2" cold "$3"
  (($3 == 0)) || "$2" warm "$3"
  ! has "$name" Bus || end_members bus
}

race_to_join() {  # ROUND
  has_its_starts knows join_once "$1"
}

# ---- Serving ---------------------------------------------------------------------------------------------------------

# A station that waits for a word to join, and asks for an address then.
start_station() {
  cat >/run/lab/guest.conf <<END
ctrl_interface=/run/lab/guest
network={
  ssid="$NETWORK"
  psk="$SECRET"
  scan_freq=$(frequency)
  disabled=1
}
END
  forget_networks guest
  (
    echo "$BASHPID" >"$GROUPS_OF_ALL/station/cgroup.procs"
    ip netns exec guest wpa_supplicant -B -D nl80211 -i wlan0 -c /run/lab/guest.conf >/run/lab/guest.log
    ip netns exec guest wpa_cli -p /run/lab/guest -i wlan0 scan_interval 1 >/run/lab/guest.log
    ip netns exec guest wpa_cli -p /run/lab/guest -i wlan0 -B -a /run/lab/guest.joined
  ) || fail "the station does not start: $(</run/lab/guest.log)"
}

write_station_scripts() {
  cat >/run/lab/guest.joined <<'END'
#!/bin/sh
[ "$2" != CONNECTED ] || exec busybox udhcpc -b -t 30 -T 1 -i "$1" -s /run/lab/guest.leased
END
  cat >/run/lab/guest.leased <<'END'
#!/bin/sh
[ "$1" != bound ] || ip address replace "$ip/$mask" dev "$interface"
END
  chmod 755 /run/lab/guest.joined /run/lab/guest.leased
}

stop_station() {
  end_members station
  ip -n guest address flush dev wlan0
}

serve_once() {  # STATE ROUND
  local watched label=ap.$name.$air.$band.$1 beacon_watcher starter started
  local processor_before bus_before
  FIGURE=()
  start_station
  watched=/run/lab/beacon.watch
  watch "$watched" "$WATCH" beacon hwsim0 "$NETWORK" $PATIENCE
  beacon_watcher=$WATCHER
  watched=/run/lab/station.watch
  watch "$watched" ip netns exec guest "$WATCH" join $PATIENCE
  start serves
  if wait "$beacon_watcher"; then
    ip netns exec guest wpa_cli -p /run/lab/guest -i wlan0 enable_network 0 >/dev/null
    wait "$WATCHER" || say "no station has joined $name: $(<"$watched")"
  else
    say "$name is not on the air"
    kill "$WATCHER"
  fi
  read_start
  FIGURE[beacon]=$(since /run/lab/beacon.watch beacon)
  FIGURE[ping]=$(since "$watched" ping)
  settle
  stop retires
  stop_station
  write_figures ap "$1" "$2"
}

race_to_serve() {  # ROUND
  [[ $band == 2.4 ]] || ! has "$name" Channel || return 0
  has_its_starts offers serve_once "$1"
}

# ---- The air ---------------------------------------------------------------------------------------------------------

put_up_neighbours() {
  local index
  for index in "${!NEIGHBOUR_CHANNELS[@]}"; do
    neighbour "neighbour$index" "${NEIGHBOUR_CHANNELS[index]}" $((-48 - 2 * index))
  done
}

neighbour() {  # NAME CHANNEL SIGNAL
  local letter=g
  (($2 < 36)) || letter=a
  access_point "$1" ssid="$1" hw_mode=$letter channel="$2" signal="$3" \
    wpa=2 wpa_passphrase='none of yours' rsn_pairwise=CCMP
}

# The network that is joined; on another band it is the same one's next access point.
put_up_network() {  # NAME
  access_point "$1" ssid="$NETWORK" hw_mode="$(mode)" channel="$(channel_in "$band")" signal=-45 \
    wpa=2 wpa_passphrase="$SECRET" rsn_pairwise=CCMP
  serve "$1" 10.2.0
  access_point_address=$(address_of "$1")
}

change_band() {
  hostapd_conf ssid="$NETWORK" hw_mode="$(mode)" channel="$(channel_in "$band")" \
    wpa=2 wpa_passphrase="$SECRET" rsn_pairwise=CCMP >/run/lab/router.conf
  switch_on router
}

# Round 0 comes once, and is not measured: the kernel's modules are loaded then, and files come from the host.
rounds() {  # EVENT FUNCTION
  local round=1
  [[ $practised == *" $2 "* ]] || round=0
  practised+=" $2 "
  for ((; round <= ROUNDS; round++)); do
    for name in $CONTENDERS; do
      ! has "$name" "$1" || "$2" "$round"
    done
  done
}

# ----------------------------------------------------------------------------------------------------------------------

# shellcheck disable=SC2034  # where the steps are told
exec {STEPS}>"$LOGS/steps"
mount -t cgroup2 cgroup2 "$GROUPS_OF_ALL"
mkdir "$GROUPS_OF_ALL"/{contender,bus,station}
access_point_address='' band=2.4 air=alone name='' practised=''
put_up_network router
switch_off router
touch /run/lab/nas.syslog "$LOGS/nas.syslog"
mount --bind /run/lab/nas.syslog "$LOGS/nas.syslog"
appliance nas
disown
give_radio guest
write_station_scripts
ip link set hwsim0 up

for air in $AIRS; do
  [[ $air == alone ]] || put_up_neighbours
  for band in $BANDS; do
    if [[ " $EVENTS " == *' join '* ]]; then
      change_band
      rounds Join race_to_join
      switch_off router
    fi
    [[ " $EVENTS " != *' ap '* ]] || rounds 'Access point' race_to_serve
  done
done

umount "$LOGS/nas.syslog"
cp /run/lab/nas.syslog "$LOGS/"
