// What becomes of a connection when another network is tried in vain.
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>
#include <filesystem>

#include "running.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

namespace {

constexpr char kSettings[] = "/usr/mero/etc/wpa_supplicant.conf";
constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";
constexpr char kDhcpClientPid[] = "/var/run/udhcpc-wlan0.pid";

constexpr char kLost[] = "/tmp/connection.lost";

constexpr char kBack[] = "merowireless: the former connection, to Home, is back\n";

// Home, as it was joined last: with another secret than the known one.
constexpr char kHomeSettings[] =
    "ctrl_interface=/var/run/wpa_supplicant\n"
    "network={\n"
    "\tssid=\"Home\"\n"
    "\tbssid=0A:0A:0A:0A:0A:0A\n"
    "\tscan_ssid=1\n"
    "\tkey_mgmt=WPA-PSK\n"
    "\tpairwise=CCMP\n"
    "\tpsk=\"the \"newer\" secret\"\n"
    "}\n";

std::string Told(const WIRELESS_NETWORK_CONFIG& config) {
  return std::string(config.network.szEssid) + "|" + config.szKey + "|" + std::to_string(config.network.auth) + "|" +
         std::to_string(config.network.encrypt) + "|" + std::to_string(config.noneBssid) + "|" +
         std::to_string(config.network.opmode);
}

WIRELESS_NETWORK_CONFIG Office() {
  WIRELESS_NETWORK_CONFIG config = library::Home();
  std::strcpy(config.network.szEssid, "Office");
  std::memset(config.network.bssid, 0x0C, sizeof config.network.bssid);
  return config;
}

const std::string kHomeTold = "Home|the \"newer\" secret|5|8|0|2";
const std::string kOfficeTold = "Office|open sesame|5|8|1|2";

// The office lets nobody in; Home does.
int JoinAllButTheOffice(const WIRELESS_NETWORK_CONFIG* config) {
  library::Record(Told(*config));
  return config->network.szEssid == std::string("Office") ? -1 : 0;
}

// An interface that is no radio, but has addresses and routes.
class Interface {
 public:
  Interface() { Shell("ip link add wlan0 type veth && ip link set wlan0 up"); }
  Interface(const Interface&) = delete;
  Interface& operator=(const Interface&) = delete;
  ~Interface() { Shell("ip link delete wlan0"); }
};

class FormerConnection : public ToolTest {
 protected:
  FormerConnection() {
    for (const char* szPath : {kSupplicantPid, kDhcpClientPid}) std::filesystem::remove(szPath);
    WriteText(kSettings, kHomeSettings);
    WIRELESS_NETWORK_CONFIG home = library::Home();
    library::Known({home, Office()});
    library::InRange({home.network, Office().network});
    library::Connected("Home");
    library::MEROWirelessNetworkConnect = JoinAllButTheOffice;
  }
};

TEST_F(FormerConnection, IsBackAfterAnAttemptThatFailed) {
  const Ran ran = Tool({"connect", "Office"});
  EXPECT_EQ(ran.status, 9);
  EXPECT_THAT(ran.err, AllOf(testing::StartsWith(kBack), HasSubstr("Office could not be joined in time")));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", kOfficeTold, "MEROWirelessNetworkDisconnect",
                                            "MEROWirelessNetworkConnect", kHomeTold));
}

// Where the supplicant's settings are another network's, what was saved tells how to join.
TEST_F(FormerConnection, IsBackByWhatWasSaved) {
  for (const std::string& settings : {std::string(), std::string("\tssid=\"Elsewhere\"\n\tkey_mgmt=NONE\n")}) {
    WriteText(kSettings, settings);
    EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr(kBack));
    EXPECT_THAT(library::Calls().back(), testing::StartsWith("Home|open sesame|"));
  }
}

TEST_F(FormerConnection, ThatCannotBeBroughtBackLeavesNothing) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"connect", "Office"});
  EXPECT_EQ(ran.status, 9);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the former connection, to Home, could not be brought back\n"));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

TEST_F(FormerConnection, ThatNobodyKnowsCannotBeBroughtBack) {
  std::filesystem::remove(kSettings);
  library::Known({Office()});
  EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr("could not be brought back\n"));
}

