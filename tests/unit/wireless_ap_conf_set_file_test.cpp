// Saving the access-point settings: the file afterwards, and the record that is read from it.
#include <sys/stat.h>
#include <algorithm>

#include <climits>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <random>

#include "ap_settings.h"
#include "common/text.h"
#include "hostile_texts.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

std::string Replaced(std::string text, const std::string& from, const std::string& to) {
  const size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return at == std::string::npos ? text : text.replace(at, from.size(), to);
}

// The record that reading a saved one gives.
MERO_AP_CONF ReadBack(MERO_AP_CONF conf) {
  std::memset(conf.hostapConf.guestNet.szBSSID, 0, sizeof conf.hostapConf.guestNet.szBSSID);
  return conf;
}

class SavedApSettings : public UnitTest {
 protected:
  SavedApSettings() {
    std::filesystem::remove_all(kSettings);
    ::setenv("LC_ALL", "C", 1);  // every byte is text to the search, whoever runs the tests
  }

  BOOL Save() {
    return memory::Run(0, [this] { return MEROWirelessSetAPConfig(&conf_); });
  }

  void ExpectSaved() {
    EXPECT_EQ(Save(), TRUE);
    EXPECT_THAT(fake::Messages(), IsEmpty());
  }

  // Expects that the record is refused with a message, and that the file stays as it is.
  void ExpectRefused(const std::string& message) {
    const std::string before = TextOrNothing(kSettings);
    EXPECT_EQ(Save(), FALSE);
    EXPECT_EQ(TextOrNothing(kSettings), before);
    EXPECT_THAT(WithoutLines(fake::Messages()), Contains("wireless_ap_conf_set:# " + message));
  }

  MERO_AP_CONF Read() {
    MERO_AP_CONF conf = UsedSettings();
    EXPECT_GT(MEROWirelessGetAPConfig(conf_.szSecName, &conf), 0);
    return conf;
  }

  void NameSection(const std::string& name) { CopyText(conf_.szSecName, name); }

  MERO_AP_CONF conf_ = OfficeSettings(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
  const std::string office_ = OfficeSection(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
};

// The text around the section of the model.
const std::string kBefore = "# access points\r\n\n[AR-9271]\n\tenable=yes\n\tssid= \xff\x80\" \n; more\n";
const std::string kBehind = "[last]\r\n\tenable=yes\r\nrubbish\n\tno newline at the end";

// ---- What stands in the file ----

TEST_F(SavedApSettings, AreCreatedForTheFirstModelAndAreTheOwnersAlone) {
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), office_);
  EXPECT_EQ(ModeOf(kSettings), 0600u);
}

TEST_F(SavedApSettings, KeepTheModeThatTheFileWasGiven) {
  WriteText(kSettings, "");
  ASSERT_EQ(chmod(kSettings.c_str(), 0640), 0);
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), office_);
  EXPECT_EQ(ModeOf(kSettings), 0640u);
}

TEST_F(SavedApSettings, HoldWhatTheEncryptionsNeedAndNothingElse) {
  for (const MERO_AP_ENCRYPT encryption : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_EAP}) {
    for (const MERO_AP_ENCRYPT guest : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK}) {
      conf_ = OfficeSettings(encryption, guest);
      ExpectSaved();  // in place of what the encryptions before needed
      EXPECT_EQ(ReadText(kSettings), OfficeSection(encryption, guest));
    }
  }
}

TEST_F(SavedApSettings, HoldTheTwoSwitchesAsWordsAndAllElseAsNumbers) {
  conf_.blEnable = static_cast<BOOL>(5);
  conf_.blWifiUnblock = static_cast<BOOL>(-1);
  conf_.hostapConf.guestNet.blEnable = FALSE;
  conf_.hostapConf.guestNet.blAPIsolate = TRUE;
  ExpectSaved();
  std::string expected = Replaced(office_, "unblock=no", "unblock=yes");
  expected = Replaced(expected, "guest_net_enable=27", "guest_net_enable=0");
  EXPECT_EQ(ReadText(kSettings), Replaced(expected, "ap_isolate=28", "ap_isolate=1"));
  EXPECT_THAT(expected, HasSubstr("\tenable=yes\n"));
  EXPECT_THAT(expected, HasSubstr("\tignore_broadcast_ssid=5\n"));
}

