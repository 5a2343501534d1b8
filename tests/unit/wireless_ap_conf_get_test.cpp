// The access-point settings as they are read: what is asked of the platform, and what the file makes of the record.
#include <climits>
#include <cstring>
#include <filesystem>

#include "ap_settings.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

const std::string kAsksForFile = "PLIBCFileExist(" + kSettings + ")";
const std::string kAsksForHash = "PLIBCSzHashAlloc(1024)";
const std::string kReadsSection = "PLIBCFileGetSection(" + kSettings + ", " + kModel + ", &)";
const std::string kFreesHash = "PLIBCSzHashFree(&)";

// The record when nothing could be read.
MERO_AP_CONF DefaultSettings() {
  MERO_AP_CONF conf{};
  std::strcpy(conf.szSecName, kModel.c_str());
  conf.blWifiUnblock = TRUE;
  for (const NumberKey& key : kNumberKeys) {
    if (key.isOfASectionWithoutLines() && !key.isOfGuests()) PutNumber(conf, key, key.missing);
  }
  std::strcpy(conf.wifiSchedConf.szWifiSched, kEveryHour.c_str());
  std::strcpy(conf.hostapConf.szSSID, "Corvanta");
  std::strcpy(conf.hostapConf.szBridge, "lbr0");
  return conf;
}

// The record of a section without lines.
MERO_AP_CONF BareSettings() {
  MERO_AP_CONF conf{};
  std::strcpy(conf.szSecName, kModel.c_str());
  conf.blWifiUnblock = TRUE;
  for (const NumberKey& key : kNumberKeys) {
    if (key.isOfASectionWithoutLines()) PutNumber(conf, key, key.missing);
  }
  for (const TextKey& key : kTextKeys) PutText(conf, key, key.missing);
  return conf;
}

class ApSettings : public UnitTest {
 protected:
  ApSettings() { std::filesystem::remove_all(kSettings); }

  // Reads a section into a record that has been used before.
  int Read(const std::string& section = kModel) {
    conf_ = UsedSettings();
    return memory::Run(0, [&] { return MEROWirelessGetAPConfig(section.c_str(), &conf_); });
  }

  // The record of a section with these lines.
  MERO_AP_CONF ReadLines(const std::string& lines) {
    WriteText(kSettings, "[" + kModel + "]\n" + lines);
    EXPECT_GT(Read(), 0) << lines;
    return conf_;
  }

  static std::vector<std::string> Steps() {
    return fake::EffectsOf({"PLIBCFileExist", "PLIBCSzHashAlloc", "PLIBCFileGetSection", "PLIBCSzHashFree", "syslog"});
  }

  MERO_AP_CONF conf_;
};

// ---- What is asked of the platform, and what is made of its answers ----

TEST_F(ApSettings, AreReadOnceAndTheHashIsReleased) {
  fake::PLIBCFileExist.Returns(-1);  // not zero: it exists
  for (const int result : {1, 7, INT_MAX}) {
    fake::PLIBCFileGetSection.Returns(result);
    EXPECT_EQ(Read(), result);
    EXPECT_THAT(Differences(conf_, BareSettings()), IsEmpty());
  }
  const std::vector<std::string> steps = Steps();
  ASSERT_EQ(steps.size(), 12u);
  for (size_t i = 0; i < steps.size(); i += 4) {
    EXPECT_THAT(std::vector<std::string>(&steps[i], &steps[i] + 4),
                ElementsAre(kAsksForFile, kAsksForHash, kReadsSection, kFreesHash));
  }
}

// Keys came in the order in which they are written.
TEST_F(ApSettings, AreTakenInTheirOwnOrder) {
  std::vector<std::string> calls;
  for (const char* szKey : kKeysInReadingOrder) calls.push_back("PLIBCSzHashGetValue(&, " + std::string(szKey) + ")");
  ReadLines("\tenable=yes\n\tencryption=3\n\tguest_net_encryption=2\n");
  EXPECT_EQ(fake::EffectsOf({"PLIBCSzHashGetValue"}), calls);
}

TEST_F(ApSettings, AreTheDefaultsAndNothingIsReadWithoutAFile) {
  EXPECT_EQ(Read(), 0);
  EXPECT_THAT(Differences(conf_, DefaultSettings()), IsEmpty());
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForFile));
}

