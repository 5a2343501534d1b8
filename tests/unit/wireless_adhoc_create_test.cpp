#include <climits>
#include <cstring>

#include "hostile_texts.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

constexpr char kTool[] = "/usr/sbin/iwconfig";
constexpr char kSetsEssid[] = "/sbin/iwconfig wlan0 essid cell > /dev/null 2>&1";
constexpr char kSetsNoKey[] = "/sbin/iwconfig wlan0 key off";

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_adhoc_create:# " + message);
}

// All that creating an open cell does.
const std::vector<std::string> kCourse = {
    "MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()",
    "PLIBNetIfDown(wlan0)",     "MEROWirelessOpmodeSet(1)",
    RunOf(kSetsEssid),          RunOf(kSetsNoKey),
    "PLIBNetIfUp(wlan0)",
};

// The course up to the step that fails, and the report of that.
std::vector<std::string> CourseUpTo(const std::string& failing, const std::string& message) {
  const auto at = std::ranges::find(kCourse, failing);
  EXPECT_NE(at, kCourse.end()) << failing;
  std::vector<std::string> course(kCourse.begin(), at + 1);
  course.push_back(ReportOf(message));
  return course;
}

class AdhocCell : public UnitTest {
 protected:
  AdhocCell() {
    Begin();
    std::strcpy(config_.network.szEssid, "cell");
    config_.network.opmode = WIRELESS_OPMODE_ADHOC;
    config_.network.encrypt = WIRELESS_ENCRYPT_NONE;
  }

  static void Begin() {
    fake::Begin();
    fake::MEROWirelessAdapterNum.Returns(1);
    fake::MEROWirelessInterfaceGet.Returns("wlan0");
    fake::PLIBNetIfDown.Returns(1);
    fake::PLIBNetIfUp.Returns(1);
    fake::MEROWirelessOpmodeSet.Returns(0);
    fake::system.Returns(0);
  }

  // As above, but that commands are real ones.
  static void BeginWithTool() {
    Begin();
    fake::system.Does([](const char* szCommand) { return fake::system.Real(szCommand); });
    ForgetCalls();
  }

  int Create() {
    return memory::Run(0, [this] { return MEROWirelessAdhocCreate(&config_); });
  }

  void SetKey(const std::string& key) {
    config_.network.encrypt = WIRELESS_ENCRYPT_WEP;
    std::strcpy(config_.szKey, key.c_str());
  }

  WIRELESS_NETWORK_CONFIG config_{};
};

TEST_F(AdhocCell, IsCreatedWhileTheInterfaceIsDown) {
  EXPECT_EQ(Create(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kCourse));
}

TEST_F(AdhocCell, WithoutEncryptionIgnoresTheKey) {
  for (const char* szKey : {"abcde", "seven77", "0123456789"}) {
    Begin();
    std::strcpy(config_.szKey, szKey);
    EXPECT_EQ(Create(), 0);
    EXPECT_THAT(Steps(), ElementsAreArray(kCourse)) << szKey;
  }
}

TEST_F(AdhocCell, TakesAKeyAsTextOrDigitsByItsLengthAlone) {
  const struct {
    std::string key;
    std::string command;
  } kKeys[] = {
      {"abcde", "/sbin/iwconfig wlan0 key open s:abcde > /dev/null 2>&1"},
      {"12345", "/sbin/iwconfig wlan0 key open s:12345 > /dev/null 2>&1"},
      {"thirteenchars", "/sbin/iwconfig wlan0 key open s:thirteenchars > /dev/null 2>&1"},
      {"0123456789", "/sbin/iwconfig wlan0 key open 0123456789 > /dev/null 2>&1"},
      {"notinbase8", "/sbin/iwconfig wlan0 key open notinbase8 > /dev/null 2>&1"},
      {"0123456789abcdef0123456789", "/sbin/iwconfig wlan0 key open 0123456789abcdef0123456789 > /dev/null 2>&1"},
      {"zyxwvutsrqponmlkjihgfedcba", "/sbin/iwconfig wlan0 key open zyxwvutsrqponmlkjihgfedcba > /dev/null 2>&1"},
      {"a b$c", "/sbin/iwconfig wlan0 key open s:'a b$c' > /dev/null 2>&1"},
  };
  for (const auto& row : kKeys) {
    Begin();
    SetKey(row.key);
    EXPECT_EQ(Create(), 0) << row.key;
    std::vector<std::string> course = kCourse;
    *std::ranges::find(course, RunOf(kSetsNoKey)) = RunOf(row.command);
    EXPECT_THAT(Steps(), ElementsAreArray(course)) << row.key;
  }
}

