# A Debian system boots with our packages: the adapter as hardware, units, an upgrade and the removal under way.
# Debian
# On request
# Plain only
# Limit: 1800 s
# shellcheck shell=bash

# The warnings that a boot may have: the lab's kernel lacks a module that systemd would like, the library tells how often
# it has scanned, the program may just be asking the adapter when that is pulled, nobody tells an access point's name
# server of others, and systemd wonders at a connection that has outlasted the program when that is started anew.
known_warnings='systemd\[1\]: Failed to find module .autofs4.$'
known_warnings+='|merowireless\[[0-9]+\]: wireless_network_scan:[0-9]+ Scan [0-9]: (result is un-stable|success)\.$'
known_warnings+='|dnsmasq\[[0-9]+\]: no servers found in /etc/resolv.conf, will retry$'
known_warnings+='|systemd\[1\]: mero-wireless-autoconnect.service: Found left-over process [0-9]+ '
known_warnings+='\((wpa_supplicant|busybox)\) in control group while starting unit. Ignoring.$'
known_warnings+='|systemd\[1\]: This usually indicates unclean termination of a previous run, or service '
known_warnings+='implementation deficiencies.$'
# shellcheck disable=SC2034  # what a word uses
known_warnings+='|merowireless\[[0-9]+\]: current_info:[0-9]+ Failed to ask the adapter wlan0: No such device$'

air() {
  access_point cafe ssid=cafe channel=6 wpa=2 wpa_passphrase='deux croissants' rsn_pairwise=CCMP
  serve cafe 10.2.0
}

boot_1() {
  has_started
  takes_archive now
  apt install merowireless merowireless-appliance

  say '-- the adapter that was there before is found'
  within 20 unit_is "$ADAPTER" active || fail 'nobody takes the adapter'
  on nas cat /tmp/wireless.info
  expect_line 'INTERFACE="wlan0"'
  expect_unit mero-network.service active
  expect_unit mero-wireless-schedule.timer active
  expect_unit "$KEEPER" inactive

  say '-- a network is to be joined at start-up'
  echo 'deux croissants' >/var/lib/lab/key
  on nas merowireless save cafe --key-file /var/lib/lab/key
  systemctl enable "$KEEPER"
  expect_quiet_journal
  reboots
}

boot_2() {
  say '-- the network is joined by itself'
  within 60 is_joined || fail 'the network is not joined'
  tell_time 'an address'
  has_started
  expect_reachable nas 10.2.0.1
  expect_unit "$KEEPER" active
  expect_unit mero-wireless-schedule.timer active
  show_boot_times

  say '-- the adapter is pulled and plugged in'
  pull_adapter
  within 10 unit_is "$ADAPTER" inactive || fail 'the unit of the adapter stays'
  expect_unit "$KEEPER" inactive
  expect_same 'the note of the adapter' '' "$(</tmp/wireless.info)"
  expect_same 'the daemons without an adapter' '' "$(daemons)"
  plug_adapter
  within 60 is_joined || fail 'the network is not joined again'
  tell_time 'an address'

  say '-- the interface goes down and up, as when a machine sleeps'
  ip link set wlan0 down
  sleep 5
  ip link set wlan0 up
  within 60 answers 10.2.0.1 || fail 'the network does not come back'
  tell_time 'an answer'
  within 60 is_addressed_anew || fail 'the network is joined again, and no address asked for'

  say '-- an upgrade keeps the connection, and has the new program keep it'
  local before
  before=$(daemons)
  [[ $before == *wpa_supplicant* && $before == *udhcpc* ]] || fail "the client's programs are not among these: $before"
  takes_archive later
  apt upgrade
  within 10 unit_is "$KEEPER" active || fail 'nobody keeps the connection'
  expect_same 'the program that keeps it' /usr/bin/merowireless "$(file_of_keeper)"
  expect_same 'the daemons after the upgrade' "$before" "$(daemons)"

  say '-- without the program the connection stays as it is'
  apt remove merowireless
  expect_unit "$KEEPER" inactive
  expect_same 'the daemons without the program' "$before" "$(daemons)"
  apt install merowireless
  within 10 unit_is "$KEEPER" active || fail 'nobody keeps the connection again'

  say '-- the removal leaves the network'
  apt remove merowireless merowireless-appliance libmerowireless-core1
  expect_same 'the daemons after the removal' '' "$(daemons)"
  expect_same 'the addresses after the removal' '' "$(ipv4_of nas)"
  [[ ! -s /etc/resolv.conf ]] || fail "name servers are left after the removal: $(</etc/resolv.conf)"
  takes_archive now
  apt install merowireless merowireless-appliance
  within 60 is_joined || fail 'the network is not joined after the next installation'
  expect_quiet_journal

  say '-- the adapter is to be an access point'
  systemctl disable --now "$KEEPER"
  on nas merowireless disconnect
  on nas merowireless ap set --ssid hall --encryption wpa2 --key-file /var/lib/lab/key --channel 1 --bridge lbr0
  on nas merowireless ap enable
  reboots
}

