#include <climits>
#include <filesystem>

#include "hostile_texts.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr int kUsable = 1;
constexpr int kBlocked = 0;
constexpr int kUnknown = -1;

const std::string kSettings = "/usr/mero/etc/wireless_ap.conf";
const std::string kInfo = "/tmp/wireless.info";

const std::string kAsksForSettings = "PLIBCFileExist(" + kSettings + ")";
const std::string kReadsProduct = "PLIBCFileGetKeyValue(" + kInfo + ", PRODUCT, &, 1024, 0)";
const std::string kSaysFileNotFound = "PLIBCErrSet(1792)";
const std::string kAsksForHash = "PLIBCSzHashAlloc(1024)";
const std::string kReadsSection = "PLIBCFileGetSection(" + kSettings + ", RT-5370, &)";
const std::string kReadsSwitch = "PLIBCSzHashGetValue(&, unblock)";
const std::string kFreesHash = "PLIBCSzHashFree(&)";

// ---- What is asked of the platform, and what is made of its answers ----

class BlockCheck : public UnitTest {
 protected:
  BlockCheck() { Begin(); }

  // From here on the settings have a section for the adapter, which says that the radio may be used.
  static void Begin() {
    fake::Begin();
    fake::PLIBCFileExist.Returns(1);
    fake::PLIBCFileGetKeyValue.Does([](const char*, const char*, char* szValue, size_t cbValue, int) {
      EXPECT_TRUE(std::all_of(szValue, szValue + cbValue, [](char c) { return c == '\0'; }));
      std::snprintf(szValue, cbValue, "RT-5370");
      return 1;
    });
    fake::PLIBCFileGetSection.Returns(1);
    fake::PLIBCSzHashGetValue.Returns("yes");
  }

  static int Check() {
    return memory::Run(0, [] { return MEROWirelessCheckBlock(); });
  }
};

TEST_F(BlockCheck, LooksAtTheSectionOfTheAdapterThatIsPluggedIn) {
  EXPECT_EQ(Check(), kUsable);
  EXPECT_THAT(fake::Effects(),
              ElementsAre(kAsksForSettings, kReadsProduct, kAsksForHash, kReadsSection, kReadsSwitch, kFreesHash));
}

TEST_F(BlockCheck, NeedsNothingButTheAbsenceOfSettingsToLetTheRadioBeUsed) {
  fake::PLIBCFileExist.Returns(0);
  EXPECT_EQ(Check(), kUsable);
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForSettings));
}

TEST_F(BlockCheck, TakesAnyAnswerButZeroForSettingsThatAreThere) {
  fake::PLIBCFileExist.Returns(-1);
  fake::PLIBCSzHashGetValue.Returns("no");
  EXPECT_EQ(Check(), kBlocked);
}

TEST_F(BlockCheck, CannotTellWithoutTheNameOfTheAdapter) {
  for (const int result : {0, -1, INT_MIN}) {
    Begin();
    fake::PLIBCFileGetKeyValue.Returns(result);
    EXPECT_EQ(Check(), kUnknown);
    EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForSettings, kReadsProduct, kSaysFileNotFound)) << result;
  }
}

TEST_F(BlockCheck, CannotTellWithoutMemoryAndSetsNoErrorCode) {
  fake::PLIBCSzHashAlloc.Returns(nullptr);
  EXPECT_EQ(Check(), kUnknown);
  EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForSettings, kReadsProduct, kAsksForHash));
}

TEST_F(BlockCheck, LetsARadioBeUsedThatHasNoSettings) {
  for (const int result : {0, -1, INT_MIN}) {
    Begin();
    fake::PLIBCFileGetSection.Returns(result);
    EXPECT_EQ(Check(), kUsable);
    EXPECT_THAT(fake::Effects(), ElementsAre(kAsksForSettings, kReadsProduct, kAsksForHash, kReadsSection, kFreesHash))
        << result;
  }
}

TEST_F(BlockCheck, TakesAnyAnswerAboveZeroForSuccess) {
  fake::PLIBCFileGetKeyValue.Does([](const char*, const char*, char* szValue, size_t cbValue, int) {
    std::snprintf(szValue, cbValue, "RT-5370");
    return 7;
  });
  fake::PLIBCFileGetSection.Returns(7);
  fake::PLIBCSzHashGetValue.Returns("no");
  EXPECT_EQ(Check(), kBlocked);
}

TEST_F(BlockCheck, CannotTellFromASectionWithoutTheSwitch) {
  fake::PLIBCSzHashGetValue.Returns(static_cast<const char*>(nullptr));
  EXPECT_EQ(Check(), kUnknown);
  EXPECT_THAT(fake::Effects(),
              ElementsAre(kAsksForSettings, kReadsProduct, kAsksForHash, kReadsSection, kReadsSwitch, kFreesHash));
}

TEST_F(BlockCheck, SaysBlockedForNothingButNo) {
  fake::PLIBCSzHashGetValue.Returns("no");
  EXPECT_EQ(Check(), kBlocked);
  for (const char* szOther : {"yes", "No", "NO", "nO", "0", "", " no", "no ", "not", "n", "false", "off"}) {
    fake::PLIBCSzHashGetValue.Returns(szOther);
    EXPECT_EQ(Check(), kUsable) << szOther;
  }
}

