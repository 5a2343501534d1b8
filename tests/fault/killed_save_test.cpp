// A save that is killed, at every instant: whether by a signal, a crash or a power cut.
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

}  // namespace
