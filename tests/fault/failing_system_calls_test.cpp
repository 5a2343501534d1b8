// A save whose system calls fail, one at a time.
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <set>

#include "tests/fault/calls.h"
#include "tests/fault/saving.h"
#include "tests/fault/scene.h"
#include "tests/fault/supervised.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

using testing::AnyOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

bool Lists(const std::vector<SystemCall>& calls, const std::string& name) {
  return std::ranges::find(calls, name, &SystemCall::name) != calls.end();
}

class ASaveWithAFailure : public PlatformTest {
 protected:
  // Lets each system call on files of each save fail, and calls `look(before, after, outcome)` with the store before
  // the save and the one that the save is to make of it.
  template <class Look>
  static void FailEverywhere(int error, Look look) {
    std::set<std::string> failed;
    for (const Saving& saving : Savings()) {
      SCOPED_TRACE(saving.szName);
      const auto save = [&] { return MEROWirelessConfSet(&saving.network); };
      Prepare(saving);
      const std::string before = StoredText();
      ASSERT_EQ(save(), 0);
      const std::string after = StoredText();

      for (int call = 1;; ++call) {
        Prepare(saving);
        const Outcome outcome = RunSupervised({Interference::kFail, call, error, ""}, save);
        if (!outcome.reached) break;
        SCOPED_TRACE("call " + std::to_string(call) + ", " + outcome.call.name + ": " + std::strerror(error));
        failed.insert(outcome.call.name);
        look(before, after, outcome);
        for (const std::string& name : NamesIn(kStoreDirectory)) {
          // A lock that was not taken, or could not be removed, is left for the next writer.
          const bool ofLock =
              outcome.call.name == "flock" || outcome.call.name == "stat" || outcome.call.name == "unlink";
          if (ofLock && name == ".wireless.conf.lock") continue;
          EXPECT_EQ(name, "wireless.conf");
        }
        EXPECT_EQ(save(), 0) << "the next save";
        EXPECT_THAT(NamesIn(kStoreDirectory), ElementsAre("wireless.conf"));
        EXPECT_EQ(StoredText(), after) << "of the next save";
      }
    }
    EXPECT_THAT(failed,
                testing::IsSupersetOf({"open", "read", "write", "fsync", "close", "rename", "flock", "fchmod"}));
  }

  static void ExpectFailed(const Outcome& outcome, int code, const std::string& before, const std::string& after) {
    EXPECT_EQ(outcome.result, -1);
    EXPECT_EQ(outcome.code, code);
    char szErrno[32];
    std::snprintf(szErrno, sizeof szErrno, "errno=0x%X", static_cast<unsigned>(code));
    EXPECT_THAT(outcome.reports, ElementsAre(HasSubstr(kStore), HasSubstr("wireless_conf_set:")));
    EXPECT_THAT(outcome.reports, Contains(AnyOf(HasSubstr(szErrno), HasSubstr("Failed to touch"))));
    // The new file has taken the place of the old one for good: it is whole, but may not outlast a power cut.
    const bool inPlace = Lists(outcome.before, "rename");
    EXPECT_THAT(StoredText(), inPlace ? testing::Matcher<std::string>(after) : IsStillThe(before));
  }
};

TEST_F(ASaveWithAFailure, ReportsItAndLeavesTheStoreAndNothingElse) {
  const struct {
    int error;
    int code;
  } rows[] = {{EIO, ERR_IO}, {ENOSPC, ERR_NO_SPACE}, {EDQUOT, ERR_NO_SPACE}, {EACCES, ERR_PERMISSION}};
  for (const auto& row : rows) {
    FailEverywhere(row.error, [&](const std::string& before, const std::string& after, const Outcome& outcome) {
      // Not to know that there is a store, or whose its directory is, to close what was only read, or to remove the
      // lock does not keep a network from being saved.
      constexpr std::string_view kHarmless[] = {"access", "close", "stat", "unlink"};
      const bool harmless = std::ranges::count(kHarmless, outcome.call.name) > 0 && outcome.result == 0;
      // A close that fails is not tried again, since the descriptor may be another's by then.
      EXPECT_EQ(outcome.descriptorsLeft, outcome.call.name == "close" ? 1 : 0);
      if (!harmless) return ExpectFailed(outcome, row.code, before, after);
      EXPECT_THAT(outcome.reports, IsEmpty());
      EXPECT_EQ(StoredText(), after);
    });
  }
}

