// connect, autoconnect, disconnect, address, gateway, adhoc, watch, radio and mode.
#include <cstring>
#include <filesystem>

#include "running.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

WIRELESS_NETWORK_CONFIG Home(const char* szIp = "DHCP") {
  WIRELESS_NETWORK_CONFIG config{};
  config.network = Network("Home");
  std::strcpy(config.szKey, "open sesame");
  std::strcpy(config.szIp, szIp);
  std::strcpy(config.szMask, "255.255.255.0");
  std::strcpy(config.szGateway, "10.0.0.1");
  return config;
}

class Connection : public ToolTest {
 protected:
  Connection() {
    library::Known({Home()});
    library::Connected("Home");
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
      library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" + config->szUser + "|" +
                      std::to_string(config->noneBssid));
      return 0;
    };
    library::MEROWirelessIfconfigSet = [](const char* szInterface, WIRELESS_NETWORK_CONFIG config) {
      library::Record(std::string(szInterface) + "|" + config.szIp + "|" + config.szMask);
      return 0;
    };
    library::MEROWirelessDefaultGatewaySet = [](const char* szGateway) { return library::Record(szGateway), 0; };
  }
};

TEST_F(Connection, ToAKnownNetworkTakesItsSecretAndAddress) {
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "connected to Home without an address\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "Home|open sesame||0",
                                            "MEROWirelessIfconfigSet", "wlan0|DHCP|255.255.255.0"));
}

constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";

// A supplicant's client that does this.
void InstallSupplicantClient(const std::string& script) {
  constexpr char kPath[] = "/usr/sbin/wpa_cli";
  WriteText(kPath, "#!/bin/sh\n" + script);
  std::filesystem::permissions(kPath, std::filesystem::perms(0755));
}

TEST_F(Connection, IsMadeOnlyWhenTheFormerSupplicantHasGone) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("echo $* >/tmp/told\n(sleep 0.3; rm /var/run/wpa_supplicant.pid) &\n");
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Record(std::filesystem::exists(kSupplicantPid) ? "too early" : "joined");
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("joined"));
  EXPECT_EQ(ReadText("/tmp/told"), "terminate\n");
}

TEST_F(Connection, IsMadeWhenOnlyTheFileOfASupplicantIsLeft) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("exit 255\n");
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("MEROWirelessNetworkConnect"));
}

TEST_F(Connection, IsNotMadeBesideASupplicantThatDoesNotEnd) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("exit 0\n");
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the former connection does not end"));
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessNetworkConnect")));
}

TEST_F(Connection, OfAStaticNetworkSetsItsGatewayToo) {
  library::Known({Home("10.0.0.9")});
  EXPECT_EQ(Tool({"connect", "0A:0A:0A:0A:0A:0A", "--any-ap"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", "Home|open sesame||1", "MEROWirelessIfconfigSet",
                          "wlan0|10.0.0.9|255.255.255.0", "MEROWirelessDefaultGatewaySet", "10.0.0.1"));
}

TEST_F(Connection, CanLeaveTheAddressesAlone) {
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "Home|open sesame||0"));
}

TEST_F(Connection, ToAnUnknownNetworkScansAndTakesASecret) {
  library::InRange({Network("Office", WIRELESS_AUTH_WPA2EAP)});
  EXPECT_EQ(Tool({"connect", "Office", "--key-stdin", "--user", "ann"}, {.input = "secret"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("Office|secret|ann|0"));
  EXPECT_EQ(Tool({"connect", "Office", "--key-stdin"}, {.input = "secret"}).status, 2);
}

TEST_F(Connection, ToANetworkOutOfRangeIsNotTried) {
  EXPECT_EQ(Tool({"connect", "Elsewhere"}).status, 4);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// The library takes such an attempt for a success.
TEST_F(Connection, IsNotTriedWhileTheRadioIsSwitchedOff) {
  for (int answer : {0, -1}) {
    library::MEROWirelessCheckBlock = [answer] { return answer; };
    for (const auto& command : std::vector<std::vector<std::string>>{{"connect", "Home"}, {"autoconnect"}}) {
      const Ran ran = Tool(command);
      EXPECT_EQ(ran.status, 6);
      EXPECT_THAT(ran.err, HasSubstr("`merowireless radio on` switches it on"));
    }
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, ThatFailsWithoutAReasonSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("Home could not be joined in time"));
}

TEST_F(Connection, ThatMeetsAnotherAttemptSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    return library::Report("Another connection construction is going"), -1;
  };
  EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("is being joined already"));
}

TEST_F(Connection, ThatLosesItsAdapterSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  int asked = 0;
  library::MEROWirelessAdapterNum = [asked]() mutable { return asked++ < 1 ? 1 : 0; };
  EXPECT_EQ(Tool({"connect", "Home"}).status, 3);
}

TEST_F(Connection, WithoutADhcpServerIsAFailureThoughTheNetworkWasJoined) {
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    return library::Report("Failed to get IP from DHCP"), 0;
  };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("no DHCP server answered"));
}

