// Bridges as their network-script files describe them.
#include <cstring>
#include <filesystem>
#include <functional>
#include <random>

#include "common/text.h"
#include "tests/platform/platform_test.h"

namespace {

constexpr char kScripts[] = "/etc/sysconfig/network-scripts";
constexpr char kScript[] = "/etc/sysconfig/network-scripts/ifcfg-lbr0";

struct Bridge {
  NETINFO netInfo;
  BRIDGE_INFO bridgeInfo;
};

Bridge NatBridge() {
  Bridge bridge{};
  bridge.netInfo = {TRUE, TRUE, "lbr0", {2, 0, 0, 0xAB, 0xCD, 0xEF}, "10.1.14.1", "255.255.255.0"};
  bridge.bridgeInfo.type = TYPE_NAT_MASTER;
  CopyText(bridge.bridgeInfo.szIfName, "lbr0");
  CopyText(bridge.bridgeInfo.info.szPrimary, "wlan0");
  return bridge;
}

Bridge PlainBridge() {
  Bridge bridge{};
  bridge.netInfo.blActive = TRUE;
  CopyText(bridge.netInfo.szInterface, "br0");
  bridge.bridgeInfo.type = TYPE_BR_MASTER;
  CopyText(bridge.bridgeInfo.szIfName, "br0");
  CopyText(bridge.bridgeInfo.info.szPrimary, "eth0");
  return bridge;
}

int Set(const Bridge& bridge) {
  return MERONetSetBridgeConfig(&bridge.netInfo, &bridge.bridgeInfo);
}

// The bridge of that name, which must be configured.
Bridge Get(const char* szName) {
  Bridge bridge;
  std::memset(&bridge, 0x55, sizeof bridge);
  EXPECT_EQ(MERONetGetBridgeConfig(szName, &bridge.netInfo, &bridge.bridgeInfo), 0) << szName;
  return bridge;
}

void ExpectSame(const Bridge& is, const Bridge& want) {
  EXPECT_EQ(is.netInfo.blManual, want.netInfo.blManual);
  EXPECT_EQ(is.netInfo.blActive, want.netInfo.blActive);
  EXPECT_STREQ(is.netInfo.szInterface, want.netInfo.szInterface);
  EXPECT_EQ(std::memcmp(is.netInfo.rgbMac, want.netInfo.rgbMac, sizeof is.netInfo.rgbMac), 0);
  EXPECT_STREQ(is.netInfo.szIp, want.netInfo.szIp);
  EXPECT_STREQ(is.netInfo.szMask, want.netInfo.szMask);
  EXPECT_EQ(is.bridgeInfo.type, want.bridgeInfo.type);
  EXPECT_STREQ(is.bridgeInfo.szIfName, want.bridgeInfo.szIfName);
  EXPECT_STREQ(is.bridgeInfo.info.szPrimary, want.bridgeInfo.info.szPrimary);
}

class BridgeConfiguration : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    std::filesystem::remove_all("/etc/sysconfig");
  }

  // Nothing is configured under the name, and the records stay as they were.
  static void ExpectNone(const char* szName) {
    const Bridge before = NatBridge();
    Bridge bridge = before;
    EXPECT_EQ(MERONetGetBridgeConfig(szName, &bridge.netInfo, &bridge.bridgeInfo), -1) << szName;
    ExpectNothingFound(ERR_NO_DEVICE);
    EXPECT_EQ(std::memcmp(&bridge, &before, sizeof bridge), 0) << szName;
  }

  static void ExpectRefused(const Bridge& bridge, const std::string& report) {
    EXPECT_EQ(Set(bridge), -1) << report;
    ExpectFailure(ERR_BAD_PARAMETERS, report);
  }

  static void WriteScript(std::string_view content) {
    std::filesystem::create_directories(kScripts);
    WriteText(kScript, content);
  }
};

TEST_F(BridgeConfiguration, OfANatBridgeIsWrittenAsTheStartScriptReadsIt) {
  EXPECT_EQ(Set(NatBridge()), 0);
  EXPECT_EQ(ReadText(kScript),
            "DEVICE=lbr0\nNAT=yes\nPRIMARY=wlan0\nBOOTPROTO=static\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\n"
            "ONBOOT=yes\nHWADDR=02:00:00:AB:CD:EF\nTYPE=Bridge\n");
  EXPECT_EQ(ModeOf(kScript), 0644u);
  ExpectSame(Get("lbr0"), NatBridge());
}

