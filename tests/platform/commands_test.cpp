// Running a program without a shell.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <fstream>

#include "tests/platform/platform_test.h"

namespace {

using testing::HasSubstr;

class Command : public PlatformTest {
 protected:
  static constexpr char kOutput[] = "/tmp/platform/output";

  // Writes a script that appends what it is to show to kOutput.
  void SetUp() override {
    PlatformTest::SetUp();
    WriteText(kFile, "#!/bin/sh\nfor a; do printf '<%s>' \"$a\"; done >>/tmp/platform/output\n", 0700);
  }

  static int Shell(const char* szCommand) { return PLIBCExec("/bin/sh", "-c", szCommand, nullptr, nullptr); }
};

TEST_F(Command, GivesTheProgramsExitStatus) {
  for (const int status : {0, 1, 7, 127, 255}) {
    EXPECT_EQ(Shell(("exit " + std::to_string(status)).c_str()), status);
  }
}

TEST_F(Command, HasFinishedWhenTheCallReturns) {
  EXPECT_EQ(Shell("sleep 0.1; echo finished >/tmp/platform/output"), 0);
  EXPECT_EQ(ReadText(kOutput), "finished\n");
}

TEST_F(Command, GetsUpToFourArgumentsEndedByTheFirstNull) {
  const struct {
    const char* rgszArgs[4];
    const char* szShown;
  } rows[] = {
      {{"1", "2", "3", "4"}, "<1><2><3><4>"},
      {{"1", "2", nullptr, "4"}, "<1><2>"},
      {{"", "", nullptr, nullptr}, "<><>"},
      {{nullptr, "2", "3", "4"}, ""},
  };
  for (const auto& [args, szShown] : rows) {
    EXPECT_EQ(PLIBCExec(kFile, args[0], args[1], args[2], args[3]), 0);
    EXPECT_EQ(ReadText(kOutput), szShown);
    EXPECT_EQ(PLIBCSysUnlink(kOutput), 0);
  }
}

TEST_F(Command, GetsItsArgumentsUnchangedWhateverTheyMeanToAShell) {
  for (const char* szArgument : {"$(touch /tmp/platform/missing)", "`id`", "a;b", "a b", "*", "~", "\"'\\", "|", "&",
                                 "<x", ">x", "#", "!", "a\nb", "\t", "%s", "-rf", "\xFF\xFE", "${HOME}"}) {
    EXPECT_EQ(PLIBCExec(kFile, szArgument, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(ReadText(kOutput), "<" + std::string(szArgument) + ">");
    EXPECT_EQ(PLIBCSysUnlink(kOutput), 0);
  }
  EXPECT_EQ(PLIBCFileExist(kMissing), 0);
}

TEST_F(Command, GetsTheEnvironmentOfTheCaller) {
  ::setenv("MERO_TEST", "of the caller", 1);
  EXPECT_EQ(Shell("test \"$MERO_TEST\" = 'of the caller'"), 0);
}

// A program that holds what the caller has open, such as a lock, a socket or a marker, may hold it for ever.
TEST_F(Command, InheritsTheStandardDescriptorsAndNothingElse) {
  const int open = ::open("/dev/null", O_RDONLY);
  ASSERT_EQ(::dup2(open, 100), 100);
  const int output = ::open(kOutput, O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
  const int stdOut = ::dup(STDOUT_FILENO);
  ASSERT_EQ(::dup2(output, STDOUT_FILENO), STDOUT_FILENO);
  EXPECT_EQ(PLIBCExec("/bin/ls", "/proc/self/fd", nullptr, nullptr, nullptr), 0);
  ASSERT_EQ(::dup2(stdOut, STDOUT_FILENO), STDOUT_FILENO);
  EXPECT_EQ(ReadText(kOutput), "0\n1\n2\n3\n");  // 3 is the listing itself
}

TEST_F(Command, StartsWithAllSignalsAsIfNobodyHadTouchedThem) {
  sigset_t blocked;
  ::sigfillset(&blocked);
  ::sigdelset(&blocked, SIGCHLD);
  ASSERT_EQ(::sigprocmask(SIG_BLOCK, &blocked, nullptr), 0);
  ASSERT_NE(std::signal(SIGPIPE, SIG_IGN), SIG_ERR);
  ASSERT_NE(std::signal(SIGTERM, SIG_IGN), SIG_ERR);
  EXPECT_EQ(Shell("grep -E 'Sig(Blk|Ign)' /proc/self/status >/tmp/platform/output"), 0);
  std::ifstream status(kOutput);
  int masks = 0;
  for (std::string name, mask; status >> name >> mask; ++masks) {
    // Signals 32 and 33 are libc's own, and its own to set.
    EXPECT_EQ(std::stoull(mask, nullptr, 16) & ~0x1'8000'0000ull, 0u) << name << mask;
  }
  EXPECT_EQ(masks, 2);
}

TEST_F(Command, HasAnOrdinaryUmaskAndTheCallerKeepsItsOwn) {
  for (const mode_t mask : {0000u, 0077u}) {
    const mode_t before = ::umask(mask);
    EXPECT_EQ(Shell("umask >/tmp/platform/output"), 0);
    EXPECT_EQ(::umask(before), mask);
    EXPECT_EQ(ReadText(kOutput), "0022\n") << mask;
  }
}

TEST_F(Command, IsWaitedForAlthoughSignalsComeMeanwhile) {
  struct sigaction action = {};
  action.sa_handler = [](int) {};
  ASSERT_EQ(::sigaction(SIGALRM, &action, nullptr), 0);  // without SA_RESTART
  const itimerval often = {{0, 5'000}, {0, 5'000}};
  ASSERT_EQ(::setitimer(ITIMER_REAL, &often, nullptr), 0);
  EXPECT_EQ(Shell("sleep 0.1; exit 3"), 3);
  const itimerval never = {};
  ASSERT_EQ(::setitimer(ITIMER_REAL, &never, nullptr), 0);
}

TEST_F(Command, LeavesOtherChildrenToTheCaller) {
  const pid_t other = ::fork();
  if (other == 0) ::_exit(5);
  EXPECT_EQ(Shell("exit 0"), 0);
  int state = 0;
  ASSERT_EQ(::waitpid(other, &state, 0), other);
  EXPECT_EQ(WEXITSTATUS(state), 5);
}

TEST_F(Command, ThatCannotBeRunIsReported) {
  WriteText("/tmp/platform/plain", "exit 0\n", 0600);
  WriteText("/tmp/platform/junk", "no program", 0700);
  const struct {
    const char* szPath;
    const char* szReason;
  } rows[] = {
      {"/tmp/platform/missing", "No such file or directory"},
      {"/tmp/platform/file/below", "Not a directory"},
      {"/tmp/platform", "Permission denied"},
      {"/tmp/platform/plain", "Permission denied"},
      {"/tmp/platform/junk", "Exec format error"},
      {"", "No such file or directory"},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(PLIBCExec(row.szPath, nullptr, nullptr, nullptr, nullptr), -1) << row.szPath;
    ExpectFailure(ERR_COMMAND_FAILED, std::string("Failed to run ") + row.szPath + ": " + row.szReason);
  }
}

TEST_F(Command, IsNotLookedForInThePath) {
  EXPECT_EQ(PLIBCExec("true", nullptr, nullptr, nullptr, nullptr), -1);
  ExpectFailure(ERR_COMMAND_FAILED, "Failed to run true: No such file or directory");
}

TEST_F(Command, ThatASignalEndsHasFailed) {
  EXPECT_EQ(Shell("kill -KILL $$"), -1);
  EXPECT_EQ(PLIBCErrGet(), ERR_COMMAND_FAILED);
  EXPECT_THAT(TakeLog(), testing::ElementsAre(testing::Field(&LogLine::text, HasSubstr("Failed to run /bin/sh: "))));
}

TEST_F(Command, WithoutAPathIsRefused) {
  EXPECT_EQ(PLIBCExec(nullptr, "1", nullptr, nullptr, nullptr), -1);
  ExpectNullRefused();
}

}  // namespace
