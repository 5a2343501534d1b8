// The supplicant's configuration, byte for byte.
#include <sys/stat.h>

#include "hostile_texts.h"
#include "joining.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kHead[] = "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n";

// What follows the line "scan_ssid=1" for these authentications with these encryptions. The network's key is
// "0123456789" and its user "alice".
struct Security {
  std::vector<int> auths;
  std::vector<int> encrypts;
  std::string lines;
  bool isKnown = true;
};

const Security kSecurities[] = {
    {{1, 2, 3}, {0, 1, 4, 8, 12, 6, 9, 15, 20}, "\tkey_mgmt=NONE\n}\n"},
    {{1, 2, 3},
     {2},
     "\tkey_mgmt=NONE\n"
     "\twep_key0=0123456789\n"
     "\twep_tx_keyidx=0\n"
     "\tauth_alg=SHARED\n"
     "}\n"},

    {{4, 5}, {0, 1, 2}, "\tkey_mgmt=WPA-PSK\n\tpsk=\"0123456789\"\n}\n"},
    {{4, 5}, {4, 6, 20}, "\tkey_mgmt=WPA-PSK\n\tpairwise=TKIP\n\tpsk=\"0123456789\"\n}\n"},
    {{4, 5}, {8, 9}, "\tkey_mgmt=WPA-PSK\n\tpairwise=CCMP\n\tpsk=\"0123456789\"\n}\n"},
    {{4, 5}, {12, 15}, "\tkey_mgmt=WPA-PSK\n\tpairwise=TKIP CCMP\n\tpsk=\"0123456789\"\n}\n"},

    {{7, 8},
     {0, 1, 2},
     "\tkey_mgmt=WPA-EAP\n"
     "\teap=TTLS PEAP\n"
     "\tidentity=\"alice\"\n"
     "\tpassword=\"0123456789\"\n"
     "}\n"},
    {{7, 8},
     {4, 6, 20},
     "\tkey_mgmt=WPA-EAP\n"
     "\teap=TTLS PEAP\n"
     "\tpairwise=TKIP\n"
     "\tidentity=\"alice\"\n"
     "\tpassword=\"0123456789\"\n"
     "}\n"},
    {{7, 8},
     {8, 9},
     "\tkey_mgmt=WPA-EAP\n"
     "\teap=TTLS PEAP\n"
     "\tpairwise=CCMP\n"
     "\tidentity=\"alice\"\n"
     "\tpassword=\"0123456789\"\n"
     "}\n"},
    {{7, 8},
     {12, 15},
     "\tkey_mgmt=WPA-EAP\n"
     "\teap=TTLS PEAP\n"
     "\tpairwise=TKIP CCMP\n"
     "\tidentity=\"alice\"\n"
     "\tpassword=\"0123456789\"\n"
     "}\n"},
    {{0, 6, 9, -1, 257}, {0, 1, 2, 4, 8, 12, 6, 9, 15, 20}, "", false},
};

class SupplicantConfig : public JoiningTest {
 protected:
  SupplicantConfig() {
    std::strcpy(config_.szKey, "0123456789");
    config_.noneBssid = 0;
  }

  void SetSecurity(int auth, int encrypt) {
    config_.network.auth = static_cast<WIRELESS_AUTH>(auth);
    config_.network.encrypt = static_cast<WIRELESS_ENCRYPT>(encrypt);
  }

  // Joins the network, and gives what the supplicant was configured with, up to its end or to where it was given up.
  std::string ConfigAfterJoining(int result = 0) {
    EXPECT_EQ(Join(), result);
    return ReadText(kSupplicantConfig);
  }
};

TEST_F(SupplicantConfig, IsExactlyWhatEachAuthenticationAndEncryptionNeeds) {
  int nCases = 0;
  for (const Security& security : kSecurities) {
    for (const int auth : security.auths) {
      for (const int encrypt : security.encrypts) {
        for (const bool pinned : {true, false}) {
          Begin();
          SetSecurity(auth, encrypt);
          config_.noneBssid = pinned ? 0 : 1;
          EXPECT_EQ(ConfigAfterJoining(security.isKnown ? 0 : -1), kHead + std::string("\tssid=\"Home Net\"\n") +
                                                                       (pinned ? "\tbssid=00:11:22:AA:BB:CC\n" : "") +
                                                                       "\tscan_ssid=1\n" + security.lines)
              << auth << ' ' << encrypt;
          ++nCases;
        }
      }
    }
  }
  EXPECT_EQ(nCases, 12 * 10 * 2);
}

