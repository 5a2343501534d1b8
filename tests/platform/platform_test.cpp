// What the tests of the platform have in common.
#include "tests/platform/platform_test.h"

#include <sys/mount.h>

#include <filesystem>

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