TEST_F(ApSettings, AreTheDefaultsWithoutMemoryForTheHashAndNothingIsReported) {
  fake::PLIBCFileExist.Returns(1);
  fake::PLIBCSzHashAlloc.Returns(nullptr);
  EXPECT_EQ(Read(), -1);
  EXPECT_THAT(Differences(conf_, DefaultSettings()), IsEmpty());
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForFile, kAsksForHash));
}

TEST_F(ApSettings, AreTheDefaultsWhenTheSectionCannotBeReadAndTheAnswerSaysHow) {
  for (const int result : {0, -1, -7, INT_MIN}) {
    fake::Begin();
    fake::PLIBCFileExist.Returns(1);
    fake::PLIBCFileGetSection.Does([result](const char*, const char*, PPLIBSZHASH* ppshHash) {
      PLIBCSzHashSetValue(ppshHash, "ssid", "half of a section");
      return result;
    });
    EXPECT_EQ(Read(), result);
    EXPECT_THAT(Differences(conf_, DefaultSettings()), IsEmpty()) << result;
    EXPECT_THAT(Steps(), ElementsAre(kAsksForFile, kAsksForHash, kReadsSection, kFreesHash)) << result;
    EXPECT_EQ(fake::PLIBCSzHashGetValue.calls(), 0) << result;
  }
}

TEST_F(ApSettings, StayUntouchedWhenAnArgumentIsMissing) {
  conf_ = UsedSettings();
  EXPECT_EQ(MEROWirelessGetAPConfig(nullptr, &conf_), -1);
  EXPECT_EQ(MEROWirelessGetAPConfig(kModel.c_str(), nullptr), -1);
  EXPECT_EQ(MEROWirelessGetAPConfig(nullptr, nullptr), -1);
  EXPECT_THAT(Differences(conf_, UsedSettings()), IsEmpty());
  EXPECT_EQ(fake::Effects().size(), 3u);
  EXPECT_THAT(WithoutLines(fake::Effects()), Each(fake::Report("wireless_ap_conf_get:# Bad parameters")));
}

// A hash moves when it grows, and a platform may hand out another one.
TEST_F(ApSettings, AreTakenFromTheHashThatThePlatformLeaves) {
  PPLIBSZHASH pshMoved = nullptr;
  fake::PLIBCFileExist.Returns(1);
  fake::PLIBCFileGetSection.Does([&](const char*, const char*, PPLIBSZHASH* ppshHash) {
    fake::PLIBCSzHashFree.Real(*ppshHash);
    pshMoved = *ppshHash = fake::PLIBCSzHashAlloc.Real(1024);
    fake::PLIBCSzHashSetValue.Real(ppshHash, "txpower", "33");
    return 1;
  });
  fake::PLIBCSzHashFree.Does([&](PPLIBSZHASH pshHash) {
    EXPECT_EQ(pshHash, pshMoved);
    fake::PLIBCSzHashFree.Real(pshHash);
  });
  EXPECT_EQ(Read(), 1);
  EXPECT_EQ(conf_.txpower, 33);
  EXPECT_EQ(fake::PLIBCSzHashFree.calls(), 1);
}

// ---- What holds when there is nothing to read ----