TEST_F(BlockCheck, AsksForTheSectionUnderTheVeryNameOfTheAdapter) {
  for (const std::string& name : kHostileTexts) {
    Begin();
    fake::PLIBCFileGetKeyValue.Does([&](const char*, const char*, char* szValue, size_t cbValue, int) {
      std::snprintf(szValue, cbValue, "%s", name.c_str());
      return 1;
    });
    EXPECT_EQ(Check(), kUsable);
    EXPECT_THAT(fake::EffectsOf({"PLIBCFileGetSection"}),
                ElementsAre("PLIBCFileGetSection(" + kSettings + ", " + name + ", &)"));
    EXPECT_EQ(fake::system.calls() + fake::popen.calls() + fake::PLIBCExec.calls(), 0);
  }
}

// ---- What the real files make of it ----

class RadioSwitch : public UnitTest {
 protected:
  RadioSwitch() {
    std::filesystem::remove_all(kSettings);
    WriteText(kInfo, "PRODUCT=RT-5370\n");
    PLIBCErrSet(ERR_NONE);
  }
};

constexpr char kOther[] = "[AR-9271]\n\tunblock=no\n";

TEST_F(RadioSwitch, IsOnWithoutSettingsWhetherAnAdapterIsAnnouncedOrNot) {
  EXPECT_EQ(MEROWirelessCheckBlock(), kUsable);
  std::filesystem::remove(kInfo);
  EXPECT_EQ(MEROWirelessCheckBlock(), kUsable);
  EXPECT_EQ(PLIBCErrGet(), ERR_NONE);
}

TEST_F(RadioSwitch, IsUnknownWithoutAnAnnouncedAdapter) {
  WriteText(kSettings, kOther);
  for (const char* szInfo : {"", "VENDOR=x\n", "product=AR-9271\n"}) {
    WriteText(kInfo, szInfo);
    PLIBCErrSet(ERR_NONE);
    EXPECT_EQ(MEROWirelessCheckBlock(), kUnknown) << szInfo;
    EXPECT_EQ(PLIBCErrGet(), 0x0700) << szInfo;
  }
  std::filesystem::remove(kInfo);
  PLIBCErrSet(ERR_NONE);
  EXPECT_EQ(MEROWirelessCheckBlock(), kUnknown);
  EXPECT_EQ(PLIBCErrGet(), 0x0700);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(RadioSwitch, IsOnForAnAdapterWithoutASection) {
  WriteText(kSettings, kOther);
  EXPECT_EQ(MEROWirelessCheckBlock(), kUsable);
  WriteText(kSettings, "");
  EXPECT_EQ(MEROWirelessCheckBlock(), kUsable);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(RadioSwitch, IsWhatTheSectionOfTheAdapterSays) {
  const struct {
    const char* szSection;
    int answer;
  } kSections[] = {
      {"\tunblock=no\n", kBlocked},
      {"\tenable=yes\n\tunblock=no\n\tssid=x\n", kBlocked},
      {"\tunblock=yes\n\tunblock=no\n", kBlocked},
      {"\tunblock=yes\n", kUsable},
      {"\tunblock=No\n", kUsable},
      {"\tunblock=0\n", kUsable},
      {"\tunblock=\n", kUsable},
      {"\tunblock=no,\n", kUsable},
      {"\tenable=no\n", kUnknown},
      {"\tUNBLOCK=no\n", kUnknown},
      {"", kUnknown},
  };
  for (const auto& section : kSections) {
    WriteText(kSettings, kOther + ("[RT-5370]\n" + std::string(section.szSection)) + "[RT]\n\tunblock=no\n");
    EXPECT_EQ(memory::Run(0, [] { return MEROWirelessCheckBlock(); }), section.answer) << section.szSection;
    EXPECT_EQ(memory::Held(), 0u) << section.szSection;
  }
  EXPECT_EQ(PLIBCErrGet(), ERR_NONE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(RadioSwitch, IsFoundForAdapterNamesInQuotesAndWithBlanks) {
  WriteText(kInfo, "VENDOR=\"x\"\nPRODUCT=\"WLAN Stick 'N' $HOME\"\n");
  WriteText(kSettings, kOther + std::string("[WLAN Stick 'N' $HOME]\n\tunblock=no\n"));
  EXPECT_EQ(MEROWirelessCheckBlock(), kBlocked);
}

TEST_F(RadioSwitch, LeavesNothingBehindAndReportsNothingItselfWhenMemoryRunsOut) {
  WriteText(kSettings, kOther + std::string("[RT-5370]\n\tunblock=no\n"));
  int failures = 0;
  memory::FailEach([] { return MEROWirelessCheckBlock(); },
                   [&](int n, int answer) {
                     EXPECT_EQ(memory::Held(), 0u) << n;
                     failures += memory::HasFailed() ? 1 : 0;
                     if (!memory::HasFailed()) {
                       EXPECT_EQ(answer, kBlocked);
                     }
                   });
  EXPECT_GT(failures, 3);
  for (const std::string& message : fake::Messages()) {
    EXPECT_THAT(message, testing::Not(testing::StartsWith("wireless_check_block")));
  }
}

}  // namespace