TEST_F(AdhocCell, WithAKeyOfAnotherLengthFailsAndLeavesTheInterfaceDown) {
  for (size_t size = 0; size <= 256; ++size) {
    if (size == 5 || size == 13 || size == 10 || size == 26) continue;
    Begin();
    SetKey(std::string(size, '0'));
    EXPECT_EQ(Create(), -1) << size;
    EXPECT_THAT(Steps(), ElementsAreArray(CourseUpTo(RunOf(kSetsEssid), "The key is not standard WEP format.")))
        << size;
  }
}

TEST_F(AdhocCell, RejectsNull) {
  EXPECT_EQ(MEROWirelessAdhocCreate(nullptr), -1);
  EXPECT_THAT(Steps(), ElementsAre(ReportOf("Bad parameters")));
}

TEST_F(AdhocCell, NeedsAnAdapter) {
  config_.network.opmode = WIRELESS_OPMODE_MANAGED;  // which would be refused behind this
  for (const int none : {0, -1, INT_MIN}) {
    Begin();
    fake::MEROWirelessAdapterNum.Returns(none);
    EXPECT_EQ(Create(), -1);
    EXPECT_THAT(Steps(), ElementsAre(kCourse[0], ReportOf("There is no wireless USB adapter plugged"))) << none;
  }
}

TEST_F(AdhocCell, LeavesTheInterfaceAloneForANetworkThatIsNone) {
  config_.network.encrypt = WIRELESS_ENCRYPT_AES;  // which would be refused behind this
  for (const int opmode : {0, 2, 3, 4, 5, 6, 7, 8, -1, 257}) {
    Begin();
    config_.network.opmode = static_cast<WIRELESS_OPMODE>(opmode);
    EXPECT_EQ(Create(), -1);
    EXPECT_THAT(Steps(), ElementsAre(kCourse[0], kCourse[1], ReportOf("Interface wlan0 is not Adhoc mode."))) << opmode;
  }
}

TEST_F(AdhocCell, LeavesTheInterfaceAloneForAnEncryptionThatACellCannotHave) {
  const struct {
    int encrypt;
    std::string text;
  } kEncryptions[] = {{0, "UNKNOWN"},  {4, "TKIP"},     {8, "AES"},      {12, "TKIPAES"},
                      {6, "UNKNOWN"},  {3, "UNKNOWN"},  {5, "UNKNOWN"},  {10, "UNKNOWN"},
                      {14, "UNKNOWN"}, {-1, "UNKNOWN"}, {16, "UNKNOWN"}, {257, "UNKNOWN"}};
  for (const auto& row : kEncryptions) {
    Begin();
    config_.network.encrypt = static_cast<WIRELESS_ENCRYPT>(row.encrypt);
    EXPECT_EQ(Create(), -1);
    EXPECT_THAT(Steps(), ElementsAre(kCourse[0], kCourse[1],
                                     "MEROWirelessEncryptStringGet(" + std::to_string(row.encrypt) + ", 0)",
                                     ReportOf("Adhoc mode does not support encryption [" + row.text + "].")))
        << row.encrypt;
  }
}

