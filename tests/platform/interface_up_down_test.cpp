// Network interfaces up and down.
#include <net/if.h>

#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"

namespace {

class AnInterface : public PlatformTest {};

TEST_F(AnInterface, IsBroughtUpAndTakenDown) {
  const NetworkInterface interface("net0");
  EXPECT_EQ(interface.flags() & IFF_UP, 0u);
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(PLIBNetIfUp("net0"), 1);
    EXPECT_NE(interface.flags() & IFF_UP, 0u);
  }
  for (int i = 0; i < 2; ++i) {
    EXPECT_EQ(PLIBNetIfDown("net0"), 1);
    EXPECT_EQ(interface.flags() & IFF_UP, 0u);
  }
}

TEST_F(AnInterface, KeepsItsOtherFlags) {
  const NetworkInterface interface("net0");
  Shell("ip link set net0 promisc on arp off multicast off");
  const unsigned before = interface.flags();
  EXPECT_EQ(PLIBNetIfUp("net0"), 1);
  EXPECT_EQ(PLIBNetIfDown("net0"), 1);
  EXPECT_EQ(interface.flags(), before);
}

TEST_F(AnInterface, ThatDoesNotExistIsReported) {
  EXPECT_EQ(PLIBNetIfUp("none0"), 0);
  ExpectFailure(ERR_NO_DEVICE, "Failed to bring up none0: No such device");
  EXPECT_EQ(PLIBNetIfDown("none0"), 0);
  ExpectFailure(ERR_NO_DEVICE, "Failed to take down none0: No such device");
}

// A name that was cut to what the kernel takes would bring up another interface.
TEST_F(AnInterface, IsNotReachedByANameThatBeginsWithItsOwn) {
  const NetworkInterface interface("fifteen-letters");
  EXPECT_EQ(PLIBNetIfUp("fifteen-letters-and-more"), 0);
  ExpectFailure(ERR_NO_DEVICE, "Failed to bring up fifteen-letters-and-more: No such device");
  EXPECT_EQ(interface.flags() & IFF_UP, 0u);
  EXPECT_EQ(PLIBNetIfUp("fifteen-letters"), 1);
}

TEST_F(AnInterface, WithoutANameIsRefused) {
  EXPECT_EQ(PLIBNetIfUp(nullptr), 0);
  ExpectNullRefused();
  EXPECT_EQ(PLIBNetIfDown(nullptr), 0);
  ExpectNullRefused();
}

}  // namespace
