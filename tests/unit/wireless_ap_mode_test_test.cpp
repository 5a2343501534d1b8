#include <climits>
#include <filesystem>

#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kMarker[] = "/var/tmp/.wireless_ap_connecting";

class AccessPointMode : public UnitTest {
 protected:
  AccessPointMode() { std::filesystem::remove(kMarker); }
};

TEST_F(AccessPointMode, IsOnAsLongAsTheMarkerIsThere) {
  EXPECT_EQ(MEROWirelessTestAPMode(), FALSE);
  WriteText(kMarker, "");
  EXPECT_EQ(MEROWirelessTestAPMode(), TRUE);
  EXPECT_EQ(MEROWirelessTestAPMode(), TRUE);
  std::filesystem::remove(kMarker);
  EXPECT_EQ(MEROWirelessTestAPMode(), FALSE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(AccessPointMode, IsNotOnForTheMarkerOfAClientConnection) {
  WriteText("/var/tmp/.wireless_connecting", "");
  EXPECT_EQ(MEROWirelessTestAPMode(), FALSE);
  std::filesystem::remove("/var/tmp/.wireless_connecting");
}

TEST_F(AccessPointMode, IsExactlyTrueOrFalseHoweverThePlatformSaysIt) {
  for (const int exists : {1, 2, -1, 256, INT_MIN}) {
    fake::Begin();
    fake::PLIBCFileExist.Returns(exists);
    EXPECT_EQ(MEROWirelessTestAPMode(), TRUE) << exists;
    EXPECT_THAT(fake::Effects(), ElementsAre("PLIBCFileExist(/var/tmp/.wireless_ap_connecting)"));
  }
  fake::PLIBCFileExist.Returns(0);
  EXPECT_EQ(MEROWirelessTestAPMode(), FALSE);
}

}  // namespace
