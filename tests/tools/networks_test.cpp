// scan, known, save and forget.
#include <algorithm>
#include <cstring>

#include "common/text.h"
#include "running.h"
#include "tests/support/ring.h"

using library::Network;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::StartsWith;

namespace {

constexpr char kSecretPath[] = "/tmp/secret";

WIRELESS_NETWORK_CONFIG Home() {
  WIRELESS_NETWORK_CONFIG config = library::Home();
  config.atime = 1795174528;
  return config;
}

// Records each save by the network that it was given.
void RecordSaves() {
  library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" + config->szIp + "|" +
                    config->szMask + "|" + config->szGateway + "|" + std::to_string(config->network.auth) + "|" +
                    std::to_string(config->network.opmode));
    return 0;
  };
}

class Networks : public ToolTest {
 protected:
  Networks() {
    library::InRange({Network("Home")});
    RecordSaves();
    WriteText(kSecretPath, "open sesame\n");
  }
};

// Records how each scan is to be made.
void RecordScans() {
  library::MEROWirelessNetworkScan = [](WIRELESS_SCAN scan, WIRELESS_LIST* head) {
    FillRing<WIRELESS_NETWORK>(head, {});
    return library::Record(scan == WIRELESS_SCAN_RENEW ? "renewed" : "read"), 0;
  };
}

// How a scan is made when this has been heard.
std::string WayOfScan(const std::vector<kernel::Result>& heard, std::vector<std::string> options = {}) {
  kernel::Heard(heard);
  options.insert(options.begin(), "scan");
  const Ran ran = Tool(options);
  return ran.status == 0 ? library::Calls().back() : ran.err;
}

constexpr Address kCafe = {2, 0, 0, 0, 1, 0};

// The first scan read the results of none, and said that nothing was in range.
TEST_F(Networks, AreScannedForWhenTheLastResultsAreOldOrNone) {
  RecordScans();
  EXPECT_EQ(WayOfScan({}), "renewed");
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 30'000}}), "read");
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 30'001}}), "renewed");
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 40'000}, {.address = kernel::kHome, .msAgo = 1'000}}), "read");
}

TEST_F(Networks, AreScannedForThoughTheOneThatIsJoinedIsHeardAllTheTime) {
  RecordScans();
  const kernel::Result joined{.address = kernel::kHome, .msAgo = 50, .isJoined = true};
  EXPECT_EQ(WayOfScan({joined}), "renewed");
  EXPECT_EQ(WayOfScan({joined, {.address = kCafe, .msAgo = 40'000}}), "renewed");
  EXPECT_EQ(WayOfScan({joined, {.address = kCafe, .msAgo = 9'000}}), "read");
}

TEST_F(Networks, AreScannedForOrNotAsIsAskedFor) {
  RecordScans();
  EXPECT_EQ(WayOfScan({}, {"--cached"}), "read");
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 10}}, {"--renew"}), "renewed");
  EXPECT_EQ(Tool({"scan", "--cached"}).out,
            "no network is in range without a country; `merowireless country CC` sets it\n");
  CopyText(kernel::RulesNow().szKernel, "DE");
  EXPECT_THAT(Tool({"scan", "--cached"}).out, testing::StartsWith("no network is in range in DE"));
  EXPECT_EQ(Tool({"scan", "--renew", "--json"}).out, "{\"result\":\"ok\",\"networks\":[]}\n");
  EXPECT_EQ(Tool({"scan", "--renew", "--cached"}).status, 2);
}

// A scan takes the adapter off the channel on which others rely on it.
TEST_F(Networks, AreNotScannedForWhileTheAdapterIsAnAccessPoint) {
  RecordScans();
  kernel::BecomeAccessPoint("Office");
  constexpr char kRefusal[] =
      "merowireless: the adapter is an access point's, and a scan would disturb it: `merowireless ap disable` takes it "
      "down; `merowireless scan --cached` shows what was heard last\n";
  EXPECT_EQ(WayOfScan({}), kRefusal);
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 10}}, {"--renew"}), kRefusal);
  EXPECT_EQ(Tool({"save", "Elsewhere"}).err, kRefusal);
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_EQ(WayOfScan({}, {"--cached"}), "read");
  EXPECT_EQ(WayOfScan({{.address = kCafe, .msAgo = 10}}), "read");
}