// The connection is lost while there is that file, and there again when a network is joined.
void CanBeLost() {
  std::filesystem::remove(kLost);
  library::MEROWirelessConnStatusGet = [] {
    return Exists(kLost) ? WIRELESS_STATUS_DISCONNECTED : WIRELESS_STATUS_CONNECTED_MANAGED;
  };
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    std::filesystem::remove(kLost);
    return library::Record(Told(*config)), 0;
  };
}

// The adapter was a client's without a network afterwards, and nothing told of that.
TEST_F(FormerConnection, IsBackAfterAnAccessPointThatFailed) {
  library::SavedAp(library::Office());
  library::MEROWirelessAPEnable = [] { return WriteText(kLost, ""), FALSE; };
  CanBeLost();
  const Ran ran = Tool({"ap", "enable"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.err, std::string(kBack) +
                         "merowireless: the access point could not be enabled: -v shows what the library reports\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "MEROWirelessAPEnable",
                                            "MEROWirelessSetAPConfig", "MEROWirelessAPDisable",
                                            "MEROWirelessNetworkDisconnect", "MEROWirelessNetworkConnect", kHomeTold));
}

TEST_F(FormerConnection, IsBackAfterAModeThatFailed) {
  constexpr char kInfo[] = "/etc/hostapd/hostapd-wlan0.info";
  WriteText(kInfo, "enable=\"no\"\n");
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE) { return WriteText(kLost, ""), FALSE; };
  CanBeLost();
  const Ran ran = Tool({"mode", "ap"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, testing::StartsWith(kBack));
  std::filesystem::remove(kInfo);
}

// It was ended and joined again, which may come to nothing.
TEST_F(FormerConnection, ThatAnAccessPointThatFailedHasNotTouchedIsLeftAlone) {
  library::SavedAp(library::Office());
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF) { return FALSE; };
  EXPECT_THAT(Tool({"ap", "enable"}).err, Not(HasSubstr("former")));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig"));
}

// The library joined a network by the interface of an access point.
TEST_F(FormerConnection, IsNotBroughtBackOnAnAccessPoint) {
  library::SavedAp(library::Office());
  library::MEROWirelessAPEnable = [] { return kernel::BecomeAccessPoint("Office"), FALSE; };
  library::MEROWirelessAPDisable = [] { return FALSE; };
  library::MEROWirelessConnStatusGet = [] {
    return kernel::Main().type == NL80211_IFTYPE_AP ? WIRELESS_STATUS_DISCONNECTED : WIRELESS_STATUS_CONNECTED_MANAGED;
  };
  EXPECT_THAT(
      Tool({"ap", "enable"}).err,
      HasSubstr("merowireless: the former connection, to Home, is not brought back: the adapter is an access point\n"));
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessNetworkConnect")));
}

TEST_F(FormerConnection, IsLeftToWhoeverSetsUpAnAccessPoint) {
  library::SavedAp(library::Office());
  library::MEROWirelessAPEnable = [] {
    WriteText(kLost, "");
    return library::Report("wireless_ap_enable", "Another ap construction is going"), FALSE;
  };
  CanBeLost();
  EXPECT_EQ(Tool({"ap", "enable"}).status, 8);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "MEROWirelessAPEnable"));
}

TEST_F(FormerConnection, IsMissedByNobodyWhereThereWasNone) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  const Ran ran = Tool({"connect", "Office"});
  EXPECT_THAT(ran.err, Not(HasSubstr("former")));
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", kOfficeTold, "MEROWirelessNetworkDisconnect"));
}

// The lease of the network that was left stayed behind, and so did what asked for one.
TEST_F(FormerConnection, IsGivenALeaseAgain) {
  const StartedDaemon client("busybox", kDhcpClientPid);
  library::MEROWirelessIfconfigSet = [](const char* szInterface, WIRELESS_NETWORK_CONFIG config) {
    return library::Record(std::string(szInterface) + "|" + config.szIp), 0;
  };
  EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr(kBack));
  EXPECT_EQ(library::Calls().back(), "wlan0|DHCP");
}

