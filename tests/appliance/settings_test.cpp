// What the kit reads of settings is what the libraries read: both walk the same tables.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <optional>
#include <string>
#include <vector>

#include "common/text.h"
#include "kit.h"
#include "platform.h"
#include "wireless.h"

namespace {

using namespace std::string_literals;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

constexpr char kFile[] = "/tmp/file";
constexpr char kApSettings[] = "/usr/mero/etc/wireless_ap.conf";
constexpr char kBridgeScript[] = "/etc/sysconfig/network-scripts/ifcfg-br0";

Ran RunReader(const std::string& words) {
  return RunInShell("/usr/mero/sbin/mero-settings " + words);
}

std::string Shortened(const std::string& text) {
  return text.size() <= 200 ? text : text.substr(0, 100) + "..." + text.substr(text.size() - 100);
}

class Settings : public Kit {};

// ---- Key/value files ---------------------------------------------------------------------------------------------

struct Value {
  std::string text;
  std::optional<std::string> value;  // of KEY
};

const std::vector<Value>& Values() {
  static const std::string huge(100000, 'x');
  static const std::vector<Value> values = {
      {"KEY=value\n", "value"},
      {"KEY=\"value\"\n", "value"},
      {"KEY='a b'\n", "a b"},
      {"  KEY = value \n", "value"},
      {"\tKEY\t=\t\"value\"\t\n", "value"},
      {"KEY=\" value \"\n", " value "},
      {"KEY=value\r\n", "value"},
      {"KEY=\"value\"\r\n", "value"},
      {"KEY=value\r", "value"},
      {"KEY=\r\n", ""},
      {"KEY=value", "value"},
      {"KEY=first\nKEY=last\n", "last"},
      {"KEY=first\nKEY=\n", ""},
      {"KEY=a=b\n", "a=b"},
      {"KEY=\n", ""},
      {"KEY=\"\"\n", ""},
      {"KEY=\"\n", "\""},
      {"KEY=\"value'\n", "\"value'"},
      {"KEY='\"value\"'\n", "\"value\""},
      {"KEY=value # no comment\n", "value # no comment"},
      {"KEY=$(touch /tmp/run)`touch /tmp/run`\n", "$(touch /tmp/run)`touch /tmp/run`"},
      {"KEY=a\\nb%s\n", "a\\nb%s"},
      {"KEY=\xFF\xFE\x80\n", "\xFF\xFE\x80"},
      {"KEY=\xC2\xA0value\n", "\xC2\xA0value"},
      {"KEY=va\0lue\n"s, "va"},
      {"KEY=\0\n"s, ""},
      {"OTHER=" + huge + "\nKEY=value\n", "value"},
      {"KEY=" + huge + "\n", huge},
      {"OTHERKEY=x\n#KEY=x\n ;KEY=x\n", std::nullopt},
      {"key=x\nKEY\nexport KEY=x\n=x\n", std::nullopt},
      {"KEY\0=x\n"s, std::nullopt},
      {"\xEF\xBB\xBFKEY=x\n", std::nullopt},
      {"KEY+=x\n", std::nullopt},
      {"[KEY=]\n", std::nullopt},
      {"", std::nullopt},
      {"\0\n"s, std::nullopt},
  };
  return values;
}

TEST_F(Settings, ValuesAreReadByTheLibrary) {
  for (const Value& row : Values()) {
    Write(kFile, row.text);
    std::string value(256 * 1024, '\0');
    ASSERT_EQ(PLIBCFileGetKeyValue(kFile, "KEY", value.data(), value.size(), 0), row.value ? 1 : 0)
        << Shortened(row.text);
    EXPECT_EQ(value.c_str(), row.value.value_or("")) << Shortened(row.text);
  }
}

TEST_F(Settings, ValuesAreReadByTheKitAsByTheLibrary) {
  for (const Value& row : Values()) {
    Write(kFile, row.text);
    EXPECT_EQ(Tells("value_of KEY /tmp/file"), row.value.value_or("")) << Shortened(row.text);
    const Ran ran = RunReader("file /tmp/file KEY");
    EXPECT_EQ(ran.status, row.value ? 0 : 1) << Shortened(row.text);
    EXPECT_EQ(ran.output, row.value.value_or("") + "\n") << Shortened(row.text);
  }
  EXPECT_EQ(Tells("value_of KEY /tmp/missing"), "");
  EXPECT_FALSE(fs::exists("/tmp/run"));
}

const struct {
  std::string text;
  bool enabled;
} kSwitches[] = {
    {"enable=yes\n", true},          {"enable=\"yes\"\n", true},
    {"enable='yes'\r\n", true},      {" enable = yes ", true},
    {"enable=no\nenable=yes", true}, {"enable=yes\nenable=no", false},
    {"enable=Yes\n", false},         {"enable=YES\n", false},
    {"enable=1\n", false},           {"enable=\" yes\"\n", false},
    {"enable=yes;\n", false},        {"enable=yes\0no\n"s, false},
    {"Enable=yes\n", false},         {"enable\n", false},
    {"#enable=yes\n", false},        {"", false},
};

TEST_F(Settings, SwitchesAreReadByTheLibrary) {
  for (const auto& row : kSwitches) {
    Write(kFile, row.text);
    EXPECT_EQ(PLIBCFileCheckKeyValue(kFile, "enable", "yes", 0), row.enabled ? 1 : 0) << row.text;
  }
}

TEST_F(Settings, SwitchesAreReadByTheKitAsByTheLibrary) {
  for (const auto& row : kSwitches) {
    Write("/etc/hostapd/hostapd-wlan0.info", row.text);
    Write("/etc/hostapd/hostapd-wlan0-guest.info", row.text);
    Write("/etc/hostapd/hostapd-wlan0-guest.conf", "");
    EXPECT_EQ(RunInParts("access_point_is wlan0 yes").status, row.enabled ? 0 : 1) << row.text;
    EXPECT_EQ(RunInParts("guest_is_on wlan0").status, row.enabled ? 0 : 1) << row.text;
    EXPECT_EQ(RunReader("check /etc/hostapd/hostapd-wlan0.info enable yes").output, row.enabled ? "yes\n" : "no\n")
        << row.text;
  }
  EXPECT_EQ(RunInParts("is_enabled /tmp/missing").status, 1);
  Write("/etc/hostapd/hostapd-wlan0.info", "enable=no\n");
  EXPECT_EQ(RunInParts("access_point_is wlan0 no").status, 0);
}

// ---- The access point --------------------------------------------------------------------------------------------

using Record = MERO_AP_CONF;

struct ApSetting {
  std::string text;
  const char* szKey;
  std::string value;
  std::string (*in)(const Record&);  // what the record has for the key
};

const std::string kSection = "[RT [5370]\n";

std::string AccessDs(const Record& conf) {
  return std::to_string(conf.guestNetAccessRule.blAccessDS);
}
std::string LanBlock(const Record& conf) {
  return std::to_string(conf.guestNetAccessRule.blLanBlock);
}
std::string Ssid(const Record& conf) {
  return conf.hostapConf.szSSID;
}
std::string GuestSsid(const Record& conf) {
  return conf.hostapConf.guestNet.szSSID;
}
std::string Power(const Record& conf) {
  return std::to_string(conf.txpower);
}
std::string Hours(const Record& conf) {
  return conf.wifiSchedConf.szWifiSched;
}
std::string GuestHours(const Record& conf) {
  return conf.guestNetSchedConf.szWifiSched;
}
std::string GuestFollows(const Record& conf) {
  return std::to_string(conf.guestNetSchedConf.wifiSchedEnabled);
}
std::string Enable(const Record& conf) {
  return conf.blEnable != FALSE ? "yes" : "no";
}
std::string Unblock(const Record& conf) {
  return conf.blWifiUnblock != FALSE ? "yes" : "no";
}

const std::vector<ApSetting>& ApSettings() {
  static const std::string huge(100000, 'x');
  static const std::vector<ApSetting> settings = {
      {kSection + "\tguest_net_access_ds=1\n", "guest_net_access_ds", "1", AccessDs},
      {kSection + "\tguest_net_access_ds=1", "guest_net_access_ds", "1", AccessDs},
      {kSection + "\tguest_net_access_ds=0\r\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=0\r", "guest_net_access_ds", "0", AccessDs},
      {"[RT [5370]\r\n\tguest_net_access_ds=0\r\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=\r\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=00\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=0x0\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=0x1\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=no\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=yes\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=\"1\"\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds= 7x\n", "guest_net_access_ds", "7", AccessDs},
      {kSection + "\tguest_net_access_ds=\t-1 \n", "guest_net_access_ds", "-1", AccessDs},
      {kSection + "\tguest_net_access_ds=+1\n", "guest_net_access_ds", "1", AccessDs},
      {kSection + "\tguest_net_access_ds=1\0002\n"s, "guest_net_access_ds", "1", AccessDs},
      {kSection + " \tguest_net_access_ds \t= 1\n", "guest_net_access_ds", "1", AccessDs},
      {kSection + "#guest_net_access_ds=1\n;guest_net_access_ds=1\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tGuest_Net_Access_DS=1\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_access_ds=1\n\tguest_net_access_ds=0\n", "guest_net_access_ds", "0", AccessDs},
      {kSection + "\tguest_net_lan_block=0\n[rt [5370]\n\tguest_net_lan_block=1\n", "guest_net_lan_block", "0",
       LanBlock},
      {"[rt [5370]\n\tguest_net_lan_block=0\n" + kSection, "guest_net_lan_block", "0", LanBlock},
      {" [ rT [5370\t] \n\tguest_net_lan_block=0\n", "guest_net_lan_block", "0", LanBlock},
      {"guest_net_lan_block=0\n[other]\nguest_net_lan_block=0\n" + kSection, "guest_net_lan_block", "1", LanBlock},
      {kSection + "[other]\nguest_net_lan_block=0\n", "guest_net_lan_block", "1", LanBlock},
      {"[" + huge + "]\n\tguest_net_lan_block=0\n" + kSection, "guest_net_lan_block", "1", LanBlock},
      {kSection, "guest_net_sched_enable", "0", GuestFollows},
      {kSection, "txpower", "10", Power},
      {kSection + "\ttxpower=\n", "txpower", "0", Power},
      {kSection + "\tssid= \"a = b\" \n", "ssid", " \"a = b\" ", Ssid},
      {kSection + "\tssid='a\\nb%s\n", "ssid", "'a\\nb%s", Ssid},
      {kSection + "\tssid=\xFF\xFE\x80\n", "ssid", "\xFF\xFE\x80", Ssid},
      {kSection + "\tssid=a\0b\n"s, "ssid", "a", Ssid},
      {kSection + "\tssid=" + huge + "\n", "ssid", std::string(127, 'x'), Ssid},
      {kSection + "\tother=" + huge + "\n\tssid=a\n", "ssid", "a", Ssid},
      {kSection, "ssid", "", Ssid},
      {kSection, "guest_net_ssid", "HarborstoreGuest", GuestSsid},
      {kSection, "wifi_sched", std::string(168, '1'), Hours},
      {kSection + "\twifi_sched=\n", "wifi_sched", "", Hours},
      {kSection + "\tguest_net_sched=" + std::string(200, '0'), "guest_net_sched", std::string(168, '0'), GuestHours},
      {kSection + "\tenable=yes\n", "enable", "yes", Enable},
      {kSection + "\tenable=Yes\n", "enable", "no", Enable},
      {kSection + "\tenable= yes\n", "enable", "no", Enable},
      {kSection + "\tenable=1\n", "enable", "no", Enable},
      {kSection, "enable", "no", Enable},
      {kSection, "unblock", "yes", Unblock},
      {kSection + "\tunblock=\n", "unblock", "no", Unblock},
  };
  return settings;
}

TEST_F(Settings, OfTheAccessPointAreReadByTheLibrary) {
  for (const ApSetting& row : ApSettings()) {
    Write(kApSettings, row.text);
    char szSection[1024];
    Record conf;
    ASSERT_EQ(MEROWirelessApConfigSecNameGet(szSection, sizeof szSection), TRUE);
    ASSERT_EQ(MEROWirelessGetAPConfig(szSection, &conf), 1) << Shortened(row.text);
    EXPECT_EQ(row.in(conf), row.value) << row.szKey << " in " << Shortened(row.text);
  }
}

TEST_F(Settings, OfTheAccessPointAreReadByTheKitAsByTheLibrary) {
  for (const ApSetting& row : ApSettings()) {
    Write(kApSettings, row.text);
    const std::string key = row.szKey;
    EXPECT_EQ(Tells("setting " + key), row.value) << key << " in " << Shortened(row.text);
    const bool number = !row.value.empty() && row.value.find_first_not_of("-0123456789") == std::string::npos;
    const int status = !number ? 1 : row.value == "0" ? 1 : 0;
    EXPECT_EQ(RunInParts("is_on " + key).status, status) << key << " in " << Shortened(row.text);
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
    if (row.szAdapter != nullptr) Write("/tmp/wireless.info", row.szAdapter);
    if (row.szText != nullptr) Write(kApSettings, row.szText);
    const Ran ran = RunReader(
        "access-point guest_net_lan_block guest_net_access_ds guest_net_internet_block guest_net_allow_http "
        "guest_net_sched_enable ap_isolate enable unblock bridge guest_net_ssid guest_net_sched");
    EXPECT_EQ(ran.status, 0);
    EXPECT_EQ(ran.output, "1\n0\n0\n1\n0\n1\nno\nyes\n\nHarborstoreGuest\n" + std::string(168, '1') + "\n");
    EXPECT_THAT(Tells("guest_rules"), AllOf(HasSubstr("ip daddr @local-networks reject\n\t\t\taccept\n"),
                                            Not(HasSubstr("meta nfproto ipv4 accept"))));
  }
}

// A carriage return behind the 0 had the appliance open to guests.
TEST_F(Settings, KeepGuestsOutWhereverTheLibraryReadsANull) {
  for (const char* szNull : {"0\r\n", "0\r", "no\n", "00\n", "0x0\n", " 0 \n", "\n", "off\n", "\"1\"\n"}) {
    Write(kApSettings, kSection + "\tguest_net_access_ds=" + szNull);
    EXPECT_THAT(Tells("guest_rules"), Not(HasSubstr("meta nfproto ipv4 accept"))) << szNull;
    Write(kApSettings, kSection + "\tguest_net_allow_http=" + szNull);
    EXPECT_THAT(Tells("guest_rules"), Not(HasSubstr("dport { 80, 443 }"))) << szNull;
  }
  for (const char* szOther : {"1\r\n", "01\n", " 7x\n", "-1\n"}) {
    Write(kApSettings, kSection + "\tguest_net_lan_block=" + szOther);
    EXPECT_THAT(Tells("guest_rules"), HasSubstr("ip daddr @local-networks reject\n")) << szOther;
  }
}

TEST_F(Settings, ThatAreSecretsAreNotTold) {
  Write(kApSettings, kSection +
                         "\tencryption=2\n\twpa_passphrase=hushhush\n\tguest_net_encryption=1\n"
                         "\tguest_net_wep_key0=hushhush\n\tauth_server_shared_secret=hushhush\n\tbssid=hushhush\n");
  for (const char* szKey : {"wpa_passphrase", "guest_net_wep_key0", "wep_key0", "auth_server_shared_secret",
                            "guest_net_wpa_passphrase", "bssid", "", "no_key"}) {
    const Ran ran = RunReader("access-point enable '"s + szKey + "'");
    EXPECT_EQ(ran.status, 2) << szKey;
    EXPECT_THAT(ran.output, StartsWith("mero-settings: there is no setting '"s + szKey + "' to be told\nusage: "));
    EXPECT_THAT(ran.output, Not(HasSubstr("hushhush")));
  }
}

// ---- Bridges -----------------------------------------------------------------------------------------------------

std::string YesNo(bool yes) {
  return yes ? "yes" : "no";
}
std::string Nat(const NETINFO&, const BRIDGE_INFO& bridgeInfo) {
  return YesNo(bridgeInfo.type == TYPE_NAT_MASTER);
}
std::string AtBoot(const NETINFO& netInfo, const BRIDGE_INFO&) {
  return YesNo(netInfo.blActive != FALSE);
}
std::string Static(const NETINFO& netInfo, const BRIDGE_INFO&) {
  return YesNo(netInfo.blManual != FALSE);
}
std::string Address(const NETINFO& netInfo, const BRIDGE_INFO&) {
  return netInfo.szIp;
}
std::string Mask(const NETINFO& netInfo, const BRIDGE_INFO&) {
  return netInfo.szMask;
}
std::string Member(const NETINFO&, const BRIDGE_INFO& bridgeInfo) {
  return bridgeInfo.info.szPrimary;
}
std::string Hardware(const NETINFO& netInfo, const BRIDGE_INFO&) {
  constexpr unsigned char kNone[6] = {};
  char szAddress[18] = "";
  if (std::memcmp(netInfo.rgbMac, kNone, sizeof kNone) == 0) return "";
  return MEROWirelessBssidStringGet(netInfo.rgbMac, szAddress, sizeof szAddress);
}

const struct {
  std::string text;  // behind TYPE=Bridge
  const char* szName;
  std::string value;
  std::string (*in)(const NETINFO&, const BRIDGE_INFO&);
} kBridges[] = {
    {"NAT=yes\n", "nat", "yes", Nat},
    {"NAT=YES\n", "nat", "yes", Nat},
    {"NAT=\"Yes\"\r\n", "nat", "yes", Nat},
    {"NAT = 'yes'", "nat", "yes", Nat},
    {"NAT=no\nNAT=yes\n", "nat", "yes", Nat},
    {"NAT=1\n", "nat", "no", Nat},
    {"NAT=true\n", "nat", "no", Nat},
    {"NAT=\" yes\"\n", "nat", "no", Nat},
    {"nat=yes\n", "nat", "no", Nat},
    {"NAT=\n", "nat", "no", Nat},
    {"", "nat", "no", Nat},
    {"ONBOOT=Yes\n", "at-boot", "yes", AtBoot},
    {"ONBOOT=yes\r\n", "at-boot", "yes", AtBoot},
    {"ONBOOT=on\n", "at-boot", "no", AtBoot},
    {"", "at-boot", "no", AtBoot},
    {"BOOTPROTO=STATIC\n", "static", "yes", Static},
    {"BOOTPROTO='Static'\r", "static", "yes", Static},
    {"BOOTPROTO=dhcp\n", "static", "no", Static},
    {"BOOTPROTO=none\n", "static", "no", Static},
    {"IPADDR=\"192.0.2.1\"\r\n", "address", "192.0.2.1", Address},
    {"IPADDR=192.0.2.1/24 and more\n", "address", "192.0.2.1/24 and mo", Address},
    {"IPADDR=\xFF\0\n"s, "address", "\xFF", Address},
    {"", "address", "", Address},
    {"NETMASK= 255.255.255.0 \n", "mask", "255.255.255.0", Mask},
    {"PRIMARY=eth0\n", "member", "eth0", Member},
    {"PRIMARY=eth0\nPRIMARY=\n", "member", "", Member},
    {"PRIMARY=a-name-too-long-for-it\n", "member", "a-name-too-long", Member},
    {"HWADDR=\"02:0:0:00:aB:07\"\n", "hardware-address", "02:00:00:00:AB:07", Hardware},
    {"HWADDR=nonsense\n", "hardware-address", "", Hardware},
    {"HWADDR=00:00:00:00:00:00\n", "hardware-address", "", Hardware},
    {"", "hardware-address", "", Hardware},
};

TEST_F(Settings, OfBridgesAreReadByTheLibrary) {
  for (const auto& row : kBridges) {
    Write(kBridgeScript, "TYPE=Bridge\n" + row.text);
    NETINFO netInfo;
    BRIDGE_INFO bridgeInfo;
    ASSERT_EQ(MERONetGetBridgeConfig("br0", &netInfo, &bridgeInfo), 0);
    EXPECT_EQ(row.in(netInfo, bridgeInfo), row.value) << row.text;
  }
}

TEST_F(Settings, OfBridgesAreReadByTheKitAsByTheLibrary) {
  for (const auto& row : kBridges) {
    Write(kBridgeScript, "TYPE=Bridge\n" + row.text);
    EXPECT_EQ(Tells("ask bridge br0 "s + row.szName + "; printf '%s' \"$answer\""), row.value) << row.text;
    EXPECT_EQ(RunInParts("is_bridge br0").status, 0) << row.text;
    const int status = row.value == "yes" ? 0 : 1;
    const std::string asks = row.szName == "nat"s       ? "is_nat br0"
                             : row.szName == "at-boot"s ? "comes_up_at_boot br0"
                                                        : "";
    if (!asks.empty()) {
      EXPECT_EQ(RunInParts(asks).status, status) << row.text;
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
    Write(kBridgeScript, row.text + "\nNAT=yes\nONBOOT=yes\n");
    NETINFO netInfo;
    BRIDGE_INFO bridgeInfo;
    EXPECT_EQ(MERONetGetBridgeConfig("br0", &netInfo, &bridgeInfo), row.bridge ? 0 : -1) << row.text;
    const int status = row.bridge ? 0 : 1;
    for (const char* szQuestion : {"is_bridge br0", "is_nat br0", "comes_up_at_boot br0"}) {
      EXPECT_EQ(RunInParts(szQuestion).status, status) << szQuestion << "\n" << row.text;
    }
  }
  EXPECT_EQ(RunInParts("is_bridge br1").status, 1);
  EXPECT_EQ(RunReader("bridge br1 nat address").output, "\n\n");
}

// Capitals and carriage returns kept a bridge that the library knows from being made.
TEST_F(Settings, HaveABridgeMadeAsTheLibraryReadsThem) {
  Write(kBridgeScript,
        "TYPE=BRIDGE\r\nNAT=YES\r\nBOOTPROTO=STATIC\r\nIPADDR=192.0.2.1\r\nNETMASK=255.255.255.0\r\nONBOOT=Yes\r\n");
  const Ran ran = RunInShell("/etc/rc.network boot");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.output, "");
  EXPECT_EQ(RunInShell("ip -brief -4 address show br0 | awk '{ print $1, $3 }'").output, "br0 192.0.2.1/24\n");
  EXPECT_THAT(Tells("rules br0"), HasSubstr("ip saddr 192.0.2.0/24 oifname != \"br0\" masquerade"));
}

// ---- The adapter's section ---------------------------------------------------------------------------------------

// An adapter whose name had 32 bytes, or ended in a blank, could never be an access point.
TEST_F(Settings, OfEveryAdapterAreReadAsTheyWereSaved) {
  const struct {
    std::string product;
    std::string name;
  } rows[] = {
      {"802.11 n WLAN\n", "802.11 n WLAN"},
      {"802.11 n WLAN", "802.11 n WLAN"},
      {std::string(31, 'a') + "\n", std::string(31, 'a')},
      {std::string(32, 'b') + "\n", std::string(31, 'b')},
      {std::string(4096, 'c'), std::string(31, 'c')},
      {std::string(65536, ' ') + "d", "148f:5370"},
      {std::string(30, 'e') + " fg\n", std::string(30, 'e')},
      {"WLAN adapter  \n", "WLAN adapter"},
      {" \t WLAN\tadapter\v\f\r\n", "WLANadapter"},
      {"RT [5370]\n", "RT 5370"},
      {"[]\n", "148f:5370"},
      {"\"USB2.0\" 'WLAN'\n", "USB2.0 'WLAN'"},
      {"'WLAN'\n", "'WLAN'"},
      {"\"\"\n", "148f:5370"},
      {"#x\n", "#x"},
      {";x\n", ";x"},
      {"=\n", "="},
      {"a=b\n", "a=b"},
      {"a.*\\[^$]b\\\n", "a.*\\^$b\\"},
      {"$(touch /tmp/run)`touch /tmp/run`\n", "$(touch /tmp/run)`touch /tmp/ru"},
      {"%s%n --\n", "%s%n --"},
      {"-e\n", "-e"},
      {"*\n", "*"},
      {"first\nsecond\n", "firstsecond"},
      {"a\0\x01\x1B\x7F"
       "b\n"s,
       "ab"},
      {"Caf\xC3\xA9\n", "Caf\xC3\xA9"},
      {std::string(30, 'h') + "\xC3\xA9\n", std::string(30, 'h')},
      {std::string(28, 'i') + "\xF0\x9F\x93\xB6\n", std::string(28, 'i')},
      {std::string(27, 'j') + "\xF0\x9F\x93\xB6\n", std::string(27, 'j') + "\xF0\x9F\x93\xB6"},
      {"k\xFF\xFE\n", "k\xFF\xFE"},
      {std::string(40, '\x80') + "\n", std::string(28, '\x80')},
      {"  \t \n", "148f:5370"},
      {"\n", "148f:5370"},
      {"", "148f:5370"},
  };
  Write("/tmp/usb/idVendor", "148f\n");
  Write("/tmp/usb/idProduct", "5370\n");
  Install("readlink", "[ \"$2\" = /sys/class/net/wlan7/device ] && echo /tmp/usb/device\n");
  fs::create_directories("/tmp/usb/device");
  int power = 0;
  for (const auto& row : rows) {
    Write("/tmp/usb/product", row.product);
    ASSERT_EQ(Tells("note_adapter wlan7"), "") << Shortened(row.product);

    char szName[1024];
    ASSERT_EQ(MEROWirelessApConfigSecNameGet(szName, sizeof szName), TRUE) << Shortened(row.product);
    EXPECT_EQ(szName, row.name) << Shortened(row.product);
    Record conf{}, read{};
    CopyText(conf.szSecName, szName);
    conf.blEnable = TRUE;
    conf.txpower = ++power;
    ASSERT_EQ(MEROWirelessSetAPConfig(&conf), TRUE) << row.name;
    ASSERT_EQ(MEROWirelessGetAPConfig(szName, &read), 1) << row.name;
    EXPECT_STREQ(read.szSecName, szName);
    EXPECT_EQ(read.txpower, power) << row.name;
    EXPECT_EQ(Tells("setting txpower"), std::to_string(power)) << row.name;

    Write(kFile, row.name);
    EXPECT_EQ(RunReader("section-name </tmp/file").output, row.name + "\n") << "it has one name only";
  }
  EXPECT_FALSE(fs::exists("/tmp/run"));
}

TEST_F(Settings, OfAnAdapterWithoutANameAndNumbersAreNotMadeUp) {
  Install("readlink", "echo /tmp/none/device\n");
  const Ran ran = RunInParts("note_adapter wlan7");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.output, HasSubstr("the adapter wlan7 has neither a name nor numbers"));
  EXPECT_THAT(RunInShell("cat /tmp/wireless.info").output, HasSubstr("RT [5370"));
}

