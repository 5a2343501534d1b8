// Another process changes a file between two system calls of an operation: the first call meets the state before the
// change, the next one the state after it.
#include <cerrno>
#include <filesystem>

#include "tests/fault/supervised.h"
#include "tests/platform/platform_test.h"

namespace {

class ARival : public PlatformTest {
 protected:
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

TEST_F(ARival, ThatMakesAFileHasItsKeysKept) {
  WriteText(kFile, "RIVAL=kept\n");
  const Outcome outcome =
      RunBeforeRival("readlink", [] { return PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n"); });
  EXPECT_TRUE(outcome.reached);
  EXPECT_EQ(outcome.result, 1);
  EXPECT_EQ(ReadText(kFile), "RIVAL=kept\nKEY=new\n");
}

}  // namespace