TEST_F(FormerConnection, HasItsAddressAndItsRoutesAgain) {
  const Interface interface;
  Shell("ip address add 10.0.0.9/24 dev wlan0");
  const std::string routes = Shell(
      "ip route add default via 10.0.0.1 dev wlan0 metric 7 &&"
      "ip route add 10.9.0.0/16 via 10.0.0.2 dev wlan0 && ip route show");
  library::MEROWirelessNetworkDisconnect = [] { return Shell("ip address flush dev wlan0"), 0; };
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG config) {
    EXPECT_STREQ(config.szMask, "255.255.255.0");
    return Shell("ip address add " + std::string(config.szIp) + "/24 dev wlan0"), 0;
  };
  EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr(kBack));
  EXPECT_EQ(Shell("ip route show"), routes);
}

TEST_F(FormerConnection, ThatIsBackInPartIsCalledSo) {
  const Interface interface;
  Shell("ip address add 10.0.0.9/24 dev wlan0 && ip route add default via 10.0.0.1 dev wlan0");
  library::MEROWirelessNetworkDisconnect = [] { return Shell("ip address flush dev wlan0"), 0; };
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return 0; };
  EXPECT_THAT(Tool({"connect", "Office"}).err,
              HasSubstr("merowireless: the former connection, to Home, is back, but not all that came with it\n"));
}

TEST_F(FormerConnection, IsBackWhenTheNewOneGetsNoAddress) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    return library::Record(Told(*config)), 0;
  };
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return -1; };
  const Ran ran = Tool({"connect", "Office"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr(kBack));
  EXPECT_EQ(library::Calls().back(), kHomeTold);
}

TEST_F(FormerConnection, IsLeftForOneThatAsksForALeaseStill) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    return library::Record(Told(*config)), 0;
  };
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    return library::Report("wireless_ifcfg_set", "Failed to get IP from DHCP"), 0;
  };
  EXPECT_EQ(Tool({"connect", "Office"}).status, 7);
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessNetworkDisconnect")));
}

TEST_F(FormerConnection, WithACellIsBackToo) {
  library::InCell("Bench");
  EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr("merowireless: the former connection, to Bench, is back\n"));
  EXPECT_EQ(library::Calls().back(), "Bench||1|1|0|1");
}

TEST_F(FormerConnection, IsBackWhenACellCannotBeStarted) {
  library::MEROWirelessAdhocCreate = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  EXPECT_THAT(Tool({"adhoc", "Bench"}).err, HasSubstr(kBack));
  EXPECT_EQ(library::Calls().back(), kHomeTold);
}

// Joins the office for ever, and Home at once.
int WaitAtTheOffice(const WIRELESS_NETWORK_CONFIG* config) {
  library::Record(Told(*config));
  while (config->network.szEssid == std::string("Office")) ::pause();
  return 0;
}

bool IsTold(const std::string& told) {
  const auto calls = library::Calls();
  return std::find(calls.begin(), calls.end(), told) != calls.end();
}

TEST_F(FormerConnection, IsBackAfterAnInterruption) {
  library::MEROWirelessNetworkConnect = WaitAtTheOffice;
  StartedTool tool({"connect", "Office"});
  ASSERT_TRUE(Soon([] { return IsTold(kOfficeTold); }));
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.err, testing::StartsWith(kBack));
  EXPECT_EQ(library::Calls().back(), kHomeTold);
}

TEST_F(FormerConnection, IsGivenUpByASecondInterruption) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(Told(*config));
    while (true) ::pause();
    return 0;
  };
  StartedTool tool({"connect", "Office"});
  for (const std::string& told : {kOfficeTold, kHomeTold}) {
    ASSERT_TRUE(Soon([&] { return IsTold(told); }));
    ::kill(tool.pid(), SIGINT);
  }
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.err, HasSubstr("interrupted again, and something may be left"));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

// The supplicant inherits them.
TEST_F(FormerConnection, IsMadeByProcessesThatCanBeEnded) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    sigset_t blocked;
    ::sigprocmask(SIG_BLOCK, nullptr, &blocked);
    if (::sigismember(&blocked, SIGTERM) != 0) library::Record("cannot be ended");
    return JoinAllButTheOffice(config);
  };
  EXPECT_THAT(Tool({"connect", "Office"}).err, HasSubstr(kBack));
  EXPECT_THAT(library::Calls(), Not(Contains("cannot be ended")));
}

// A connection was ended for what could have been known before.
class KnownBeforehand : public FormerConnection {
 protected:
  KnownBeforehand() {
    WriteText(kSupplicantPid, "1\n");
    WriteScript("/usr/sbin/wpa_cli", "touch /tmp/told; rm /var/run/wpa_supplicant.pid\n");
    std::filesystem::remove("/tmp/told");
  }
  ~KnownBeforehand() override { std::filesystem::remove(kSupplicantPid); }