// The adapter's section was made of what a command had not said, and guests got the rules of no settings.
TEST_F(Settings, OfAnAdapterThatCannotBeLookedAtAreNotMadeUp) {
  Install("readlink", "exit 1\n");
  const Ran ran = RunInParts("note_adapter wlan7");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.output, HasSubstr("cannot tell which adapter wlan7 is"));
  EXPECT_THAT(RunInShell("cat /tmp/wireless.info").output, HasSubstr("RT [5370"));
}

// ---- What cannot be read -----------------------------------------------------------------------------------------

// Everything that is read for something else than to be shown.
constexpr const char* kQuestions[] = {
    "setting wifi_sched",
    "is_on guest_net_lan_block",
    "! is_on guest_net_access_ds",
    "value_of BRIDGE /etc/sysconfig/network-scripts/ifcfg-wlan0",
    "bridge=$(script_value BRIDGE wlan0) || exit 1",
    "! is_enabled /etc/hostapd/hostapd-wlan0.info",
    "! access_point_is wlan0 yes",
    "! guest_is_on wlan0",
    "! is_bridge br0",
    "! is_nat br0",
    "! comes_up_at_boot br0",
    "make_bridge br0",
    "give_up_bridge br0",
    "decide_on_guests wlan0",
    "! is_off_now wifi_sched_enabled wifi_sched",
    "apply_main_schedule lo",
    "serve_addresses br0",
    "guest_rules",
    "verdict guest_net_lan_block",
    "rules br0",
    "set_firewall br0",
    "note_adapter lo",
};