TEST_F(Networks, AreListedByTheirStrengthWhateverTheListingToolDoes) {
  WIRELESS_NETWORK weak = Network("weak"), strong = Network("strong"), fair = Network("fair");
  weak.signal = -80;
  strong.signal = -40;
  fair.signal = -60;
  library::InRange({weak, strong, fair});
  WriteText("/tmp/list", Tool({"scan", "--porcelain"}).out);
  EXPECT_EQ(Shell("cut -f 1 /tmp/list"), "strong\nfair\nweak\n");
}

TEST_F(Networks, AreMarkedThatAreJoinedOrKnown) {
  WIRELESS_NETWORK other = Network("Home");
  other.bssid[5] = 0x0B;
  other.signal = 50;
  WIRELESS_NETWORK strange = Network("Strange");
  strange.bssid[5] = 0x0C;
  strange.signal = 20;
  library::InRange({Network("Home"), other, strange});
  library::Known({Home()});
  kernel::Heard({{.address = kernel::kHome, .isJoined = true}});
  EXPECT_EQ(Tool({"scan"}).out,
            "NAME       SIGNAL  CH  SECURITY  STANDARD  ACCESS POINT       KNOWN\n"
            "Home     ▂▄▆▁  74   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0A  joined\n"
            "Home     ▂▄▁▁  50   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0B  yes\n"
            "Strange  ▂▁▁▁  20   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0C  -\n");
  WriteText("/tmp/list", Tool({"scan", "--porcelain"}).out);
  EXPECT_EQ(Shell("cut -f 1,9,10 /tmp/list"), "Home\tyes\tyes\nHome\tno\tyes\nStrange\tno\tno\n");
  EXPECT_THAT(Tool({"scan", "--json"}).out,
              HasSubstr(R"("joined":true,"known":true,"unsupported":null},{"name":"Home","signal":50)"));
}

// Anybody can put up an open network with a name that is known.
TEST_F(Networks, AreNotMarkedAsKnownThatOnlyBearAKnownName) {
  library::Known({Home()});
  library::InRange({Network("Home", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE)});
  EXPECT_THAT(Tool({"scan", "--porcelain"}).out, testing::EndsWith("\tno\tno\t\n"));
}

TEST_F(Networks, CannotBeScannedForWithoutAnAdapter) {
  library::MEROWirelessNetworkScan = [](WIRELESS_SCAN, WIRELESS_LIST*) { return -1; };
  EXPECT_EQ(Tool({"scan"}).status, 1);
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"scan"}).status, 3);
  EXPECT_EQ(Tool({"scan", "--cached"}).status, 3);
}

TEST_F(Networks, ThatAreKnownAreListedWithoutTheirSecrets) {
  library::Known({Home()});
  const Surroundings utc{.environment = {{"TZ", "UTC"}}};
  EXPECT_EQ(Tool({"known"}, utc).out,
            "NAME  SECURITY  ADDRESS  SAVED             ACCESS POINT       AUTO\n"
            "Home  WPA2 AES  DHCP     2026-11-20 11:35  0A:0A:0A:0A:0A:0A  yes\n");
  EXPECT_EQ(Tool({"known", "--json"}).out,
            R"({"result":"ok","networks":[{"name":"Home","auth":"WPA2PSK","encryption":"AES","mode":"MANAGED",)"
            R"("ip":"DHCP","mask":null,"gateway":null,"saved":"2026-11-20T11:35:28Z","address":"0A:0A:0A:0A:0A:0A",)"
            R"("name_hex":null,"has_secret":true,"addresses":"0A:0A:0A:0A:0A:0A",)"
            R"("name_servers":null,"priority":0,"autojoin":true}]})"
            "\n");
  EXPECT_EQ(Tool({"known", "--porcelain"}).out,
            "Home\tWPA2PSK\tAES\tMANAGED\tDHCP\t\t\t2026-11-20T11:35:28Z\t0A:0A:0A:0A:0A:0A\t\tyes\t0A:0A:0A:0A:0A:"
            "0A\t\t0\tyes\n");
}

TEST_F(Networks, ShowTheirSecretsOnRequest) {
  library::Known({Home()});
  for (const char* form : {"--json", "--porcelain", "-v"}) {
    EXPECT_THAT(Tool({"known", form, "--show-secrets"}).out, HasSubstr("open sesame")) << form;
    EXPECT_THAT(Tool({"known", form}).out, Not(HasSubstr("open sesame"))) << form;
  }
}

TEST_F(Networks, AreListedInTheOrderAskedFor) {
  WIRELESS_NETWORK_CONFIG later = Home();
  later.atime += 1;
  std::strcpy(later.network.szEssid, "Later");
  library::Known({Home(), later});
  EXPECT_THAT(Tool({"known", "--porcelain"}).out, StartsWith("Home"));
  EXPECT_THAT(Tool({"known", "--porcelain", "--by-time"}).out, StartsWith("Later"));
}

