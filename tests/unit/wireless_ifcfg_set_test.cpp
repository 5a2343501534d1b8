#include <cstring>

#include "hostile_texts.h"
#include "known_networks.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

const std::string kAsksForLease = "MEROIGetDHCPTestNetInfo(&, 16)";
const std::string kApplies = "MERONetSetCard1(&, 0)";

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_ifcfg_set:# " + message);
}

// An interface that is set, by a platform that keeps what it is told.
class Addressing : public UnitTest {
 protected:
  Addressing() { Begin(); }

  void Begin() {
    fake::Begin();
    asked_ = {};
    applied_ = {};
    fake::MEROIGetDHCPTestNetInfo.Does([this](PNETINFO pNetInfo, int) {
      asked_ = *pNetInfo;
      std::strcpy(pNetInfo->szIp, "10.1.1.7");
      std::strcpy(pNetInfo->szMask, "255.0.0.0");
      std::memcpy(pNetInfo->rgbMac, "\x02\x01\x02\x03\x04\x05", 6);
      return 0;
    });
    fake::MERONetSetCard1.Does([this](const NETINFO* pNetInfo, int) {
      applied_ = *pNetInfo;
      return 0;
    });
  }

  // Every field of a record, in order, and nothing behind the end of its texts.
  static void ExpectRecord(const NETINFO& record, BOOL manual, const std::string& ifName, const std::string& mac,
                           const std::string& ip, const std::string& mask) {
    const auto whole = [](const auto& field) { return std::string(std::begin(field), std::end(field)); };
    const auto padded = [](std::string text, size_t size) { return text.append(size - text.size(), '\0'); };
    EXPECT_EQ(record.blManual, manual);
    EXPECT_EQ(record.blActive, FALSE);
    EXPECT_EQ(whole(record.szInterface), padded(ifName, 16));
    EXPECT_EQ(whole(record.rgbMac), padded(mac, 6));
    EXPECT_EQ(whole(record.szIp), padded(ip, 20));
    EXPECT_EQ(whole(record.szMask), padded(mask, 20));
  }

  WIRELESS_NETWORK_CONFIG config_ = HomeNetwork();
  NETINFO asked_;
  NETINFO applied_;
};

TEST_F(Addressing, RejectsAnInterfaceWithoutAName) {
  EXPECT_EQ(MEROWirelessIfconfigSet(nullptr, config_), -1);
  EXPECT_THAT(Steps(), ElementsAre(ReportOf("Bad parameters")));
}

TEST_F(Addressing, SetsTheStaticAddressAndMask) {
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  EXPECT_THAT(Steps(), ElementsAre(kApplies));
  ExpectRecord(applied_, TRUE, "wlan0", "", "192.168.1.20", "255.255.255.0");
}

TEST_F(Addressing, LeasesAnAddressWhenItIsCalledDhcp) {
  std::strcpy(config_.szIp, "DHCP");
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForLease, kApplies));
  ExpectRecord(asked_, FALSE, "wlan0", "", "", "");
  ExpectRecord(applied_, FALSE, "wlan0", "\x02\x01\x02\x03\x04\x05", "10.1.1.7", "255.0.0.0");
}

TEST_F(Addressing, AppliesWhatThereIsWhenNoServerAnswers) {
  std::strcpy(config_.szIp, "DHCP");
  fake::MEROIGetDHCPTestNetInfo.Returns(-1);
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForLease, ReportOf("Failed to get IP from DHCP"), kApplies));
  ExpectRecord(applied_, FALSE, "wlan0", "", "", "");
}

TEST_F(Addressing, TakesAnythingButDhcpInCapitalsForAStaticAddress) {
  for (const char* szIp :
       {"dhcp", "Dhcp", "DHCP ", " DHCP", "DHCPD", "DHC", "", "not an address", "999.1.2.3", "1234567890123456789"}) {
    Begin();
    std::strcpy(config_.szIp, szIp);
    std::strcpy(config_.szMask, "any text");
    EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0) << szIp;
    EXPECT_THAT(Steps(), ElementsAre(kApplies)) << szIp;
    ExpectRecord(applied_, TRUE, "wlan0", "", szIp, "any text");
  }
}

TEST_F(Addressing, CutsWhatIsTooLongForTheInterfacesRecord) {
  for (const bool leased : {false, true}) {
    Begin();
    if (leased) std::strcpy(config_.szIp, "DHCP");
    EXPECT_EQ(MEROWirelessIfconfigSet("interface-of-a-long-name", config_), 0);
    EXPECT_STREQ(applied_.szInterface, "interface-of-a-");
  }
  // Texts that fill their fields, and go on in the next one.
  std::memset(config_.szIp, '1', sizeof config_.szIp);
  std::memset(config_.szMask, '2', sizeof config_.szMask);
  std::strcpy(config_.szGateway, "10.0.0.1");
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  ExpectRecord(applied_, TRUE, "wlan0", "", std::string(19, '1'), std::string(19, '2'));
}

TEST_F(Addressing, FailsWhenTheInterfaceCannotBeSet) {
  for (const int result : {-1, -7}) {
    for (const char* szIp : {"192.168.1.20", "DHCP"}) {
      Begin();
      fake::MERONetSetCard1.Returns(result);
      std::strcpy(config_.szIp, szIp);
      EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), -1);
      EXPECT_EQ(Last(Steps()), ReportOf("Failed to set network interface"));
      EXPECT_EQ(fake::Messages().size(), 1u);
    }
  }
}

TEST_F(Addressing, SaysSoWhenBothTheLeaseAndTheInterfaceFail) {
  std::strcpy(config_.szIp, "DHCP");
  fake::MEROIGetDHCPTestNetInfo.Returns(-1);
  fake::MERONetSetCard1.Returns(-1);
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), -1);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForLease, ReportOf("Failed to get IP from DHCP"), kApplies,
                                   ReportOf("Failed to set network interface")));
}

TEST_F(Addressing, TakesAnyAnswerThatIsNotNegativeForSuccess) {
  fake::MERONetSetCard1.Returns(1);
  fake::MEROIGetDHCPTestNetInfo.Returns(1);
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  std::strcpy(config_.szIp, "DHCP");
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(Addressing, LeavesTheGatewayAlone) {
  EXPECT_EQ(MEROWirelessIfconfigSet("wlan0", config_), 0);
  EXPECT_EQ(fake::system.calls(), 0);
  EXPECT_EQ(fake::PLIBCExec.calls(), 0);
}

TEST_F(Addressing, PassesTextsOnAsTheyAre) {
  for (const std::string& text : kHostileTexts) {
    Begin();
    const std::string part = text.substr(0, 15);
    std::strcpy(config_.szIp, part.c_str());
    std::strcpy(config_.szMask, part.c_str());
    EXPECT_EQ(MEROWirelessIfconfigSet(part.c_str(), config_), 0) << text;
    ExpectRecord(applied_, TRUE, part, "", part, part);
    EXPECT_EQ(fake::system.calls() + fake::popen.calls(), 0);
  }
}

TEST_F(Addressing, RunsNothingThatATextHolds) {
  for (const std::string& text : kHostileTexts) {
    fake::Begin();
    ForgetCalls();
    const std::string part = text.substr(0, 15);
    for (const std::string& ip : {part, std::string("DHCP"), std::string("10.0.0.2")}) {
      std::strcpy(config_.szIp, ip.c_str());
      EXPECT_EQ(MEROWirelessIfconfigSet(part.c_str(), config_), -1) << text;
    }
    EXPECT_FALSE(HasIntruder()) << text;
  }
}

}  // namespace
