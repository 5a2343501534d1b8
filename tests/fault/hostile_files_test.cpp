// What is no file, or no file that anybody would write, in the place of each file that an exported function reads: a
// clear answer, in bounded time and memory.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <set>
#include <span>

#include "tests/fault/calls.h"
#include "tests/fault/scene.h"
#include "tests/support/files.h"
#include "tests/support/processes.h"

namespace {

namespace fs = std::filesystem;

constexpr rlim_t kSeconds = 20;  // of the processor
// How many sections, keys, and tens of bytes of a line a function gets in all of its files together.
#ifdef MERO_SANITIZE
constexpr int kMost = 100'000;
#else
constexpr int kMost = 1'000'000;
constexpr rlim_t kMemory = 768U << 20;  // a file of the largest size that is read, and what is made of it
#endif
constexpr int kWrong = static_cast<int>(Answer::kWrong);

std::string Numbered(const char* szBefore, const char* szBehind, int count) {
  std::string text;
  for (int i = 0; i < count; ++i) text += szBefore + std::to_string(i) + szBehind;
  return text;
}

void Link(const std::string& target, const std::string& path) {
  ASSERT_EQ(::symlink(target.c_str(), path.c_str()), 0);
}

void MakeSocket(const std::string& path) {
  sockaddr_un address = {.sun_family = AF_UNIX, .sun_path = {}};
  path.copy(address.sun_path, sizeof address.sun_path - 1);
  const int fd = ::socket(AF_UNIX, SOCK_STREAM, 0);
  ASSERT_EQ(::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  ::close(fd);
}

// A file that has no end for whoever reads it to its end.
void MakeSparse(const std::string& path) {
  WriteText(path, "");
  ASSERT_EQ(::truncate(path.c_str(), off_t{1} << 40), 0);
}

struct Hostile {
  const char* szName;
  // Makes it where there is nothing, of what was there before and so many sections, keys, or tens of bytes.
  std::function<void(const std::string& path, const std::string& before, int many)> make;
};

// Files that say something else.
const Hostile kFiles[] = {
    {"nothing in it", [](const auto& path, const auto&, int) { WriteText(path, ""); }},
    {"a NUL in each line",
     [](const auto& path, std::string before, int) {
       for (size_t at = 0; (at = before.find('\n', at)) != std::string::npos; at += 2) before.insert(at, 1, '\0');
       WriteText(path, before);
     }},
    {"half of it",
     [](const auto& path, const auto& before, int) { WriteText(path, before.substr(0, before.size() / 2)); }},
    {"a long line", [](const auto& path, const auto& before,
                       int many) { WriteText(path, before + std::string(10 * static_cast<size_t>(many), 'a')); }},
    {"a long value",
     [](const auto& path, const auto& before, int many) {
       WriteText(path, before + "essid=" + std::string(10 * static_cast<size_t>(many), '\\') + "\n");
     }},
    {"many sections", [](const auto& path, const auto& before,
                         int many) { WriteText(path, before + Numbered("[s", "]\n\tessid=x\n", many)); }},
    {"one section many times",
     [](const auto& path, const auto& before, int many) { WriteText(path, before + Numbered("[s]\n#", "\n", many)); }},
    {"many keys", [](const auto& path, const auto& before,
                     int many) { WriteText(path, before + Numbered("key", "=\"x\"\n", many)); }},
};

// And what is no file, or has no end.
const Hostile kNoFiles[] = {
    {"a terabyte of nothing", [](const auto& path, const auto&, int) { MakeSparse(path); }},
    {"a loop of links",
     [](const auto& path, const auto&, int) {
       Link(path, path + ".again");
       Link(path + ".again", path);
     }},
    {"a link to nowhere", [](const auto& path, const auto&, int) { Link("/nowhere/at/all", path); }},
    {"a link to a device without an end", [](const auto& path, const auto&, int) { Link("/dev/zero", path); }},
    {"a link to a device that is full", [](const auto& path, const auto&, int) { Link("/dev/full", path); }},
    {"a directory", [](const auto& path, const auto&, int) { fs::create_directory(path); }},
    {"a pipe", [](const auto& path, const auto&, int) { ASSERT_EQ(::mkfifo(path.c_str(), 0600), 0); }},
    {"a socket", [](const auto& path, const auto&, int) { MakeSocket(path); }},
};

// The call, in a process that is killed when it takes more than it may: its answer, or -1.
int CallWithinBounds(const Exported& function) {
  return RunInChild([&] {
    const rlimit seconds = {kSeconds, kSeconds};
    ::setrlimit(RLIMIT_CPU, &seconds);
    ::alarm(6 * kSeconds);
#ifndef MERO_SANITIZE  // which takes hold of far more addresses than it uses
    const rlimit memory = {kMemory, kMemory};
    ::setrlimit(RLIMIT_AS, &memory);
#endif
    return static_cast<int>(function.call());
  });
}

// What stands in the place of a file: its kind, and where it leads to.
std::string KindOf(const std::string& path) {
  const fs::file_status status = fs::symlink_status(path);
  return std::to_string(static_cast<int>(status.type())) +
         (fs::is_symlink(status) ? fs::read_symlink(path).string() : std::string());
}

std::set<std::string> FilesOf(const Exported& function) {
  std::set<std::string> files(function.least.reads.begin(), function.least.reads.end());
  files.insert(function.least.replaced.begin(), function.least.replaced.end());
  return files;
}

// Those that read files. The others that do so wait, too, and read by calling these.
std::vector<const Exported*> Readers() {
  std::vector<const Exported*> readers;
  for (const Exported& function : ExportedFunctions()) {
    if (!FilesOf(function).empty() && function.least.sleeps == 0) readers.push_back(&function);
  }
  return readers;
}

class AHostileFile : public testing::TestWithParam<const Exported*> {
 protected:
  // Gives a visitor each file of the function, with something else in its place.
  template <class Visit>
  void ForEach(std::span<const Hostile> all, Visit visit) {
    for (const std::string& path : FilesOf(*GetParam())) {
      for (const Hostile& hostile : all) {
        SCOPED_TRACE(path + ": " + hostile.szName);
        const Scene scene(GetParam()->prepare);
        const std::string before = TextOrNothing(path);
        fs::remove_all(path);
        fs::create_directories(fs::path(path).parent_path());
        hostile.make(path, before, kMost / static_cast<int>(FilesOf(*GetParam()).size()));
        visit(path);
        fs::remove_all(path);
        fs::remove_all(path + ".again");
      }
    }
  }
};

TEST_P(AHostileFile, IsAnsweredInBoundedTimeAndMemory) {
  ForEach(kFiles, [&](const std::string&) { EXPECT_NE(CallWithinBounds(*GetParam()), -1); });
}

// It is not waited for, and it is nobody's to take away.
TEST_P(AHostileFile, ThatIsNoneIsAFailureOrNothingAndStays) {
  ForEach(kNoFiles, [&](const std::string& path) {
    const std::string kind = KindOf(path);
    EXPECT_THAT(CallWithinBounds(*GetParam()), testing::AllOf(testing::Ne(-1), testing::Ne(kWrong)));
    EXPECT_EQ(KindOf(path), kind);
  });
}

// A rival without manners: writes in place, half of it at first, and cuts the file off again.
int KeepChanging(const std::string& path, const std::string& text) {
  ::alarm(120);
  while (true) {
    const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    if (fd < 0) return 1;
    if (::write(fd, text.data(), text.size() / 2) < 0) return 1;
    if (::write(fd, text.data() + text.size() / 2, text.size() - text.size() / 2) < 0) return 1;
    if (::ftruncate(fd, static_cast<off_t>(text.size() / 3)) < 0) return 1;
    ::close(fd);
  }
}

TEST_P(AHostileFile, MayChangeAndShrinkWhileItIsRead) {
  const Exported& function = *GetParam();
  for (const std::string& path : FilesOf(function)) {
    SCOPED_TRACE(path);
    const Scene scene(function.prepare);
    const std::string before = TextOrNothing(path);
    const std::string text = before + Numbered("[s", "]\n\tessid=\"x\"\n", 2'000);
    fs::create_directories(fs::path(path).parent_path());
    const StartedChild rival([&] { return KeepChanging(path, text); });
    ASSERT_TRUE(Soon([&] { return TextOrNothing(path) != before; }));
    for (int round = 0; round < 10; ++round) EXPECT_NE(CallWithinBounds(function), -1);
    EXPECT_EQ(::waitpid(rival.pid(), nullptr, WNOHANG), 0);  // it has been there all the time
  }
}

INSTANTIATE_TEST_SUITE_P(, AHostileFile, testing::ValuesIn(Readers()), [](const auto& of) { return of.param->szName; });

}  // namespace
