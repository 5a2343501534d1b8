// The file after a save.

#include <cstring>
#include <filesystem>

#include "known_networks.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr long long kNow = 1700000000;

class SavedFile : public UnitTest {
 protected:
  SavedFile() {
    std::filesystem::remove_all(kStore);
    fake::NowIs(kNow);
  }

  static void ExpectSaved(const WIRELESS_NETWORK_CONFIG& config) {
    EXPECT_EQ(memory::Run(0, [&] { return MEROWirelessConfSet(&config); }), 0);
    EXPECT_THAT(fake::Messages(), IsEmpty());
  }

  WIRELESS_NETWORK_CONFIG config_ = HomeNetwork();
};

TEST_F(SavedFile, IsCreatedForTheFirstNetworkAndIsTheOwnersAlone) {
  ExpectSaved(config_);
  EXPECT_EQ(ReadText(kStore), HomeSectionSavedAt(kNow));
  EXPECT_EQ(ModeOf(kStore), 0600u);
}

TEST_F(SavedFile, GetsItsFirstNetworkWhenItWasEmpty) {
  WriteText(kStore, "");
  ExpectSaved(config_);
  EXPECT_EQ(ReadText(kStore), HomeSectionSavedAt(kNow));
}

TEST_F(SavedFile, HoldsANetworkOnceAndWithItsLatestValues) {
  ExpectSaved(config_);
  std::strcpy(config_.szKey, "battery staple");
  fake::NowIs(kNow + 60);
  ExpectSaved(config_);
  std::string expected = HomeSectionSavedAt(kNow + 60);
  expected.replace(expected.find("correct horse"), std::strlen("correct horse"), "battery staple");
  EXPECT_EQ(ReadText(kStore), expected);
}

TEST_F(SavedFile, KeepsTheKeysThatOtherProgramsAddedToASection) {
  WriteText(kStore, "[" + kHomeSection + "]\n\tPRIORITY=3\n\tKEY=old\n\tNOTE=a = b\n");
  ExpectSaved(config_);
  const std::string text = ReadText(kStore);
  EXPECT_THAT(text, testing::HasSubstr("\tPRIORITY=3\n"));
  EXPECT_THAT(text, testing::HasSubstr("\tNOTE=a = b\n"));
  EXPECT_THAT(text, testing::HasSubstr("\tKEY=correct horse\n"));
  EXPECT_THAT(text, testing::Not(testing::HasSubstr("old")));
}

// A key was cut at its NUL when it was written again. Then it was another one, and stood behind that one's own line.
TEST_F(SavedFile, IsNotOverruledByALineWhoseKeyHasANulInIt) {
  using std::string_literals::operator""s;
  const std::string odd = "\tESSID\0x=Elsewhere\n"s;
  WriteText(kStore, "[" + kHomeSection + "]\n\tESSID=old\n" + odd);
  ExpectSaved(config_);
  WIRELESS_NETWORK_CONFIG saved;
  EXPECT_EQ(MEROWirelessConfGet(kHomeSection.c_str(), &saved), 0);
  EXPECT_STREQ(saved.network.szEssid, config_.network.szEssid);
  EXPECT_THAT(ReadText(kStore), testing::HasSubstr(odd));
}

TEST_F(SavedFile, KeepsEveryOtherByte) {
  const std::string before = "# known networks\r\n\n" + NthSection(1, "5") + "garbage\n; more\n";
  const std::string behind = "[last]\n\tKEY=\xff\x80 \"'\n\n\tno newline at the end";
  WriteText(kStore, before + HomeSectionSavedAt(9) + behind);
  ExpectSaved(config_);
  EXPECT_EQ(ReadText(kStore), before + HomeSectionSavedAt(kNow) + behind);
}

TEST_F(SavedFile, TellsNetworksApartByAddressAndNotByName) {
  ExpectSaved(config_);
  config_.network.bssid[5] = 0xCD;
  ExpectSaved(config_);
  std::string second = HomeSectionSavedAt(kNow);
  for (size_t at; (at = second.find("BB:CC")) != std::string::npos;) second.replace(at, 5, "BB:CD");
  EXPECT_EQ(ReadText(kStore), HomeSectionSavedAt(kNow) + second);
}

TEST_F(SavedFile, HoldsAllNetworksWithoutAnAddressInOneSection) {
  std::memset(config_.network.bssid, 0, sizeof config_.network.bssid);
  ExpectSaved(config_);
  std::strcpy(config_.network.szEssid, "Other Net");
  ExpectSaved(config_);
  const std::string text = ReadText(kStore);
  EXPECT_EQ(text.find("[00:00:00:00:00:00]"), 0u);
  EXPECT_EQ(std::ranges::count(text, '['), 1);
  EXPECT_THAT(text, testing::HasSubstr("\tESSID=Other Net\n"));
}

