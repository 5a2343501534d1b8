// What the program says of each failure, in whole.
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>

#include "running.h"

namespace {

using library::Network;
using testing::HasSubstr;

using Words = std::vector<std::string>;

struct Row {
  void (*world)();
  Words words;
  std::string message;
  std::string input = {};
};

void ExpectMessages(const std::vector<Row>& rows) {
  for (const Row& row : rows) {
    library::Reset();
    library::InRange({Network("Home"), Network("square", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE),
                      Network("old", WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP),
                      Network("Office", WIRELESS_AUTH_WPA2EAP)});
    row.world();
    const Ran ran = Tool(row.words, {.input = row.input});
    EXPECT_NE(ran.status, 0);
    EXPECT_THAT(ran.err, HasSubstr("merowireless: " + row.message + ": ")) << testing::PrintToString(row.words);
  }
}

void AsItIs() {}

// What the library's join reports, which fails then.
template <const char* kReport>
void JoinReports() {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    return library::Report("wireless_network_connect", kReport), -1;
  };
}

class Messages : public ToolTest {};

TEST_F(Messages, TellOfNetworksWhyTheyAreNotSaved) {
  ExpectMessages({
      {AsItIs,
       {"save", "Home", "--bssid", "00:11:22:33:44", "--security", "open"},
       "--bssid is no access point's address"},
      {AsItIs,
       {"save", "Home", "--bssid", "00:11:22:33:44:55", "--security", "wpa9"},
       "with --bssid, --security says how the network is protected"},
      {AsItIs, {"save", "", "--bssid", "00:11:22:33:44:55", "--security", "open"}, "the name cannot be this"},
      {AsItIs, {"save", "square", "--key-stdin"}, "square is open and takes no secret", "secret"},
      {AsItIs, {"save", "Home"}, "Home needs a secret, and there is no terminal to ask on"},
      {AsItIs, {"save", "Home", "--key-stdin"}, "the standard input holds more than a secret", std::string(5000, 'x')},
      {AsItIs, {"save", "Home", "--key-stdin"}, "the standard input holds several lines", "several\nlines"},
      {AsItIs, {"save", "Home", "--key-stdin"}, "this can be no passphrase", "short"},
      {AsItIs, {"save", "old", "--key-stdin"}, "a WEP key cannot have this length", "four"},
      {[] { library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG*) { return -1; }; },
       {"save", "square"},
       "the network could not be saved"},
  });
}

TEST_F(Messages, TellOfNetworksWhyTheyAreNotListed) {
  ExpectMessages({
      {[] { library::MEROWirelessConfEnum = [](WIRELESS_LIST*) { return -1; }; },
       {"known"},
       "the known networks cannot be read"},
      {[] {
         library::MEROWirelessNetworkScan = [](WIRELESS_SCAN, WIRELESS_LIST* head) {
           head->q_forw = head->q_back = head;
           return -1;
         };
       },
       {"scan"},
       "the adapter gave no scan results"},
      {[] {
         library::MEROWirelessNetworkScan = [](WIRELESS_SCAN, WIRELESS_LIST* head) {
           head->q_forw = head->q_back = head;
           return library::Report("wireless_network_scan", "Failed to activate network interface wlan0"), -1;
         };
       },
       {"scan"},
       "the adapter's interface cannot be brought up"},
      {[] {
         library::MEROWirelessCheckBlock = [] { return 0; };
         library::MEROWirelessNetworkScan = [](WIRELESS_SCAN, WIRELESS_LIST* head) {
           head->q_forw = head->q_back = head;
           return library::Report("wireless_network_scan", "Failed to activate network interface wlan0"), -1;
         };
       },
       {"scan"},
       "the radio is switched off"},
  });
}

