// What the tests of the platform have in common.
#include "tests/platform/platform_test.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>

using testing::ElementsAre;
using testing::IsEmpty;

void PlatformTest::SetUp() {
  std::filesystem::remove_all(kDirectory);
  std::filesystem::create_directory(kDirectory);
  TakeLog();
  PLIBCErrSet(ERR_NONE);
}

void PlatformTest::TearDown() {
  EXPECT_THAT(TakeLog(), IsEmpty());
}

void ExpectFailure(int code, const std::string& report) {
  EXPECT_EQ(PLIBCErrGet(), code);
  EXPECT_THAT(TakeLog(), ElementsAre(Says(report)));
  PLIBCErrSet(ERR_NONE);
}

void ExpectNothingFound(int code) {
  EXPECT_EQ(PLIBCErrGet(), code);
  EXPECT_THAT(TakeLog(), IsEmpty());
  PLIBCErrSet(ERR_NONE);
}

void ExpectNullRefused() {
  ExpectFailure(ERR_BAD_PARAMETERS, "Bad parameters");
}

void WriteFile(const std::string& path, std::string_view content, mode_t mode) {
  const int fd = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, mode);
  ASSERT_GE(fd, 0) << path;
  ASSERT_EQ(::write(fd, content.data(), content.size()), static_cast<ssize_t>(content.size())) << path;
  ASSERT_EQ(::fchmod(fd, mode), 0) << path;
  ASSERT_EQ(::close(fd), 0) << path;
}

std::string ReadFile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  EXPECT_TRUE(file.is_open()) << path;
  return {std::istreambuf_iterator<char>(file), {}};
}

mode_t ModeOf(const std::string& path) {
  struct stat info = {};
  EXPECT_EQ(::lstat(path.c_str(), &info), 0) << path;
  return info.st_mode & 07777;
}

std::vector<std::string> NamesIn(const std::string& directory) {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(directory)) names.push_back(entry.path().filename());
  std::ranges::sort(names);
  return names;
}

MemoryFileSystem::MemoryFileSystem(std::string directory, const std::string& options)
    : directory_(std::move(directory)) {
  std::filesystem::create_directories(directory_);
  EXPECT_EQ(::mount("tmpfs", directory_.c_str(), "tmpfs", 0, options.c_str()), 0) << directory_;
}

MemoryFileSystem::~MemoryFileSystem() {
  EXPECT_EQ(::umount(directory_.c_str()), 0) << directory_;
}

void MemoryFileSystem::MakeReadOnly() {
  EXPECT_EQ(::mount(nullptr, directory_.c_str(), nullptr, MS_REMOUNT | MS_RDONLY, nullptr), 0) << directory_;
}