void ExpectEveryQuestionToEndTheScript(const std::string& why) {
  Install("nft", "touch /tmp/rules-are-set\n");
  Install("ip", "case $* in *show*) ;; *) touch /tmp/addresses-are-set ;; esac\n");
  for (const std::string question : kQuestions) {
    const Ran ran = RunInParts(question + "\necho went on");
    EXPECT_EQ(ran.status, 1) << question << " with " << why << "\n" << ran.output;
    EXPECT_THAT(ran.output, HasSubstr("sh: cannot read settings: ")) << question << " with " << why;
    EXPECT_THAT(ran.output, Not(HasSubstr("went on"))) << question << " with " << why;
  }
  EXPECT_FALSE(fs::exists("/tmp/rules-are-set"));
  EXPECT_FALSE(fs::exists("/tmp/addresses-are-set"));
}

TEST_F(Settings, EndTheScriptWhereTheirReaderIsMissing) {
  fs::remove("/usr/mero/sbin/mero-settings");
  ExpectEveryQuestionToEndTheScript("no reader");
}

TEST_F(Settings, EndTheScriptWhereTheirReaderFails) {
  for (const char* szFailure :
       {"exit 2", "kill -s SEGV $$", "kill -s KILL $$", "echo 1; exit 3", "echo yes; exit 126"}) {
    Write("/usr/mero/sbin/mero-settings", "#!/bin/sh\n"s + szFailure + "\n");
    ExpectEveryQuestionToEndTheScript(szFailure);
  }
}