TEST_F(SavedApSettings, HoldEveryNumberWithItsSign) {
  for (const int value : {-1, -13, INT_MIN, INT_MAX, 0}) {
    for (const NumberKey& key : kNumberKeys) {
      if (std::strstr(key.szKey, "encryption") != nullptr) continue;
      const bool ofEap = std::strcmp(key.szWith, "\tencryption=3\n") == 0;
      conf_ = OfficeSettings(ofEap ? AP_ENCRYPT_WPA_EAP : AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_PSK);
      PutNumber(conf_, key, value);
      ExpectSaved();
      const std::string line = std::string("\n\t") + key.szKey + "=" + std::to_string(value) + "\n";
      EXPECT_THAT(ReadText(kSettings), HasSubstr(line));
      EXPECT_THAT(Differences(Read(), ReadBack(conf_)), IsEmpty()) << line;
    }
  }
}

TEST_F(SavedApSettings, HoldTheGuestNetworksAddressWhichIsNotReadBack) {
  std::strcpy(conf_.hostapConf.guestNet.szBSSID, "any text = at \"all\"");
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), Replaced(office_, "02:11:22:33:44:55", "any text = at \"all\""));
  EXPECT_STREQ(Read().hostapConf.guestNet.szBSSID, "");
}

TEST_F(SavedApSettings, ReplaceTheSectionOfTheModelAndKeepEveryOtherByte) {
  WriteText(kSettings, kBefore + "[RT-5370]\n\twep_key0=old\n\tssid=old\n" + kBehind);
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), kBefore + office_ + kBehind);
  conf_.hostapConf.channel = 1;
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), kBefore + Replaced(office_, "channel=11", "channel=1") + kBehind);
}

TEST_F(SavedApSettings, GetANewSectionBehindAllOthers) {
  WriteText(kSettings, kBefore + kBehind);
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), kBefore + kBehind + "\n" + office_);
}

TEST_F(SavedApSettings, KeepSeveralModelsSideBySide) {
  ExpectSaved();
  const MERO_AP_CONF first = conf_;
  conf_ = OfficeSettings(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_OPEN);
  NameSection("AR-9271");
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings),
            office_ + Replaced(OfficeSection(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_OPEN), kModel, "AR-9271"));
  EXPECT_THAT(Differences(Read(), ReadBack(conf_)), IsEmpty());
  conf_ = first;
  EXPECT_THAT(Differences(Read(), ReadBack(conf_)), IsEmpty());
}

// ---- An access point that is switched off ----

TEST_F(SavedApSettings, ChangeInNothingButTheSwitchWhenTheAccessPointIsDisabled) {
  const std::string lines = Replaced(OfficeLines(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WEP), "\tunblock=no\n",
                                     "# of another program\n\tPRIORITY=3\n\tunblock=yes\r\n");
  WriteText(kSettings, kBefore + "[RT-5370]\r\n" + lines + kBehind);
  conf_.blEnable = FALSE;
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings),
            kBefore + "[RT-5370]\r\n" + Replaced(lines, "\tenable=yes\n", "\tenable=no\n") + kBehind);
}

TEST_F(SavedApSettings, HoldOnlyTheSwitchWhenADisabledAccessPointIsTheFirst) {
  conf_.blEnable = FALSE;
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), "[RT-5370]\n\tenable=no\n");
  EXPECT_EQ(ModeOf(kSettings), 0600u);
  WriteText(kSettings, kBefore);
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), kBefore + "[RT-5370]\n\tenable=no\n");
}

TEST_F(SavedApSettings, AreAllThereAgainWhenTheAccessPointIsSwitchedOnAgain) {
  ExpectSaved();
  MERO_AP_CONF expected = ReadBack(conf_);
  conf_ = MERO_AP_CONF{};
  NameSection(kModel);
  ExpectSaved();
  expected.blEnable = FALSE;
  EXPECT_THAT(Differences(Read(), expected), IsEmpty());
}

// ---- How the section is found ----

TEST_F(SavedApSettings, FindASectionWithoutRegardToCase) {
  WriteText(kSettings, "[ABC]\n\tssid=old\n" + kBehind);
  NameSection("abc");
  ExpectSaved();
  EXPECT_EQ(fake::PLIBCFileSetSection.calls(), 1);
  EXPECT_EQ(ReadText(kSettings), Replaced(office_, kModel, "ABC") + kBehind);
}

// The search finds what is no section: the section is added then nevertheless.
TEST_F(SavedApSettings, GetTheSectionAlsoWhenSomethingElseLooksLikeIt) {
  for (const std::string& text : {std::string("# see [RT-5370] in the manual\n"), std::string("\tssid=[rt-5370]\n"),
                                  std::string("[x]\n\tnote=a[RT-5370]b\n"), std::string("garbage [[RT-5370]]\n")}) {
    fake::Begin();
    WriteText(kSettings, text);
    ExpectSaved();
    EXPECT_EQ(fake::PLIBCFileSetSection.calls(), 1);
    EXPECT_EQ(ReadText(kSettings), text + office_);
  }
}

