// Each command that a script of the kit runs fails once, one at a time: the access point is on the air with every rule
// that its settings ask for, or off with nothing left, and the script says why; the script again mends it.
#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "kit_radio.h"

namespace {

// A sweep is in three parts, which can go on side by side: each has every third turn.
constexpr int kParts = 3;

class KitSweep : public KitRadio, public testing::WithParamInterface<int> {
 protected:
  KitSweep() {
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
# is_its_turn CALL: counts a call, which has a name of its own.
is_its_turn() {
	n=0
	echo "$1" >>/tmp/count
	while read -r call && n=$((n + 1)) && [ "$call" != "$1" ]; do :; done </tmp/count
	[ $n -eq $turn ]
}
break_down() {
	echo "$name $*" >/tmp/failed
	echo "$name: broken for once" >&2
}
! is_its_turn $$ || {
	break_down "$@"
	exit 2
}
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
		break_down "$line"
		echo "Command failed -:$number" >&2
		exit 1
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

  static Ran RunWithTurn(int turn, const std::string& words) {
    WriteText("/tmp/count", "");
    WriteText("/tmp/turn", std::to_string(turn) + "\n");
    fs::remove("/tmp/failed");
    return RunInShell("PATH=/tmp/counted:$PATH " + words);
  }

  static std::string Failed() { return RunInShell("cat /tmp/failed 2>/dev/null").out; }
  static bool Reached(int turn) { return std::stoi(RunInShell("wc -l </tmp/count").out) >= turn; }

  // The sweep of a command that leads from one state to another, with a failure to one of the states that are whole.
  // From each of those the command is seen to mend it, once: the state is the same. How many failures there were.
  template <class Bring>
  int Sweep(const std::string& words, const std::string& from, Bring bring, const std::string& to,
            const std::vector<std::string>& whole) {
    int failures = 0;
    std::vector<std::string> mended;
    std::string state;
    for (int turn = GetParam();; turn += kParts) {
      if (state != from) bring();
      const Ran ran = RunWithTurn(turn, words);
      const std::string failed = Failed();
      state = State();
      if (failed.empty()) {
        EXPECT_EQ(ran.status, 0) << ran.out;
        EXPECT_EQ(state, to) << "turn " << turn << "\n" << ran.out;
        if (HasFailure() || !Reached(turn)) return failures;
        continue;
      }
      ++failures;
      if (ran.status == 0) {
        EXPECT_EQ(state, to) << failed << ran.out;
        continue;
      }
      EXPECT_NE(ran.out, "") << failed;
      EXPECT_TRUE(std::find(whole.begin(), whole.end(), state) != whole.end()) << failed << ran.out << state;
      if (HasFailure()) return failures;
      if (std::find(mended.begin(), mended.end(), state) != mended.end()) continue;
      mended.push_back(state);
      const Ran again = Run(words);
      EXPECT_EQ(again.status, 0) << failed << again.out;
      state = State();
      EXPECT_EQ(state, to) << failed << again.out;
    }
  }
};

constexpr char kStart[] = "/etc/rc.network start wlan0 lbr0";
constexpr char kRestart[] = "/etc/rc.network restart wlan0 lbr0";
constexpr char kSchedule[] = "/etc/rc.network schedule wlan0";

class KitSweepOfAccessPoint : public KitSweep {
 protected:
  KitSweepOfAccessPoint() {
    Hour("00");
    EXPECT_EQ(Run(kStart).out, "");
    main_ = State();
    Hour("01");
    EXPECT_EQ(Run(kStart).out, "");
    on_ = State();
    EXPECT_EQ(Run(kRestart).out, "");
    off_ = State();
  }

  std::string on_, main_, off_;
};

TEST_P(KitSweepOfAccessPoint, Start) {
  const int failures = Sweep(kStart, on_, [] { Run(kStart); }, on_, {on_, off_});
  std::printf("%d commands failed\n", failures);
  EXPECT_GE(failures, 8);
}

TEST_P(KitSweepOfAccessPoint, Restart) {
  const int failures = Sweep(kRestart, on_, [] { Run(kStart); }, off_, {on_, off_});
  std::printf("%d commands failed\n", failures);
  EXPECT_GE(failures, 5);
}

TEST_P(KitSweepOfAccessPoint, Schedule) {
  Hour("00");
  Run(kStart);
  BreakOnce("nft");
  Hour("01");
  Run(kSchedule);
  const std::string late = State();
  const auto bring = [] {
    Hour("00");
    Run(kStart);
    Hour("01");
  };
  const int failures = Sweep(kSchedule, main_, bring, on_, {main_, off_, late});
  std::printf("%d commands failed\n", failures);
  EXPECT_GE(failures, 8);
}

TEST_P(KitSweepOfAccessPoint, RemovalOfItsAdapter) {
  const std::string remove = "/usr/mero/hotplug/usb.wireless.function remove";
  const auto pull = [] {
    RunInShell("ip link show wlan0 || ip link add wlan0 type veth peer name air");
    WriteText("/tmp/wireless.info", "PRODUCT=\"RT [5370\"\n");
    Run(kStart);
    RunInShell("ip link delete wlan0");
  };
  pull();
  const std::string pulled = State();
  EXPECT_EQ(Run(kRestart).out, "");
  const std::string ended = State();  // and still noted
  EXPECT_EQ(Run(remove).out, "");
  const std::string removed = State();
  const int failures = Sweep(remove, pulled, pull, removed, {ended, removed});
  std::printf("%d commands failed\n", failures);
  EXPECT_GE(failures, 5);
}

TEST_P(KitSweep, Boot) {
  WriteText("/etc/sysconfig/network-scripts/ifcfg-abr0",
            "TYPE=Bridge\nPRIMARY=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.1\nNETMASK=255.255.255.0\nONBOOT=yes\n");
  const std::string boot = "/etc/rc.network boot";
  ASSERT_EQ(Run(boot).out, "");
  const std::string up = State();
  int failures = 0;
  for (int turn = GetParam(); turn == GetParam() || Reached(turn - kParts); turn += kParts) {
    RunInShell("ip link delete lbr0; ip link delete abr0; ip link set dev eth0 down");
    const Ran ran = RunWithTurn(turn, boot);
    if (Failed().empty()) continue;
    ++failures;
    if (ran.status == 0) {
      EXPECT_EQ(State(), up) << Failed() << ran.out;
      continue;
    }
    EXPECT_NE(ran.out, "") << Failed();
    // Of two bridges, one at most is not as it should be, unless nothing was begun.
    const std::string made = RunInShell("ip -brief -4 address show up | grep -cE '^[al]br0 .*/24'").out;
    EXPECT_TRUE(made == "1\n" || made == "2\n" || !fs::exists("/sys/class/net/abr0")) << Failed() << ran.out << made;
    EXPECT_EQ(Run(boot).out, "") << Failed();
    EXPECT_EQ(State(), up) << Failed();
  }
  std::printf("%d commands failed\n", failures);
  EXPECT_GE(failures, 3);
}

INSTANTIATE_TEST_SUITE_P(Part, KitSweep, testing::Range(1, kParts + 1));
INSTANTIATE_TEST_SUITE_P(Part, KitSweepOfAccessPoint, testing::Range(1, kParts + 1));

}  // namespace
