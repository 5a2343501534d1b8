// A machine on which each command that a script of the kit runs is counted, and one of them goes wrong.
#ifndef MERO_TESTS_KIT_SWEEP_H
#define MERO_TESTS_KIT_SWEEP_H

#include <string>

#include "kit_radio.h"

// What becomes of the command whose turn it is.
enum class Turn { kFails, kTakesLong, kKills };

class CountedKit : public KitRadio {
 protected:
  CountedKit() {
    WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n");
    WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
    WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
    // Other rules than the usual ones.
    WriteText("/usr/mero/etc/wireless_ap.conf",
              "[RT [5370]\n\tguest_net_internet_block=1\n\tguest_net_access_ds=1\n\tguest_net_sched_enable=1\n"
              "\tguest_net_sched=0" +
                  std::string(167, '1') + "\n");
    Install("sleep", "exec /usr/bin/sleep 0.01\n");
    Install("date", "read -r hour </tmp/hour; echo 0 $hour\n");
    StandIn("hostapd", Daemon("hostapd", "-P") +
                           "/usr/sbin/ip link delete gwlan 2>/dev/null\n"
                           "grep -q ^bss=gwlan /run/rc.network/hostapd-wlan0.conf || exit 0\n"
                           "/usr/sbin/ip link add gwlan type veth peer name gair\n");
    fs::create_directories("/tmp/counted");
    WriteScript("/tmp/counted/tool", R"(name=${0##*/} n=0
case $PATH in
/tmp/counted:*) ;;
*) exec "/tmp/uncounted/$name" "$@" ;; # outside of the sweep
esac
read -r turn </tmp/turn
read -r mode missing </tmp/mode
echo "$name" >>/tmp/ran
[ "$name" != "$missing" ] || {
	echo "$name: not found" >&2
	exit 127
}
# is_its_turn CALL: counts a call, which has a name of its own.
is_its_turn() {
	n=0
	echo "$1" >>/tmp/count
	while read -r call && n=$((n + 1)) && [ "$call" != "$1" ]; do :; done </tmp/count
	[ $n -eq $turn ]
}
# break_down WORD...: is false where the command does its work all the same. A script that is killed is killed with all
# that it has begun, but for daemons.
break_down() {
	echo "$name $*" >/tmp/failed
	case $mode in
	kills) kill -s KILL 0 ;;
	takes-long) PATH=/usr/bin:/bin sleep 0.1 && return 1 ;;
	*) echo "$name: broken for once" >&2 ;;
	esac
}
! is_its_turn $$ || ! break_down "$@" || exit 2
PATH=/tmp/bin:/tmp/uncounted:${PATH#*:}
case "$name $*" in
"ip "*-batch*) ;;
*) exec "$name" "$@" ;;
esac
# Each command of a batch is a call, those before the one that fails being done.
done='' number=0
while IFS= read -r line; do
	number=$((number + 1))
	[ $number -eq 1 ] || ! is_its_turn $$.$number || {
		printf '%s' "$done" | ip "$@"
		done=''
		! break_down "$line" || {
			echo "Command failed -:$number" >&2
			exit 1
		}
	}
	done="$done$line
"
done
printf '%s' "$done" | ip "$@"
)");
    for (const char* szTool : kTools) fs::create_symlink("tool", std::string("/tmp/counted/") + szTool);
    // The scripts name it by its path.
    fs::create_directories("/tmp/uncounted");
    fs::copy("/usr/mero/sbin/mero-settings", "/tmp/uncounted/mero-settings");
    fs::remove("/usr/mero/sbin/mero-settings");
    fs::create_symlink("/tmp/counted/tool", "/usr/mero/sbin/mero-settings");
    Hour("01");
  }

  static void Hour(const char* szHour) { WriteText("/tmp/hour", std::string(szHour) + "\n"); }

  // Everything that a start makes, and leaves, but for the guests' interface, which is the daemon's own.
  static std::string State() {
    return Daemons() +
           RunInShell(
               "cat /tmp/rules; cat /proc/sys/net/ipv4/ip_forward; ls -d /sys/class/net/* | grep -v /g[aw]; ls -d "
               "/sys/class/net/*/brif/*; "
               "ip -brief -4 address | sort; cat /sys/class/net/wlan0/flags; cat /etc/hostapd/*.info "
               "/tmp/wireless.info; "
               "stat -c '%n %a %u' /run/rc.network /run/rc.network/* /tmp/wireless* /etc/hostapd/* | grep "
               "-v 'leases\\|lock'")
               .out;
  }

  // The script is started by setsid(1), so that all of it can be killed.
  static Ran RunWithTurn(int turn, const std::string& words, Turn what = Turn::kFails) {
    constexpr const char* kModes[] = {"fails", "takes-long", "kills"};
    return RunInMode(turn, kModes[static_cast<int>(what)], words);
  }

  // A script without that program.
  static Ran RunWithout(const std::string& program, const std::string& words) {
    return RunInMode(0, "fails " + program, words);
  }

  static Ran RunInMode(int turn, const std::string& mode, const std::string& words) {
    WriteText("/tmp/count", "");
    WriteText("/tmp/ran", "");
    WriteText("/tmp/turn", std::to_string(turn) + "\n");
    WriteText("/tmp/mode", mode + "\n");
    fs::remove("/tmp/failed");
    return RunInShell("setsid -w sh -c 'echo $$ >/tmp/session; export PATH=/tmp/counted:$PATH; exec " + words + "'");
  }

  static std::string Failed() { return RunInShell("cat /tmp/failed 2>/dev/null").out; }
  static bool Reached(int turn) { return std::stoi(RunInShell("wc -l </tmp/count").out) >= turn; }
};

#endif  // MERO_TESTS_KIT_SWEEP_H
