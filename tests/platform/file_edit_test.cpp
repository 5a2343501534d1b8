// What holds for every change of a file, whatever its form.
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <functional>
#include <thread>

#include "tests/platform/platform_test.h"

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

// Each operation that changes a file, as one that gives "KEY" the value "new".
struct Change {
  const char* szName;
  std::function<bool(const char* szPath)> make;
  const char* szBefore;
  const char* szAfter;
};

bool SetSection(const char* szPath, bool add) {
  PPLIBSZHASH pshHash = PLIBCSzHashAlloc(1024);
  EXPECT_EQ(PLIBCSzHashSetValue(&pshHash, "KEY", "new"), 1);
  const int done = add ? PLIBCFileAddSection(szPath, "a", pshHash, "%s=%s\n")
                       : PLIBCFileSetSection(szPath, "a", nullptr, pshHash, "%s=%s\n");
  PLIBCSzHashFree(pshHash);
  return done == 1;
}

const std::array<Change, 5> kChanges = {{
    {"set a key", [](const char* szPath) { return PLIBCFileSetKeyValue(szPath, "KEY", "new", "%s=%s\n") == 1; },
     "KEY=old\n", "KEY=new\n"},
    {"remove a key", [](const char* szPath) { return PLIBCFileRemoveKey(szPath, "KEY") == 1; }, "KEY=old\nA=1\n",
     "A=1\n"},
    {"add a section", [](const char* szPath) { return SetSection(szPath, true); }, "[b]\n", "[b]\n[a]\nKEY=new\n"},
    {"set a section", [](const char* szPath) { return SetSection(szPath, false); }, "[a]\n", "[a]\nKEY=new\n"},
    {"set a section's key",
     [](const char* szPath) { return PLIBCFileSetSectionValue(szPath, "a", "KEY", "new", "%s=%s\n") == 0; },
     "[a]\nKEY=old\n", "[a]\nKEY=new\n"},
}};

class AFileThatIsChanged : public PlatformTest {};

TEST_F(AFileThatIsChanged, IsReplacedAsAWholeSoThatReadersNeverSeeAPart) {
  for (const Change& change : kChanges) {
    WriteFile(kFile, change.szBefore);
    std::ifstream reader(kFile);
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(reader), {}), change.szBefore) << change.szName;
    EXPECT_EQ(ReadFile(kFile), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file")) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, KeepsItsMode) {
  for (const mode_t mode : {0600u, 0644u, 0666u, 0640u, 0400u, 04755u}) {
    for (const Change& change : kChanges) {
      WriteFile(kFile, change.szBefore, mode);
      ASSERT_TRUE(change.make(kFile)) << change.szName;
      EXPECT_EQ(ModeOf(kFile), mode) << change.szName;
    }
  }
}

