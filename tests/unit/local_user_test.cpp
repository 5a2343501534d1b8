// Somebody else with an account puts things in the way of the library's files, in directories that anyone may write.
#include <sys/stat.h>

#include "joining.h"
#include "tests/support/local_user.h"

namespace {

const std::string kVictim = "/var/tmp/victim";

class ALocalUser : public JoiningTest {
 protected:
  ALocalUser() {
    for (const char* szDirectory : {"/tmp", "/var/tmp"}) ::chmod(szDirectory, 01777);
    WriteText(kVictim, "as was");
  }

  void SetUp() override {
    if (!HasLocalUsers()) GTEST_SKIP() << "not the machine's root";
  }

  static void ObstructEachWay(const std::string& path, const std::function<void()>& look) {
    ::ObstructEachWay(path, kVictim, Begin, look);
  }
};

// A directory in the marker's place refused every connection, for ever.
TEST_F(ALocalUser, KeepsNobodyFromConnectingByAMarker) {
  ObstructEachWay(kMarker, [this] {
    EXPECT_EQ(Join(), 0);
    EXPECT_FALSE(Exists(kMarker));
    EXPECT_EQ(ReadText(kRecord), "Home Net\n7\n5\n8\n00:11:22:AA:BB:CC\n");
  });
}

TEST_F(ALocalUser, HasNoConnectionRecordedInAFileOfTheirs) {
  ObstructEachWay(kRecord, [this] {
    EXPECT_EQ(Join(), 0);
    EXPECT_TRUE(IsOurs(kRecord));
    EXPECT_EQ(ReadText(kRecord), "Home Net\n7\n5\n8\n00:11:22:AA:BB:CC\n");
  });
}

TEST_F(ALocalUser, DoesNotMakeBelieveThatAnAccessPointIsBeingSetUp) {
  ObstructEachWay("/var/tmp/.wireless_ap_connecting", [] {
    EXPECT_EQ(MEROWirelessTestAPMode(), FALSE);
    std::filesystem::remove_all("/var/tmp/.wireless_ap_connecting");
  });
}

// With a name of their own for the adapter, others chose the settings that block it or not.
TEST_F(ALocalUser, DoesNotNameTheAdapter) {
  ObstructEachWay(kAdapterInfo, [] {
    char szName[64] = "";
    EXPECT_EQ(MEROWirelessApConfigSecNameGet(szName, sizeof szName), FALSE);
    EXPECT_STREQ(szName, "");
    WriteText(kApSettings, "[theirs]\n\tunblock=yes\n");
    EXPECT_EQ(MEROWirelessCheckBlock(), -1);
  });
}

}  // namespace
