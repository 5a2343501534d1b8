// The course of an automatic connection, and how it ends.
#include "auto_connection.h"
#include "hostile_texts.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;

class AutoConnect : public AutoConnectTest {};

TEST_F(AutoConnect, JoinsTheSavedNetworkThatIsInRangeAndAddressesTheInterface) {
  Save({{"Home", 1, 10}});
  Find(InRange("Home", 1));
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("Home"), kAddresses})));
  EXPECT_EQ(addressed_, "10.0.0.1/255.0.0.1");
  EXPECT_EQ(fake::EffectsOf({"system"}).size(), 1u);  // no route is set
}

TEST_F(AutoConnect, LeasesAnAddressForANetworkThatWantsOne) {
  Save({{"Home", 1, 10, "\tIPADDR=DHCP\n\tAUTH=OPEN\n\tENCRYPT=NONE\n"}});
  Find(InRange("Home", 1));
  fake::MEROIGetDHCPTestNetInfo.Returns(0);
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(),
              ElementsAreArray(Course({kLooks, JoinOf("Home"), "MEROIGetDHCPTestNetInfo(&, 16)", kAddresses})));
}

TEST_F(AutoConnect, TakesAConnectionThatExistsDown) {
  Save({{"Home", 1, 10}});
  Find(InRange("Home", 1));
  for (const auto status : {WIRELESS_STATUS_CONNECTED_MANAGED, WIRELESS_STATUS_CONNECTED_ADHOC}) {
    for (const int result : {0, -1}) {
      fake::Begin();
      StatusIs(status, result);
      fake::MEROWirelessNetworkDisconnect.Returns(-1);
      EXPECT_EQ(Connect(), -1);
      EXPECT_THAT(WithoutLines(fake::Effects()),
                  ElementsAre(kAsksForStatus, AutoConnectReport("Connection exists"), kDisconnects));
    }
  }
}

TEST_F(AutoConnect, GoesOnInAnyOtherState) {
  for (const int status : {0, 1, 2, 3, 4, 7, 8, -1}) {
    Begin();
    Save({{"Home", 1, 10}});
    Find(InRange("Home", 1));
    StatusIs(static_cast<WIRELESS_STATUS>(status));
    EXPECT_EQ(Connect(), 0) << status;
  }
}

TEST_F(AutoConnect, GoesOnWhenTheStateCannotBeAsked) {
  Save({{"Home", 1, 10}});
  Find(InRange("Home", 1));
  fake::MEROWirelessCurInfoGet.Returns(-1);
  EXPECT_EQ(Connect(), 0);
}

TEST_F(AutoConnect, FailsAndDisconnectsWhenNothingIsSaved) {
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kFailsToConnect, kDisconnects})));
}

TEST_F(AutoConnect, FailsAndDisconnectsWhenWhatIsSavedCannotBeRead) {
  Save({{"Home", 1, 10}});
  for (const int result : {-1, -7}) {
    fake::Begin();
    fake::PLIBCFileEnumSection.Returns(result);
    fake::MEROWirelessCurInfoGet.Returns(0);
    fake::MEROWirelessNetworkDisconnect.Returns(0);
    EXPECT_EQ(Connect(), -1);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForStatus,
                                     fake::Report("wireless_conf_enum_by_atime:# Failed to enumerate sections in '" +
                                                  kStore + "'"),
                                     AutoConnectReport("Failed to enumerate wireless network configurations"),
                                     kFailsToConnect, kDisconnects));
  }
}

TEST_F(AutoConnect, FailsAndDisconnectsWhenTheInterfaceCannotBeAddressed) {
  Save({{"Home", 1, 10}});
  Find(InRange("Home", 1));
  fake::MERONetSetCard1.Returns(-1);
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(Course({kLooks, JoinOf("Home"), kAddresses,
                                       fake::Report("wireless_ifcfg_set:# Failed to set network interface"),
                                       AutoConnectReport("Failed to set interface configuration"), kDisconnects})));
}