TEST_F(BridgeConfiguration, OfAPlainBridgeLeavesOutWhatIsEmpty) {
  EXPECT_EQ(Set(PlainBridge()), 0);
  EXPECT_EQ(ReadText("/etc/sysconfig/network-scripts/ifcfg-br0"),
            "DEVICE=br0\nNAT=no\nPRIMARY=eth0\nBOOTPROTO=dhcp\nONBOOT=yes\nTYPE=Bridge\n");
  ExpectSame(Get("br0"), PlainBridge());
}

TEST_F(BridgeConfiguration, ReadsBackTheSameFieldByField) {
  const std::function<void(Bridge&)> changes[] = {
      [](Bridge&) {},
      [](Bridge& b) { b.netInfo.blManual = FALSE; },
      [](Bridge& b) { b.netInfo.blActive = FALSE; },
      [](Bridge& b) { std::memset(b.netInfo.rgbMac, 0, sizeof b.netInfo.rgbMac); },
      [](Bridge& b) { std::memset(b.netInfo.rgbMac, 0xFF, sizeof b.netInfo.rgbMac); },
      [](Bridge& b) { b.netInfo.szIp[0] = '\0'; },
      [](Bridge& b) { b.netInfo.szMask[0] = '\0'; },
      [](Bridge& b) { CopyText(b.netInfo.szIp, "nineteen-characters"); },
      [](Bridge& b) { CopyText(b.netInfo.szMask, "255.255.255.255"); },
      [](Bridge& b) { b.bridgeInfo.type = TYPE_BR_MASTER; },
      [](Bridge& b) { b.bridgeInfo.info.szPrimary[0] = '\0'; },
      [](Bridge& b) { CopyText(b.bridgeInfo.info.szPrimary, "fifteen-letters"); },
  };
  for (const auto& change : changes) {
    Bridge bridge = NatBridge();
    change(bridge);
    EXPECT_EQ(Set(bridge), 0);  // each over the one before, so that what it left behind would show
    ExpectSame(Get("lbr0"), bridge);
  }
}

TEST_F(BridgeConfiguration, ReadsBackTheSameWhateverItHolds) {
  std::mt19937 random(20);
  const auto below = [&](size_t count) { return random() % count; };
  constexpr std::string_view kCharacters = "0123456789abcxyzABCXYZ.-_:+=,@%^\xC3\xA9\xFF";
  const auto word = [&](size_t longest) {
    std::string text;
    for (size_t size = below(longest + 1); text.size() < size;) text += kCharacters[below(kCharacters.size())];
    return text;
  };
  const auto name = [&] {
    std::string text = word(14);
    std::erase(text, ':');
    return "n" + text;
  };
  for (int i = 0; i < 300; ++i) {
    Bridge bridge{};
    bridge.netInfo.blManual = below(2) != 0 ? TRUE : FALSE;
    bridge.netInfo.blActive = below(2) != 0 ? TRUE : FALSE;
    for (unsigned char& octet : bridge.netInfo.rgbMac) octet = static_cast<unsigned char>(below(256) * below(2));
    CopyText(bridge.netInfo.szIp, word(19));
    CopyText(bridge.netInfo.szMask, word(19));
    bridge.bridgeInfo.type = below(2) != 0 ? TYPE_BR_MASTER : TYPE_NAT_MASTER;
    CopyText(bridge.netInfo.szInterface, name());
    CopyText(bridge.bridgeInfo.szIfName, bridge.netInfo.szInterface);
    if (below(3) != 0) CopyText(bridge.bridgeInfo.info.szPrimary, "p" + name().substr(1));
    ASSERT_EQ(Set(bridge), 0) << i;
    ExpectSame(Get(bridge.netInfo.szInterface), bridge);
    ASSERT_FALSE(HasFailure()) << i;
  }
}

TEST_F(BridgeConfiguration, KeepsWhatOthersHaveWritten) {
  WriteScript("# the lower bridge\nDEVICE=old\nMTU=1400\nHWADDR=02:00:00:00:00:01\n\nTYPE=\"Bridge\"\nSTP=on");
  Bridge bridge = NatBridge();
  std::memset(bridge.netInfo.rgbMac, 0, sizeof bridge.netInfo.rgbMac);
  EXPECT_EQ(Set(bridge), 0);
  EXPECT_EQ(ReadText(kScript),
            "# the lower bridge\nDEVICE=lbr0\nMTU=1400\n\nTYPE=Bridge\nSTP=on\nNAT=yes\nPRIMARY=wlan0\n"
            "BOOTPROTO=static\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\nONBOOT=yes\n");
  EXPECT_EQ(ModeOf(kScript), 0600u);
}