TEST_F(SupplicantConfig, IsGivenUpForAnUnknownAuthenticationAndTheNetworkIsNotJoined) {
  for (const int auth : {0, 6, 9, -1, 257}) {
    Begin();
    SetSecurity(auth, 8);
    EXPECT_EQ(Join(), -1);
    EXPECT_THAT(WithoutLines(fake::Messages()),
                ElementsAre("wireless_network_connect:# Failed to detect authentication/encryption type",
                            "wireless_network_connect:# Failed to set [/usr/mero/etc/wpa_supplicant.conf]",
                            "wireless_network_connect:# Failed to connect network."));
    EXPECT_EQ(fake::system.calls(), 0) << auth;
  }
}

TEST_F(SupplicantConfig, PinsTheAccessPointUnlessItIsUnknownOrTheNameAloneCounts) {
  const struct {
    const char* bssid;
    int noneBssid;
    const char* szLine;
  } kPins[] = {
      {"\x00\x00\x00\x00\x00\x00", 0, ""},
      {"\x00\x00\x00\x00\x00\x00", 1, ""},
      {"\x00\x11\x22\xAA\xBB\xCC", 1, ""},
      {"\x00\x11\x22\xAA\xBB\xCC", -1, ""},
      {"\x00\x11\x22\xAA\xBB\xCC", 256, ""},
      {"\x00\x11\x22\xAA\xBB\xCC", 0, "\tbssid=00:11:22:AA:BB:CC\n"},
      {"\x01\x00\x00\x00\x00\x00", 0, "\tbssid=01:00:00:00:00:00\n"},
      {"\x00\x01\x00\x00\x00\x00", 0, "\tbssid=00:01:00:00:00:00\n"},
      {"\x00\x00\x01\x00\x00\x00", 0, "\tbssid=00:00:01:00:00:00\n"},
      {"\x00\x00\x00\x01\x00\x00", 0, "\tbssid=00:00:00:01:00:00\n"},
      {"\x00\x00\x00\x00\x01\x00", 0, "\tbssid=00:00:00:00:01:00\n"},
      {"\x00\x00\x00\x00\x00\x01", 0, "\tbssid=00:00:00:00:00:01\n"},
      {"\xff\xff\xff\xff\xff\xff", 0, "\tbssid=FF:FF:FF:FF:FF:FF\n"},
  };
  SetSecurity(WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
  for (const auto& pin : kPins) {
    Begin();
    std::memcpy(config_.network.bssid, pin.bssid, 6);
    config_.noneBssid = pin.noneBssid;
    EXPECT_EQ(ConfigAfterJoining(),
              kHead + std::string("\tssid=\"Home Net\"\n") + pin.szLine + "\tscan_ssid=1\n\tkey_mgmt=NONE\n}\n");
  }
}

TEST_F(SupplicantConfig, HasTheAddressAndTheCiphersAsThePlatformSpellsThem) {
  SetSecurity(WIRELESS_AUTH_WPA2PSK, 12);
  fake::MEROWirelessBssidStringGet.Does([this](const unsigned char* rgbBssid, char* szBssid, size_t cbBssid) {
    EXPECT_EQ(std::memcmp(rgbBssid, config_.network.bssid, 6), 0);
    std::snprintf(szBssid, cbBssid, "00-11");
    return szBssid;
  });
  fake::MEROWirelessEncryptStringGet.Returns("A B");
  EXPECT_EQ(ConfigAfterJoining(), kHead + std::string("\tssid=\"Home Net\"\n\tbssid=00-11\n\tscan_ssid=1\n"
                                                      "\tkey_mgmt=WPA-PSK\n\tpairwise=A B\n\tpsk=\"0123456789\"\n}\n"));
  EXPECT_THAT(fake::EffectsOf({"MEROWirelessBssidStringGet", "MEROWirelessEncryptStringGet"}),
              ElementsAre("MEROWirelessBssidStringGet(&, &, 1024)", "MEROWirelessEncryptStringGet(12, 1)",
                          "MEROWirelessBssidStringGet(&, &, 1024)"));  // the last one for the record
}

TEST_F(SupplicantConfig, TakesAWepKeyAsTextOrDigitsByItsLengthAlone) {
  const struct {
    std::string key;
    std::string line;
  } kKeys[] = {
      {"abcde", "\twep_key0=\"abcde\"\n"},
      {"12345", "\twep_key0=\"12345\"\n"},
      {"a\"b$c", "\twep_key0=\"a\"b$c\"\n"},
      {"thirteenchars", "\twep_key0=\"thirteenchars\"\n"},
      {"0123456789", "\twep_key0=0123456789\n"},
      {"notinbase8", "\twep_key0=notinbase8\n"},
      {"0123456789abcdef0123456789", "\twep_key0=0123456789abcdef0123456789\n"},
  };
  SetSecurity(WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP);
  for (const auto& row : kKeys) {
    Begin();
    std::strcpy(config_.szKey, row.key.c_str());
    EXPECT_THAT(ConfigAfterJoining(), testing::EndsWith("\tscan_ssid=1\n\tkey_mgmt=NONE\n" + row.line +
                                                        "\twep_tx_keyidx=0\n\tauth_alg=SHARED\n}\n"));
    EXPECT_THAT(fake::Messages(), IsEmpty());
  }
}

TEST_F(SupplicantConfig, GoesWithoutAWepKeyOfAnotherLengthAndTheNetworkIsStillTried) {
  for (size_t size = 0; size <= 256; ++size) {
    if (size == 5 || size == 13 || size == 10 || size == 26) continue;
    Begin();
    SetSecurity(WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_WEP);
    std::strcpy(config_.szKey, std::string(size, '7').c_str());
    EXPECT_THAT(ConfigAfterJoining(), testing::EndsWith("\tscan_ssid=1\n\tkey_mgmt=NONE\n"
                                                        "\twep_tx_keyidx=0\n\tauth_alg=SHARED\n}\n"))
        << size;
    EXPECT_THAT(WithoutLines(fake::Messages()), ElementsAre("wireless_network_connect:# Wrong WEP Format.")) << size;
    EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant))) << size;
  }
}