  // Connecting to this network ends so, with this message, and changes nothing.
  static void Expect(const WIRELESS_NETWORK_CONFIG& office, int status, const std::string& message,
                     const std::string& name = "Office") {
    library::Known({library::Home(), office});
    const Ran ran = Tool({"connect", name});
    EXPECT_EQ(ran.status, status) << ran.err;
    EXPECT_THAT(ran.err, AllOf(HasSubstr(message), Not(HasSubstr("former"))));
    EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessNetworkConnect")));
    EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessNetworkDisconnect")));
    EXPECT_FALSE(Exists("/tmp/told")) << "the supplicant was told to end";
  }
};

TEST_F(KnownBeforehand, IsWhatIsNotInRange) {
  library::InRange({library::Home().network});
  Expect(Office(), 4, "Office is not in range, and nothing was changed");
  WIRELESS_NETWORK another = Office().network;
  another.bssid[0] ^= 2;
  library::InRange({another});
  Expect(Office(), 4, "Office is not in range, and nothing was changed", "0C:0C:0C:0C:0C:0C");
  EXPECT_EQ(Tool({"connect", "Office"}).status, 9) << "any access point of the name will do";
}

TEST_F(KnownBeforehand, IsAProtectionThatCannotBeJoined) {
  WIRELESS_NETWORK_CONFIG office = Office();
  for (const WIRELESS_AUTH auth : {WIRELESS_AUTH_UNKNOWN, WIRELESS_AUTH_WPANONE}) {
    office.network.auth = auth;
    Expect(office, 10, "Office is protected in a way that cannot be joined");
  }
}

TEST_F(KnownBeforehand, IsASecretThatCanBeNone) {
  WIRELESS_NETWORK_CONFIG office = Office();
  std::strcpy(office.szKey, "short");
  Expect(office, 5, "the secret that was saved for Office can be none");
  office.network.auth = WIRELESS_AUTH_SHARED;
  library::InRange({office.network});
  std::strcpy(office.szKey, "no digits!");
  Expect(office, 5, "the secret that was saved for Office can be none");
}

// The supplicant was told of another name or secret: what stood before the '#'.
TEST_F(KnownBeforehand, IsATextOfWhichTheSupplicantWouldReadABeginning) {
  WIRELESS_NETWORK_CONFIG office = Office();
  for (const char* szText : {"a \"quoted #1", "\"\"\"# and more"}) {
    std::strcpy(office.szKey, szText);
    Expect(office, 10, "the supplicant would take the end of the secret of Office for a comment");
  }
  office = Office();
  std::strcpy(office.network.szEssid, "5\" #2");
  library::InRange({office.network});
  Expect(office, 10, "the supplicant would take the end of the name 5\" #2 for a comment", "5\" #2");
}

TEST_F(FormerConnection, GivesWayToANetworkWhoseTextsTheSupplicantReadsToTheirEnds) {
  WIRELESS_NETWORK_CONFIG office = Office();
  for (const char* szText : {"number #1", "a \"quoted\" #1", "#1 of \"all"}) {
    std::strcpy(office.szKey, szText);
    library::Known({library::Home(), office});
    EXPECT_EQ(Tool({"connect", "Office"}).status, 9) << szText;
  }
}

TEST_F(KnownBeforehand, IsAnAddressThatNoHostCanHave) {
  WIRELESS_NETWORK_CONFIG office = Office();
  for (const auto& [szIp, szMask] :
       {std::pair("10.0.0", "255.0.0.0"), std::pair("10.0.0.9", ""), std::pair("10.0.0.0", "255.255.255.0"),
        std::pair("10.0.0.255", "255.255.255.0")}) {
    std::strcpy(office.szIp, szIp);
    std::strcpy(office.szMask, szMask);
    Expect(office, 1, "the network was saved with an address that no host can have");
  }
  std::strcpy(office.szIp, "10.0.0.9");
  std::strcpy(office.szGateway, "10.0.1.1");
  Expect(office, 1, "the network was saved with a gateway that is not in its subnet");
  std::strcpy(office.szGateway, "10.0.0.9");
  Expect(office, 1, "the network was saved with a gateway whose address no other host can have");
}

}  // namespace