TEST_F(BridgeConfiguration, IsReadAsAShellWouldReadIt) {
  for (const char* szContent :
       {"TYPE=Bridge\nNAT=yes\nBOOTPROTO=static\nONBOOT=yes\nPRIMARY=wlan0\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\n"
        "HWADDR=02:00:00:ab:cd:ef\n",
        "TYPE=\"BRIDGE\"\r\nNAT=\"yes\"\r\nBOOTPROTO='static'\r\nONBOOT=\"yes\"\r\nPRIMARY=\"wlan0\"\r\n"
        "IPADDR=\"10.1.14.1\"\r\nNETMASK=\"255.255.255.0\"\r\nHWADDR=\"2:0:0:AB:CD:EF\"\r\n",
        " TYPE = bridge \nTYPE=Bridge\nDEVICE=other\n# NAT=no\nNAT=yes\nBOOTPROTO=dhcp\nBOOTPROTO=static\nONBOOT=no\n"
        "ONBOOT=yes\nPRIMARY=wlan0\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\nHWADDR=02:00:00:AB:CD:EF"}) {
    WriteScript(szContent);
    ExpectSame(Get("lbr0"), NatBridge());
  }
}

TEST_F(BridgeConfiguration, LeavesFieldsEmptyForWhatItDoesNotSay) {
  Bridge bridge{};
  CopyText(bridge.netInfo.szInterface, "lbr0");
  CopyText(bridge.bridgeInfo.szIfName, "lbr0");
  bridge.bridgeInfo.type = TYPE_BR_MASTER;
  for (const char* szContent : {"TYPE=Bridge\n", "TYPE=Bridge\nNAT=\nBOOTPROTO=\nONBOOT=\nHWADDR=\nPRIMARY=\n",
                                "TYPE=Bridge\nNAT=maybe\nBOOTPROTO=bootp\nONBOOT=1\nHWADDR=02:00:00:AB:CD\n"}) {
    WriteScript(szContent);
    ExpectSame(Get("lbr0"), bridge);
  }
}

TEST_F(BridgeConfiguration, IsOnlyThereWhenTheFileSaysSo) {
  ExpectNone("lbr0");
  for (const char* szContent :
       {"", "DEVICE=lbr0\nONBOOT=yes\n", "TYPE=\n", "TYPE=Ethernet\n", "TYPE=Bridges\n", "TYPE=Bridg\n",
        "#TYPE=Bridge\n", "TYPE=Bridge\nTYPE=Ethernet\n", "type=Bridge\n", "TYPE=Bridge-but-much-longer-than-that\n"}) {
    WriteScript(szContent);
    ExpectNone("lbr0");
  }
}

TEST_F(BridgeConfiguration, IsNoneOfANameThatLeadsElsewhere) {
  WriteScript("TYPE=Bridge\n");
  WriteText("/etc/sysconfig/lbr0", "TYPE=Bridge\n");
  std::filesystem::create_directories(std::string(kScripts) + "/ifcfg-x");
  for (const char* szName : {"", ".", "..", "x/../../lbr0", "x/../ifcfg-lbr0", "lbr0/", "lbr0 ", "l br0", "lbr0\n",
                             "lbr0:1", "a-name-of-sixteen"}) {
    ExpectNone(szName);
  }
}

TEST_F(BridgeConfiguration, TakesTheNameFromEitherRecord) {
  for (const bool first : {true, false}) {
    Bridge bridge = NatBridge();
    (first ? bridge.netInfo.szInterface : bridge.bridgeInfo.szIfName)[0] = '\0';
    EXPECT_EQ(Set(bridge), 0);
    ExpectSame(Get("lbr0"), NatBridge());
  }
}

TEST_F(BridgeConfiguration, IsRefusedWithoutOneGoodName) {
  const struct {
    const char* szInterface;
    const char* szIfName;
  } rows[] = {{"", ""},           {"lbr0", "lbr1"}, {"..", ".."},       {"a/b", "a/b"}, {"a b", "a b"},
              {"a\nb", "a\nb"},   {"a:1", "a:1"},   {"\"a\"", "\"a\""}, {"$(a)", ""},   {"", "a;b"},
              {"lbr0", "lbr0\n"}, {"a\tb", "a\tb"}, {"\x7f", "\x7f"},   {"`a`", "`a`"}, {"a'b", "a'b"}};
  for (const auto& row : rows) {
    Bridge bridge = NatBridge();
    CopyText(bridge.netInfo.szInterface, row.szInterface);
    CopyText(bridge.bridgeInfo.szIfName, row.szIfName);
    ExpectRefused(bridge, "'" + std::string(row.szInterface) + "' and '" + row.szIfName + "' do not name a bridge");
  }
  EXPECT_FALSE(std::filesystem::exists("/etc/sysconfig"));
}