TEST_F(Networks, AreForgottenByNameWithAllTheirAccessPoints) {
  WIRELESS_NETWORK_CONFIG other = Home();
  other.network.bssid[5] = 0x0b;
  WIRELESS_NETWORK_CONFIG cafe = Home();
  cafe.network = Network("Cafe");
  library::Known({Home(), cafe, other});
  library::PLIBCFileRemoveSection = [](const char* szPath, const char* szSection) {
    library::Record(std::string(szPath) + " " + szSection);
    return 1;
  };
  EXPECT_EQ(Tool({"forget", "Home"}).out, "forgot Home\n");
  EXPECT_THAT(library::Calls(), ElementsAre("PLIBCFileRemoveSection", "/usr/mero/etc/wireless.conf 0A:0A:0A:0A:0A:0A",
                                            "PLIBCFileRemoveSection", "/usr/mero/etc/wireless.conf 0A:0A:0A:0A:0A:0B"));
}

TEST_F(Networks, AreForgottenByAddressAndToldToMachines) {
  library::Known({Home()});
  EXPECT_EQ(Tool({"forget", "0a:0a:0a:0a:0a:0a", "--porcelain"}).out,
            "Home\tWPA2PSK\tAES\tMANAGED\tDHCP\t\t\t2026-11-20T11:35:28Z\t0A:0A:0A:0A:0A:0A\t\tyes\t0A:0A:0A:0A:0A:"
            "0A\t\t0\tyes\n");
  EXPECT_THAT(Tool({"forget", "Home", "--json"}).out, StartsWith(R"({"result":"ok","networks":[{"name":"Home")"));
}

TEST_F(Networks, ThatAreNotKnownOrCannotBeForgottenAreAFailure) {
  library::Known({Home()});
  Ran ran = Tool({"forget", "Elsewhere"});
  EXPECT_EQ(ran.status, 4);
  EXPECT_EQ(ran.err, "merowireless: no network named Elsewhere is known: `merowireless known` lists those that are\n");
  for (int answer : {-1, 0}) {
    library::PLIBCFileRemoveSection = [answer](const char*, const char*) { return answer; };
    ran = Tool({"forget", "Home"});
    EXPECT_EQ(ran.status, 1);
    EXPECT_EQ(ran.err, "merowireless: Home could not be forgotten: its section is in /usr/mero/etc/wireless.conf\n");
  }
}

TEST_F(Networks, AreSavedAsTheScanDescribesThem) {
  const Ran ran = Tool({"save", "Home", "--key-file", kSecretPath});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "saved Home (0A:0A:0A:0A:0A:0A)\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessConfSet", "Home|open sesame|DHCP|||5|2"));
}

TEST_F(Networks, ThatHaveJustBeenSavedAreToldToMachines) {
  EXPECT_EQ(Tool({"save", "Home", "--key-file", kSecretPath, "--porcelain"}).out,
            "Home\tWPA2PSK\tAES\tMANAGED\tDHCP\t\t\t\t0A:0A:0A:0A:0A:0A\t\tyes\t0A:0A:0A:0A:0A:0A\t\t0\tyes\n");
}