TEST_F(Messages, TellOfAddressesWhyTheyAreNotSet) {
  ExpectMessages({
      {AsItIs, {"address", "nowhere"}, "this is no IPv4 address: nowhere"},
      {AsItIs, {"address", "10.0.0.9"}, "a static address and its netmask go together"},
      {AsItIs, {"address", "10.0.0.9", "--mask", "255.0.255.0"}, "this is no netmask: 255.0.255.0"},
      {AsItIs, {"address", "none"}, "none is no address"},
      {AsItIs, {"address", "DHCP", "--mask", "255.0.0.0"}, "a static address and its netmask go together"},
      {AsItIs, {"address", "10.0.0.0", "--mask", "255.0.0.0"}, "no host can have this address"},
      {AsItIs, {"save", "Home", "--ip", "10.255.255.255", "--mask", "255.0.0.0"}, "no host can have this address"},
      {AsItIs, {"save", "Home", "--ip", "127.0.0.1", "--mask", "255.0.0.0"}, "no host can have this address"},
      {AsItIs, {"save", "Home", "--ip", "224.0.0.1", "--mask", "255.255.255.0"}, "no host can have this address"},
      {AsItIs, {"save", "Home", "--ip", "0.0.0.1", "--mask", "255.255.255.0"}, "no host can have this address"},
      {AsItIs, {"save", "Home", "--mask", "255.0.0.0"}, "a static address and its netmask go together"},
      {AsItIs, {"save", "Home", "--gateway", "10.0.0.1"}, "only a static address has a gateway of its own"},
      {AsItIs, {"gateway", "there"}, "the gateway is no IPv4 address"},
      {[] { library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return -1; }; },
       {"address", "DHCP"},
       "the address could not be set"},
  });
}

constexpr char kAnother[] = "Another connection construction is going";
constexpr char kProtected[] = "Failed to detect authentication/encryption type";
constexpr char kNotRecorded[] = "Failed to record this connection.";

TEST_F(Messages, TellOfAConnectionWhyItIsNotMade) {
  const Words joins = {"connect", "Home", "--key-stdin"};
  ExpectMessages({
      {JoinReports<kAnother>, joins, "a network is being joined already, or an attempt was cut off", "open sesame"},
      {JoinReports<kProtected>, joins, "Home is protected in a way that cannot be joined", "open sesame"},
      {JoinReports<kNotRecorded>, joins, "the join could not be written down", "open sesame"},
      {AsItIs, {"connect", "Office", "--key-stdin"}, "this network asks who you are", "secret"},
      {AsItIs, {"connect", "Office", "--key-stdin", "--user", "a\nb"}, "the user cannot be used", "secret"},
      {[] {
         library::Known({library::Home()});
         library::InRange({Network("Home", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE)});
       },
       {"connect", "Home"},
       "Home was saved as WPA2 AES and is open now, so it may be another one of that name"},
      {[] { library::MEROWirelessCheckBlock = [] { return 0; }; }, {"connect", "Home"}, "the radio is switched off"},
      {[] { library::MEROWirelessCheckBlock = [] { return -1; }; },
       {"connect", "Home"},
       "nobody knows whether the radio may be used"},
  });
}

TEST_F(Messages, TellOfAnAdapterWhatItDoesNotDo) {
  ExpectMessages({
      {AsItIs, {"radio", "sideways"}, "the radio cannot be this"},
      {AsItIs, {"mode", "both"}, "there is no such mode"},
      {[] {
         library::PLIBCFileSetSectionValue = [](const char*, const char*, const char*, const char*, const char*) {
           return -1;
         };
       },
       {"radio", "off"},
       "the radio could not be switched"},
      {[] { library::MEROWirelessApConfigSecNameGet = [](char*, size_t) { return FALSE; }; },
       {"ap", "show"},
       "the adapter has not been announced"},
  });
}

void AnOffice() {
  library::SavedAp(library::Office());
}

// The office, but for a text that is missing.
template <auto kField>
void AnOfficeWithout() {
  MERO_AP_CONF conf = library::Office();
  *kField(conf) = '\0';
  library::SavedAp(conf);
}

char* NameOf(MERO_AP_CONF& conf) {
  return conf.hostapConf.szSSID;
}
char* BridgeOf(MERO_AP_CONF& conf) {
  return conf.hostapConf.szBridge;
}
char* GuestNameOf(MERO_AP_CONF& conf) {
  return conf.hostapConf.guestNet.szSSID;
}

