// Reading one known network from its file.
#include <algorithm>
#include <climits>
#include <cstring>
#include <filesystem>

#include "common/known_networks_file.h"
#include "common/paths.h"
#include "tests/platform/platform_test.h"

namespace {

constexpr char kBssid[] = "00:11:22:AA:BB:CC";

class KnownNetwork : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    std::filesystem::remove_all(kKnownNetworksPath);
  }

  static WIRELESS_NETWORK_CONFIG Get(const char* szSection = kBssid) {
    WIRELESS_NETWORK_CONFIG config = {};
    EXPECT_EQ(MEROWirelessConfGet(szSection, &config), 0) << szSection;
    return config;
  }

  // The network of a section that holds these lines.
  static WIRELESS_NETWORK_CONFIG Of(const std::string& lines) {
    WriteText(kKnownNetworksPath, std::string("[") + kBssid + "]\n" + lines);
    return Get();
  }

  static std::string BssidOf(const WIRELESS_NETWORK_CONFIG& config) {
    char szText[18];
    return MEROWirelessBssidStringGet(config.network.bssid, szText, sizeof szText);
  }
};

TEST_F(KnownNetwork, IsReadFieldByField) {
  const WIRELESS_NETWORK_CONFIG config =
      Of("\tKEY= a secret \n\tIPADDR=192.168.1.2\n\tNETMASK=255.255.255.0\n\tGATEWAY=192.168.1.1\n"
         "\tESSID=my \"home\" \n\tBSSID=00:11:22:aa:bb:CC\n\tMODE=MANAGED\n\tACCESS_TIME=1700000000\n"
         "\tAUTH=WPA2PSK\n\tENCRYPT=TKIPAES\n");
  EXPECT_STREQ(config.szKey, " a secret ");
  EXPECT_STREQ(config.szIp, "192.168.1.2");
  EXPECT_STREQ(config.szMask, "255.255.255.0");
  EXPECT_STREQ(config.szGateway, "192.168.1.1");
  EXPECT_EQ(config.atime, 1'700'000'000);
  EXPECT_STREQ(config.network.szEssid, "my \"home\" ");
  EXPECT_EQ(BssidOf(config), "00:11:22:AA:BB:CC");
  EXPECT_EQ(config.network.opmode, WIRELESS_OPMODE_MANAGED);
  EXPECT_EQ(config.network.auth, WIRELESS_AUTH_WPA2PSK);
  EXPECT_EQ(config.network.encrypt, WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES);
}

TEST_F(KnownNetwork, HasWhatIsNotSavedZero) {
  WIRELESS_NETWORK_CONFIG config;
  std::memset(&config, 'x', sizeof config);
  WriteText(kKnownNetworksPath, std::string("[") + kBssid + "]\n\tCHANNEL=6\n\tUSER=x\n\tSIGNAL=9\n\tPROTOCOL=11b\n");
  ASSERT_EQ(MEROWirelessConfGet(kBssid, &config), 0);
  EXPECT_EQ(config.network.channel, 0);
  EXPECT_EQ(config.network.signal, 0);
  EXPECT_EQ(config.network.protocol, WIRELESS_PROTO_UNKNOWN);
  EXPECT_EQ(config.noneBssid, 0);
  EXPECT_STREQ(config.szUser, "");
}

TEST_F(KnownNetwork, ComesBackAsItWasSaved) {
  for (int mode = WIRELESS_OPMODE_AUTO; mode <= WIRELESS_OPMODE_UNKNOWN; ++mode) {
    for (int auth = WIRELESS_AUTH_UNKNOWN; auth <= WIRELESS_AUTH_WPA2EAP; ++auth) {
      for (const int encrypt : {0, 1, 2, 4, 8, 12}) {
        WIRELESS_NETWORK_CONFIG saved = {};
        std::ranges::copy(std::array{0x00, 0x11, 0x22, 0xaa, 0xbb, 0xcc}, saved.network.bssid);
        std::ranges::fill_n(saved.szKey, sizeof saved.szKey - 1, 'k');
        std::ranges::fill_n(saved.szIp, sizeof saved.szIp - 1, '1');
        std::ranges::fill_n(saved.szMask, sizeof saved.szMask - 1, '2');
        std::ranges::fill_n(saved.szGateway, sizeof saved.szGateway - 1, '3');
        std::ranges::fill_n(saved.network.szEssid, sizeof saved.network.szEssid - 1, '\xFF');
        saved.network.opmode = static_cast<WIRELESS_OPMODE>(mode);
        saved.network.auth = static_cast<WIRELESS_AUTH>(auth);
        saved.network.encrypt = static_cast<WIRELESS_ENCRYPT>(encrypt);
        ASSERT_EQ(MEROWirelessConfSet(&saved), 0);
        const WIRELESS_NETWORK_CONFIG read = Get();
        EXPECT_STREQ(read.szKey, saved.szKey);
        EXPECT_STREQ(read.szIp, saved.szIp);
        EXPECT_STREQ(read.szMask, saved.szMask);
        EXPECT_STREQ(read.szGateway, saved.szGateway);
        EXPECT_STREQ(read.network.szEssid, saved.network.szEssid);
        EXPECT_EQ(BssidOf(read), BssidOf(saved));
        EXPECT_EQ(read.network.opmode, mode);
        EXPECT_EQ(read.network.auth, auth);
        EXPECT_EQ(read.network.encrypt, encrypt);
      }
    }
  }
}

TEST_F(KnownNetwork, HasTextsCutToTheirFields) {
  const std::string text(5000, 'x');
  const WIRELESS_NETWORK_CONFIG config = Of(
      "KEY=" + text + "\nIPADDR=" + text + "\nNETMASK=" + text + "\nGATEWAY=" + text + "\nESSID=" + text +
      "\nMODE=" + text + "\nACCESS_TIME=" + text + "\nAUTH=" + text + "\nENCRYPT=" + text + "\nBSSID=" + text + "\n");
  EXPECT_EQ(config.szKey, text.substr(0, 256));
  EXPECT_EQ(config.szIp, text.substr(0, 19));
  EXPECT_EQ(config.szMask, text.substr(0, 19));
  EXPECT_EQ(config.szGateway, text.substr(0, 19));
  EXPECT_EQ(config.network.szEssid, text.substr(0, 32));
  EXPECT_EQ(config.atime, 0);
  EXPECT_EQ(BssidOf(config), "00:00:00:00:00:00");
  EXPECT_EQ(config.network.opmode, WIRELESS_OPMODE_UNKNOWN);
  EXPECT_EQ(config.network.auth, WIRELESS_AUTH_UNKNOWN);
  EXPECT_EQ(config.network.encrypt, WIRELESS_ENCRYPT_UNKNOWN);
}

TEST_F(KnownNetwork, IsEmptyOrUnknownWhereItsSectionIsEmpty) {
  for (const char* szLines :
       {"", "KEY=\nIPADDR=\nNETMASK=\nGATEWAY=\nESSID=\nBSSID=\nMODE=\nACCESS_TIME=\nAUTH=\nENCRYPT=\n",
        "key=x\nessid=x\nKEYS=x\n KEY\n#KEY=x\nMODE=junk\nAUTH=junk\nENCRYPT=junk\nBSSID=junk\n"}) {
    const WIRELESS_NETWORK_CONFIG config = Of(szLines);
    EXPECT_STREQ(config.szKey, "") << szLines;
    EXPECT_STREQ(config.szIp, "") << szLines;
    EXPECT_STREQ(config.szMask, "") << szLines;
    EXPECT_STREQ(config.szGateway, "") << szLines;
    EXPECT_STREQ(config.network.szEssid, "") << szLines;
    EXPECT_EQ(BssidOf(config), "00:00:00:00:00:00") << szLines;
    EXPECT_EQ(config.network.opmode, WIRELESS_OPMODE_UNKNOWN) << szLines;
    EXPECT_EQ(config.network.auth, WIRELESS_AUTH_UNKNOWN) << szLines;
    EXPECT_EQ(config.network.encrypt, WIRELESS_ENCRYPT_UNKNOWN) << szLines;
    EXPECT_EQ(config.atime, 0) << szLines;
  }
}

TEST_F(KnownNetwork, HasATimeWithin32Bits) {
  const struct {
    const char* szText;
    int32_t time;
  } rows[] = {
      {"0", 0},
      {"5", 5},
      {"-1", -1},
      {"2147483647", INT32_MAX},
      {"2147483648", INT32_MAX},
      {"4294967296", INT32_MAX},
      {"9223372036854775807", INT32_MAX},
      {"9223372036854775808", INT32_MAX},
      {"99999999999999999999999999", INT32_MAX},
      {"-2147483648", INT32_MIN},
      {"-2147483649", INT32_MIN},
      {"-99999999999999999999999999", INT32_MIN},
      {"", 0},
      {"-", 0},
      {"x", 0},
      {"12x", 0},
      {"1.5", 0},
      {"0x10", 0},
      {"99999999999999999999999999x", 0},
  };
  for (const auto& row : rows) {
    EXPECT_EQ(Of(std::string("ACCESS_TIME=") + row.szText + "\n").atime, row.time) << row.szText;
  }
}

TEST_F(KnownNetwork, HasAnAddressOnlyWhenItIsWellFormed) {
  for (const char* szText : {"0:11:22:aa:bb:cc", "00-11-22-AA-BB-CC", "00:11:22:AA:BB", "00:11:22:AA:BB:CC:DD",
                             "00:11:22:AA:BB:C", "00:11:22:AA:BB:CG", "00:11:22:AA:BB:CC ", " 00:11:22:AA:BB:CC",
                             "001122AABBCC", "-1:11:22:AA:BB:CC", "0x:11:22:AA:BB:CC", "00:11:22:AA:BB:CCx"}) {
    EXPECT_EQ(BssidOf(Of(std::string("BSSID=") + szText + "\n")), "00:00:00:00:00:00") << szText;
  }
  EXPECT_EQ(BssidOf(Of("BSSID=fe:DC:ba:98:76:54\n")), "FE:DC:BA:98:76:54");
}

TEST_F(KnownNetwork, HasOfARepeatedKeyTheLast) {
  const WIRELESS_NETWORK_CONFIG config =
      Of("ESSID=long name\nESSID=b\nAUTH=OPEN\nAUTH=junk\nACCESS_TIME=5\nACCESS_TIME=x\n"
         "BSSID=00:11:22:AA:BB:CC\nBSSID=junk\n");
  EXPECT_STREQ(config.network.szEssid, "b");
  EXPECT_EQ(config.network.auth, WIRELESS_AUTH_UNKNOWN);
  EXPECT_EQ(config.atime, 0);
  EXPECT_EQ(BssidOf(config), "00:00:00:00:00:00");
}

TEST_F(KnownNetwork, IsTheFirstOfSeveralSectionsOfItsName) {
  WriteText(kKnownNetworksPath,
            "[x]\nESSID=x\n[ 00:11:22:aa:bb:cc ]\r\nESSID=first\r\n[00:11:22:AA:BB:CC]\nESSID=second\n");
  EXPECT_STREQ(Get("00:11:22:AA:BB:CC").network.szEssid, "first");
  EXPECT_STREQ(Get("00:11:22:aa:bb:cc").network.szEssid, "first");
}

TEST_F(KnownNetwork, MayStandInASectionOfAnyName) {
  for (const char* szName : {"", "two words", "a]", "[a", "\xFF\xFE", "KEY=value"}) {
    WriteText(kKnownNetworksPath, "[other]\nESSID=other\n[" + std::string(szName) + "]\nESSID=this\n[last]\n");
    EXPECT_STREQ(Get(szName).network.szEssid, "this") << szName;
  }
}

TEST_F(KnownNetwork, ThatIsNotSavedIsNotFound) {
  WIRELESS_NETWORK_CONFIG config;
  std::memset(&config, 'x', sizeof config);
  const WIRELESS_NETWORK_CONFIG before = config;

  EXPECT_EQ(MEROWirelessConfGet(kBssid, &config), -1);
  ExpectNothingFound(ERR_FILE_NOT_FOUND);
  for (const char* szContent : {"", "[00:11:22:AA:BB:CD]\nESSID=x\n", "ESSID=x\n", "00:11:22:AA:BB:CC\n"}) {
    WriteText(kKnownNetworksPath, szContent);
    EXPECT_EQ(MEROWirelessConfGet(kBssid, &config), -1) << szContent;
    ExpectNothingFound(ERR_SECTION_NOT_FOUND);
  }
  EXPECT_EQ(std::memcmp(&config, &before, sizeof config), 0);
}

TEST_F(KnownNetwork, ThatCannotBeReadIsReported) {
  std::filesystem::create_directory(kKnownNetworksPath);
  WIRELESS_NETWORK_CONFIG config;
  std::memset(&config, 'x', sizeof config);
  const WIRELESS_NETWORK_CONFIG before = config;
  EXPECT_EQ(MEROWirelessConfGet(kBssid, &config), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to read /usr/mero/etc/wireless.conf: Invalid argument");
  EXPECT_EQ(std::memcmp(&config, &before, sizeof config), 0);
}

TEST_F(KnownNetwork, NeedsANameAndARecord) {
  WIRELESS_NETWORK_CONFIG config;
  EXPECT_EQ(MEROWirelessConfGet(nullptr, &config), -1);
  ExpectNullRefused();
  EXPECT_EQ(MEROWirelessConfGet(kBssid, nullptr), -1);
  ExpectNullRefused();
}

}  // namespace
