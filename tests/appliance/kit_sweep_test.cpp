// Each command that a script of the kit runs fails once, one at a time: the access point is on the air with every rule
// that its settings ask for, or off with nothing left, and the script says why; the script again mends it.
#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "kit_sweep.h"

namespace {

// A sweep is in three parts, which can go on side by side: each has every third turn.
constexpr int kParts = 3;

class KitSweep : public CountedKit, public testing::WithParamInterface<int> {
 protected:
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
  BreakOnce("nft", "-f");
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