TEST_F(SupplicantConfig, QuotesEveryPassphraseAlsoOneOfDigits) {
  SetSecurity(WIRELESS_AUTH_WPAPSK, WIRELESS_ENCRYPT_NONE);
  for (const std::string& key : {std::string(64, 'f'), std::string(), std::string(256, 'k')}) {
    Begin();
    std::strcpy(config_.szKey, key.c_str());
    EXPECT_THAT(ConfigAfterJoining(), testing::EndsWith("\tkey_mgmt=WPA-PSK\n\tpsk=\"" + key + "\"\n}\n"));
  }
}

TEST_F(SupplicantConfig, HoldsNamesAndSecretsAsTheyAre) {
  SetSecurity(WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_NONE);
  for (const std::string& text : kHostileTexts) {
    if (text.find('\n') != std::string::npos) continue;
    Begin();
    std::strcpy(config_.network.szEssid, text.c_str());
    std::strcpy(config_.szUser, (text + "user").c_str());
    std::strcpy(config_.szKey, (text + "key").c_str());
    EXPECT_EQ(ConfigAfterJoining(), kHead + std::string("\tssid=\"") + text +
                                        "\"\n\tbssid=00:11:22:AA:BB:CC\n\tscan_ssid=1\n"
                                        "\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n\tidentity=\"" +
                                        text + "user\"\n\tpassword=\"" + text + "key\"\n}\n");
    EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant)));
  }
}

// The file after a value was refused: all that was written before that value, and nothing of an older file.
TEST_F(SupplicantConfig, IsGivenUpAtANameOrASecretWithALineFeed) {
  const std::string name = kHead + std::string("\tssid=\"Home Net\"\n\tbssid=00:11:22:AA:BB:CC\n\tscan_ssid=1\n");
  const struct {
    int auth;
    int encrypt;
    char* szText;
    std::string written;
  } rows[] = {
      {1, 1, config_.network.szEssid, kHead},
      {5, 1, config_.szKey, name + "\tkey_mgmt=WPA-PSK\n"},
      {8, 1, config_.szUser, name + "\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n"},
      {8, 1, config_.szKey, name + "\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n\tidentity=\"alice\"\n"},
      {2, 2, config_.szKey, name + "\tkey_mgmt=NONE\n"},
  };
  for (const auto& row : rows) {
    for (const char* szBroken : {"aaaa\n", "\nbbbb", "a\n}\nnetwork={", "a\n}\nnetwork={\n\tpriority=9"}) {
      const bool wepKey = row.encrypt == 2 && std::strlen(szBroken) != 5 && std::strlen(szBroken) != 26;
      if (wepKey) continue;  // no key at all
      Begin();
      SetSecurity(row.auth, row.encrypt);
      const std::string before = row.szText;
      std::strcpy(row.szText, szBroken);
      WriteText(kSupplicantConfig, "old");
      EXPECT_EQ(Join(), -1);
      std::strcpy(row.szText, before.c_str());
      EXPECT_EQ(ReadText(kSupplicantConfig), row.written);
      EXPECT_EQ(fake::system.calls(), 0);
      EXPECT_FALSE(Exists(kMarker));
      EXPECT_THAT(WithoutLines(fake::Messages()),
                  ElementsAre("wireless_network_connect:# A name or secret with a line feed cannot be configured.",
                              "wireless_network_connect:# Failed to set [/usr/mero/etc/wpa_supplicant.conf]",
                              "wireless_network_connect:# Failed to connect network."));
    }
  }
}