TEST_F(ASaveWithAFailure, FailsWhenTheFileThatItWroteCannotBeClosed) {
  const Saving saving = Savings().front();
  for (int call = 1;; ++call) {
    Prepare(saving);
    const std::string before = StoredText();
    const Outcome outcome =
        RunSupervised({Interference::kFail, call, EIO, "close"}, [&] { return MEROWirelessConfSet(&saving.network); });
    ASSERT_TRUE(outcome.reached);
    if (!Lists(outcome.before, "fsync")) continue;
    return ExpectFailed(outcome, ERR_IO, before, "");
  }
}

TEST_F(ASaveWithAFailure, GoesOnWhereTheFailureDoesNotMatter) {
  const struct {
    const char* szCall;
    int error;
    const char* szBehind;  // only a call behind one of this name
  } rows[] = {
      {"flock", EINTR, ""},
      {"read", EINTR, ""},
      {"write", EINTR, ""},
      {"fsync", EINVAL, "rename"},
  };
  const Saving saving = Savings().front();
  for (const auto& row : rows) {
    int met = 0;
    for (int call = 1;; ++call) {
      Prepare(saving);
      const Outcome outcome = RunSupervised({Interference::kFail, call, row.error, row.szCall},
                                            [&] { return MEROWirelessConfSet(&saving.network); });
      if (!outcome.reached) break;
      if (*row.szBehind != '\0' && !Lists(outcome.before, row.szBehind)) continue;
      ++met;
      EXPECT_EQ(outcome.result, 0) << row.szCall;
      EXPECT_THAT(outcome.reports, IsEmpty()) << row.szCall;
      EXPECT_THAT(StoredText(), HasSubstr("new secret")) << row.szCall;
    }
    EXPECT_GT(met, 0) << row.szCall;
  }
}

TEST_F(ASaveWithAFailure, GoesOnBehindAWriteThatTookAPart) {
  for (const Saving& saving : Savings()) {
    const auto save = [&] { return MEROWirelessConfSet(&saving.network); };
    Prepare(saving);
    ASSERT_EQ(save(), 0);
    const std::string after = StoredText();
    int writes = 0;
    while (true) {
      Prepare(saving);
      if (!RunSupervised({Interference::kShorten, writes + 1, 0, "write"}, save).reached) break;
      ++writes;
      EXPECT_EQ(StoredText(), after) << saving.szName;
    }
    EXPECT_GT(writes, 0);
  }
}

class AFailure : public PlatformTest {};

TEST_F(AFailure, HasACodeThatTellsItsReason) {
  const struct {
    int error;
    int code;
  } rows[] = {
      {ENOMEM, ERR_OUT_OF_MEMORY},   {EINVAL, ERR_BAD_PARAMETERS},
      {EACCES, ERR_PERMISSION},      {EPERM, ERR_PERMISSION},
      {EROFS, ERR_PERMISSION},       {ENOSPC, ERR_NO_SPACE},
      {EDQUOT, ERR_NO_SPACE},        {EIO, ERR_IO},
      {ENOTDIR, ERR_FILE_NOT_FOUND}, {EFBIG, ERR_TOO_LARGE},
      {ENAMETOOLONG, ERR_TOO_LARGE}, {ENODEV, ERR_NO_DEVICE},
      {ENXIO, ERR_NO_DEVICE},        {EBUSY, ERR_UNKNOWN},
      {EMFILE, ERR_UNKNOWN},         {ELOOP, ERR_UNKNOWN},
  };
  for (const auto& row : rows) {
    const Outcome outcome =
        RunSupervised({Interference::kFail, 1, row.error, "unlink"}, [] { return PLIBCSysUnlink("/tmp/file"); });
    EXPECT_EQ(outcome.call.name, "unlink");
    EXPECT_EQ(outcome.result, -1);
    EXPECT_EQ(outcome.code, row.code) << std::strerror(row.error);
    EXPECT_THAT(outcome.reports, ElementsAre(HasSubstr(std::string("/tmp/file: ") + std::strerror(row.error))));
  }
}