TEST_F(ApSettings, AreTheDefaultsForAnAdapterWithoutASection) {
  for (const std::string& text : {std::string(), std::string("\tssid=lost\n"), std::string("# [RT-5370]\n"),
                                  "[AR-9271]\n" + OfficeLines(AP_ENCRYPT_WEP, AP_ENCRYPT_WEP)}) {
    WriteText(kSettings, text);
    EXPECT_EQ(Read(), 0) << text;
    EXPECT_THAT(Differences(conf_, DefaultSettings()), IsEmpty()) << text;
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, AreTheDefaultsWhenTheFileCannotBeRead) {
  std::filesystem::create_directory(kSettings);
  EXPECT_LT(Read(), 0);
  EXPECT_THAT(Differences(conf_, DefaultSettings()), IsEmpty());
}

TEST_F(ApSettings, HoldTheNameOfTheSectionAsItWasAskedForUpTo31Bytes) {
  const std::string name = "A product name that is far too long for its field";
  const std::string kept = name.substr(0, 31);
  EXPECT_EQ(Read(name), 0);
  EXPECT_EQ(conf_.szSecName, kept);
  WriteText(kSettings, "[" + kept + "]\n\tssid=cut\n[" + name + "]\n\tssid=whole\n");
  EXPECT_GT(Read(name), 0);
  EXPECT_EQ(conf_.szSecName, kept);
  EXPECT_STREQ(conf_.hostapConf.szSSID, "whole");
  WriteText(kSettings, "[rt-5370]\n\tssid=found\n");
  EXPECT_GT(Read(), 0);
  EXPECT_EQ(conf_.szSecName, kModel);
  EXPECT_STREQ(conf_.hostapConf.szSSID, "found");
}

// The record was reset before its name had been looked up, and with it the name.
TEST_F(ApSettings, AreReadAgainUnderTheNameThatTheRecordHolds) {
  const MERO_AP_CONF expected = ReadLines("\tenable=yes\n\tssid=Office Net\n");
  conf_.hostapConf.szSSID[0] = 'x';
  EXPECT_GT(MEROWirelessGetAPConfig(conf_.szSecName, &conf_), 0);
  EXPECT_THAT(Differences(conf_, expected), IsEmpty());
}

// ---- What a section stands for ----

// In particular the guest network, which is bare in a record without a section.
TEST_F(ApSettings, HaveDefaultsOfTheirOwnForKeysThatASectionLacks) {
  EXPECT_THAT(Differences(ReadLines(""), BareSettings()), IsEmpty());
  MERO_AP_CONF enabled = BareSettings();
  enabled.blEnable = TRUE;
  EXPECT_THAT(Differences(ReadLines("\tenable=yes\n"), enabled), IsEmpty());
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, HaveADefaultForEveryKeyThatASectionLacks) {
  for (const NumberKey& key : kNumberKeys) EXPECT_EQ(NumberIn(ReadLines(key.szWith), key), key.missing) << key.szKey;
  for (const TextKey& key : kTextKeys) EXPECT_EQ(TextIn(ReadLines(key.szWith), key), key.missing) << key.szKey;
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, AreEverythingThatASectionSaysButTheGuestNetworksAddress) {
  for (const MERO_AP_ENCRYPT encryption : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_EAP}) {
    for (const MERO_AP_ENCRYPT guest : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK}) {
      WriteText(kSettings, OfficeSection(encryption, guest));
      EXPECT_EQ(Read(), 1);
      MERO_AP_CONF expected = OfficeSettings(encryption, guest);
      std::memset(expected.hostapConf.guestNet.szBSSID, 0, sizeof expected.hostapConf.guestNet.szBSSID);
      EXPECT_THAT(Differences(conf_, expected), IsEmpty()) << encryption << ' ' << guest;
    }
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, DoNotDependOnTheOrderOfTheLines) {
  const std::string lines = OfficeLines(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_PSK);
  std::string reversed;
  for (size_t end = lines.size(); end > 0;) {
    const size_t begin = lines.rfind('\t', end - 1);
    reversed += lines.substr(begin, end - begin);
    end = begin;
  }
  const MERO_AP_CONF expected = ReadLines(lines);
  EXPECT_THAT(Differences(ReadLines(reversed), expected), IsEmpty());
}

TEST_F(ApSettings, HaveOneSwitchThatIsOnForNothingButYes) {
  EXPECT_EQ(ReadLines("\tenable=yes\n").blEnable, TRUE);
  EXPECT_EQ(ReadLines("\tunblock=yes\n").blWifiUnblock, TRUE);
  for (const std::string value :
       {"no", "Yes", "YES", "yEs", "1", "0", "", " yes", "yes ", "yes\t", "ye", "yess", "y", "true", "on", "\"yes\""}) {
    EXPECT_EQ(ReadLines("\tenable=" + value + "\n").blEnable, FALSE) << value;
    EXPECT_EQ(ReadLines("\tunblock=" + value + "\n").blWifiUnblock, FALSE) << value;
  }
}

