// Promises that hold for every change of a file, whatever its form.
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <functional>
#include <set>
#include <string_view>

#include "tests/platform/platform_test.h"
#include "tests/support/processes.h"

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

int g_naps = -1;  // how many were taken; negative when they are slept
timespec g_slept = {};
std::function<void(int)> g_whileNapping;  // what happens meanwhile

}  // namespace

// In the place of libc's, so that waiting in vain takes no time.
extern "C" int nanosleep(const timespec* pNap, timespec* pRest) {
  if (g_naps >= 0) {
    g_slept.tv_nsec += pNap->tv_nsec;
    g_slept.tv_sec += pNap->tv_sec + g_slept.tv_nsec / 1'000'000'000;
    g_slept.tv_nsec %= 1'000'000'000;
    ++g_naps;
    if (g_whileNapping) g_whileNapping(g_naps);
    return 0;
  }
  return ::clock_nanosleep(CLOCK_REALTIME, 0, pNap, pRest);
}

#if __TIMESIZE == 32
// The libraries have times of 64 bits also where the tests do not, and call it by another name.
extern "C" int __nanosleep64(const int64_t* pNap, void*) {
  const timespec nap{static_cast<time_t>(pNap[0]), static_cast<long>(pNap[1] & 0xffffffff)};
  return ::nanosleep(&nap, nullptr);
}
#endif

namespace {

class AFileThatIsChanged : public PlatformTest {};

TEST_F(AFileThatIsChanged, IsReplacedAsAWholeSoThatReadersNeverSeeAPart) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore);
    std::ifstream reader(kFile);
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(std::string(std::istreambuf_iterator<char>(reader), {}), change.szBefore) << change.szName;
    EXPECT_EQ(ReadText(kFile), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file")) << change.szName;
  }
}

// Every key that was set, with its old value too, was a file written and flushed anew.
TEST_F(AFileThatIsChanged, IsNotWrittenWhereItHoldsTheVeryValueAlready) {
  for (const Change& change : kChanges) {
    if (std::string_view(change.szName).starts_with("set")) {
      WriteText(kFile, change.szAfter);
      const int file = ::open(kFile, O_RDONLY | O_CLOEXEC);
      ASSERT_TRUE(change.make(kFile)) << change.szName;
      struct stat before;
      struct stat after;
      ASSERT_EQ(::fstat(file, &before) + ::stat(kFile, &after), 0);
      EXPECT_EQ(before.st_ino, after.st_ino) << change.szName;
      EXPECT_EQ(ReadText(kFile), change.szAfter) << change.szName;
      ::close(file);
    }
  }
}

// What a killed writer had left, with its secrets, stayed for as long as nothing else was set.
TEST_F(AFileThatIsChanged, HasNothingOfAKilledWriterBesideItAlsoWhereItIsNotWritten) {
  const std::string left = fs::path(kFile).parent_path() / ("." + fs::path(kFile).filename().string() + ".new");
  for (const Change& change : kChanges) {
    if (std::string_view(change.szName).starts_with("set")) {
      WriteText(kFile, change.szAfter);
      WriteText(left, "secret");
      ASSERT_TRUE(change.make(kFile)) << change.szName;
      EXPECT_FALSE(fs::exists(left)) << change.szName;
    }
  }
}

TEST_F(AFileThatIsChanged, KeepsItsMode) {
  for (const mode_t mode : {0600u, 0644u, 0666u, 0640u, 0400u, 04755u}) {
    for (const Change& change : kChanges) {
      WriteText(kFile, change.szBefore, mode);
      ASSERT_TRUE(change.make(kFile)) << change.szName;
      EXPECT_EQ(ModeOf(kFile), mode) << change.szName;
    }
  }
}

