// The appliance's media service.
#include <filesystem>

#include "tests/platform/platform_test.h"

namespace {

constexpr char kScript[] = "/etc/rc.mediaservice";

class MediaService : public PlatformTest {
 protected:
  void TearDown() override {
    std::filesystem::remove(kScript);
    PlatformTest::TearDown();
  }
};

TEST_F(MediaService, IsToldWhatToDo) {
  WriteText(kScript, "#!/bin/sh\nprintf '%s ' \"$@\" >>/tmp/platform/file\n", 0755);
  for (const int action : {0, 1, 2}) EXPECT_EQ(MEROMediaService(action), 0);
  EXPECT_EQ(ReadText(kFile), "stop start restart ");
}

TEST_F(MediaService, IsNotAskedForWhatItCannotDo) {
  WriteText(kScript, "#!/bin/sh\n: >/tmp/platform/file\n", 0755);
  for (const int action : {-1, 3}) {
    EXPECT_EQ(MEROMediaService(action), -1);
    ExpectFailure(ERR_BAD_PARAMETERS, "There is no action " + std::to_string(action) + " of the media service");
  }
  EXPECT_FALSE(std::filesystem::exists(kFile));
}

TEST_F(MediaService, IsReportedWhenItIsMissing) {
  EXPECT_EQ(MEROMediaService(2), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to find the media service /etc/rc.mediaservice: No such file or directory");
}

// It failed without an error code.
TEST_F(MediaService, IsReportedWhenItFails) {
  WriteText(kScript, "#!/bin/sh\nexit 3\n", 0755);
  EXPECT_EQ(MEROMediaService(2), -1);
  ExpectFailure(ERR_COMMAND_FAILED, "/etc/rc.mediaservice restart ended with status 3");
}

}  // namespace
