// Network interfaces up and down.
#include <net/if.h>

#include <cerrno>

#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

using testing::ElementsAre;

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

// Of a machine whose kernel also knows a wired interface.
class AnAdapter : public PlatformTest {
 protected:
  const NetworkInterface interface_{"wlan3"};
  const NetworkInterface wired_{"net0"};
  const ShownInterfaces shown_{{{"wlan3", "phy80211"}, {"net0", ""}}};
  SimulatedDriver driver_{"wlan3"};
};

// Scanning began only a second later, when the results were asked for and there were none.
TEST_F(AnAdapter, ScansAsSoonAsItIsUp) {
  EXPECT_EQ(PLIBNetIfUp("wlan3"), 1);
  EXPECT_THAT(driver_.told, ElementsAre("up", "scan"));
}

TEST_F(AnAdapter, DoesNotScanForBeingBroughtUpAgain) {
  EXPECT_EQ(PLIBNetIfUp("wlan3"), 1);
  driver_.told.clear();
  EXPECT_EQ(PLIBNetIfUp("wlan3"), 1);
  EXPECT_THAT(driver_.told, ElementsAre("up"));
}

// Whoever asked for what was known waited for the end of a scan.
TEST_F(AnAdapter, DoesNotScanWhileItKnowsOfNetworks) {
  driver_.hasResults = true;
  EXPECT_EQ(PLIBNetIfUp("wlan3"), 1);
  EXPECT_THAT(driver_.told, ElementsAre("up"));
}

TEST_F(AnAdapter, ThatIsNoClientsDoesNotScan) {
  for (const WIRELESS_OPMODE mode :
       {WIRELESS_OPMODE_AUTO, WIRELESS_OPMODE_ADHOC, WIRELESS_OPMODE_MASTER, WIRELESS_OPMODE_MONITOR}) {
    driver_.mode = static_cast<unsigned>(mode);
    driver_.told.clear();
    EXPECT_EQ(PLIBNetIfUp("wlan3"), 1) << mode;
    EXPECT_THAT(driver_.told, ElementsAre("up")) << mode;
    EXPECT_EQ(PLIBNetIfDown("wlan3"), 1) << mode;
  }
}

TEST_F(AnAdapter, IsUpThoughItCannotScan) {
  for (const int refusal : {EBUSY, EOPNOTSUPP, EPERM, ENOMEM}) {
    driver_.scanRefusal = refusal;
    EXPECT_EQ(PLIBNetIfUp("wlan3"), 1) << refusal;
    EXPECT_NE(interface_.flags() & IFF_UP, 0u) << refusal;
    EXPECT_EQ(PLIBNetIfDown("wlan3"), 1) << refusal;
  }
}

TEST_F(AnAdapter, DoesNotScanForAnotherInterface) {
  EXPECT_EQ(PLIBNetIfUp("net0"), 1);
  EXPECT_NE(wired_.flags() & IFF_UP, 0u);
  EXPECT_EQ(PLIBNetIfUp("none0"), 0);
  ExpectFailure(ERR_NO_DEVICE, "Failed to bring up none0: No such device");
  EXPECT_THAT(driver_.told, ElementsAre("up"));  // the wired one
}

// The reason would be that of a request to the driver, and not that of bringing it up.
TEST_F(AnAdapter, WhoseDriverAnswersNothingIsUpAllTheSame) {
  driver_.refusal = EIO;
  EXPECT_EQ(PLIBNetIfUp("wlan3"), 1);
  EXPECT_NE(interface_.flags() & IFF_UP, 0u);
  EXPECT_THAT(driver_.told, ElementsAre("up"));
}

}  // namespace
