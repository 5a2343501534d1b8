// The bridge that an access point joins, and the addresses that are given out on it.
#include <climits>
#include <cstring>

#include "ap_enable.h"

namespace {

using namespace enabling;
using testing::ElementsAre;
using testing::IsEmpty;

const Effects kNoBridge = {EnableReport("Failed to set bridge[lbr0] config.")};

// Every text of the server's settings, and its numbers.
Effects FieldsOf(const MERO_DHCPD_CONF& conf) {
  return {"blEnable " + std::to_string(conf.blEnable),
          "autoTime " + std::to_string(conf.autoTime),
          "leaseTime " + std::to_string(conf.leaseTime),
          std::string("szRangeStart ") + conf.szRangeStart,
          std::string("szRangeEnd ") + conf.szRangeEnd,
          std::string("szInterface ") + conf.szInterface,
          std::string("szDomain ") + conf.szDomain,
          std::string("szDns ") + conf.szDns,
          std::string("szSDns ") + conf.szSDns,
          std::string("szSubnet ") + conf.szSubnet,
          std::string("szRouter ") + conf.szRouter,
          std::string("szLeaseFile ") + conf.szLeaseFile,
          std::string("szTag ") + conf.szTag};
}

Effects FieldsOf(const Bridge& bridge) {
  const NETINFO& net = bridge.netInfo;
  const BRIDGE_INFO& info = bridge.bridgeInfo;
  const unsigned char none[6] = {};
  return {"blManual " + std::to_string(net.blManual),
          "blActive " + std::to_string(net.blActive),
          std::string("szInterface ") + net.szInterface,
          std::string("rgbMac ") + (std::memcmp(net.rgbMac, none, sizeof none) == 0 ? "none" : "some"),
          std::string("szIp ") + net.szIp,
          std::string("szMask ") + net.szMask,
          "type " + std::to_string(info.type),
          std::string("szIfName ") + info.szIfName,
          std::string("szPrimary ") + info.info.szPrimary};
}

MERO_DHCPD_CONF Range(const char* szStart, const char* szEnd) {
  MERO_DHCPD_CONF conf{};
  std::strcpy(conf.szRangeStart, szStart);
  std::strcpy(conf.szRangeEnd, szEnd);
  return conf;
}

class BridgeOfAnAccessPoint : public EnableTest {
 protected:
  // From here on the bridge is known, and starts at boot.
  void BeginWith(const Bridge& bridge) {
    Begin();
    known_ = bridge;
    const std::string name = bridge.netInfo.szInterface;
    SettingsAre("\tenable=yes\n\tbridge=" + name + "\n");
    WriteText(BridgeScript(name), "ONBOOT=yes\n");
  }
  void BeginWith(const std::string& ip, const std::string& mask) { BeginWith(NatBridge("lbr0", ip, mask)); }
};

// ---- A bridge that is not configured ----

TEST_F(BridgeOfAnAccessPoint, IsMadeToTranslateAddressesWhenItIsTheNatBridge) {
  ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
  ASSERT_TRUE(made_.has_value());
  EXPECT_THAT(FieldsOf(*made_),
              ElementsAre("blManual 1", "blActive 1", "szInterface lbr0", "rgbMac none", "szIp 10.1.14.1",
                          "szMask 255.255.255.0", "type 3", "szIfName lbr0", "szPrimary wlan0"));
  ASSERT_TRUE(written_.has_value());
  EXPECT_THAT(FieldsOf(*written_),
              ElementsAre("blEnable 1", "autoTime 30", "leaseTime 86400", "szRangeStart 10.1.14.2",
                          "szRangeEnd 10.1.14.254", "szInterface lbr0", "szDomain ", "szDns 10.1.14.1", "szSDns ",
                          "szSubnet 255.255.255.0", "szRouter 10.1.14.1", "szLeaseFile ", "szTag lbr0"));
}

TEST_F(BridgeOfAnAccessPoint, IsMadeToPassFramesToTheWiredInterfaceUnderAnyOtherName) {
  for (const std::string& name : {std::string("br0"), std::string("lbr00"), std::string("LBR0"), std::string("lbr1"),
                                  std::string("xlbr0"), std::string("fifteen-letters")}) {
    Begin();
    SettingsAre("\tenable=yes\n\tbridge=" + name + "\n");
    ExpectEnabledBy(kPrepares + AsksForBridge(name) + kMakesBridge, name);
    ASSERT_TRUE(made_.has_value());
    EXPECT_THAT(FieldsOf(*made_), ElementsAre("blManual 0", "blActive 1", "szInterface " + name, "rgbMac none", "szIp ",
                                              "szMask ", "type 2", "szIfName " + name, "szPrimary eth0"));
  }
}

TEST_F(BridgeOfAnAccessPoint, IsTakenForNewOnAnyNegativeAnswer) {
  for (const int result : {-1, -2, INT_MIN}) {
    Begin();
    fake::MERONetGetBridgeConfig.Returns(result);
    ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
  }
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenItCannotBeMade) {
  for (const int result : {-1, INT_MIN}) {
    Begin();
    fake::MERONetSetBridgeConfig.Returns(result);
    ExpectGivenUpAfter(kPrepares + AsksForBridge("lbr0") + kMakesBridge +
                       Effects{EnableReport("Failed to set bridge config.")} + kNoBridge);
    EXPECT_FALSE(Exists(kInterfaceScript));
  }
}

TEST_F(BridgeOfAnAccessPoint, IsMadeWhenTheNetworkLibrarySaysMoreThanYes) {
  fake::MERONetSetBridgeConfig.Returns(7);
  ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
}

// ---- A bridge that is configured ----

TEST_F(BridgeOfAnAccessPoint, StaysAsItIsWhenItStartsAtBootAlready) {
  for (const char* szLine : {"ONBOOT=yes\n", "ONBOOT=\"yes\"\n", "ONBOOT=no\nONBOOT='yes'"}) {
    BeginWith(NatBridge("br0", "", ""));
    known_->bridgeInfo.type = TYPE_BR_MASTER;
    WriteText(BridgeScript("br0"), szLine);
    ExpectEnabledBy(kPrepares + AsksForBridge("br0") + AsksForStartAtBoot("br0"), "br0");
    EXPECT_EQ(ReadText(BridgeScript("br0")), szLine);
  }
}

TEST_F(BridgeOfAnAccessPoint, IsMadeToStartAtBoot) {
  const std::pair<std::string, std::string> files[] = {
      {"ONBOOT=no\n", "ONBOOT=\"yes\"\n"},
      {"ONBOOT=YES\n", "ONBOOT=\"yes\"\n"},
      {"ONBOOT=\n", "ONBOOT=\"yes\"\n"},
      {"# mine\nONBOOT=\"no\"\nMTU=1400\n", "# mine\nONBOOT=\"yes\"\nMTU=1400\n"},
      {"TYPE=Bridge\n", "TYPE=Bridge\nONBOOT=\"yes\"\n"},
  };
  for (const auto& [before, after] : files) {
    BeginWith(NatBridge("br0", "", ""));
    known_->bridgeInfo.type = TYPE_BR_MASTER;
    WriteText(BridgeScript("br0"), before);
    ExpectEnabledBy(kPrepares + AsksForBridge("br0") + AsksForStartAtBoot("br0") +
                        Effects{SetOf(BridgeScript("br0"), "ONBOOT", "yes", kQuoted)},
                    "br0");
    EXPECT_EQ(ReadText(BridgeScript("br0")), after);
  }
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenItCannotBeMadeToStartAtBoot) {
  for (const int result : {0, -1}) {
    BeginWith("10.1.14.1", "255.255.255.0");
    WriteText(BridgeScript("lbr0"), "ONBOOT=no\n");
    fake::PLIBCFileSetKeyValue.FailsAt(2, result);
    ExpectGivenUpAfter(kPrepares + AsksForBridge("lbr0") + AsksForStartAtBoot("lbr0") +
                       Effects{SetOf(BridgeScript("lbr0"), "ONBOOT", "yes", kQuoted),
                               EnableReport("Failed to set key[ONBOOT] in [" + BridgeScript("lbr0") + "].")} +
                       kNoBridge);
  }
}

TEST_F(BridgeOfAnAccessPoint, GivesOutAddressesOnlyWhenItTranslatesThem) {
  for (const int type : {0, 1, 2, 4, 5, -1}) {
    BeginWith("10.1.14.1", "255.255.255.0");
    known_->bridgeInfo.type = static_cast<BR_TYPE>(type);
    ExpectEnabledBy(kPrepares + AsksForBridge("lbr0") + AsksForStartAtBoot("lbr0"), "lbr0");
  }
  BeginWith(NatBridge("br7", "10.9.9.1", "255.255.0.0"));
  EXPECT_EQ(Enable(), TRUE);
  ASSERT_TRUE(written_.has_value());
  EXPECT_THAT(FieldsOf(*written_),
              ElementsAre("blEnable 1", "autoTime 30", "leaseTime 86400", "szRangeStart 10.9.9.2",
                          "szRangeEnd 10.9.255.254", "szInterface br7", "szDomain ", "szDns 10.9.9.1", "szSDns ",
                          "szSubnet 255.255.0.0", "szRouter 10.9.9.1", "szLeaseFile ", "szTag br7"));
  EXPECT_FALSE(made_.has_value());
}

// ---- The range of addresses ----

const Effects kChecksKnown = kPrepares + AsksForBridge("lbr0") + AsksForStartAtBoot("lbr0") + AsksForServer("lbr0");

TEST_F(BridgeOfAnAccessPoint, KeepsARangeThatLiesInItsSubnetAndOnlySwitchesTheServerOn) {
  const std::string info = "/etc/dhcpd/dhcpd-lbr0-lbr0.info";
  BeginWith("10.1.14.1", "255.255.255.0");
  stored_ = Range("10.1.14.100", "10.1.14.120");
  WriteText(info, "enable=\"no\"\nauto_time=\"30\"\n");
  ExpectEnabledBy(kChecksKnown + ChecksAddress("10.1.14.100", "10.1.14.1", "255.255.255.0") +
                      ChecksAddress("10.1.14.120", "10.1.14.1", "255.255.255.0") +
                      Effects{SetOf(info, "enable", "yes", kQuoted)},
                  "lbr0");
  EXPECT_EQ(ReadText(info), "enable=\"yes\"\nauto_time=\"30\"\n");
  EXPECT_FALSE(written_.has_value());
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenTheServerCannotBeSwitchedOn) {
  const std::string info = "/etc/dhcpd/dhcpd-lbr0-lbr0.info";
  for (const int result : {0, -1}) {
    BeginWith("10.1.14.1", "255.255.255.0");
    stored_ = Range("10.1.14.100", "10.1.14.120");
    fake::PLIBCFileSetKeyValue.FailsAt(2, result);
    ExpectGivenUpAfter(
        kChecksKnown + ChecksAddress("10.1.14.100", "10.1.14.1", "255.255.255.0") +
        ChecksAddress("10.1.14.120", "10.1.14.1", "255.255.255.0") +
        Effects{SetOf(info, "enable", "yes", kQuoted), EnableReport("Failed to set key[enable] in [" + info + "].")} +
        kNoBridge);
  }
}

TEST_F(BridgeOfAnAccessPoint, GetsANewRangeWhenAnEndOfTheOldOneLiesOutside) {
  const std::pair<const char*, const char*> ranges[] = {
      {"10.1.15.2", "10.1.14.254"},
      {"10.1.14.2", "10.1.15.254"},
      {"10.1.14.2", ""},
      {"", "10.1.14.254"},
      {"", ""},
      {"10.1.14.0", "10.1.14.254"},
      {"x", "y"},
  };
  for (const auto& [szStart, szEnd] : ranges) {
    BeginWith("10.1.14.1", "255.255.255.0");
    stored_ = Range(szStart, szEnd);
    std::strcpy(stored_->szDomain, "old");
    EXPECT_EQ(Enable(), TRUE) << szStart << " " << szEnd;
    ASSERT_TRUE(written_.has_value());
    EXPECT_STREQ(written_->szRangeStart, "10.1.14.2");
    EXPECT_STREQ(written_->szRangeEnd, "10.1.14.254");
    EXPECT_STREQ(written_->szDomain, "");
  }
}

TEST_F(BridgeOfAnAccessPoint, GivesOutTheAddressesBehindItsOwn) {
  const struct {
    const char* szIp;
    const char* szMask;
    const char* szStart;
    const char* szEnd;
  } rows[] = {
      {"10.1.14.1", "255.255.255.0", "10.1.14.2", "10.1.14.254"},
      {"192.168.5.100", "255.255.255.0", "192.168.5.101", "192.168.5.254"},
      {"192.168.5.253", "255.255.255.0", "192.168.5.254", "192.168.5.254"},
      {"10.0.0.1", "255.0.0.0", "10.0.0.2", "10.255.255.254"},
      {"172.16.1.255", "255.255.252.0", "172.16.2.0", "172.16.3.254"},
      {"192.168.5.129", "255.255.255.128", "192.168.5.130", "192.168.5.254"},
      {"192.168.5.1", "255.255.255.128", "192.168.5.2", "192.168.5.126"},
      {"192.168.5.1", "255.255.255.252", "192.168.5.2", "192.168.5.2"},
      {"192.168.5.0", "255.255.255.0", "192.168.5.1", "192.168.5.254"},
      {"200.200.200.200", "255.255.255.0", "200.200.200.201", "200.200.200.254"},
      {"192.168.5.4", "255.255.255.254", "192.168.5.5", "192.168.5.4"},  // a subnet of two has no room for a server
      {"10.1.14.1", "0.0.0.0", "10.1.14.2", "255.255.255.254"},
  };
  for (const auto& row : rows) {
    BeginWith(row.szIp, row.szMask);
    ExpectEnabledBy(kChecksKnown + MakesEnd(row.szStart, row.szIp, row.szMask) +
                        MakesEnd(row.szEnd, row.szIp, row.szMask) + kWritesServer,
                    "lbr0");
    ASSERT_TRUE(written_.has_value()) << row.szIp << " " << row.szMask;
    EXPECT_STREQ(written_->szRangeStart, row.szStart);
    EXPECT_STREQ(written_->szRangeEnd, row.szEnd);
    EXPECT_STREQ(written_->szSubnet, row.szMask);
    EXPECT_STREQ(written_->szRouter, row.szIp);
    EXPECT_STREQ(written_->szDns, row.szIp);
  }
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenThereIsNoAddressBehindItsOwn) {
  const struct {
    const char* szIp;
    const char* szMask;
    const char* szStart;
  } rows[] = {
      {"192.168.5.254", "255.255.255.0", "192.168.5.255"}, {"192.168.5.255", "255.255.255.0", "192.168.6.0"},
      {"192.168.5.2", "255.255.255.252", "192.168.5.3"},   {"192.168.5.5", "255.255.255.254", "192.168.5.6"},
      {"192.168.5.5", "255.255.255.255", "192.168.5.6"},   {"255.255.255.255", "255.255.255.0", "0.0.0.0"},
      {"192.168.5.1", "255.0.255.0", "192.168.5.2"},  // a mask with a hole has no subnet
      {"10.1.14", "255.255.255.0", "10.1.0.15"},      // an address that is short for another
      {"10.1.14.1 x", "255.255.255.0", "10.1.14.2"},
  };
  for (const auto& row : rows) {
    BeginWith(row.szIp, row.szMask);
    ExpectGivenUpAfter(kChecksKnown + MakesEnd(row.szStart, row.szIp, row.szMask) +
                       Effects{EnableReport("Failed to get the valid range of dhcp server[lbr0].")} + kNoBridge);
    EXPECT_FALSE(written_.has_value()) << row.szIp;
  }
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenTheLastAddressIsNone) {
  BeginWith("10.1.14.1", "255.255.255.0");
  fake::MERONetIsSameSubnet.Returns(1, 0);
  ExpectGivenUpAfter(kChecksKnown + MakesEnd("10.1.14.2", "10.1.14.1", "255.255.255.0") +
                     MakesEnd("10.1.14.254", "10.1.14.1", "255.255.255.0") +
                     Effects{EnableReport("Failed to get the valid range of dhcp server[lbr0].")} + kNoBridge);
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenItsAddressOrMaskIsNone) {
  const std::pair<std::string, std::string> rows[] = {
      {"", ""},
      {"", "255.255.255.0"},
      {"10.1.14.1", ""},
      {"x", "255.255.255.0"},
      {"10.1.14.1", "x"},
      {"10.1.14.256", "255.255.255.0"},
      {"10.1.14.1", "/24"},
  };
  for (const auto& [ip, mask] : rows) {
    BeginWith(ip, mask);
    ExpectGivenUpAfter(
        kChecksKnown +
        Effects{EnableReport("Failed to conver to inet_aton format of [" + ip + "] or [" + mask + "].")} + kNoBridge);
  }
}

TEST_F(BridgeOfAnAccessPoint, IsGivenUpWhenTheServersFilesCannotBeWritten) {
  fake::MERONetSetDhcpServerConfigFiles.Returns(0);
  ExpectGivenUpAfter(kPrepares + kMakesNatBridge + Effects{EnableReport("Failed to set dhcpServer conf for [lbr0].")} +
                     kNoBridge);
}

TEST_F(BridgeOfAnAccessPoint, TakesAnyAnswerButZeroForWritten) {
  fake::MERONetSetDhcpServerConfigFiles.Returns(-1);
  ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
}

// ---- With the real network library ----

class RealBridgeOfAnAccessPoint : public EnableTest {
 protected:
  RealBridgeOfAnAccessPoint() {
    fake::MERONetGetBridgeConfig.Reset();
    fake::MERONetSetBridgeConfig.Reset();
    fake::MERONetGetDhcpServerConf.Reset();
    fake::MERONetSetDhcpServerConfigFiles.Reset();
    std::filesystem::remove_all("/etc/sysconfig");
    std::filesystem::remove_all("/etc/dhcpd");
  }
};

const std::string kServer = "/etc/dhcpd/dhcpd-lbr0-lbr0.conf";
const std::string kServerInfo = "/etc/dhcpd/dhcpd-lbr0-lbr0.info";

TEST_F(RealBridgeOfAnAccessPoint, IsMadeWithItsServerOnAMachineThatHasNeither) {
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
  EXPECT_EQ(ReadText(BridgeScript("lbr0")),
            "DEVICE=lbr0\nNAT=yes\nPRIMARY=wlan0\nBOOTPROTO=static\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\n"
            "ONBOOT=yes\nTYPE=Bridge\n");
  EXPECT_THAT(ReadText(kServer), testing::HasSubstr("\ndhcp-range=10.1.14.2,10.1.14.254,255.255.255.0,86400s\n"));
  EXPECT_EQ(ReadText(kServerInfo), "auto_time=\"30\"\nenable=\"yes\"\n");
}

TEST_F(RealBridgeOfAnAccessPoint, KeepsItsRangeTheSecondTime) {
  EXPECT_EQ(Enable(), TRUE);
  std::string server = ReadText(kServer);
  server.replace(server.find("10.1.14.254"), 11, "10.1.14.100");
  WriteText(kServer, server);
  WriteText(kServerInfo, "enable=no\n");
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_EQ(ReadText(kServer), server);
  EXPECT_EQ(ReadText(kServerInfo), "enable=\"yes\"\n");
}

TEST_F(RealBridgeOfAnAccessPoint, GetsANewRangeWhenItsAddressHasChanged) {
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_EQ(PLIBCFileSetKeyValue(BridgeScript("lbr0").c_str(), "IPADDR", "192.168.5.100", kPlain.c_str()), 1);
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_THAT(ReadText(kServer), testing::HasSubstr("\ndhcp-range=192.168.5.101,192.168.5.254,255.255.255.0,86400s\n"));
}

TEST_F(RealBridgeOfAnAccessPoint, HasNoServerUnderAnotherName) {
  SettingsAre("\tenable=yes\n\tbridge=br0\n");
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_EQ(ReadText(BridgeScript("br0")),
            "DEVICE=br0\nNAT=no\nPRIMARY=eth0\nBOOTPROTO=dhcp\nONBOOT=yes\nTYPE=Bridge\n");
  EXPECT_FALSE(Exists("/etc/dhcpd"));
}

TEST_F(RealBridgeOfAnAccessPoint, IsRefusedUnderANameThatLeadsElsewhere) {
  for (const char* szName : {"../x", "a b", "a/b", "$(id)"}) {
    SettingsAre(std::string("\tenable=yes\n\tbridge=") + szName + "\n");
    EXPECT_EQ(Enable(), FALSE) << szName;
    EXPECT_FALSE(Exists("/etc/sysconfig")) << szName;
  }
}

}  // namespace