TEST_F(AdhocCell, FailsWhenTheInterfaceStaysUp) {
  fake::PLIBNetIfDown.Returns(0);
  EXPECT_EQ(Create(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(CourseUpTo("PLIBNetIfDown(wlan0)", "Failed to deactivate network interface [wlan0].")));
}

TEST_F(AdhocCell, FailsWhenTheDriverRefusesTheMode) {
  for (const int result : {-1, INT_MIN}) {
    Begin();
    fake::MEROWirelessOpmodeSet.Returns(result);
    EXPECT_EQ(Create(), -1);
    EXPECT_THAT(Steps(),
                ElementsAreArray(CourseUpTo("MEROWirelessOpmodeSet(1)", "Failed to set Ad-Hoc mode of wlan0.")));
  }
}

TEST_F(AdhocCell, FailsWhenTheNameCannotBeSet) {
  for (const int result : {-1, INT_MIN}) {
    Begin();
    fake::system.Returns(result, 0);
    EXPECT_EQ(Create(), -1);
    EXPECT_THAT(Steps(),
                ElementsAreArray(CourseUpTo(RunOf(kSetsEssid), "Failed to execute '" + std::string(kSetsEssid) + "'")));
  }
}

TEST_F(AdhocCell, FailsWhenTheKeyCannotBeSet) {
  fake::system.Returns(0, -1);
  EXPECT_EQ(Create(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(CourseUpTo(RunOf(kSetsNoKey), "Failed to execute '" + std::string(kSetsNoKey) + "'")));

  for (const char* szKey : {"abcde", "0123456789"}) {
    Begin();
    fake::system.Returns(0, -1);
    SetKey(szKey);
    EXPECT_EQ(Create(), -1);
    EXPECT_EQ(Last(Steps()), ReportOf("Failed to execute '/sbin/iwconfig wlan0 key open " +
                                      std::string(*szKey == 'a' ? "s:" : "") + szKey + " > /dev/null 2>&1'"));
    EXPECT_EQ(fake::PLIBNetIfUp.calls(), 0);
  }
}

TEST_F(AdhocCell, FailsWhenTheInterfaceStaysDown) {
  fake::PLIBNetIfUp.Returns(0);
  EXPECT_EQ(Create(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(CourseUpTo("PLIBNetIfUp(wlan0)", "Failed to activate network interface wlan0")));
}

TEST_F(AdhocCell, TakesForSuccessWhateverIsNoFailure) {
  fake::MEROWirelessAdapterNum.Returns(3);
  fake::PLIBNetIfDown.Returns(-1);
  fake::PLIBNetIfUp.Returns(-1);
  fake::MEROWirelessOpmodeSet.Returns(1);
  fake::system.Returns(256, INT_MAX);
  EXPECT_EQ(Create(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kCourse));
}

TEST_F(AdhocCell, IsMadeOfAnInterfaceNameOfUpTo15Characters) {
  fake::MEROWirelessInterfaceGet.Returns("wireless-interface0");
  EXPECT_EQ(Create(), 0);
  EXPECT_THAT(Steps(), ElementsAre("MEROWirelessAdapterNum()", "MEROWirelessInterfaceGet()",
                                   "PLIBNetIfDown(wireless-interf)", "MEROWirelessOpmodeSet(1)",
                                   RunOf("/sbin/iwconfig wireless-interf essid cell > /dev/null 2>&1"),
                                   RunOf("/sbin/iwconfig wireless-interf key off"), "PLIBNetIfUp(wireless-interf)"));
}

// ---- Names and keys in the shell ----

const Call kNoKeyCall = {"/sbin/iwconfig", "wlan0", "key", "off"};

TEST_F(AdhocCell, HasItsNameUnchangedWhateverThatHolds) {
  InstallNoter(kTool);
  for (const std::string& name : kHostileTexts) {
    BeginWithTool();
    std::strcpy(config_.network.szEssid, name.c_str());
    EXPECT_EQ(Create(), 0) << name;
    EXPECT_THAT(NotedCalls(), ElementsAre(Call{"/sbin/iwconfig", "wlan0", "essid", name}, kNoKeyCall)) << name;
    EXPECT_FALSE(HasIntruder()) << name;
  }
}

TEST_F(AdhocCell, HasItsKeyUnchangedWhateverThatHolds) {
  InstallNoter(kTool);
  for (const std::string& text : kHostileTexts) {
    for (const size_t size : {5u, 10u, 13u, 26u}) {
      std::string key = text.substr(0, size);
      key.resize(size, 'x');
      BeginWithTool();
      SetKey(key);
      EXPECT_EQ(Create(), 0) << key;
      const std::string word = (size == 5 || size == 13 ? "s:" : "") + key;
      EXPECT_THAT(NotedCalls(), ElementsAre(Call{"/sbin/iwconfig", "wlan0", "essid", "cell"},
                                            Call{"/sbin/iwconfig", "wlan0", "key", "open", word}))
          << key;
      EXPECT_FALSE(HasIntruder()) << key;
    }
  }
}

TEST_F(AdhocCell, IsMadeOfAnInterfaceOfAnyName) {
  InstallNoter(kTool);
  for (const std::string& text : kHostileTexts) {
    const std::string name = text.substr(0, 15);
    BeginWithTool();
    fake::MEROWirelessInterfaceGet.Returns(name.c_str());
    EXPECT_EQ(Create(), 0) << name;
    EXPECT_THAT(NotedCalls(),
                ElementsAre(Call{"/sbin/iwconfig", name, "essid", "cell"}, Call{"/sbin/iwconfig", name, "key", "off"}))
        << name;
    EXPECT_FALSE(HasIntruder()) << name;
  }
}

TEST_F(AdhocCell, WithAnEmptyNameGivesTheToolAnEmptyName) {
  InstallNoter(kTool);
  BeginWithTool();
  config_.network.szEssid[0] = '\0';
  EXPECT_EQ(Create(), 0);
  EXPECT_THAT(NotedCalls(), ElementsAre(Call{"/sbin/iwconfig", "wlan0", "essid", ""}, kNoKeyCall));
}

// Of 32 bytes, each of which needs four once it is quoted.
const std::string kLongestQuoted(32, '\'');

TEST_F(AdhocCell, IsNotCreatedUnderAPartOfItsName) {
  std::strcpy(config_.network.szEssid, kLongestQuoted.c_str());
  EXPECT_EQ(Create(), -1);
  EXPECT_EQ(fake::system.calls(), 0);
  std::string command = "/sbin/iwconfig wlan0 essid '";
  while (command.size() < 127) command += "'\\''";
  EXPECT_THAT(Steps(), ElementsAre(kCourse[0], kCourse[1], kCourse[2], kCourse[3],
                                   ReportOf("Failed to execute '" + command.substr(0, 127) + "'")));
}

TEST_F(AdhocCell, IsNotCreatedWithAPartOfItsKey) {
  SetKey(std::string(26, '\''));
  EXPECT_EQ(Create(), -1);
  EXPECT_EQ(fake::system.calls(), 1);  // for the name
  std::string command = "/sbin/iwconfig wlan0 key open '";
  while (command.size() < 127) command += "'\\''";
  EXPECT_EQ(Last(Steps()), ReportOf("Failed to execute '" + command.substr(0, 127) + "'"));
}

// A command has up to 127 bytes.
TEST_F(AdhocCell, IsCreatedUnderTheLongestNameThatFits) {
  const size_t room = 127 - std::strlen("/sbin/iwconfig wlan0 essid '' > /dev/null 2>&1");
  const size_t nQuotes = (room - 32) / 3;
  const std::string fitting = std::string(nQuotes, '\'') + std::string(32 - nQuotes, ' ');
  const std::string tooLong = std::string(nQuotes + 1, '\'') + std::string(31 - nQuotes, ' ');
  InstallNoter(kTool);
  BeginWithTool();
  std::strcpy(config_.network.szEssid, fitting.c_str());
  EXPECT_EQ(Create(), 0);
  EXPECT_THAT(NotedCalls(), ElementsAre(Call{"/sbin/iwconfig", "wlan0", "essid", fitting}, kNoKeyCall));

  BeginWithTool();
  std::strcpy(config_.network.szEssid, tooLong.c_str());
  EXPECT_EQ(Create(), -1);
  EXPECT_THAT(NotedCalls(), IsEmpty());
}

}  // namespace
