// The kit reads the same settings as the libraries: the tests of both walk the same tables.
#include <cstring>
#include <filesystem>
#include <map>
#include <string>

#include "platform.h"
#include "readings.h"
#include "settings.h"
#include "wireless.h"

namespace {

using namespace std::string_literals;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

// ---- Key/value files ---------------------------------------------------------------------------------------------

TEST_F(Settings, ValuesAreReadByTheKitAsByTheLibrary) {
  for (const Reading& row : ValueReadings()) {
    WriteText(kFile, row.text);
    EXPECT_EQ(Tells("value_of KEY /tmp/file"), row.value.value_or("")) << Shortened(row.text);
    const Ran ran = RunReader("file /tmp/file KEY");
    EXPECT_EQ(ran.status, row.value ? 0 : 1) << Shortened(row.text);
    EXPECT_EQ(ran.out, row.value.value_or("") + "\n") << Shortened(row.text);
  }
  EXPECT_EQ(Tells("value_of KEY /tmp/missing"), "");
  EXPECT_FALSE(fs::exists("/tmp/run"));
}

TEST_F(Settings, SwitchesAreReadByTheKitAsByTheLibrary) {
  for (const Reading& row : SwitchReadings()) {
    const bool enabled = row.value == "yes";
    WriteText("/etc/hostapd/hostapd-wlan0.info", row.text);
    WriteText("/etc/hostapd/hostapd-wlan0-guest.info", row.text);
    WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "");
    EXPECT_EQ(RunInParts("access_point_is wlan0 yes").status, enabled ? 0 : 1) << row.text;
    EXPECT_EQ(RunInParts("guest_is_on wlan0").status, enabled ? 0 : 1) << row.text;
    EXPECT_EQ(RunReader("check /etc/hostapd/hostapd-wlan0.info enable yes").out, *row.value + "\n") << row.text;
  }
  EXPECT_EQ(RunInParts("is_enabled /tmp/missing").status, 1);
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=no\n");
  EXPECT_EQ(RunInParts("access_point_is wlan0 no").status, 0);
}

// ---- The access point --------------------------------------------------------------------------------------------

using Record = MERO_AP_CONF;

// What the record has for a key.
std::string ValueIn(const Record& conf, const std::string& key) {
  const auto text_of = [](bool on) { return on ? "yes" : "no"; };
  const std::map<std::string, std::string> values = {
      {"enable", text_of(conf.blEnable != FALSE)},
      {"unblock", text_of(conf.blWifiUnblock != FALSE)},
      {"txpower", std::to_string(conf.txpower)},
      {"ssid", conf.hostapConf.szSSID},
      {"wifi_sched", conf.wifiSchedConf.szWifiSched},
      {"guest_net_ssid", conf.hostapConf.guestNet.szSSID},
      {"guest_net_sched", conf.guestNetSchedConf.szWifiSched},
      {"guest_net_sched_enable", std::to_string(conf.guestNetSchedConf.wifiSchedEnabled)},
      {"guest_net_access_ds", std::to_string(conf.guestNetAccessRule.blAccessDS)},
      {"guest_net_lan_block", std::to_string(conf.guestNetAccessRule.blLanBlock)},
  };
  return values.at(key);
}

TEST_F(Settings, OfTheAccessPointAreReadByTheLibrary) {
  for (const Readings* readings : {&SectionReadings(), &AccessPointReadings()}) {
    for (const Reading& row : *readings) {
      WriteText(kApSettings, row.text);
      char szSection[1024];
      Record conf;
      ASSERT_EQ(MEROWirelessApConfigSecNameGet(szSection, sizeof szSection), TRUE);
      ASSERT_EQ(MEROWirelessGetAPConfig(szSection, &conf), 1) << Shortened(row.text);
      EXPECT_EQ(ValueIn(conf, row.key), row.value.value_or("")) << row.key << " in " << Shortened(row.text);
    }
  }
}