TEST_F(Messages, TellOfAnAccessPointWhyItIsNotSetSo) {
  constexpr char kSecret[] = "/tmp/secret-of-messages";
  constexpr char kWeek[] = "/tmp/week-of-messages";
  WriteText(kSecret, "open sesame\n");
  WriteText(kWeek, "0101\n");
  const std::pair<Words, std::string> rows[] = {
      {{}, "there is nothing to change"},
      {{"--band", "6"}, "--band cannot be this"},
      {{"--channel", "36"}, "there is no such channel in the 2.4 GHz band"},
      {{"--band", "5", "--channel", "6"}, "there is no such channel in the 5 GHz band"},
      {{"--hw-mode", "an"}, "this is no mode of the 2.4 GHz band"},
      {{"--channel", "eleven"}, "--channel cannot be this"},
      {{"--encryption", "wpa3"}, "--encryption cannot be this"},
      {{"--encryption", "open", "--wpa-encrypt-type", "aes"}, "only WPA has a choice of ciphers"},
      {{"--encryption", "open", "--key-file", kSecret}, "an open network has no secret"},
      {{"--encryption", "wep"}, "this security needs a secret"},
      {{"--encryption", "eap", "--key-file", kSecret}, "EAP needs a RADIUS server"},
      {{"--auth-server-addr", "10.0.0.1"}, "only EAP has a RADIUS server"},
      {{"--encryption", "eap", "--auth-server-addr", "there"}, "the RADIUS server's address is none"},
      {{"--bridge", "../x"}, "this is no bridge's name"},
      {{"--bridge", "gbr"}, "this bridge is the guests'"},
      {{"--bridge", std::string(300, 'x')}, "the bridge cannot be used"},
      {{"--bridge", "lo"}, "there is an interface of this name, and it is no bridge"},
      {{"--wifi-sched", "/no/such/file"}, "the schedule cannot be read from /no/such/file"},
      {{"--wifi-sched", kWeek}, "the schedule is not 168 hours"},
      {{"--guest-net-encryption", "eap"}, "a guest network cannot have EAP"},
      {{"--guest-net-enable", "yes", "--guest-net-encryption", "wpa2"}, "the guest network's security needs a secret"},
  };
  for (const auto& [options, message] : rows) {
    Words words = {"ap", "set"};
    words.insert(words.end(), options.begin(), options.end());
    ExpectMessages({{AnOffice, words, message}});
  }
  ExpectMessages({
      {AnOfficeWithout<NameOf>, {"ap", "enable"}, "the access point has no name"},
      {AnOfficeWithout<BridgeOf>, {"ap", "enable"}, "the access point has no bridge"},
      {AnOfficeWithout<GuestNameOf>, {"ap", "set", "--guest-net-enable", "yes"}, "the guest network has no name"},
  });
}

TEST_F(Messages, TellOfAnAccessPointWhyItIsNotEnabled) {
  ExpectMessages({
      {AsItIs, {"ap", "enable"}, "no access point has been set up for this adapter"},
      {[] {
         AnOffice();
         library::MEROWirelessAPEnable = [] {
           return library::Report("wireless_ap_enable", "Another ap construction is going"), FALSE;
         };
       },
       {"ap", "enable"},
       "an access point is being set up already, or an attempt was cut off"},
      {[] {
         AnOffice();
         library::MEROWirelessAPEnable = [] {
           return library::Report("wireless_ap_enable", "Failed to restart /etc/rc.network"), FALSE;
         };
       },
       {"ap", "enable"},
       "the network start script failed, and the access point is disabled"},
  });
}

TEST_F(Messages, TellThatWhatAnInterruptedCommandUndoesWasInterruptedToo) {
  AnOffice();
  library::MEROWirelessAPEnable = [] { return library::Record("enabling"), ::pause(), TRUE; };
  library::MEROWirelessAPDisable = [] { return library::Record("disabling"), ::pause(), TRUE; };
  StartedTool tool({"ap", "enable"});
  for (const char* szDoing : {"enabling", "disabling"}) {
    ASSERT_TRUE(Soon([&] { return std::ranges::count(library::Calls(), szDoing) > 0; }));
    ::kill(tool.pid(), SIGINT);
  }
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: interrupted again, and something may be left\n"));
}

}  // namespace