TEST_F(SavedApSettings, NeverReplaceAModelWhoseNameTheirNameOnlyMatches) {
  const struct {
    const char* szPresent;
    const char* szSaved;
    bool matches;
  } rows[] = {
      {"802x11n", "802.11n", true}, {"aaa", "a*", true},        {"b", "[a-c]", true},
      {"RT-5370", "RT-53", false},  {"RT-5370", "5370", false}, {"x", "y", false},
  };
  for (const auto& row : rows) {
    fake::Begin();
    const std::string present = std::string("[") + row.szPresent + "]\n\tenable=yes\n\tssid=other\n";
    WriteText(kSettings, present);
    NameSection(row.szSaved);
    ExpectSaved();
    EXPECT_EQ(fake::PLIBCFileSetSection.calls(), row.matches ? 1 : 0) << row.szSaved;
    EXPECT_EQ(ReadText(kSettings), present + Replaced(office_, kModel, row.szSaved));
  }
}

// As an expression the name does not find itself: the section is added then, which replaces it.
TEST_F(SavedApSettings, HoldASectionOnceWhoseNameDoesNotMatchItself) {
  for (const char* szName : {"a*b", "a\\b", "x[yz]", "\\(n\\)", "a\\{2\\}", "x[", "back\\"}) {
    std::filesystem::remove(kSettings);
    NameSection(szName);
    conf_.hostapConf.channel = 11;
    ExpectSaved();
    EXPECT_EQ(ReadText(kSettings), Replaced(office_, kModel, szName));
    conf_.hostapConf.channel = 6;
    ExpectSaved();
    EXPECT_EQ(ReadText(kSettings), Replaced(Replaced(office_, kModel, szName), "channel=11", "channel=6"));
  }
}

// The search shows no line then: the section is added, which replaces it.
TEST_F(SavedApSettings, HoldASectionOnceAlsoWhenTheSearchTakesTheFileForNoText) {
  const std::string before = kBefore + std::string("\0\n", 2);
  WriteText(kSettings, before + "[RT-5370]\n\tssid=old\n" + kBehind);
  ExpectSaved();
  EXPECT_EQ(ReadText(kSettings), before + office_ + kBehind);
}

// With the real shell behind the pipe.
TEST_F(SavedApSettings, NeverRunAnyPartOfTheNameOfASection) {
  ForgetCalls();
  for (const BOOL blEnable : {TRUE, FALSE}) {
    conf_.blEnable = blEnable;
    for (const std::string& name : kHostileTexts) {
      WriteText(kSettings, kBefore);
      NameSection(name);
      fake::Begin();
      const BOOL saved = Save();
      EXPECT_FALSE(HasIntruder()) << name;
      EXPECT_EQ(fake::popen.calls(), 1) << name;
      EXPECT_EQ(fake::Messages().empty(), saved == TRUE) << name;
      if (saved == TRUE) {
        EXPECT_EQ(Read().blEnable, blEnable) << name;
      } else {
        EXPECT_EQ(ReadText(kSettings), kBefore) << name;
      }
      ForgetCalls();
    }
  }
}

// ---- What is refused ----

TEST_F(SavedApSettings, StayAsTheyAreWhenAnEncryptionIsRefused) {
  const auto refuse = [this](int encryption, int guestEncryption, const std::string& message) {
    conf_.hostapConf.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
    conf_.hostapConf.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(guestEncryption);
    std::filesystem::remove(kSettings);
    ExpectRefused(message);
    EXPECT_TRUE(std::filesystem::exists(kSettings));
    WriteText(kSettings, kBefore + "[RT-5370]\n\tenable=no\n\tssid=old\n" + kBehind);
    ExpectRefused(message);
  };
  refuse(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_EAP, "Guest Network does not have EAP encryption");
  fake::Begin();
  refuse(AP_ENCRYPT_MAX, AP_ENCRYPT_OPEN, "Wrong encryption");
  fake::Begin();
  refuse(AP_ENCRYPT_OPEN, -1, "Wrong encryption");
}