TEST_F(Settings, OfTheAccessPointAreReadByTheKitAsByTheLibrary) {
  for (const Reading& row : SectionReadings()) {
    WriteText(kApSettings, row.text);
    EXPECT_EQ(Tells("read_setting " + row.key + "; printf '%s' \"$answer\""), row.value.value_or(""))
        << Shortened(row.text);
  }
  for (const Reading& row : AccessPointReadings()) {
    WriteText(kApSettings, row.text);
    EXPECT_EQ(Tells("read_setting " + row.key + "; printf '%s' \"$answer\""), row.value)
        << row.key << " in " << Shortened(row.text);
    const bool number = !row.value->empty() && row.value->find_first_not_of("-0123456789") == std::string::npos;
    const int status = number && row.value != "0" ? 0 : 1;
    EXPECT_EQ(RunInParts("is_on " + row.key).status, status) << row.key << " in " << Shortened(row.text);
  }
}

// Without a section the record's defaults have no block for guests.
TEST_F(Settings, KeepGuestsOutOfTheLanWhereTheAdapterHasNone) {
  const struct {
    const char* szAdapter;
    const char* szText;
  } rows[] = {
      {"PRODUCT=\"other\"\n", "[RT [5370]\n\tguest_net_lan_block=0\n\tguest_net_access_ds=1\n"},
      {"PRODUCT=\"other\"\n", ""},
      {"PRODUCT=\"other\"\n", nullptr},
      {"INTERFACE=\"wlan0\"\n", "[]\n\tguest_net_lan_block=0\n\tguest_net_access_ds=1\n"},
      {nullptr, "[]\n\tguest_net_lan_block=0\n\tguest_net_access_ds=1\n"},
  };
  for (const auto& row : rows) {
    fs::remove("/tmp/wireless.info");
    fs::remove(kApSettings);
    if (row.szAdapter != nullptr) WriteText("/tmp/wireless.info", row.szAdapter);
    if (row.szText != nullptr) WriteText(kApSettings, row.szText);
    const Ran ran = RunReader(
        "access-point guest_net_lan_block guest_net_access_ds guest_net_internet_block guest_net_allow_http "
        "guest_net_sched_enable ap_isolate enable unblock bridge guest_net_ssid guest_net_sched");
    EXPECT_EQ(ran.status, 0);
    EXPECT_EQ(ran.out, "1\n0\n0\n1\n0\n1\nno\nyes\n\nHarborstoreGuest\n" + std::string(168, '1') + "\n");
    EXPECT_THAT(Tells("guest_rules"), AllOf(HasSubstr("ip daddr @local-networks reject\n\t\t\taccept\n"),
                                            Not(HasSubstr("meta nfproto ipv4 accept"))));
  }
}

// A carriage return behind the 0 had the appliance open to guests.
TEST_F(Settings, KeepGuestsOutWhereverTheLibraryReadsANull) {
  for (const char* szNull : {"0\r\n", "0\r", "no\n", "00\n", "0x0\n", " 0 \n", "\n", "off\n", "\"1\"\n"}) {
    WriteText(kApSettings, kSection + "\tguest_net_access_ds=" + szNull);
    EXPECT_THAT(Tells("guest_rules"), Not(HasSubstr("meta nfproto ipv4 accept"))) << szNull;
    WriteText(kApSettings, kSection + "\tguest_net_allow_http=" + szNull);
    EXPECT_THAT(Tells("guest_rules"), Not(HasSubstr("dport { 80, 443 }"))) << szNull;
  }
  for (const char* szOther : {"1\r\n", "01\n", " 7x\n", "-1\n"}) {
    WriteText(kApSettings, kSection + "\tguest_net_lan_block=" + szOther);
    EXPECT_THAT(Tells("guest_rules"), HasSubstr("ip daddr @local-networks reject\n")) << szOther;
  }
}

TEST_F(Settings, ThatAreSecretsAreNotTold) {
  WriteText(kApSettings, kSection +
                             "\tencryption=2\n\twpa_passphrase=hushhush\n\tguest_net_encryption=1\n"
                             "\tguest_net_wep_key0=hushhush\n\tauth_server_shared_secret=hushhush\n\tbssid=hushhush\n");
  for (const char* szKey : {"wpa_passphrase", "guest_net_wep_key0", "wep_key0", "auth_server_shared_secret",
                            "guest_net_wpa_passphrase", "bssid", "", "no_key"}) {
    const Ran ran = RunReader("access-point enable '"s + szKey + "'");
    EXPECT_EQ(ran.status, 2) << szKey;
    EXPECT_THAT(ran.out, StartsWith("mero-settings: there is no setting '"s + szKey + "' to be told\nusage: "));
    EXPECT_THAT(ran.out, Not(HasSubstr("hushhush")));
  }
}