TEST_F(AFileThatIsChanged, KeepsItsOwner) {
  for (const Change& change : kChanges) {
    WriteFile(kFile, change.szBefore, 0640);
    if (::chown(kFile, 1234, 5678) < 0) GTEST_SKIP() << "not the machine's root";
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    struct stat info;
    ASSERT_EQ(::stat(kFile, &info), 0);
    EXPECT_EQ(info.st_uid, 1234u) << change.szName;
    EXPECT_EQ(info.st_gid, 5678u) << change.szName;
    EXPECT_EQ(info.st_mode & 07777u, 0640u) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, IsReachedThroughLinksAndTheLinksStay) {
  fs::create_directory("/tmp/platform/real");
  fs::create_symlink("real", "/tmp/platform/directory");
  fs::create_symlink("directory/file", "/tmp/platform/second");
  fs::create_symlink("/tmp/platform/second", "/tmp/platform/first");
  for (const Change& change : kChanges) {
    WriteFile("/tmp/platform/real/file", change.szBefore);
    ASSERT_TRUE(change.make("/tmp/platform/first")) << change.szName;
    EXPECT_TRUE(fs::is_symlink("/tmp/platform/first") && fs::is_symlink("/tmp/platform/second")) << change.szName;
    EXPECT_EQ(ReadFile("/tmp/platform/real/file"), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn("/tmp/platform/real"), ElementsAre("file")) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, IsMadeWhereADanglingLinkPoints) {
  fs::create_directory("/tmp/platform/real");
  fs::create_symlink("real/file", "/tmp/platform/link");
  EXPECT_EQ(PLIBCFileSetKeyValue("/tmp/platform/link", "KEY", "value", "%s=%s\n"), 1);
  EXPECT_TRUE(fs::is_symlink("/tmp/platform/link"));
  EXPECT_EQ(ReadFile("/tmp/platform/real/file"), "KEY=value\n");
}

TEST_F(AFileThatIsChanged, MayBeNamedFromTheCurrentDirectory) {
  fs::current_path(kDirectory);
  for (const Change& change : kChanges) {
    WriteFile("file", change.szBefore);
    ASSERT_TRUE(change.make("file")) << change.szName;
    EXPECT_EQ(ReadFile("file"), change.szAfter) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, IsNotDisturbedByWhatAKilledWriterLeft) {
  for (const Change& change : kChanges) {
    WriteFile(kFile, change.szBefore);
    WriteFile("/tmp/platform/.file.new", "half of some");
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(ReadFile(kFile), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file")) << change.szName;
  }
}

// Whoever may write to the directory could lead the new content, secrets included, to a file of theirs.
TEST_F(AFileThatIsChanged, IsNeverWrittenThroughALinkInItsWay) {
  for (const Change& change : kChanges) {
    WriteFile(kFile, change.szBefore);
    WriteFile("/tmp/platform/victim", "as was");
    fs::create_symlink("victim", "/tmp/platform/.file.new");
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(ReadFile("/tmp/platform/victim"), "as was") << change.szName;
    EXPECT_EQ(ReadFile(kFile), change.szAfter) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, LeavesNoDescriptorOpen) {
  for (const Change& change : kChanges) {
    WriteFile(kFile, change.szBefore);
    const std::vector<std::string> before = NamesIn("/proc/self/fd");
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(NamesIn("/proc/self/fd"), before) << change.szName;
  }
}

// Whether a process waits for a lock on a file.
bool WaitsForLock(pid_t pid) {
  std::ifstream locks("/proc/locks");
  for (std::string line; std::getline(locks, line);) {
    const bool waits = line.find("-> FLOCK") != std::string::npos;
    if (waits && line.find(" " + std::to_string(pid) + " ") != std::string::npos) return true;
  }
  return false;
}

testing::AssertionResult ComesToWaitForLock(pid_t pid) {
  using std::chrono_literals::operator""ms;
  for (int i = 0; i < 2000; ++i) {
    if (WaitsForLock(pid)) return testing::AssertionSuccess();
    std::this_thread::sleep_for(5ms);
  }
  return testing::AssertionFailure() << "process " << pid << " does not wait for the lock";
}

// A rival that replaces the file while another waits for it must not have its change undone.
TEST_F(AFileThatIsChanged, WaitsForAnotherWriterAndKeepsWhatThatWrote) {
  WriteFile(kFile, "KEY=old\nRIVAL=old\n");
  const int lock = ::open(kFile, O_RDONLY | O_CLOEXEC);
  ASSERT_EQ(::flock(lock, LOCK_EX), 0);

  const pid_t writer = ::fork();
  if (writer == 0) ::_exit(PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n") == 1 ? 0 : 1);
  ASSERT_TRUE(ComesToWaitForLock(writer));
  EXPECT_EQ(ReadFile(kFile), "KEY=old\nRIVAL=old\n");
  WriteFile("/tmp/platform/rival", "KEY=old\nRIVAL=new\n");
  fs::rename("/tmp/platform/rival", kFile);
  ASSERT_EQ(::flock(lock, LOCK_UN), 0);  // the child holds it open, too
  ASSERT_EQ(::close(lock), 0);

  int state = -1;
  ASSERT_EQ(::waitpid(writer, &state, 0), writer);
  EXPECT_EQ(state, 0);
  EXPECT_EQ(ReadFile(kFile), "KEY=new\nRIVAL=new\n");
}

TEST_F(AFileThatIsChanged, IsMadeAnewWhenARivalRemovesItMeanwhile) {
  WriteFile(kFile, "A=1\n");
  const int lock = ::open(kFile, O_RDONLY | O_CLOEXEC);
  ASSERT_EQ(::flock(lock, LOCK_EX), 0);

  const pid_t writer = ::fork();
  if (writer == 0) ::_exit(PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n") == 1 ? 0 : 1);
  ASSERT_TRUE(ComesToWaitForLock(writer));
  fs::remove(kFile);
  ASSERT_EQ(::flock(lock, LOCK_UN), 0);  // the child holds it open, too
  ASSERT_EQ(::close(lock), 0);

  int state = -1;
  ASSERT_EQ(::waitpid(writer, &state, 0), writer);
  EXPECT_EQ(state, 0);
  EXPECT_EQ(ReadFile(kFile), "KEY=new\n");
}

}  // namespace