TEST_F(Settings, EndTheScriptWhereTheyAreNeitherOnNorOff) {
  for (const char* szAnswer : {"", "on", "\nyes"}) {
    Write("/usr/mero/sbin/mero-settings", "#!/bin/sh\necho '"s + szAnswer + "'\n");
    for (const std::string question : {"! is_nat br0", "! comes_up_at_boot br0", "! is_on guest_net_lan_block"}) {
      const Ran ran = RunInParts(question + "\necho went on");
      EXPECT_EQ(ran.status, 1) << question;
      EXPECT_THAT(ran.output, AllOf(HasSubstr("'"s + szAnswer + "'"), Not(HasSubstr("went on")))) << question;
    }
  }
}

TEST_F(Settings, EndTheScriptWhereTheyCannotBeRead) {
  const struct {
    const char* szPath;
    const char* szQuestion;
  } rows[] = {
      {kApSettings, "guest_rules"},
      {kApSettings, "is_on guest_net_lan_block"},
      {"/tmp/wireless.info", "guest_rules"},
      {"/tmp/wireless.info", "setting wifi_sched"},
      {kBridgeScript, "is_nat br0"},
      {kBridgeScript, "make_bridge br0"},
      {"/etc/hostapd/hostapd-wlan0.info", "access_point_is wlan0 yes"},
      {"/etc/hostapd/hostapd-wlan0-guest.info", "guest_is_on wlan0"},
      {"/etc/sysconfig/network-scripts/ifcfg-wlan0", "script_value BRIDGE wlan0"},
  };
  for (const auto& row : rows) {
    fs::remove_all(row.szPath);
    fs::create_directories(row.szPath);  // what root cannot read either
    const Ran ran = RunInParts(row.szQuestion + "\necho went on"s);
    EXPECT_EQ(ran.status, 1) << row.szQuestion;
    EXPECT_THAT(ran.output,
                AllOf(HasSubstr("mero-settings: cannot read "s + row.szPath + "; the system log has the reason\n"),
                      HasSubstr("sh: cannot read"), Not(HasSubstr("went on"))))
        << row.szQuestion;
    fs::remove_all(row.szPath);
    Write("/tmp/wireless.info", "PRODUCT=\"RT [5370\"\n");
  }
}