// ---- Bridges -----------------------------------------------------------------------------------------------------

std::string AddressIn(const NETINFO& netInfo) {
  constexpr unsigned char kNone[6] = {};
  char szAddress[18] = "";
  if (std::memcmp(netInfo.rgbMac, kNone, sizeof kNone) == 0) return "";
  return MEROWirelessBssidStringGet(netInfo.rgbMac, szAddress, sizeof szAddress);
}

// What the records have for the name of a value.
std::string ValueIn(const NETINFO& netInfo, const BRIDGE_INFO& bridgeInfo, const std::string& name) {
  const auto text_of = [](bool on) { return on ? "yes" : "no"; };
  const std::map<std::string, std::string> values = {
      {"nat", text_of(bridgeInfo.type == TYPE_NAT_MASTER)},
      {"at-boot", text_of(netInfo.blActive != FALSE)},
      {"static", text_of(netInfo.blManual != FALSE)},
      {"address", netInfo.szIp},
      {"mask", netInfo.szMask},
      {"member", bridgeInfo.info.szPrimary},
      {"hardware-address", AddressIn(netInfo)},
  };
  return values.at(name);
}

TEST_F(Settings, OfBridgesAreReadByTheLibrary) {
  for (const Reading& row : BridgeReadings()) {
    WriteText(kBridgeScript, "TYPE=Bridge\n" + row.text);
    NETINFO netInfo;
    BRIDGE_INFO bridgeInfo;
    ASSERT_EQ(MERONetGetBridgeConfig("br0", &netInfo, &bridgeInfo), 0);
    EXPECT_EQ(ValueIn(netInfo, bridgeInfo, row.key), row.value) << row.text;
  }
}

TEST_F(Settings, OfBridgesAreReadByTheKitAsByTheLibrary) {
  const std::map<std::string, std::string> questions = {{"nat", "is_nat br0"}, {"at-boot", "comes_up_at_boot br0"}};
  for (const Reading& row : BridgeReadings()) {
    WriteText(kBridgeScript, "TYPE=Bridge\n" + row.text);
    EXPECT_EQ(Tells("ask bridge br0 " + row.key + "; printf '%s' \"$answer\""), row.value) << row.text;
    EXPECT_EQ(RunInParts("is_bridge br0").status, 0) << row.text;
    if (const auto question = questions.find(row.key); question != questions.end()) {
      EXPECT_EQ(RunInParts(question->second).status, row.value == "yes" ? 0 : 1) << row.text;
    }
  }
}

TEST_F(Settings, MakeABridgeOnlyForTheTypeOfOne) {
  const struct {
    std::string text;
    bool bridge;
  } rows[] = {
      {"TYPE=Bridge", true},         {"TYPE=BRIDGE\r\n", true}, {"TYPE='bridge'\n", true}, {"TYPE=Ethernet", false},
      {"TYPE=\"Bridge \"\n", false}, {"type=Bridge\n", false},  {"TYPE=Bridges", false},   {"", false},
  };
  for (const auto& row : rows) {
    WriteText(kBridgeScript, row.text + "\nNAT=yes\nONBOOT=yes\n");
    NETINFO netInfo;
    BRIDGE_INFO bridgeInfo;
    EXPECT_EQ(MERONetGetBridgeConfig("br0", &netInfo, &bridgeInfo), row.bridge ? 0 : -1) << row.text;
    const int status = row.bridge ? 0 : 1;
    for (const char* szQuestion : {"is_bridge br0", "is_nat br0", "comes_up_at_boot br0"}) {
      EXPECT_EQ(RunInParts(szQuestion).status, status) << szQuestion << "\n" << row.text;
    }
  }
  EXPECT_EQ(RunInParts("is_bridge br1").status, 1);
  EXPECT_EQ(RunReader("bridge br1 nat address").out, "\n\n");
}

