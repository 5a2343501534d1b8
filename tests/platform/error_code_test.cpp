// The error code of the process, and what failures set it to.
#include <sys/stat.h>

#include <climits>
#include <filesystem>

#include "tests/platform/platform_test.h"

namespace {

class ErrorCode : public PlatformTest {
 protected:
  static int Touch(const std::string& path) { return PLIBCFileTouch(path.c_str()); }
};

TEST_F(ErrorCode, IsWhatItWasSetTo) {
  for (const int code : {0, 0x0200, 0x0700, 1, -1, INT_MIN, INT_MAX}) {
    PLIBCErrSet(code);
    EXPECT_EQ(PLIBCErrGet(), code);
  }
}

TEST_F(ErrorCode, StaysWhenAnOperationSucceeds) {
  PLIBCErrSet(0x1234);
  EXPECT_EQ(PLIBCFileTouch(kFile), 0);
  EXPECT_EQ(PLIBCFileSetKeyValue(kFile, "KEY", "value", "%s=%s\n"), 1);
  EXPECT_EQ(PLIBCFileSetSectionValue(kFile, "section", "KEY", "value", "%s=%s\n"), 0);
  EXPECT_EQ(PLIBCExec("/bin/true", nullptr, nullptr, nullptr, nullptr), 0);
  EXPECT_EQ(PLIBCExec("/bin/false", nullptr, nullptr, nullptr, nullptr), 1);
  EXPECT_EQ(PLIBCSysUnlink(kFile), 0);
  EXPECT_EQ(PLIBCErrGet(), 0x1234);
}

TEST_F(ErrorCode, TellsThatTheDirectoryIsMissing) {
  EXPECT_EQ(Touch(kInMissingDirectory), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to create /tmp/platform/missing/file: No such file or directory");
}

TEST_F(ErrorCode, TellsThatTheDirectoryIsNone) {
  WriteText(kFile, "");
  EXPECT_EQ(Touch("/tmp/platform/file/below"), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to create /tmp/platform/file/below: Not a directory");
}

TEST_F(ErrorCode, TellsThatWritingIsForbidden) {
  MemoryFileSystem disk("/tmp/platform/disk", "");
  disk.MakeReadOnly();
  EXPECT_EQ(Touch("/tmp/platform/disk/file"), -1);
  ExpectFailure(ERR_PERMISSION, "Failed to create /tmp/platform/disk/file: Read-only file system");
}

TEST_F(ErrorCode, TellsThatTheDiskIsFull) {
  const MemoryFileSystem disk("/tmp/platform/disk", "nr_inodes=2");
  WriteText("/tmp/platform/disk/last", "");
  EXPECT_EQ(Touch("/tmp/platform/disk/file"), -1);
  ExpectFailure(ERR_NO_SPACE, "Failed to create /tmp/platform/disk/file: No space left on device");
}

TEST_F(ErrorCode, TellsThatANameIsTooLong) {
  const std::string path = std::string(kDirectory) + "/" + std::string(NAME_MAX + 1, 'n');
  EXPECT_EQ(Touch(path), -1);
  ExpectFailure(ERR_TOO_LARGE, "Failed to create " + path + ": File name too long");
}

TEST_F(ErrorCode, TellsThatAFileIsTooLarge) {
  constexpr std::uintmax_t kMoreThanIsRead = (std::uintmax_t{64} << 20) + 1;
  WriteText(kFile, "KEY=value\n");
  std::filesystem::resize_file(kFile, kMoreThanIsRead);
  char szValue[8] = "as was";
  EXPECT_EQ(PLIBCFileGetKeyValue(kFile, "KEY", szValue, sizeof szValue, 0), -1);
  ExpectFailure(ERR_TOO_LARGE, "Failed to read /tmp/platform/file: File too large");
  EXPECT_STREQ(szValue, "as was");
}

TEST_F(ErrorCode, TellsThatAFileIsNone) {
  ASSERT_EQ(::mkfifo(kFile, 0600), 0);
  char szValue[8];
  for (const char* szPath : {kFile, kDirectory, "/dev/zero"}) {
    EXPECT_EQ(PLIBCFileGetKeyValue(szPath, "KEY", szValue, sizeof szValue, 0), -1) << szPath;
    ExpectFailure(ERR_BAD_PARAMETERS, std::string("Failed to read ") + szPath + ": Invalid argument");
  }
}

TEST_F(ErrorCode, TellsThatThereIsNoSuchDevice) {
  EXPECT_EQ(PLIBNetIfUp("none0"), 0);
  ExpectFailure(ERR_NO_DEVICE, "Failed to bring up none0: No such device");
}

}  // namespace
