// Another process changes a file between two system calls of an operation: the first call meets the state before the
// change, the next one the state after it.
#include <cerrno>
#include <filesystem>
#include <set>

#include "tests/fault/saving.h"
#include "tests/fault/supervised.h"
#include "tests/platform/platform_test.h"
#include "tests/support/ring.h"

namespace {

class ARival : public PlatformTest {
 protected:
  // A store of five networks with that secret.
  static std::string StoreOf(const std::string& secret) {
    Prepare({"nothing", {}, {}});
    for (int number = 1; number <= 5; ++number) {
      const WIRELESS_NETWORK_CONFIG network = NetworkOf(number, secret);
      EXPECT_EQ(MEROWirelessConfSet(&network), 0);
    }
    return ReadText(kStore);
  }

  // Lists the networks: 1 for each with the secret "old", 100 for each with another; negative when that fails.
  static int List() {
    Ring<WIRELESS_NETWORK_CONFIG> ring;
    if (MEROWirelessConfEnumByAtime(ring.head()) != 0) return -1;
    int result = 0;
    ring.ForEach(
        [&](const WIRELESS_NETWORK_CONFIG& network) { result += network.szKey == std::string_view("old") ? 1 : 100; });
    return result;
  }

  // Runs an operation whose first call of that name finds no file, although there is one.
  static Outcome RunBeforeRival(const char* szCall, const std::function<int()>& operation) {
    return RunSupervised({Interference::kFail, 1, ENOENT, szCall}, operation);
  }
};

TEST_F(ARival, ThatMakesAFileDoesNotHaveItEmptiedByTouchingIt) {
  WriteText(kFile, "content");
  const Outcome outcome = RunBeforeRival("access", [] { return PLIBCFileTouch(kFile); });
  EXPECT_TRUE(outcome.reached);
  EXPECT_EQ(outcome.result, 0);
  EXPECT_EQ(ReadText(kFile), "content");
}

// Somebody else with a right to write to the directory could have the new content, with its secrets, written to a file
// of theirs.
TEST_F(ARival, ThatPutsALinkInTheWayOfAChangeHasNothingWrittenThroughIt) {
  WriteText(kFile, "KEY=old\n");
  WriteText("/tmp/platform/victim", "as was");
  std::filesystem::create_symlink("victim", "/tmp/platform/.file.new");
  const Outcome outcome = RunBeforeRival("unlink", [] { return PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n"); });
  EXPECT_TRUE(outcome.reached);
  EXPECT_EQ(outcome.result, -1);
  EXPECT_EQ(ReadText("/tmp/platform/victim"), "as was");
  EXPECT_EQ(ReadText(kFile), "KEY=old\n");
}

TEST_F(ARival, ThatReplacesTheStoreWhileItIsListedIsSeenInAllNetworksOrInNone) {
  const std::string after = StoreOf("new");
  const std::string before = StoreOf("old");
  const std::string beside = std::string(kStoreDirectory) + "/rival";
  const auto replace = [&] {
    WriteText(beside.c_str(), after);
    std::filesystem::rename(beside, kStore);
  };
  std::set<int> results;
  int call = 1;
  for (;; ++call) {
    WriteText(kStore, before);
    const Outcome outcome = RunSupervised({Interference::kMeanwhile, call, 0, "", replace}, List);
    if (!outcome.reached) break;
    EXPECT_THAT(outcome.result, testing::AnyOf(5, 500)) << "replaced before call " << call << ", " << outcome.call.name;
    EXPECT_THAT(outcome.reports, testing::IsEmpty());
    results.insert(outcome.result);
  }
  EXPECT_GT(call, 4) << "a listing makes more system calls than that";
  EXPECT_THAT(results, testing::ElementsAre(5, 500)) << "the replacement was met, and was not";
}

TEST_F(ARival, ThatMakesAFileHasItsKeysKept) {
  WriteText(kFile, "RIVAL=kept\n");
  const Outcome outcome =
      RunBeforeRival("readlink", [] { return PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n"); });
  EXPECT_TRUE(outcome.reached);
  EXPECT_EQ(outcome.result, 1);
  EXPECT_EQ(ReadText(kFile), "RIVAL=kept\nKEY=new\n");
}

}  // namespace