// A note in the user's name kept an open network from being joined.
TEST_F(SupplicantConfig, DoesNotCareForALineFeedInWhatItDoesNotHold) {
  const struct {
    int auth;
    int encrypt;
    char* szText;
  } rows[] = {
      {1, 1, config_.szKey},  {1, 1, config_.szUser}, {2, 2, config_.szUser},
      {5, 8, config_.szUser}, {2, 4, config_.szKey},  {2, 2, config_.szKey},  // of the wrong length, and left out
  };
  for (const auto& row : rows) {
    Begin();
    SetSecurity(row.auth, row.encrypt);
    const std::string before = row.szText;
    std::strcpy(row.szText, "a note\nof two lines");
    EXPECT_THAT(ConfigAfterJoining(), testing::EndsWith("\n}\n"));
    std::strcpy(row.szText, before.c_str());
  }
}

// A field without an end was read on into the next one.
TEST_F(SupplicantConfig, HoldsNothingFromBehindAFieldThatHasNoEnd) {
  SetSecurity(WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_NONE);
  std::memset(config_.network.szEssid, 'n', sizeof config_.network.szEssid);
  std::memset(config_.szKey, 'k', sizeof config_.szKey);
  std::strcpy(config_.szIp, "\n}\n");
  config_.network.bssid[0] = '\n';
  EXPECT_EQ(ConfigAfterJoining(), kHead + std::string("\tssid=\"") + std::string(33, 'n') +
                                      "\"\n\tbssid=0A:11:22:AA:BB:CC\n\tscan_ssid=1\n\tkey_mgmt=WPA-PSK\n\tpsk=\"" +
                                      std::string(257, 'k') + "\"\n}\n");
  EXPECT_EQ(ReadText(kRecord), std::string(33, 'n') + "\n7\n5\n1\n0A:11:22:AA:BB:CC\n");

  SetSecurity(WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_NONE);
  std::memset(config_.szUser, 'u', sizeof config_.szUser);
  EXPECT_THAT(ConfigAfterJoining(), testing::EndsWith("\tidentity=\"" + std::string(257, 'u') + "\"\n\tpassword=\"" +
                                                      std::string(257, 'k') + "\"\n}\n"));
}

TEST_F(SupplicantConfig, CanBeReadByItsOwnerAloneAlsoWhenTheOldOneCouldBeReadByAll) {
  const mode_t before = umask(0);
  for (const mode_t mask : {0000u, 0077u, 0777u}) {
    umask(mask);
    EXPECT_EQ(Join(), 0);
    EXPECT_EQ(ModeOf(kSupplicantConfig), 0600u) << mask;
  }
  umask(0);

  Begin();
  WriteText(kSupplicantConfig, "old");
  ASSERT_EQ(chmod(kSupplicantConfig.c_str(), 0666), 0);
  fake::system.Does([](const char*) {
    EXPECT_EQ(ModeOf(kSupplicantConfig), 0600u);
    return 0;
  });
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::system.calls(), 1);
  umask(before);
}

TEST_F(SupplicantConfig, IsWrittenFromScratchInsteadOfWhatItsNamePointsTo) {
  WriteText("/tmp/elsewhere", std::string(10000, 'x'));
  std::filesystem::create_symlink("/tmp/elsewhere", kSupplicantConfig);
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(ReadText("/tmp/elsewhere"), std::string(10000, 'x'));
  EXPECT_TRUE(std::filesystem::is_regular_file(std::filesystem::symlink_status(kSupplicantConfig)));
}

TEST_F(SupplicantConfig, HasNothingLeftOfALongerOneThatCouldNotBeRemoved) {
  WriteText(kSupplicantConfig, std::string(10000, 'x'));
  fake::PLIBCSysUnlink.Returns(-1);
  const std::string text = ConfigAfterJoining();
  EXPECT_THAT(text, testing::StartsWith(kHead));
  EXPECT_THAT(text, testing::EndsWith("\n}\n"));
  EXPECT_EQ(text.find('x'), std::string::npos);
}

const std::vector<std::string> kCannotSet = {
    "wireless_network_connect:# Failed to set [/usr/mero/etc/wpa_supplicant.conf]",
    "wireless_network_connect:# Failed to connect network.",
};

TEST_F(SupplicantConfig, ThatCannotBeOpenedIsReportedAndTheNetworkIsNotJoined) {
  std::filesystem::create_directory(kSupplicantConfig);
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(
      WithoutLines(fake::Messages()),
      testing::ElementsAreArray(
          Effects{"wireless_network_connect:# Failed to open file[/usr/mero/etc/wpa_supplicant.conf]."} + kCannotSet));
  EXPECT_EQ(fake::system.calls(), 0);
}

TEST_F(SupplicantConfig, ThatDoesNotReachTheDiskIsNotJoinedWith) {
  std::filesystem::create_symlink("/dev/full", kSupplicantConfig);
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(WithoutLines(fake::Messages()), testing::ElementsAreArray(kCannotSet));
  EXPECT_EQ(fake::system.calls(), 0);
}

}  // namespace