TEST_F(ApSettings, KnowTheirKeysByTheirExactNames) {
  std::string lines;
  for (const char* szKey : {"Enable", "UNBLOCK", "tx_power", "TxPower", "SSID", "ssid2", "wifi_sched_enable",
                            "guest_net_sched_enabled", "guest_net_ap_isolate", "guest_net_wpa", "guest_net_bssid"}) {
    lines += std::string("\t") + szKey + "=77\n";
  }
  EXPECT_THAT(Differences(ReadLines(lines), BareSettings()), IsEmpty());
}

// None of the numbers is an encryption, which would bring more than the number.
TEST_F(ApSettings, ReadEveryNumberUpToTheFirstByteThatIsNone) {
  const struct {
    const char* szValue;
    int value;
  } rows[] = {
      {"7", 7},
      {"12abc", 12},
      {"", 0},
      {" ", 0},
      {" 17", 17},
      {"\t\v\f 17", 17},
      {"-13", -13},
      {"+14", 14},
      {" -15 ", -15},
      {"--16", 0},
      {"- 16", 0},
      {"0x10", 0},
      {"007", 7},
      {"9e3", 9},
      {"8.9", 8},
      {"yes", 0},
      {"\"7\"", 0},
      {"a7", 0},
      {"256", 256},
      {"2147483647", INT_MAX},
      {"-2147483648", INT_MIN},
  };
  for (const NumberKey& key : kNumberKeys) {
    MERO_AP_CONF expected = ReadLines(key.szWith);
    for (const auto& row : rows) {
      PutNumber(expected, key, row.value);
      const std::string line = std::string("\t") + key.szKey + "=" + row.szValue + "\n";
      EXPECT_THAT(Differences(ReadLines(key.szWith + line), expected), IsEmpty()) << line;
    }
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, HoldEveryTextAsItStandsAndCutItToItsField) {
  for (const TextKey& key : kTextKeys) {
    MERO_AP_CONF expected = ReadLines(key.szWith);
    for (const std::string& text :
         {std::string(), std::string("x"), std::string(" blanks at both ends "), std::string("\"in quotes\""),
          std::string("a=b # c ; d [e]"), std::string("%s%n"), std::string("caf\xc3\xa9 \xff\x80"),
          std::string(key.size - 2, 'a'), std::string(key.size - 1, 'b'), std::string(key.size, 'c'),
          std::string(key.size + 1, 'd'), std::string(5000, 'e')}) {
      PutText(expected, key, text.substr(0, key.size - 1));
      const std::string line = std::string("\t") + key.szKey + "=" + text + "\n";
      EXPECT_THAT(Differences(ReadLines(key.szWith + line), expected), IsEmpty()) << line;
    }
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

// ---- What the encryptions bring ----

// The keys of every encryption, which a section collects that has had them all.
std::string EverySecret() {
  std::string lines;
  for (const MERO_AP_ENCRYPT encryption : {AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_EAP}) {
    lines += OfficeSecrets(encryption) + VisitorSecrets(encryption);
  }
  return lines;
}

TEST_F(ApSettings, IgnoreTheKeysOfAnotherEncryption) {
  for (const MERO_AP_ENCRYPT encryption : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_EAP}) {
    for (const MERO_AP_ENCRYPT guest : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK}) {
      const MERO_AP_CONF conf = ReadLines("\tencryption=" + std::to_string(encryption) +
                                          "\n\tguest_net_encryption=" + std::to_string(guest) + "\n" + EverySecret());
      MERO_AP_CONF expected = BareSettings();
      expected.hostapConf.encryption = encryption;
      expected.hostapConf.encryptInfo = OfficeSettings(encryption, guest).hostapConf.encryptInfo;
      expected.hostapConf.guestNet.encryption = guest;
      expected.hostapConf.guestNet.encryptInfo = OfficeSettings(encryption, guest).hostapConf.guestNet.encryptInfo;
      EXPECT_THAT(Differences(conf, expected), IsEmpty()) << encryption << ' ' << guest;
    }
  }
}

TEST_F(ApSettings, NeedNothingForAnEncryptionThatIsUnknownAndSayNothing) {
  for (const int encryption : {4, 7, -1, INT_MAX, INT_MIN}) {
    const std::string value = std::to_string(encryption) + "\n";
    MERO_AP_CONF expected = BareSettings();
    expected.hostapConf.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
    expected.hostapConf.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
    const std::string lines = "\tencryption=" + value + "\tguest_net_encryption=" + value;
    EXPECT_THAT(Differences(ReadLines(lines + EverySecret()), expected), IsEmpty()) << encryption;
  }
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSettings, AreReadAlsoWhenTheGuestNetworkHasAnEncryptionThatItCannotHave) {
  MERO_AP_CONF expected = OfficeSettings(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_EAP);
  std::memset(expected.hostapConf.guestNet.szBSSID, 0, sizeof expected.hostapConf.guestNet.szBSSID);
  const std::string lines = OfficeLines(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_EAP) + VisitorSecrets(AP_ENCRYPT_WPA_PSK) +
                            "\tguest_net_auth_server_addr=10.0.0.6\n";
  EXPECT_THAT(Differences(ReadLines(lines), expected), IsEmpty());
  EXPECT_THAT(WithoutLines(fake::Messages()),
              ElementsAre("wireless_ap_conf_get:# Guest Network does not have EAP encryption"));
}

// ---- Several models, and little memory ----

TEST_F(ApSettings, OfOneModelNeverShowInAnother) {
  const std::string office = OfficeSection(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
  const std::string other = "[AR-9271]\n\tenable=yes\n\tchannel=6\n\tencryption=1\n";
  MERO_AP_CONF expectedOther = BareSettings();
  std::memset(expectedOther.szSecName, 0, sizeof expectedOther.szSecName);
  std::strcpy(expectedOther.szSecName, "AR-9271");
  expectedOther.blEnable = TRUE;
  expectedOther.hostapConf.channel = 6;
  expectedOther.hostapConf.encryption = AP_ENCRYPT_WEP;
  MERO_AP_CONF expectedOffice = OfficeSettings(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
  std::memset(expectedOffice.hostapConf.guestNet.szBSSID, 0, sizeof expectedOffice.hostapConf.guestNet.szBSSID);
  for (const std::string& text : {office + other, other + office, "[RT-5370x]\n" + other.substr(10) + other + office}) {
    WriteText(kSettings, text);
    EXPECT_GT(Read("RT-5370"), 0);
    EXPECT_THAT(Differences(conf_, expectedOffice), IsEmpty()) << text;
    EXPECT_GT(Read("AR-9271"), 0);
    EXPECT_THAT(Differences(conf_, expectedOther), IsEmpty()) << text;
  }
}

TEST_F(ApSettings, AreThoseOfTheAdapterThatIsPluggedIn) {
  WriteText(kSettings, "[RT-5370]\n\tssid=first\n[AR 9271 \"mini\"]\n\tssid=second\n");
  for (const auto& [szProduct, szSSID] :
       {std::pair("RT-5370", "first"), std::pair("\"AR 9271 \"mini\"\"", "second"), std::pair("none", "Corvanta")}) {
    WriteText("/tmp/wireless.info", std::string("PRODUCT=") + szProduct + "\n");
    char szName[32];
    ASSERT_EQ(MEROWirelessApConfigSecNameGet(szName, sizeof szName), TRUE);
    (void)Read(szName);
    EXPECT_STREQ(conf_.hostapConf.szSSID, szSSID);
  }
}

TEST_F(ApSettings, AreWholeOrTheDefaultsWhenMemoryRunsOut) {
  const std::string lines = OfficeLines(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_PSK);
  const MERO_AP_CONF whole = ReadLines(lines);
  int failures = 0;
  const auto read = [this] {
    conf_ = UsedSettings();
    return MEROWirelessGetAPConfig(kModel.c_str(), &conf_);
  };
  memory::FailEach(read, [&](int n, int result) {
    EXPECT_THAT(Differences(conf_, result > 0 ? whole : DefaultSettings()), IsEmpty()) << n;
    EXPECT_EQ(memory::Held(), 0u) << n;
    failures += result < 0 ? 1 : 0;
  });
  EXPECT_GT(failures, 90);  // three blocks a line at least
  for (const std::string& message : fake::Messages()) {
    EXPECT_THAT(message, testing::Not(testing::StartsWith("wireless_ap_conf_get")));
  }
}

}  // namespace
