// The wireless adapters that the kernel has.
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

class Adapters : public PlatformTest {};

TEST_F(Adapters, AreNoneOnAMachineWithoutAny) {
  EXPECT_EQ(MEROWirelessAdapterNum(), 0);
  EXPECT_STREQ(MEROWirelessInterfaceGet(), "wlan0");
}

TEST_F(Adapters, AreTheInterfacesWithARadio) {
  const ShownInterfaces shown({{"lo", ""},
                               {"eth0", "queues"},
                               {"wlan7", ""},
                               {"wlan3", "phy80211"},
                               {"wlx0011", "wireless"},
                               {"ra0", "phy80211"}});
  EXPECT_EQ(MEROWirelessAdapterNum(), 3);
}

TEST_F(Adapters, GiveTheFirstByNameAsPeopleCount) {
  const struct {
    std::vector<ShownInterfaces::Interface> interfaces;
    const char* szFirst;
  } rows[] = {
      {{{"wlan10", "phy80211"}, {"wlan2", "phy80211"}, {"wlan3", "phy80211"}}, "wlan2"},
      {{{"wlan1", "phy80211"}, {"wlan0", "phy80211"}}, "wlan0"},
      {{{"wlan1", "phy80211"}, {"wlan0", ""}}, "wlan1"},
      {{{"wlan0", "phy80211"}, {"ra0", "wireless"}, {"eth0", ""}}, "ra0"},
      {{{"fifteen-letters", "wireless"}}, "fifteen-letters"},
  };
  for (const auto& row : rows) {
    const ShownInterfaces shown(row.interfaces);
    EXPECT_STREQ(MEROWirelessInterfaceGet(), row.szFirst);
  }
}

// While guests were on the air, their interface was taken for the client's.
TEST_F(Adapters, AreNotTheGuestsInterface) {
  const ShownInterfaces shown({{"gwlan", "phy80211"}, {"wlan0", "phy80211"}});
  EXPECT_EQ(MEROWirelessAdapterNum(), 1);
  EXPECT_STREQ(MEROWirelessInterfaceGet(), "wlan0");
}

TEST_F(Adapters, AreLookedForAtEachCall) {
  {
    const ShownInterfaces shown({{"lo", ""}, {"wlan5", "phy80211"}});
    EXPECT_EQ(MEROWirelessAdapterNum(), 1);
    EXPECT_STREQ(MEROWirelessInterfaceGet(), "wlan5");
  }
  EXPECT_EQ(MEROWirelessAdapterNum(), 0);
  EXPECT_STREQ(MEROWirelessInterfaceGet(), "wlan0");
}

}  // namespace