TEST_F(Settings, EndTheScriptsBeforeTheyActOnAnEmptyBridge) {
  const std::string script = "/etc/sysconfig/network-scripts/ifcfg-wlan0";
  fs::create_directories(script);
  Write("/etc/hostapd/hostapd-wlan0.info", "enable=yes\n");
  fs::remove("/etc/rc.network");
  Write("/etc/rc.network", "#!/bin/sh\ntouch /tmp/ran\n");
  ::chmod("/etc/rc.network", 0755);
  const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function remove");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.output, HasSubstr("cannot read settings: file " + script + " BRIDGE"));
  EXPECT_FALSE(fs::exists("/tmp/ran"));
}

// ---- The program -------------------------------------------------------------------------------------------------

TEST_F(Settings, AreToldManyAtOnce) {
  Write(kApSettings, kSection + "\tguest_net_access_ds=1\n\tssid=a b\n");
  Write(kBridgeScript, "TYPE=Bridge\nNAT=YES\nIPADDR=192.0.2.1\n");
  Write(kFile, "KEY='a b'\nOTHER=\n");
  const Ran all = RunReader(
      "access-point ssid guest_net_access_ds txpower -- bridge br0 address nat mask -- file /tmp/file OTHER KEY -- "
      "check /tmp/file KEY 'a b'");
  EXPECT_EQ(all.status, 0);
  EXPECT_EQ(all.output, "a b\n1\n10\n192.0.2.1\nyes\n\n\na b\nyes\n");

  const Ran some = RunReader("file /tmp/file MISSING KEY -- bridge br1 nat -- check /tmp/file KEY b");
  EXPECT_EQ(some.status, 1);
  EXPECT_EQ(some.output, "\na b\n\nno\n");

  const Ran failed = RunReader("file /tmp/file KEY -- file /tmp KEY");
  EXPECT_EQ(failed.status, 2);
  EXPECT_EQ(failed.output, "mero-settings: cannot read /tmp; the system log has the reason\n");
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
    EXPECT_THAT(ran.output, StartsWith("mero-settings: "s + row.szMessage + "\nusage: mero-settings "));
  }
  for (const char* szWord : {"help", "-h", "--help"}) {
    const Ran ran = RunReader(szWord);
    EXPECT_EQ(ran.status, 0) << szWord;
    EXPECT_THAT(ran.output, StartsWith("usage: mero-settings ")) << szWord;
  }
}

TEST_F(Settings, ThatCannotBeToldAreAFailure) {
  Write(kFile, "KEY=value\n");
  for (const char* szWords : {"file /tmp/file KEY", "help"}) {
    EXPECT_EQ(RunReader(szWords + " >/dev/full"s).status, 2) << szWords;
  }
  EXPECT_EQ(RunReader("file /tmp/file KEY >/dev/full").output,
            "mero-settings: cannot write: No space left on device\n");
  EXPECT_EQ(RunReader("section-name </tmp").output, "mero-settings: cannot read the adapter's name\n");
}

}  // namespace
