// address, gateway, and how a joined network is addressed.
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "common/paths.h"
#include "running.h"

using library::Network;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

WIRELESS_NETWORK_CONFIG Home(const char* szIp) {
  WIRELESS_NETWORK_CONFIG config{};
  config.network = Network("Home", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
  std::strcpy(config.szIp, szIp);
  std::strcpy(config.szMask, "255.255.255.0");
  std::strcpy(config.szGateway, "10.0.0.1");
  return config;
}

// Gateways are set for real, on an interface of this machine.
class Addresses : public ToolTest {
 protected:
  Addresses() {
    Shell("ip link add wlan0 type veth && ip address add 10.0.0.9/24 dev wlan0 && ip link set wlan0 up");
    library::Connected("Home");
    library::InRange({Home("").network});
    library::MEROWirelessIfconfigSet = [](const char* szInterface, WIRELESS_NETWORK_CONFIG config) {
      library::Record(std::string(szInterface) + "|" + config.szIp + "|" + config.szMask);
      return 0;
    };
    library::MEROWirelessDefaultGatewaySet = [](const char* szGateway) {
      library::Record(szGateway);
      return RunInShell("ip route add default via " + std::string(szGateway)), 0;
    };
  }
  Addresses(const Addresses&) = delete;
  Addresses& operator=(const Addresses&) = delete;
  ~Addresses() override { Shell("ip link delete wlan0"); }
};

TEST_F(Addresses, OfAJoinedNetworkComeWithItsGateway) {
  library::Known({Home("10.0.0.9")});
  EXPECT_EQ(Tool({"connect", "0A:0A:0A:0A:0A:0A", "--any-ap"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet", "wlan0|10.0.0.9|255.255.255.0",
                          "MEROWirelessDefaultGatewaySet", "10.0.0.1"));
}

TEST_F(Addresses, ByDhcpBringTheirOwnGateway) {
  library::Known({Home("DHCP")});
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet", "wlan0|DHCP|255.255.255.0"));
}

TEST_F(Addresses, OfTheNetworkThatAutoconnectHasJoinedComeWithItsGateway) {
  library::Known({Home("10.0.0.9")});
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  int asked = 0;
  library::MEROWirelessConnStatusGet = [asked]() mutable {
    return asked++ < 1 ? WIRELESS_STATUS_DISCONNECTED : WIRELESS_STATUS_CONNECTED_MANAGED;
  };
  EXPECT_EQ(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet", "wlan0|10.0.0.9|255.255.255.0",
                          "MEROWirelessDefaultGatewaySet", "10.0.0.1"));
}

TEST_F(Addresses, ThatNoServerGivesAreAFailureThoughTheNetworkWasJoined) {
  library::Known({Home("DHCP")});
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    return library::Report("wireless_ifcfg_set", "Failed to get IP from DHCP"), 0;
  };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 7);
  EXPECT_THAT(ran.err, HasSubstr("no DHCP server answered"));

  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  EXPECT_EQ(Tool({"autoconnect"}).status, 7);
}

TEST_F(Addresses, AreTakenWhenTheyAreAddresses) {
  EXPECT_EQ(Tool({"address", "10.0.0.9", "--mask", "255.255.255.0"}).status, 0);
  EXPECT_EQ(Tool({"address", "DHCP"}).status, 0);
  EXPECT_EQ(Tool({"gateway", "10.0.0.1"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessIfconfigSet", "wlan0|10.0.0.9|255.255.255.0", "MEROWirelessIfconfigSet",
                          "wlan0|DHCP|", "MEROWirelessDefaultGatewaySet", "10.0.0.1"));
}

TEST_F(Addresses, ThatAreNoneAreNotTried) {
  const std::vector<std::vector<std::string>> wrong = {{"address", "10.0.0.9"},
                                                       {"address", "none"},
                                                       {"address", "DHCP", "--mask", "255.0.0.0"},
                                                       {"gateway", "; reboot"}};
  for (const auto& arguments : wrong) EXPECT_EQ(Tool(arguments).status, 2) << testing::PrintToString(arguments);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// The bridge of an access point has the addresses. One on the interface would keep the bridge from being reached.
TEST_F(Addresses, OfAnAccessPointAreItsBridges) {
  kernel::BecomeAccessPoint("Office");
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"address", "DHCP"}, std::vector<std::string>{"gateway", "10.0.0.1"}}) {
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, 8);
    EXPECT_THAT(ran.err, HasSubstr("the adapter is an access point, whose addresses are its bridge's"));
  }
  kernel::BecomeClient();
  WriteText(kApMarkerPath, "");
  EXPECT_THAT(Tool({"address", "DHCP"}).err, HasSubstr("the adapter is about to be an access point, whose addresses"));
  std::filesystem::remove(kApMarkerPath);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// The library reports no command that the kernel refuses.
TEST_F(Addresses, OfGatewaysThatCannotBeReachedAreAFailure) {
  const Ran ran = Tool({"gateway", "203.0.113.1"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the gateway 203.0.113.1 could not be set"));

  Shell(
      "ip route add default via 10.0.0.2 && ip route add 203.0.113.0/24 via 10.0.0.1 &&"
      "ip route add 0.0.0.0/1 via 10.0.0.1");
  EXPECT_EQ(Tool({"gateway", "10.0.0.1"}).status, 1) << "none of the routes leads everywhere by way of it";
}

TEST_F(Addresses, OfGatewaysBehindAWireAreNotTheRadios) {
  Shell(
      "ip link add eth7 type veth && ip address add 10.7.0.9/24 dev eth7 && ip link set eth7 up &&"
      "ip route add default via 10.7.0.1");
  EXPECT_EQ(Tool({"gateway", "10.7.0.1"}).status, 1);
  Shell("ip link delete eth7");
}

}  // namespace