TEST_F(SavedFile, HoldsValuesAsTheyStandInTheRecord) {
  const std::string every = [] {
    std::string bytes;
    for (int byte = 1; byte < 256; ++byte) {
      if (byte != '\n' && byte != '\r') bytes += static_cast<char>(byte);
    }
    return bytes + '\r';
  }();
  std::strcpy(config_.szKey, every.c_str());
  std::strcpy(config_.szIp, "");
  std::strcpy(config_.szMask, "[a]=\"b\" 'c' $d `e`");
  std::memcpy(config_.network.szEssid, " name of thirty-two bytes, \xc3\xa9\xff\x80 ", 33);
  ASSERT_EQ(std::strlen(config_.network.szEssid), 32u);
  ExpectSaved(config_);
  const std::string text = ReadText(kStore);
  EXPECT_THAT(text, testing::HasSubstr("\tKEY=" + every + "\n"));
  EXPECT_THAT(text, testing::HasSubstr("\tIPADDR=\n"));
  EXPECT_THAT(text, testing::HasSubstr("\tNETMASK=[a]=\"b\" 'c' $d `e`\n"));
  EXPECT_THAT(text, testing::HasSubstr("\tESSID= name of thirty-two bytes, \xc3\xa9\xff\x80 \n"));
}

TEST_F(SavedFile, HoldsTheLongestKey) {
  std::memset(config_.szKey, 'k', 256);
  config_.szKey[256] = '\0';
  ExpectSaved(config_);
  EXPECT_THAT(ReadText(kStore), testing::HasSubstr("\tKEY=" + std::string(256, 'k') + "\n"));
}

TEST_F(SavedFile, GivesBackWhatWasSavedForEveryModeAuthenticationAndEncryption) {
  for (int opmode = WIRELESS_OPMODE_AUTO; opmode < WIRELESS_OPMODE_MAX; ++opmode) {
    for (int auth = WIRELESS_AUTH_UNKNOWN; auth <= WIRELESS_AUTH_WPA2EAP; ++auth) {
      for (const int encrypt : {0, 1, 2, 4, 8, 12}) {
        config_.network.opmode = static_cast<WIRELESS_OPMODE>(opmode);
        config_.network.auth = static_cast<WIRELESS_AUTH>(auth);
        config_.network.encrypt = static_cast<WIRELESS_ENCRYPT>(encrypt);
        ExpectSaved(config_);

        WIRELESS_NETWORK_CONFIG read{};
        ASSERT_GE(MEROWirelessConfGet(kHomeSection.c_str(), &read), 0);
        WIRELESS_NETWORK_CONFIG expected = config_;
        expected.atime = kNow;
        expected.network.channel = 0;
        expected.network.signal = 0;
        expected.network.protocol = WIRELESS_PROTO_UNKNOWN;
        expected.noneBssid = 0;
        std::memset(expected.szUser, 0, sizeof expected.szUser);
        EXPECT_EQ(std::memcmp(&read, &expected, sizeof read), 0) << opmode << ' ' << auth << ' ' << encrypt;
      }
    }
  }
}

TEST_F(SavedFile, StaysAsItWasWhenAValueCouldNotBeReadBack) {
  ExpectSaved(config_);
  std::strcpy(config_.szKey, "two\nlines");
  EXPECT_EQ(MEROWirelessConfSet(&config_), -1);
  EXPECT_EQ(ReadText(kStore), HomeSectionSavedAt(kNow));
  EXPECT_THAT(fake::Messages(), testing::Contains("wireless_conf_set:67 Failed to set section: " + kHomeSection +
                                                  " from " + kStore + ", errno=0x300"));
}

TEST_F(SavedFile, IsNotSavedToWhenItsDirectoryIsMissing) {
  std::filesystem::rename("/usr/mero/etc", "/usr/mero/gone");
  EXPECT_EQ(MEROWirelessConfSet(&config_), -1);
  std::filesystem::rename("/usr/mero/gone", "/usr/mero/etc");
  EXPECT_THAT(fake::Messages(), testing::Contains("wireless_conf_set:47 Failed to touch " + kStore));
}

TEST_F(SavedFile, IsNotSavedToWhenItIsNoFile) {
  std::filesystem::create_directory(kStore);
  EXPECT_EQ(MEROWirelessConfSet(&config_), -1);
  EXPECT_THAT(fake::Messages(), testing::Contains("wireless_conf_set:42 Failed to get section: " + kStore + " from " +
                                                  kHomeSection + ", errno=0x300"));
}

// Without memory the save fails and the file stays, or the save did not need that memory.
void ExpectWholeOrUntouched(const WIRELESS_NETWORK_CONFIG& config, const std::string& before,
                            const std::string& saved) {
  int failures = 0;
  WriteText(kStore, before);
  const auto save = [&] { return MEROWirelessConfSet(&config); };
  memory::FailEach(save, [&](int n, int result) {
    EXPECT_EQ(result, fake::Messages().empty() ? 0 : -1) << n;
    EXPECT_EQ(ReadText(kStore), result == 0 ? saved : before) << n;
    EXPECT_EQ(memory::Held(), 0u) << n;
    failures += result == 0 ? 0 : 1;
    WriteText(kStore, before);
    fake::Begin();
    fake::NowIs(kNow);
  });
  EXPECT_GT(failures, 20);  // three blocks a pair at least
}

TEST_F(SavedFile, IsUntouchedWheneverMemoryRunsOutWhileANetworkIsAdded) {
  const std::string before = NthSection(1, "5") + NthSection(2, "9");
  ExpectWholeOrUntouched(config_, before, before + HomeSectionSavedAt(kNow));
}

TEST_F(SavedFile, IsUntouchedWheneverMemoryRunsOutWhileANetworkIsReplaced) {
  const std::string before = NthSection(1, "5");
  const std::string behind = NthSection(2, "9");
  ExpectWholeOrUntouched(config_, before + HomeSectionSavedAt(1) + behind, before + HomeSectionSavedAt(kNow) + behind);
}

}  // namespace