TEST_F(Connection, ThatExistsIsKeptByAutoconnect) {
  EXPECT_EQ(Tool({"autoconnect"}).out, "connected to Home without an address\n");
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, IsMadeByAutoconnectOrNotAtAll) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  library::MEROWirelessAutoConnect = [] { return library::Report("Failed to connect any access point"), -1; };
  EXPECT_EQ(Tool({"autoconnect"}).status, 4);
  library::MEROWirelessAutoConnect = [] { return 0; };
  EXPECT_EQ(Tool({"autoconnect"}).status, 0);
}

TEST_F(Connection, Ends) {
  EXPECT_EQ(Tool({"disconnect"}).out, "disconnected\n");
  EXPECT_EQ(Tool({"disconnect", "--json"}).out, "{\"result\":\"ok\"}\n");
  library::MEROWirelessNetworkDisconnect = [] { return -1; };
  EXPECT_EQ(Tool({"disconnect"}).status, 1);
}

TEST_F(Connection, TakesAddressesThatAreAddresses) {
  EXPECT_EQ(Tool({"address", "10.0.0.9", "--mask", "255.255.255.0"}).status, 0);
  EXPECT_EQ(Tool({"address", "DHCP"}).status, 0);
  EXPECT_EQ(Tool({"gateway", "10.0.0.1"}).status, 0);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessIfconfigSet", "wlan0|10.0.0.9|255.255.255.0", "MEROWirelessIfconfigSet",
                          "wlan0|DHCP|", "MEROWirelessDefaultGatewaySet", "10.0.0.1"));
  EXPECT_EQ(Tool({"address", "10.0.0.9"}).status, 2);
  EXPECT_EQ(Tool({"gateway", "; reboot"}).status, 2);
}

TEST_F(Connection, OfEqualsIsACell) {
  library::MEROWirelessAdhocCreate = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" +
                    std::to_string(config->network.opmode) + "|" + std::to_string(config->network.encrypt));
    return 0;
  };
  EXPECT_EQ(Tool({"adhoc", "cell"}).status, 0);
  EXPECT_EQ(Tool({"adhoc", "cell", "--wep", "--key-stdin"}, {.input = "12345"}).status, 0);
  EXPECT_EQ(Tool({"adhoc", "cell", "--wep", "--key-stdin"}, {.input = "123456"}).status, 5);
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessAdhocCreate", "cell||1|1", "MEROWirelessAdhocCreate", "cell|12345|1|2"));
}

TEST_F(Connection, IsShownAgainWhenItHasChanged) {
  int asked = 0;
  library::MEROWirelessConnStatusGet = [asked]() mutable {
    return asked++ < 2 ? WIRELESS_STATUS_DOWN : WIRELESS_STATUS_DISCONNECTED;
  };
  const Ran ran = Tool({"watch", "--count", "2", "--porcelain"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out, "down\t\t\t\t\twlan0\t\t\ton\t\ndisconnected\t\t\t\t\twlan0\t\t\ton\t\n");
}

TEST_F(Connection, NeedsARadioThatCanBeSwitched) {
  EXPECT_EQ(Tool({"radio", "--porcelain"}).out, "on\tExampleStick\n");
  library::PLIBCFileSetSectionValue = [](const char* szPath, const char* szSection, const char* szKey,
                                         const char* szValue, const char* szFormat) {
    library::Record(std::string(szPath) + "|" + szSection + "|" + szKey + "|" + szValue + "|" + szFormat);
    return 0;
  };
  EXPECT_EQ(Tool({"radio", "off"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("PLIBCFileSetSectionValue",
                                            "/usr/mero/etc/wireless_ap.conf|ExampleStick|unblock|no|\t%s=%s", ""));
  EXPECT_EQ(Tool({"radio", "sideways"}).status, 2);
}

TEST_F(Connection, NeedsAnAdapterThatIsAClients) {
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) { return library::Record(std::to_string(mode)), TRUE; };
  EXPECT_EQ(Tool({"mode", "client"}).status, 0);
  EXPECT_EQ(Tool({"mode", "ap"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessModeChange", "1", "MEROWirelessModeChange", "0"));
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return FALSE; };
  EXPECT_EQ(Tool({"mode", "ap"}).status, 1);
}

}  // namespace