boot_3() {
  say '-- the access point is on the air by itself'
  within 60 serves_by_itself || fail 'the access point is not on the air'
  tell_time 'an access point'
  has_started
  show_boot_times
  make_radio phone
  joins_hall phone
  expect_confined
  expect_quiet_journal

  say '-- its timer has it follow its schedule, at the change of the hour'
  off_in_the_next_hour >/var/lib/lab/hours
  on nas merowireless ap set --wifi-sched /var/lib/lab/hours
  nears_the_next_hour
  within 15 is_off_the_air || fail 'the access point is on the air at an hour that its schedule has it off'
  nears_the_next_hour
  within 15 serves_by_itself || fail 'the access point is not on the air at an hour that its schedule has it on'
  within 60 station nas phone || fail 'the phone does not come back'
  expect_quiet_journal

  say '-- an upgrade leaves it on the air'
  local before
  before=$(daemons)
  [[ $before == *hostapd* && $before == *dnsmasq* ]] || fail "the access point's daemons are not among these: $before"
  takes_archive later
  apt upgrade
  # shellcheck disable=SC2016  # the field is dpkg's
  on nas dpkg-query --show --showformat '${Version}\n' merowireless-appliance
  expect_line "$(dpkg-deb --field /var/lib/lab/archive/merowireless-appliance_*.deb Version)"
  expect_same 'the daemons after the upgrade' "$before" "$(daemons)"
  expect_station nas phone
  expect_unit "$ADAPTER" active
  expect_unit mero-wireless-schedule.timer active

  say '-- the adapter is pulled and plugged in'
  pull_adapter
  within 20 unit_is "$ADAPTER" inactive || fail 'the unit of the adapter stays'
  expect_same 'the daemons without an adapter' '' "$(daemons)"
  plug_adapter
  within 60 serves_by_itself || fail 'the access point is not on the air again'

  say '-- the removal ends everything'
  expect_quiet_journal
  apt remove merowireless merowireless-appliance libmerowireless-core1
  expect_same 'the daemons after the removal' '' "$(daemons)"
  on nas nft list ruleset
  expect_same 'the rules after the removal' '' "$OUTPUT"
  on nas ip -brief link show type bridge
  expect_same 'the bridges after the removal' '' "$OUTPUT"
  on nas systemctl list-units --plain --no-legend 'mero-*'
  expect_same 'the units after the removal' '' "$OUTPUT"
  on nas systemctl --failed --no-legend
  expect_same 'the units that have failed' '' "$OUTPUT"
  expect_quiet_journal
}

is_joined() {
  station cafe nas && [[ $(ipv4_of nas) == 10.2.0.* ]]
}

# The former address answers until the one of a new connection has been asked for, by a client that is younger than the
# supplicant.
is_addressed_anew() {
  (($(</var/run/udhcpc-wlan0.pid) > $(</var/run/wpa_supplicant.pid)))
}

answers() {  # ADDRESS
  busybox ping -c 1 -W 1 "$1" >/dev/null 2>&1
}

# The access point's daemons, which a unit has started, have few rights (of dnsmasq, which becomes a user of its own, that
# is the bounding set: chown, dac_override, fowner, fsetid, kill, setgid, setuid, net_bind_service, net_admin, net_raw,
# sys_ptrace), see nothing of /home, and cannot write below /usr.
expect_confined() {
  local name pid
  touch /home/seen
  { touch /usr/seen && rm /usr/seen; } || fail 'nobody can write below /usr'
  for name in hostapd-wlan0 dnsmasq-lbr0; do
    pid=$(</run/rc.network/$name.pid)
    expect_same "the rights of $name" 'CapBnd: 00000000000834fb NoNewPrivs: 1 Seccomp: 2' \
      "$(grep -E '^(CapBnd|NoNewPrivs|Seccomp):' "/proc/$pid/status" | xargs)"
    [[ -d /proc/$pid/root/usr ]] || fail "what $name sees cannot be told"
    [[ ! -e /proc/$pid/root/home/seen ]] || fail "$name sees what is in /home"
    nsenter --target "$pid" --mount true || fail "what $name may write cannot be told"
    ! nsenter --target "$pid" --mount touch /usr/seen 2>/dev/null || fail "$name can write below /usr"
  done
}

serves_by_itself() {
  [[ $(hostapd_cli -p /var/run/hostapd -i wlan0 status 2>/dev/null) == *state=ENABLED* ]]
}

is_off_the_air() {
  [[ $(</sys/class/net/wlan0/operstate) == down ]]
}

# A schedule has a digit for each hour of the week.
off_in_the_next_hour() {
  local day hour
  read -r day hour < <(date '+%w %-H')
  printf '%0168d' 0 | tr 0 1 | sed "s/./0/$(((day * 24 + hour + 1) % 168 + 1))"
}

nears_the_next_hour() {
  date --set "$(date '+%F %H'):59:57" | show
}

# What runs of the access point, or the client.
daemons() {
  processes_of nas | grep -E '(hostapd|dnsmasq|udhcpc|wpa_supplicant) ' | grep -vE '/run/lab/|wpa_supplicant -u ' || :
}

file_of_keeper() {
  readlink "/proc/$(systemctl show --property MainPID --value "$KEEPER")/exe"
}

joins_hall() {  # NAME
  wpa_passphrase hall 'deux croissants' >"/run/lab/$1.conf"
  ip netns exec "$1" wpa_supplicant -B -i wlan0 -c "/run/lab/$1.conf" -P "/run/lab/$1.pid" >/dev/null
  within 30 station nas "$1" || fail "$1 cannot join"
  ip netns exec "$1" busybox udhcpc -n -q -f -i wlan0 -s /bin/true 2>&1 | show
}