TEST_F(BridgeConfiguration, IsRefusedWhenItIsNoBridges) {
  for (const int type : {0, 1, 4, 5, -1}) {
    Bridge bridge = NatBridge();
    bridge.bridgeInfo.type = static_cast<BR_TYPE>(type);
    ExpectRefused(bridge, "lbr0 is of type " + std::to_string(type) + ", which is no bridge's");
  }
  EXPECT_FALSE(std::filesystem::exists("/etc/sysconfig"));
}

TEST_F(BridgeConfiguration, IsRefusedWhenTheFirstMemberCannotBeOne) {
  for (const char* szPrimary : {"lbr0", "..", "a/b", "a b", "a\nTYPE=x", "\"wlan0\"", "$(id)", "a:1"}) {
    Bridge bridge = NatBridge();
    CopyText(bridge.bridgeInfo.info.szPrimary, szPrimary);
    ExpectRefused(bridge, "'" + std::string(szPrimary) + "' is no first member for lbr0");
  }
  EXPECT_FALSE(std::filesystem::exists("/etc/sysconfig"));
}

// A file that was written half would leave a bridge that nobody asked for.
TEST_F(BridgeConfiguration, StaysWholeWhenAnAddressIsRefused) {
  EXPECT_EQ(Set(NatBridge()), 0);
  const std::string before = ReadText(kScript);
  for (const char* szJunk :
       {"10.1.14.1\nNAT=no", " 10.1.14.1", "10.1.14.1 ", "\"10.1.14.1\"", "'", "$(reboot)", "a;b", "#", "\x01", "\\"}) {
    Bridge bridge = PlainBridge();
    CopyText(bridge.netInfo.szInterface, "lbr0");
    CopyText(bridge.bridgeInfo.szIfName, "lbr0");
    CopyText(bridge.netInfo.szIp, szJunk);
    ExpectRefused(bridge, "'" + std::string(szJunk) + "' and '' are no address and mask for lbr0");
    bridge.netInfo.szIp[0] = '\0';
    CopyText(bridge.netInfo.szMask, szJunk);
    ExpectRefused(bridge, "'' and '" + std::string(szJunk) + "' are no address and mask for lbr0");
  }
  EXPECT_EQ(ReadText(kScript), before);
}

TEST_F(BridgeConfiguration, IsRefusedWhenATextDoesNotEnd) {
  const auto refuse = [](auto field, const std::string& report) {
    Bridge bridge = NatBridge();
    auto& text = field(bridge);
    std::memset(text, 'x', sizeof text);
    ExpectRefused(bridge, report);
  };
  const std::string longName(16, 'x');
  const std::string longAddress(20, 'x');
  refuse([](Bridge& b) -> auto& { return b.netInfo.szInterface; },
         "'" + longName + "' and 'lbr0' do not name a bridge");
  refuse([](Bridge& b) -> auto& { return b.bridgeInfo.szIfName; },
         "'lbr0' and '" + longName + "' do not name a bridge");
  refuse([](Bridge& b) -> auto& { return b.bridgeInfo.info.szPrimary; },
         "'" + longName + "' is no first member for lbr0");
  refuse([](Bridge& b) -> auto& { return b.netInfo.szIp; },
         "'" + longAddress + "' and '255.255.255.0' are no address and mask for lbr0");
  refuse([](Bridge& b) -> auto& { return b.netInfo.szMask; },
         "'10.1.14.1' and '" + longAddress + "' are no address and mask for lbr0");
}

TEST_F(BridgeConfiguration, IsNotWrittenWhereThereIsNoRoomForFiles) {
  WriteText("/etc/sysconfig", "");
  EXPECT_EQ(Set(NatBridge()), -1);
  ExpectFailure(ERR_FILE_NOT_FOUND, "Failed to make /etc/sysconfig/network-scripts: Not a directory");
  std::filesystem::remove("/etc/sysconfig");
}

TEST_F(BridgeConfiguration, WithoutARecordIsRefused) {
  Bridge bridge = NatBridge();
  EXPECT_EQ(MERONetSetBridgeConfig(nullptr, &bridge.bridgeInfo), -1);
  ExpectNullRefused();
  EXPECT_EQ(MERONetSetBridgeConfig(&bridge.netInfo, nullptr), -1);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetBridgeConfig(nullptr, &bridge.netInfo, &bridge.bridgeInfo), -1);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetBridgeConfig("lbr0", nullptr, &bridge.bridgeInfo), -1);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetBridgeConfig("lbr0", &bridge.netInfo, nullptr), -1);
  ExpectNullRefused();
}

}  // namespace