TEST_F(SavedApSettings, StayAsTheyAreWhenATextCouldNotBeReadBack) {
  const std::string from = "section: " + kModel + " from " + kSettings + ", errno=0x300";
  for (const TextKey& key : kTextKeys) {
    for (const std::string text : {"\n", "two\nlines", "end\n", "a\n[AR-9271]"}) {
      fake::Begin();
      const bool isOfWep = std::strstr(key.szWith, "encryption=1") != nullptr;
      const bool isOfEap = std::strstr(key.szWith, "encryption=3") != nullptr;
      const MERO_AP_ENCRYPT encryption = isOfWep ? AP_ENCRYPT_WEP : AP_ENCRYPT_WPA_PSK;
      conf_ = OfficeSettings(isOfEap ? AP_ENCRYPT_WPA_EAP : encryption, encryption);
      PutText(conf_, key, text.substr(0, key.size - 1));
      std::filesystem::remove(kSettings);
      ExpectRefused("Failed to add " + from);
      EXPECT_EQ(ReadText(kSettings), "") << key.szKey;
      WriteText(kSettings, kBefore + "[RT-5370]\n\tenable=no\n\tssid=old\n" + kBehind);
      ExpectRefused("Failed to set " + from);
    }
  }
  conf_ = OfficeSettings(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
  std::strcpy(conf_.hostapConf.guestNet.szBSSID, "02:11:22:33:44:55\n");
  ExpectRefused("Failed to set " + from);
}

TEST_F(SavedApSettings, StayAsTheyAreWhenTheNameCouldNotBeReadBack) {
  for (const BOOL blEnable : {TRUE, FALSE}) {
    conf_.blEnable = blEnable;
    for (const std::string name : {" ", " a", "a ", "\ta", "a\r", "x\nz", "x]\n[z"}) {
      fake::Begin();
      NameSection(name);
      WriteText(kSettings, kBefore + kBehind);
      ExpectRefused(blEnable != FALSE ? "Failed to add section: " + name + " from " + kSettings + ", errno=0x300"
                                      : "Failed to set key[enable] of sec[" + name + "] in file[" + kSettings + "].");
    }
  }
}

TEST_F(SavedApSettings, AreNotSavedWhenTheDirectoryIsMissing) {
  std::filesystem::rename("/usr/mero/etc", "/usr/mero/gone");
  for (const BOOL blEnable : {TRUE, FALSE}) {
    fake::Begin();
    conf_.blEnable = blEnable;
    EXPECT_EQ(Save(), FALSE);
    EXPECT_EQ(Last(WithoutLines(fake::Messages())), "wireless_ap_conf_set:# Failed to touch " + kSettings);
  }
  std::filesystem::rename("/usr/mero/gone", "/usr/mero/etc");
}

TEST_F(SavedApSettings, AreNotSavedToWhatIsNoFile) {
  std::filesystem::create_directory(kSettings);
  EXPECT_EQ(Save(), FALSE);
  EXPECT_THAT(
      Last(WithoutLines(fake::Messages())),
      HasSubstr("wireless_ap_conf_set:# Failed to add section: " + kModel + " from " + kSettings + ", errno=0x"));
  conf_.blEnable = FALSE;
  EXPECT_EQ(Save(), FALSE);
  EXPECT_EQ(Last(WithoutLines(fake::Messages())),
            "wireless_ap_conf_set:# Failed to set key[enable] of sec[" + kModel + "] in file[" + kSettings + "].");
}

// A failure for a pair that is not written anyway is no failure of the save.
bool HasReportedFailure() {
  return std::ranges::any_of(fake::Messages(),
                             [](const std::string& message) { return message.starts_with("wireless_ap_conf_set:"); });
}

// Without memory the save fails and the file stays, or the save did not need that memory.
void ExpectWholeOrUntouched(MERO_AP_CONF conf, const std::string& before, const std::string& saved, int nLeast) {
  int failures = 0;
  WriteText(kSettings, before);
  const auto save = [&] { return MEROWirelessSetAPConfig(&conf); };
  memory::FailEach(save, [&](int n, BOOL result) {
    EXPECT_EQ(result, HasReportedFailure() ? FALSE : TRUE) << n;
    EXPECT_EQ(ReadText(kSettings), result == TRUE ? saved : before) << n;
    EXPECT_EQ(memory::Held(), 0u) << n;
    failures += result == TRUE ? 0 : 1;
    WriteText(kSettings, before);
    fake::Begin();
  });
  EXPECT_GT(failures, nLeast);
}

TEST_F(SavedApSettings, AreWholeOrUntouchedWheneverMemoryRunsOut) {
  constexpr int kOfPairs = 90;  // three blocks a pair at least
  const std::string old = "[RT-5370]\n\tenable=yes\n\tssid=old\n";
  ExpectWholeOrUntouched(conf_, kBefore + old + kBehind, kBefore + office_ + kBehind, kOfPairs);
  ExpectWholeOrUntouched(conf_, kBefore, kBefore + office_, kOfPairs);
  conf_.blEnable = FALSE;
  ExpectWholeOrUntouched(conf_, kBefore + old + kBehind, kBefore + Replaced(old, "=yes", "=no") + kBehind, 2);
}

TEST_F(SavedApSettings, AreWholeOrEmptyWhenMemoryRunsOutOnTheFirstSave) {
  memory::FailEach([this] { return MEROWirelessSetAPConfig(&conf_); },
                   [&](int n, BOOL result) {
                     EXPECT_EQ(result, HasReportedFailure() ? FALSE : TRUE) << n;
                     EXPECT_EQ(TextOrNothing(kSettings), result == TRUE ? office_ : "") << n;
                     EXPECT_EQ(memory::Held(), 0u) << n;
                     std::filesystem::remove(kSettings);
                     fake::Begin();
                   });
}

// ---- What a read makes of what was saved ----

// Bytes of every kind, and more often those that mean something to a file, to a shell, or at the end of a line.
class AnyRecord {
 public:
  explicit AnyRecord(unsigned seed) : random_(seed) {}

  MERO_AP_CONF Next() {
    MERO_AP_CONF conf{};
    conf.blEnable = static_cast<BOOL>(Number() | 1);
    conf.blWifiUnblock = static_cast<BOOL>(Below(2));
    CopyText(conf.szSecName, kNames[Below(std::size(kNames))]);
    CopyText(conf.hostapConf.guestNet.szBSSID, Text(sizeof conf.hostapConf.guestNet.szBSSID - 1));
    const int encryption = static_cast<int>(Below(4));
    const int guestEncryption = static_cast<int>(Below(3));
    for (const NumberKey& key : kNumberKeys) {
      if (IsNeeded(key.szWith, encryption, guestEncryption)) PutNumber(conf, key, Number());
    }
    for (const TextKey& key : kTextKeys) {
      if (IsNeeded(key.szWith, encryption, guestEncryption)) PutText(conf, key, Text(key.size - 1));
    }
    conf.hostapConf.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
    conf.hostapConf.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(guestEncryption);
    return conf;
  }

 private:
  static constexpr const char* kNames[] = {"RT-5370", "802.11n WLAN Stick", "$(x) `y` \"z\" 'q' \\",
                                           "[a]=*#;", "\xff\x80",           ""};

  static bool IsNeeded(const std::string& with, int encryption, int guestEncryption) {
    return with.empty() || with == "\tencryption=" + std::to_string(encryption) + "\n" ||
           with == "\tguest_net_encryption=" + std::to_string(guestEncryption) + "\n";
  }

  size_t Below(size_t limit) { return std::uniform_int_distribution<size_t>(0, limit - 1)(random_); }
  int Number() { return std::uniform_int_distribution<int>(INT_MIN, INT_MAX)(random_) >> Below(32); }

  char Byte() {
    static constexpr std::string_view kTelling = " \t\r\"'`=#;[]\\$%\xc3\xa9\xff\x80";
    if (Below(2) == 0) return kTelling[Below(kTelling.size())];
    const char c = static_cast<char>(1 + Below(255));
    return c == '\n' ? '\v' : c;
  }

  // A text that a line of a file can hold, every fourth of them the longest.
  std::string Text(size_t longest) {
    std::string text(Below(4) == 0 ? longest : Below(longest + 1), ' ');
    for (char& c : text) c = Byte();
    return text;
  }

  std::mt19937 random_;
};

TEST_F(SavedApSettings, SurviveFieldByFieldWhateverTheBytes) {
  AnyRecord any(7);
  for (int i = 0; i < 300; ++i) {
    conf_ = any.Next();
    // The text that is there already may come from a machine that ends its lines in CR LF.
    if (i % 3 == 0) WriteText(kSettings, "[" + std::string(conf_.szSecName) + "]\r\n\tenable=no\r\n");
    ExpectSaved();
    MERO_AP_CONF expected = ReadBack(conf_);
    expected.blEnable = TRUE;
    ASSERT_THAT(Differences(Read(), expected), IsEmpty()) << i;
  }
}

TEST_F(SavedApSettings, AreTheSameFileWhenWhatWasReadIsSaved) {
  AnyRecord any(11);
  for (int i = 0; i < 50; ++i) {
    conf_ = any.Next();
    std::memset(conf_.hostapConf.guestNet.szBSSID, 0, sizeof conf_.hostapConf.guestNet.szBSSID);
    ExpectSaved();
    const std::string text = ReadText(kSettings);
    conf_ = Read();
    ExpectSaved();
    ASSERT_EQ(ReadText(kSettings), text) << i;
  }
}

}  // namespace