TEST_F(AFileThatIsChanged, KeepsItsOwner) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore, 0640);
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
    WriteText("/tmp/platform/real/file", change.szBefore);
    ASSERT_TRUE(change.make("/tmp/platform/first")) << change.szName;
    EXPECT_TRUE(fs::is_symlink("/tmp/platform/first") && fs::is_symlink("/tmp/platform/second")) << change.szName;
    EXPECT_EQ(ReadText("/tmp/platform/real/file"), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn("/tmp/platform/real"), ElementsAre("file")) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, IsMadeWhereADanglingLinkPoints) {
  fs::create_directory("/tmp/platform/real");
  fs::create_symlink("real/file", "/tmp/platform/link");
  EXPECT_EQ(PLIBCFileSetKeyValue("/tmp/platform/link", "KEY", "value", "%s=%s\n"), 1);
  EXPECT_TRUE(fs::is_symlink("/tmp/platform/link"));
  EXPECT_EQ(ReadText("/tmp/platform/real/file"), "KEY=value\n");
}

TEST_F(AFileThatIsChanged, MayBeNamedFromTheCurrentDirectory) {
  fs::current_path(kDirectory);
  for (const Change& change : kChanges) {
    WriteText("file", change.szBefore);
    ASSERT_TRUE(change.make("file")) << change.szName;
    EXPECT_EQ(ReadText("file"), change.szAfter) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, IsNotDisturbedByWhatAKilledWriterLeft) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore);
    WriteText("/tmp/platform/.file.new", "half of some");
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(ReadText(kFile), change.szAfter) << change.szName;
    EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file")) << change.szName;
  }
}

// Somebody else with a right to write to the directory could have the new content, with its secrets, written to a file
// of theirs.
TEST_F(AFileThatIsChanged, IsNeverWrittenThroughALinkInItsWay) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore);
    WriteText("/tmp/platform/victim", "as was");
    fs::create_symlink("victim", "/tmp/platform/.file.new");
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(ReadText("/tmp/platform/victim"), "as was") << change.szName;
    EXPECT_EQ(ReadText(kFile), change.szAfter) << change.szName;
  }
}

TEST_F(AFileThatIsChanged, LeavesNoDescriptorOpen) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore);
    const std::set<int> before = OpenDescriptors();
    ASSERT_TRUE(change.make(kFile)) << change.szName;
    EXPECT_EQ(OpenDescriptors(), before) << change.szName;
  }
}

constexpr char kLock[] = "/tmp/platform/.file.lock";

// Another's lock on the file, for as long as the holder lives.
class Rival {
 public:
  Rival() : lock_(::open(kLock, O_RDWR | O_CREAT | O_CLOEXEC, 0600)) { EXPECT_EQ(::flock(lock_, LOCK_EX), 0); }
  Rival(const Rival&) = delete;
  Rival& operator=(const Rival&) = delete;
  ~Rival() { GiveUp(); }

  // In a process that was forked, and holds it open too.
  void Close() const { ::close(lock_); }

  // As a writer does when it is done.
  void GiveUp() {
    if (lock_ < 0) return;
    EXPECT_EQ(::unlink(kLock), 0);
    EXPECT_EQ(::flock(lock_, LOCK_UN), 0);
    ::close(lock_);
    lock_ = -1;
  }

 private:
  int lock_;
};

// Whether a process has opened the lock, and so asks for it.
bool AsksForLock(pid_t pid) {
  std::error_code error;
  for (const auto& entry : fs::directory_iterator("/proc/" + std::to_string(pid) + "/fd", error)) {
    if (fs::read_symlink(entry.path(), error).string().starts_with(kLock)) return true;
  }
  return false;
}

// A process that gives "KEY" the value "new", and has come to ask for the lock.
class Writer {
 public:
  explicit Writer(const Rival& rival) : pid_(::fork()) {
    if (pid_ == 0) rival.Close();
    if (pid_ == 0) ::_exit(PLIBCFileSetKeyValue(kPath, "KEY", "new", "%s=%s\n") == 1 ? 0 : 1);
    EXPECT_TRUE(Soon([this] { return AsksForLock(pid_); })) << "process " << pid_ << " does not ask for the lock";
  }