TEST_F(Networks, AreSavedByTheAddressOfTheirAccessPoint) {
  EXPECT_EQ(Tool({"save", "0a:0a:0a:0a:0a:0a", "--key-stdin"}, {.input = "open sesame"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessConfSet", "Home|open sesame|DHCP|||5|2"));
}

TEST_F(Networks, AreSavedWithAStaticAddress) {
  EXPECT_EQ(Tool({"save", "Home", "--key-file", kSecretPath, "--ip", "10.0.0.9", "--mask", "255.255.255.0", "--gateway",
                  "10.0.0.1"})
                .status,
            0);
  EXPECT_THAT(library::Calls().back(), "Home|open sesame|10.0.0.9|255.255.255.0|10.0.0.1|5|2");
}

TEST_F(Networks, ThatHideAreSavedAsDescribed) {
  library::InRange({});
  EXPECT_EQ(Tool({"save", "Hidden", "--bssid", "00:11:22:33:44:55", "--security", "open"}).status, 0);
  EXPECT_EQ(library::Calls().back(), "Hidden||DHCP|||1|2");
}

TEST_F(Networks, AreNotDescribedInPart) {
  EXPECT_EQ(Tool({"save", "Home", "--security", "open"}).status, 2);
  EXPECT_EQ(Tool({"save", "Home", "--bssid", "00:11:22:33:44:55"}).status, 2);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Networks, ThatAreOutOfRangeAreNotSaved) {
  const Ran ran = Tool({"save", "Elsewhere"});
  EXPECT_EQ(ran.status, 4);
  EXPECT_EQ(ran.err,
            "merowireless: no network named Elsewhere is in range: `merowireless scan --renew` shows those that are\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkScan"));
}

TEST_F(Networks, ThatAppearedSinceTheLastScanAreFound) {
  library::MEROWirelessNetworkScan = [](WIRELESS_SCAN scan, WIRELESS_LIST* head) {
    if (scan == WIRELESS_SCAN_RENEW) return FillRing<WIRELESS_NETWORK>(head, {Network("Newcomer")}), 0;
    return FillRing<WIRELESS_NETWORK>(head, {}), 0;
  };
  const Ran ran = Tool({"save", "Newcomer", "--key-file", kSecretPath});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(library::Calls().back(), "Newcomer|open sesame|DHCP|||5|2");
}

TEST_F(Networks, ThatCannotBeScannedForAreNotSaidToBeOutOfRange) {
  library::MEROWirelessNetworkScan = [](WIRELESS_SCAN, WIRELESS_LIST*) { return -1; };
  EXPECT_EQ(Tool({"save", "Elsewhere"}).status, 1);
}

TEST_F(Networks, AreNotSavedWithWhatCannotBeTheirSecret) {
  for (const std::string secret : {"", "short", "twenty-one\nlines", "non\xC3\xA9scii", "x\ty-z-1-2-3"}) {
    const Ran ran = Tool({"save", "Home", "--key-stdin"}, {.input = secret});
    EXPECT_EQ(ran.status, 5) << secret;
    if (secret.empty()) continue;
    EXPECT_THAT(ran.out + ran.err, Not(HasSubstr(secret)));
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Networks, AreNotSavedWithWhatCannotBeTheirAddress) {
  const std::vector<std::vector<std::string>> wrong = {
      {"--ip", "dhcpd"},
      {"--ip", "10.0.0.256", "--mask", "255.0.0.0"},
      {"--ip", "10.0.0.1"},
      {"--ip", "10.0.0.1", "--mask", "255.0.255.0"},
      {"--ip", "10.0.0.1", "--mask", "255.0.0.0", "--gateway", "there"},
      {"--gateway", "10.0.0.1"},
      {"--mask", "255.0.0.0"},
      {"--ip", "none", "--mask", "255.0.0.0"},
  };
  for (const auto& options : wrong) {
    std::vector<std::string> arguments{"save", "Home", "--key-file", kSecretPath};
    arguments.insert(arguments.end(), options.begin(), options.end());
    EXPECT_EQ(Tool(arguments).status, 2) << testing::PrintToString(options);
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Networks, AreNotSavedAsDescribedWhenTheyCannotBe) {
  const std::vector<std::vector<std::string>> wrong = {
      {"", "--bssid", "00:11:22:33:44:55"},
      {std::string(33, 'x'), "--bssid", "00:11:22:33:44:55"},
      {"Hidden", "--bssid", "00:00:00:00:00:00"},
      {"Hidden", "--bssid", "FF:FF:FF:FF:FF:FF"},
      {"Hidden", "--bssid", "01:11:22:33:44:55"},
      {"Hidden", "--bssid", "00:11:22:33:44"},
      {"Hidden", "--bssid", "00:11:22:33:44:55", "--key-file", kSecretPath},  // an open one has no secret
  };
  for (std::vector<std::string> arguments : wrong) {
    arguments.insert(arguments.begin(), "save");
    arguments.insert(arguments.end(), {"--security", "open"});
    EXPECT_EQ(Tool(arguments).status, 2) << testing::PrintToString(arguments);
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Networks, ThatCannotBeSavedAreAFailure) {
  library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"save", "Home", "--key-file", kSecretPath});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("is there room on the disk?"));
  library::g_user = 1000;
  EXPECT_THAT(Tool({"save", "Home", "--key-file", kSecretPath}).err, HasSubstr("run it as root"));
}

TEST_F(Networks, ThatWereSavedAtNoKnownTimeSaySo) {
  WIRELESS_NETWORK_CONFIG home = Home();
  home.atime = 0;
  library::Known({home});
  EXPECT_THAT(Tool({"known"}).out, HasSubstr("\nHome  WPA2 AES  DHCP     -      0A:"));
}

}  // namespace
