#include "unit_test.h"

namespace {

using testing::IsEmpty;

class AccessPointSupport : public UnitTest {};

TEST_F(AccessPointSupport, IsNotAnnouncedAlsoWhileAnAccessPointRuns) {
  fake::MEROWirelessAdapterNum.Returns(1);
  fake::PLIBCFileExist.Returns(1);
  EXPECT_EQ(MEROWirelessAPIsSupported(), FALSE);
  WriteText("/var/tmp/.wireless_ap_connecting", "");
  EXPECT_EQ(MEROWirelessAPIsSupported(), FALSE);
  EXPECT_THAT(fake::Effects(), IsEmpty());
}

}  // namespace