  bool Succeeds() const { return StatusOf(pid_) == 0; }

 private:
  static constexpr char kPath[] = "/tmp/platform/file";

  pid_t pid_;
};

// A rival that replaces the file while another waits for it must not have its change undone.
TEST_F(AFileThatIsChanged, WaitsForAnotherWriterAndKeepsWhatThatWrote) {
  WriteText(kFile, "KEY=old\nRIVAL=old\n");
  Rival rival;
  const Writer writer(rival);
  EXPECT_EQ(ReadText(kFile), "KEY=old\nRIVAL=old\n");
  WriteText("/tmp/platform/rival", "KEY=old\nRIVAL=new\n");
  fs::rename("/tmp/platform/rival", kFile);
  rival.GiveUp();
  EXPECT_TRUE(writer.Succeeds());
  EXPECT_EQ(ReadText(kFile), "KEY=new\nRIVAL=new\n");
}

// The process crashed, and left its lock.
TEST_F(AFileThatIsChanged, IsMadeAnewWhenARivalRemovesItMeanwhile) {
  WriteText(kFile, "A=1\n");
  Rival rival;
  const Writer writer(rival);
  fs::remove(kFile);
  rival.GiveUp();
  EXPECT_TRUE(writer.Succeeds());
  EXPECT_EQ(ReadText(kFile), "KEY=new\n");
  EXPECT_THAT(NamesIn(kDirectory), ElementsAre("file"));
}

TEST_F(AFileThatIsChanged, IsReportedAfterAWhileWhenARivalKeepsItsLock) {
  for (const Change& change : kChanges) {
    WriteText(kFile, change.szBefore);
    Rival rival;
    g_naps = 0;
    g_slept = {};
    EXPECT_FALSE(change.make(kFile)) << change.szName;
    EXPECT_EQ(g_naps, 4000) << change.szName;
    EXPECT_EQ(g_slept.tv_sec, 20) << change.szName;
    const std::vector<LogLine> log = TakeLog();
    ASSERT_EQ(log.size(), 1u);
    EXPECT_THAT(log[0].text, testing::EndsWith(" /tmp/platform/file: another process keeps its lock"));
    EXPECT_EQ(ReadText(kFile), change.szBefore) << change.szName;
    g_naps = -1;
  }
}

// Each new lock was waited for anew.
TEST_F(AFileThatIsChanged, IsNotWaitedForLongerWhenItsLockIsTakenAgainAndAgain) {
  WriteText(kFile, "KEY=old\n");
  std::vector<int> locks;
  g_whileNapping = [&locks](int nap) {
    if (nap % 1000 != 1) return;
    (void)::unlink(kLock);
    for (const int lock : locks) ::flock(lock, LOCK_UN);
    locks.push_back(::open(kLock, O_RDWR | O_CREAT | O_CLOEXEC, 0600));
    ::flock(locks.back(), LOCK_EX);
  };
  const Rival rival;
  g_naps = 0;
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "new", "%s=%s\n"), -1);
  EXPECT_EQ(g_naps, 4000);
  EXPECT_EQ(TakeLog().size(), 1u);
  g_naps = -1;
  g_whileNapping = nullptr;
  for (const int lock : locks) ::close(lock);
}

TEST_F(AFileThatIsChanged, GetsItsModeWhateverTheUmask) {
  for (const mode_t mask : {0000u, 0077u, 0777u}) {
    const mode_t before = ::umask(mask);
    for (const Change& change : kChanges) {
      PLIBCSysUnlink(kFile);
      if (!change.make(kFile)) continue;  // there was no key to remove
      const bool hasSections = ReadText(kFile).starts_with('[');
      EXPECT_EQ(ModeOf(kFile), hasSections ? 0600u : 0644u) << change.szName;
      ASSERT_TRUE(change.make(kFile)) << change.szName;
      EXPECT_EQ(ModeOf(kFile), hasSections ? 0600u : 0644u) << change.szName;
    }
    ::umask(before);
  }
}

}  // namespace
