// What the tests of the platform have in common.
#ifndef MERO_TESTS_PLATFORM_PLATFORM_TEST_H
#define MERO_TESTS_PLATFORM_PLATFORM_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "platform.h"
#include "tests/platform/system_log.h"
#include "tests/support/files.h"

// Starts with an empty directory, no error code and an empty log. Whatever is reported during a test must be expected
// by it.
class PlatformTest : public testing::Test {
 protected:
  static constexpr char kDirectory[] = "/tmp/platform";
  static constexpr char kFile[] = "/tmp/platform/file";
  static constexpr char kMissing[] = "/tmp/platform/missing";
  static constexpr char kInMissingDirectory[] = "/tmp/platform/missing/file";

  void SetUp() override;
  void TearDown() override;
};

// The operation before has failed: it set this code and made this one report.
void ExpectFailure(int code, const std::string& report);

// The operation before has found nothing: it set this code and reported nothing.
void ExpectNothingFound(int code);

// The operation before was refused because of a null argument.
void ExpectNullRefused();

// A file system in memory, for as long as the holder lives.
class MemoryFileSystem {
 public:
  MemoryFileSystem(std::string directory, const std::string& options);
  MemoryFileSystem(const MemoryFileSystem&) = delete;
  MemoryFileSystem& operator=(const MemoryFileSystem&) = delete;
  ~MemoryFileSystem();

  void MakeReadOnly();

 private:
  std::string directory_;
};

#endif  // MERO_TESTS_PLATFORM_PLATFORM_TEST_H