TEST_F(AutoConnect, DisconnectsOnceAndOnlyAfterAFailure) {
  Save({{"Home", 1, 10}});
  EXPECT_EQ(Connect(), 0);
  EXPECT_EQ(fake::MEROWirelessNetworkDisconnect.calls(), 0);
  outOfReach_ = {"Home"};
  EXPECT_EQ(Connect(), -1);
  EXPECT_EQ(fake::MEROWirelessNetworkDisconnect.calls(), 1);
}

TEST_F(AutoConnect, AddressesAnInterfaceNameOfUpTo15Characters) {
  Save({{"Home", 1, 10}});
  fake::MEROWirelessInterfaceGet.Returns("wireless-interface0");
  std::string ifName;
  fake::MERONetSetCard1.Does([&](const NETINFO* pNetInfo, int) {
    ifName = pNetInfo->szInterface;
    return 0;
  });
  EXPECT_EQ(Connect(), 0);
  EXPECT_EQ(ifName, "wireless-interf");
}

// A radio that is switched off joins nothing, and says that it did.
TEST_F(AutoConnect, TakesABlockedRadioForSuccess) {
  Save({{"Home", 1, 10}});
  Find(InRange("Home", 1));
  WriteText(kApSettings, "[RT-5370]\n\tunblock=no\n");
  WriteText(kAdapterInfo, "PRODUCT=RT-5370\n");
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, kAddresses})));
}

// ---- Names from the air, and memory ----

TEST_F(AutoConnect, JoinsNetworksOfAnyNameThatIsInRange) {
  for (const std::string& name : kHostileTexts) {
    if (name.find('\n') != std::string::npos || name.find_last_not_of(" \t\r\n") + 1 != name.size()) continue;
    Begin();
    ForgetCalls();
    Save({{"Home", 1, 10}});
    Find(InRange(name, 1));
    EXPECT_EQ(Connect(), 0) << name;
    EXPECT_THAT(fake::EffectsOf({"join"}), ElementsAre(JoinOf(name)));
    EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant)));
  }
}

TEST_F(AutoConnect, LeavesNothingAllocatedHoweverItEnds) {
  std::vector<Saved> networks;
  for (int i = 1; i <= 50; ++i) networks.push_back({"net " + std::to_string(i), i, i});
  const std::vector<std::set<std::string>> kReaches = {{}, {"net 50"}, {"net 50", "net 49"}};
  for (const auto& outOfReach : kReaches) {
    Begin();
    Save(networks);
    outOfReach_ = outOfReach;
    EXPECT_EQ(Connect(), 0);
    EXPECT_EQ(fake::EffectsOf({"join"}).size(), outOfReach.size() + 1);
    EXPECT_EQ(memory::Held(), 0u);
  }
  Begin();
  Save(networks);
  fake::system.Returns(-1);
  EXPECT_EQ(Connect(), -1);
  EXPECT_EQ(memory::Held(), 0u);
}

TEST_F(AutoConnect, EndsConnectedAndAddressedOrDisconnectedWheneverMemoryRunsOut) {
  int failures = 0;
  const auto prepare = [this] {
    Begin();
    Save({{"A", 1, 20}, {"B", 2, 10}});
    Find(InRange("B", 2));
    outOfReach_ = {"A"};
  };
  prepare();
  memory::FailEach(
      [] { return MEROWirelessAutoConnect(); },
      [&](int n, int result) {
        EXPECT_EQ(memory::Held(), 0u) << n;
        EXPECT_EQ(Last(fake::Effects()), result == 0 ? kAddresses : kDisconnects) << n;
        if (result == 0) {
          EXPECT_EQ(addressed_, "10.0.0.2/255.0.0.2") << n;
        } else {
          EXPECT_EQ(result, -1) << n;
          EXPECT_EQ(Last(WithoutLines(fake::Messages())), "wireless_auto_connect:# Failed to connect any access point")
              << n;
        }
        failures += result == 0 ? 0 : 1;
        prepare();
      });
  EXPECT_GT(failures, 5);
}

}  // namespace