// Adapters that could not be listed were taken to be absent, without a word.
TEST_F(AFailure, ToListTheAdaptersIsReportedAndHidesNoOther) {
  const ShownInterfaces shown({{"wlan5", "phy80211"}, {"wlan6", "phy80211"}});
  for (const auto& [szCall, found] : {std::pair("getdents", 0), std::pair("access", 1)}) {
    Plan plan = {Interference::kFail, 1, EIO, szCall};
    plan.all = true;
    const Outcome outcome = RunSupervised(plan, [] { return MEROWirelessAdapterNum(); });
    EXPECT_TRUE(outcome.reached) << szCall;
    EXPECT_EQ(outcome.result, found) << szCall;
    EXPECT_EQ(outcome.code, ERR_IO) << szCall;
    EXPECT_THAT(outcome.reports, ElementsAre(HasSubstr("Failed to list /sys/class/net: Input/output error"))) << szCall;
  }
}

// It was tried a hundred times, with a report of each, whatever the reason was.
TEST_F(AFailure, ToPutARecordIntoItsPlaceIsReportedOnce) {
  const auto join =
      std::ranges::find(ExportedFunctions(), std::string("MEROWirelessNetworkConnect"), &Exported::szName);
  const Scene scene(join->prepare);
  Plan plan = {Interference::kFail, 1, EACCES, "rename"};
  plan.all = plan.onwards = plan.withoutSleeps = true;
  const Outcome outcome = RunSupervised(plan, [&] { return static_cast<int>(join->call()); });
  EXPECT_EQ(outcome.result, static_cast<int>(Answer::kFailed));
  EXPECT_THAT(outcome.reports, Contains(HasSubstr("Failed to record this connection.")));
  EXPECT_THAT(outcome.reports, Not(Contains(HasSubstr("Failed to remove /var/tmp/.wireless_current_connection"))));
}

// glibc's system() says of a shell that could not be started what it says of one that ended with 127: it was taken for
// a command that had run.
TEST_F(AFailure, ToStartAShellIsReported) {
  for (const char* szName : {"MEROWirelessAdhocCreate", "MEROWirelessDefaultGatewaySet"}) {
    const auto function = std::ranges::find(ExportedFunctions(), std::string(szName), &Exported::szName);
    const Scene scene(function->prepare);
    Plan plan = {Interference::kFail, 1, EAGAIN, "clone"};
    plan.all = plan.withoutSleeps = true;
    const Outcome outcome = RunSupervised(plan, [&] { return static_cast<int>(function->call()); });
    EXPECT_TRUE(outcome.reached) << szName;
    EXPECT_EQ(outcome.result, static_cast<int>(Answer::kFailed)) << szName;
    EXPECT_THAT(outcome.reports, Contains(HasSubstr("Failed to execute"))) << szName;
  }
}

// It was taken to be there, and was not made.
TEST_F(AFailure, ToLookAtAFileDoesNotKeepItFromBeingMade) {
  const Outcome outcome =
      RunSupervised({Interference::kFail, 1, EIO, "access"}, [] { return PLIBCFileTouch("/tmp/platform/file"); });
  EXPECT_TRUE(outcome.reached);
  EXPECT_EQ(outcome.result, 0);
  EXPECT_EQ(ReadText("/tmp/platform/file"), "");
}

// There was taken to be no adapter, and so nothing to end.
TEST_F(AFailure, ToListTheAdaptersIsAFailureToDisconnect) {
  const ShownInterfaces shown({{"lo", ""}, {"wlan0", "phy80211"}});
  for (const char* szCall : {"open", "getdents", "access"}) {
    Plan plan = {Interference::kFail, 1, EIO, szCall};
    plan.all = plan.onwards = true;
    const Outcome outcome = RunSupervised(plan, [] { return MEROWirelessNetworkDisconnect(); });
    EXPECT_TRUE(outcome.reached) << szCall;
    EXPECT_EQ(outcome.result, -1) << szCall;
    EXPECT_THAT(outcome.reports, Contains(HasSubstr("Failed to look for the adapter to disconnect"))) << szCall;
  }
}

}  // namespace