// Capitals and carriage returns kept a bridge that the library knows from being made.
TEST_F(Settings, HaveABridgeMadeAsTheLibraryReadsThem) {
  WriteText(
      kBridgeScript,
      "TYPE=BRIDGE\r\nNAT=YES\r\nBOOTPROTO=STATIC\r\nIPADDR=192.0.2.1\r\nNETMASK=255.255.255.0\r\nONBOOT=Yes\r\n");
  const Ran ran = RunInShell("/etc/rc.network boot");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out, "");
  EXPECT_EQ(RunInShell("ip -brief -4 address show br0 | awk '{ print $1, $3 }'").out, "br0 192.0.2.1/24\n");
  EXPECT_THAT(Tells("rules br0"), HasSubstr("ip saddr 192.0.2.0/24 oifname != \"br0\" masquerade"));
}

// ---- The program -------------------------------------------------------------------------------------------------

TEST_F(Settings, AreToldManyAtOnce) {
  WriteText(kApSettings, kSection + "\tguest_net_access_ds=1\n\tssid=a b\n");
  WriteText(kBridgeScript, "TYPE=Bridge\nNAT=YES\nIPADDR=192.0.2.1\n");
  WriteText(kFile, "KEY='a b'\nOTHER=\n");
  const Ran all = RunReader(
      "access-point ssid guest_net_access_ds txpower -- bridge br0 address nat mask -- file /tmp/file OTHER KEY -- "
      "check /tmp/file KEY 'a b'");
  EXPECT_EQ(all.status, 0);
  EXPECT_EQ(all.out, "a b\n1\n10\n192.0.2.1\nyes\n\n\na b\nyes\n");

  const Ran some = RunReader("file /tmp/file MISSING KEY -- bridge br1 nat -- check /tmp/file KEY b");
  EXPECT_EQ(some.status, 1);
  EXPECT_EQ(some.out, "\na b\n\nno\n");

  const Ran failed = RunReader("file /tmp/file KEY -- file /tmp KEY");
  EXPECT_EQ(failed.status, 2);
  EXPECT_EQ(failed.out, "mero-settings: cannot read /tmp; the system log has the reason\n");
}

TEST_F(Settings, AreNotToldForWrongWords) {
  const struct {
    const char* szWords;
    const char* szMessage;
  } rows[] = {
      {"", "a request is missing"},
      {"what", "there is no request 'what'"},
      {"access-point", "access-point needs a KEY"},
      {"bridge br0", "bridge needs a BRIDGE and a VALUE"},
      {"bridge br0 colour", "a bridge has no 'colour'"},
      {"file /tmp/file", "file needs a FILE and a KEY"},
      {"check /tmp/file KEY", "check needs a FILE, a KEY and a VALUE"},
      {"check /tmp/file KEY yes no", "check needs a FILE, a KEY and a VALUE"},
      {"section-name x", "section-name takes no more words"},
      {"--", "a request is missing"},
      {"file /tmp/file KEY --", "a request is missing"},
      {"-- file /tmp/file KEY", "a request is missing"},
      {"--helpx", "there is no request '--helpx'"},
      {"help file", "there is no request 'help'"},
  };
  for (const auto& row : rows) {
    const Ran ran = RunReader(row.szWords);
    EXPECT_EQ(ran.status, 2) << row.szWords;
    EXPECT_THAT(ran.out, StartsWith("mero-settings: "s + row.szMessage + "\nusage: mero-settings "));
  }
  for (const char* szWord : {"help", "-h", "--help"}) {
    const Ran ran = RunReader(szWord);
    EXPECT_EQ(ran.status, 0) << szWord;
    EXPECT_THAT(ran.out, StartsWith("usage: mero-settings ")) << szWord;
  }
}

TEST_F(Settings, ThatCannotBeToldAreAFailure) {
  WriteText(kFile, "KEY=value\n");
  for (const char* szWords : {"file /tmp/file KEY", "help"}) {
    EXPECT_EQ(RunReader(szWords + " >/dev/full"s).status, 2) << szWords;
  }
  EXPECT_EQ(RunReader("file /tmp/file KEY >/dev/full").out, "mero-settings: cannot write: No space left on device\n");
  EXPECT_EQ(RunReader("section-name </tmp").out, "mero-settings: cannot read the adapter's name\n");
}

}  // namespace
