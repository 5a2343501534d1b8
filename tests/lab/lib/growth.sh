# What an appliance has more of, the longer it runs: nothing.
# shellcheck shell=bash

# amounts_of NAME: how much of everything that could grow there is, a line each, and how much of it may come and go. The
# memory is what the kernel keeps for itself, and what processes have; both in KiB.
amounts_of() {
  local root=/proc/${INIT_OF[$1]}/root process _ pids=()
  while read -r process _; do pids+=("$root/proc/$process"); done < <(processes_of "$1")
  printf '%s\t%s\t%s\n' \
    processes "${#pids[@]}" 0 \
    'open descriptors' "$(counted "$root"/proc/[0-9]*/fd/*)" 0 \
    'memory of processes' "$(cat "${pids[@]/%//status}" /dev/null | awk '/^VmRSS:/ { sum += $2 } END { print sum + 0 }')" 64 \
    'memory of the kernel' "$(awk '/^SUnreclaim:|^KernelStack:/ { sum += $2 } END { print sum }' /proc/meminfo)" 2048 \
    files "$(cd "$root" && find etc run tmp usr/mero var/lib var/tmp -xdev | wc -l)" 0 \
    mounts "$(wc -l <"/proc/${INIT_OF[$1]}/mounts")" 0 \
    sockets "$(inside "$1" cat /proc/net/{unix,packet,netlink,udp,udp6,tcp,tcp6,raw,raw6} | wc -l)" 0 \
    interfaces "$(ip -n "$1" -oneline link | wc -l)" 0 \
    addresses "$(ip -n "$1" -oneline address | wc -l)" 0 \
    routes "$(ip -n "$1" route show table all | wc -l)" 0 \
    'rules between networks' "$(inside "$1" nft list ruleset | wc -l)" 0
}

counted() {  # FILE...
  [[ -e $1 || -L $1 ]] || shift
  echo $#
}

# expect_nothing_grown NAME AMOUNTS: tells how much there is of everything now, and how much there was.
expect_nothing_grown() {
  local what before may now grown=''
  while IFS=$'\t' read -r what before may now; do
    [[ $before && $now ]] || fail "of this there is no number: $what"
    say "$(printf '%-24s %7d %7d' "$what" "$before" "$now")"
    ((now <= before + may)) || grown+="$what "
  done < <(paste <(printf '%s\n' "$2") <(amounts_of "$1" | cut -f 2))
  [[ ! $grown ]] || fail "there is more of this on $1: $grown"
}
