// Files in a directory that anyone may write, and what somebody else may put in their place.
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>

#include "tests/platform/containers.h"
#include "tests/platform/platform_test.h"
#include "tests/support/local_user.h"

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::Field;
using testing::IsEmpty;
using testing::StartsWith;

constexpr char kVictim[] = "/tmp/platform.victim";
constexpr char kFormat[] = "%s=%s\n";

class AFileThatAnyoneMayReplace : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    if (!HasLocalUsers()) GTEST_SKIP() << "not the machine's root";
    ASSERT_EQ(::chmod(kDirectory, 01777), 0);
    WriteText(kVictim, "as was");
  }

  static void ForEachObstacle(const std::string& path, const std::function<void()>& look) {
    const auto clear = [] {
      for (const auto& entry : fs::directory_iterator(kDirectory)) fs::remove_all(entry.path());
    };
    ObstructEachWay(path, kVictim, clear, look);
  }
};

TEST_F(AFileThatAnyoneMayReplace, IsTakenForMissingWhenItIsSomebodyElses) {
  ForEachObstacle(kFile, [] {
    EXPECT_EQ(PLIBCFileExist(kFile), 0);
    EXPECT_THAT(TakeLog(),
                ElementsAre(Says("/tmp/platform/file is taken for missing: somebody else has put it there")));
  });
  fs::remove_all(kFile);
  WriteText(kFile, "ours");
  EXPECT_EQ(PLIBCFileExist(kFile), 1);
}

TEST_F(AFileThatAnyoneMayReplace, IsTouchedIntoOneOfOurs) {
  ForEachObstacle(kFile, [] {
    EXPECT_EQ(PLIBCFileTouch(kFile), 0);
    EXPECT_TRUE(IsOurs(kFile));
    EXPECT_EQ(ModeOf(kFile), 0600u);
    EXPECT_EQ(PLIBCFileExist(kFile), 1);
    TakeLog();
  });
}

TEST_F(AFileThatAnyoneMayReplace, IsRemovedWithoutWhatItLeadsTo) {
  ForEachObstacle(kFile, [] {
    EXPECT_EQ(PLIBCSysUnlink(kFile), 0);
    EXPECT_FALSE(fs::exists(fs::symlink_status(kFile)));
    for (const std::string& name : NamesIn(kDirectory)) EXPECT_THAT(name, StartsWith("file.foreign-"));
  });
}

TEST_F(AFileThatAnyoneMayReplace, IsNotReadWhenItIsSomebodyElses) {
  ForEachObstacle(kFile, [] {
    const auto refused = [] {
      ExpectFailure(ERR_PERMISSION,
                    "Failed to read /tmp/platform/file: it is somebody else's, in a directory that anyone "
                    "may write");
    };
    char szValue[16] = "as was";
    EXPECT_EQ(PLIBCFileGetKeyValue(kFile, "PRODUCT", szValue, sizeof szValue, 0), -1);
    EXPECT_STREQ(szValue, "as was");
    refused();
    EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, "PRODUCT", "theirs", 0), 0);
    refused();
    TextHash hash;
    EXPECT_EQ(PLIBCFileGetSection(kFile, "theirs", hash.address()), -1);
    refused();
  });
}

TEST_F(AFileThatAnyoneMayReplace, IsNotChangedWhenItIsSomebodyElses) {
  ForEachObstacle(kFile, [] {
    EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "secret", kFormat), -1);
    EXPECT_EQ(TakeLog().size(), 1u);
  });
}

TEST_F(AFileThatAnyoneMayReplace, IsChangedWhateverIsInTheWayOfItsNewContentAndOfItsLock) {
  for (const char* szName : {"/tmp/platform/.file.new", "/tmp/platform/.file.lock"}) {
    ForEachObstacle(szName, [] {
      WriteText(kFile, "KEY=old\n");
      EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "new", kFormat), 1);
      EXPECT_EQ(ReadText(kFile), "KEY=new\n");
      EXPECT_TRUE(IsOurs(kFile));
      EXPECT_EQ(ModeOf(kFile), 0600u);
    });
  }
}

// A directory in the record's place kept a connection from being left, for ever.
TEST_F(AFileThatAnyoneMayReplace, DoesNotKeepAConnectionFromBeingLeft) {
  static constexpr char kRecord[] = "/var/tmp/.wireless_current_connection";
  ASSERT_EQ(::chmod("/var/tmp", 01777), 0);
  ForEachObstacle(kRecord, [] {
    EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
    EXPECT_FALSE(fs::exists(fs::symlink_status(kRecord)));
  });
}

// A second name of a file of ours, which the kernel lets others give where it is told not to mind.
TEST_F(AFileThatAnyoneMayReplace, IsSomebodyElsesWhenItIsASecondNameOfAFileOfOurs) {
  ASSERT_EQ(::link(kVictim, kFile), 0);
  EXPECT_EQ(PLIBCFileExist(kFile), 0);
  EXPECT_EQ(PLIBCFileTouch(kFile), 0);
  EXPECT_TRUE(IsOurs(kFile));
  EXPECT_EQ(ModeOf(kFile), 0600u);
  EXPECT_EQ(ReadText(kFile), "");
  EXPECT_EQ(ReadText(kVictim), "as was");
  TakeLog();
}

// Root was kept waiting without limit, and without a word.
TEST_F(AFileThatAnyoneMayReplace, IsNotHeldUpByALockOfWhoeverMayReadIt) {
  WriteText(kFile, "KEY=old\n", 0644);
  int ready[2];
  ASSERT_EQ(::pipe(ready), 0);
  const pid_t user = ::fork();
  if (user == 0) {
    const bool locked = ::setuid(65534) == 0 && ::flock(::open(kFile, O_RDONLY), LOCK_EX) == 0;
    (void)::write(ready[1], locked ? "y" : "n", 1);
    ::pause();
    ::_exit(0);
  }
  char answer = 0;
  ASSERT_EQ(::read(ready[0], &answer, 1), 1);
  EXPECT_EQ(answer, 'y');
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "new", kFormat), 1);
  EXPECT_EQ(ReadText(kFile), "KEY=new\n");
  ::kill(user, SIGKILL);
  ::close(ready[0]);
  ::close(ready[1]);
}

TEST_F(AFileThatAnyoneMayReplace, HasALockThatNobodyElseMayOpen) {
  WriteText(kFile, "KEY=old\n", 0666);
  const mode_t before = ::umask(0);
  mode_t seen = 07777;
  const pid_t writer = ::fork();
  if (writer == 0) {
    for (int i = 0; i < 2000; ++i) PLIBCFileSetKeyValue(kFile, "KEY", std::to_string(i).c_str(), kFormat);
    ::_exit(0);
  }
  struct stat info;
  for (int i = 0; i < 1'000'000 && seen == 07777; ++i) {
    if (::stat("/tmp/platform/.file.lock", &info) == 0) seen = info.st_mode & 07777;
  }
  ::kill(writer, SIGKILL);
  ::umask(before);
  EXPECT_EQ(seen, 0600u);
}

}  // namespace
