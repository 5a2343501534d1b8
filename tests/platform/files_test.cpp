// Files as such: there or not, made, removed.
#include <sys/stat.h>
#include <unistd.h>

#include <filesystem>

#include "tests/platform/platform_test.h"

namespace {

namespace fs = std::filesystem;

class Files : public PlatformTest {};

TEST_F(Files, ExistWhenTheirPathLeadsToSomething) {
  WriteText(kFile, "");
  fs::create_symlink("file", "/tmp/platform/link");
  fs::create_symlink("missing", "/tmp/platform/dangling");
  const struct {
    const char* szPath;
    int exists;
  } rows[] = {
      {kFile, 1},
      {kDirectory, 1},
      {"/tmp/platform/link", 1},
      {"/dev/null", 1},
      {kMissing, 0},
      {"/tmp/platform/dangling", 0},
      {kInMissingDirectory, 0},
      {"/tmp/platform/file/below", 0},
      {"", 0},
  };
  for (const auto& row : rows) EXPECT_EQ(PLIBCFileExist(row.szPath), row.exists) << row.szPath;
}

TEST_F(Files, AreTouchedIntoBeingEmptyAndForTheOwnerAlone) {
  ::umask(0);
  EXPECT_EQ(PLIBCFileTouch(kFile), 0);
  EXPECT_EQ(ReadText(kFile), "");
  EXPECT_EQ(ModeOf(kFile), 0600u);
}

TEST_F(Files, KeepContentAndModeWhenTouched) {
  WriteText(kFile, "content", 0644);
  EXPECT_EQ(PLIBCFileTouch(kFile), 0);
  EXPECT_EQ(ReadText(kFile), "content");
  EXPECT_EQ(ModeOf(kFile), 0644u);
}

TEST_F(Files, ThatExistCanBeTouchedWhereNothingCanBeWritten) {
  MemoryFileSystem disk("/tmp/platform/disk", "");
  WriteText("/tmp/platform/disk/file", "");
  disk.MakeReadOnly();
  EXPECT_EQ(PLIBCFileTouch("/tmp/platform/disk/file"), 0);
}

TEST_F(Files, ThatCannotBeMadeAreReported) {
  EXPECT_EQ(PLIBCFileTouch(kInMissingDirectory), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to create /tmp/platform/missing/file: No such file or directory");
}

TEST_F(Files, AreUnlinkedWhetherTheyAreThereOrNot) {
  WriteText(kFile, "");
  EXPECT_EQ(PLIBCSysUnlink(kFile), 0);
  EXPECT_FALSE(fs::exists(kFile));
  EXPECT_EQ(PLIBCSysUnlink(kFile), 0);
}

TEST_F(Files, AreLeftAloneWhenALinkToThemIsUnlinked) {
  WriteText(kFile, "");
  fs::create_symlink("file", "/tmp/platform/link");
  EXPECT_EQ(PLIBCSysUnlink("/tmp/platform/link"), 0);
  EXPECT_THAT(NamesIn(kDirectory), testing::ElementsAre("file"));
}

TEST_F(Files, ThatAreDirectoriesAreNotUnlinked) {
  EXPECT_EQ(PLIBCSysUnlink(kDirectory), -1);
  ExpectFailure(ERR_UNKNOWN, "Failed to remove /tmp/platform: Is a directory");
  EXPECT_TRUE(fs::exists(kDirectory));
}

TEST_F(Files, AndEmptyDirectoriesAreRemovedWhetherTheyAreThereOrNot) {
  WriteText(kFile, "");
  fs::create_directory("/tmp/platform/empty");
  for (const char* szPath : {kFile, "/tmp/platform/empty", kMissing}) {
    EXPECT_EQ(PLIBCSysRemove(szPath), 0) << szPath;
    EXPECT_FALSE(fs::exists(szPath)) << szPath;
  }
}

TEST_F(Files, KeepTheirDirectoryFromBeingRemoved) {
  WriteText(kFile, "");
  EXPECT_EQ(PLIBCSysRemove(kDirectory), -1);
  ExpectFailure(ERR_UNKNOWN, "Failed to remove /tmp/platform: Directory not empty");
  EXPECT_TRUE(fs::exists(kFile));
}

TEST_F(Files, WithoutANameAreRefused) {
  EXPECT_EQ(PLIBCFileExist(nullptr), 0);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCFileTouch(nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSysUnlink(nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(PLIBCSysRemove(nullptr), -1);
  ExpectNullRefused();
}

}  // namespace
