// A save that is killed, at every instant: whether by a signal, a crash or a power cut.
#include <cstring>
#include <filesystem>

#include "tests/fault/saving.h"
#include "tests/fault/supervised.h"
#include "tests/platform/platform_test.h"

namespace {

using testing::AnyOf;
using testing::ElementsAre;

class AKilledSave : public PlatformTest {
 protected:
  // Kills each save before every one of its system calls, and looks at what is left.
  static void KillEverywhere(Interference how) {
    for (const Saving& saving : Savings()) {
      SCOPED_TRACE(saving.szName);
      const auto save = [&] { return MEROWirelessConfSet(&saving.network); };
      Prepare(saving);
      const std::string before = StoredText();
      ASSERT_EQ(save(), 0);
      const std::string after = StoredText();

      int call = 1;
      for (;; ++call) {
        Prepare(saving);
        const Outcome outcome = RunSupervised({how, call, 0, ""}, save);
        if (!outcome.reached) break;
        SCOPED_TRACE("killed before call " + std::to_string(call) + ", " + outcome.call.name);
        EXPECT_TRUE(outcome.killed);
        EXPECT_THAT(StoredText(), AnyOf(IsStillThe(before), after));
        EXPECT_EQ(save(), 0);
        EXPECT_EQ(StoredText(), after);
        EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("wireless.conf"));
      }
      EXPECT_GT(call, 15) << "a save makes more system calls than that";
      EXPECT_EQ(StoredText(), after) << "of the run that was not killed";
    }
  }
};

TEST_F(AKilledSave, LeavesTheOldStoreOrTheNewOneAndTheNextSaveCleansUp) {
  KillEverywhere(Interference::kKill);
}

TEST_F(AKilledSave, LeavesTheOldStoreWhenItIsKilledInTheMiddleOfAWrite) {
  KillEverywhere(Interference::kTearWrite);
}

// A power cut also takes what was written and not flushed.
TEST_F(AKilledSave, FlushesTheFileBeforeItIsInPlaceAndItsDirectoryBehind) {
  const Saving saving = Savings().front();
  Prepare(saving);
  const Outcome outcome = RunSupervised({}, [&] { return MEROWirelessConfSet(&saving.network); });
  std::vector<std::string> order;
  for (const SystemCall& call : outcome.before) {
    if (call.name == "write" || call.name == "fsync" || call.name == "rename") order.push_back(call.name);
  }
  // The sections before the network's own, its own, and those behind it.
  EXPECT_THAT(order, ElementsAre("write", "write", "write", "fsync", "rename", "fsync"));
}

// A DHCP server whose setting up had been broken off was known without its time, and was switched on like that.
TEST_F(AKilledSave, MakesNoDhcpServerKnownThatLacksASetting) {
  MERO_DHCPD_CONF conf{};
  conf.autoTime = 30;
  for (char* szName : {conf.szInterface, conf.szTag}) std::strcpy(szName, "lbr0");
  std::strcpy(conf.szRangeStart, "10.1.14.2");
  int known = 0;
  for (int call = 1;; ++call) {
    std::filesystem::remove_all("/etc/dhcpd");
    const Outcome outcome =
        RunSupervised({Interference::kKill, call, 0, ""}, [&] { return MERONetSetDhcpServerConfigFiles(&conf, 1); });
    if (!outcome.reached) break;
    MERO_DHCPD_CONF read{};
    if (MERONetGetDhcpServerConf("lbr0", "lbr0", &read) == 0) continue;
    EXPECT_EQ(read.autoTime, 30) << "killed before call " << call << ", " << outcome.call.name;
    ++known;
  }
  EXPECT_GT(known, 3);
}

}  // namespace
