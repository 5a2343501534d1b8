// Saving the access-point settings: the questions to the platform and to the shell, and the effect of their answers.
#include <climits>

#include "ap_settings.h"
#include "reports.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

const std::string kFormat = "\t%s=%s\n";
const std::string kHeaderLine = "[" + kModel + "]\n";

const std::string kAsksForHash = "PLIBCSzHashAlloc(1024)";
const std::string kFreesHash = "PLIBCSzHashFree(&)";
const std::string kAsksForFile = "PLIBCFileExist(" + kSettings + ")";
const std::string kMakesFile = "PLIBCFileTouch(" + kSettings + ")";
const std::string kLooksForSection = "popen(grep -i \"\\[" + kModel + "\\]\" " + kSettings + ", r)";
const std::string kEndsLooking = "pclose(&)";
const std::string kAddsSection = "PLIBCFileAddSection(" + kSettings + ", " + kModel + ", &, " + kFormat + ")";
const std::string kSetsSection = "PLIBCFileSetSection(" + kSettings + ", " + kModel + ", null, &, " + kFormat + ")";
const std::string kSwitchesOff =
    "PLIBCFileSetSectionValue(" + kSettings + ", " + kModel + ", enable, no, " + kFormat + ")";
const std::string kAsksForError = "PLIBCErrGet()";

std::string Report(const std::string& message) {
  return fake::Report("wireless_ap_conf_set:# " + message);
}

// The lines of a section as they are put into the hash, one by one.
std::vector<std::string> PairsPut(const std::string& lines) {
  std::vector<std::string> pairs;
  for (size_t begin = 0; begin < lines.size();) {
    const size_t equals = lines.find('=', begin);
    const size_t end = lines.find('\n', begin);
    pairs.push_back("PLIBCSzHashSetValue(&, " + lines.substr(begin + 1, equals - begin - 1) + ", " +
                    lines.substr(equals + 1, end - equals - 1) + ")");
    begin = end + 1;
  }
  return pairs;
}

// Both are put whether or not the access point is switched on.
const std::string kPutsEnable = "PLIBCSzHashSetValue(&, enable, no)";
const std::string kPutsUnblock = "PLIBCSzHashSetValue(&, unblock, no)";

// A save where the world does as the test says: at first, all goes well and the section is there.
class ApSave : public UnitTest {
 protected:
  ApSave() { Begin(); }

  static void Begin() {
    fake::Begin();
    fake::PLIBCFileExist.Returns(1);
    fake::PLIBCFileTouch.Returns(0);
    fake::PipesGive({kHeaderLine});
    fake::PLIBCFileAddSection.Returns(1);
    fake::PLIBCFileSetSection.Returns(1);
    fake::PLIBCFileSetSectionValue.Returns(0);
    fake::PLIBCErrGet.Returns(0xBEEF);
  }

  BOOL Run() {
    return memory::Run(0, [this] { return MEROWirelessSetAPConfig(&conf_); });
  }

  // The steps of a save that gets as far as the pairs: those before them, and those behind.
  static std::vector<std::string> StepsAroundPairs(std::vector<std::string> before,
                                                   const std::vector<std::string>& behind) {
    const std::vector<std::string> pairs = PairsPut(OfficeLines(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP));
    before.insert(before.end(), pairs.begin(), pairs.end());
    before.insert(before.end(), behind.begin(), behind.end());
    return before;
  }

  // Whether anything was asked for that changes what a section holds.
  static bool HasWritten() {
    return fake::PLIBCFileAddSection.calls() + fake::PLIBCFileSetSection.calls() +
               fake::PLIBCFileSetSectionValue.calls() >
           0;
  }

  MERO_AP_CONF conf_ = OfficeSettings(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WEP);
};

// ---- The steps of a save that succeeds ----

TEST_F(ApSave, ReplacesTheSectionOfAModelThatIsKnown) {
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking},
                                                         {kSetsSection, kFreesHash})));
}

TEST_F(ApSave, AddsASectionForAModelThatIsNotKnown) {
  fake::PipesGive({""});
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking},
                                                         {kAddsSection, kFreesHash})));
}

TEST_F(ApSave, CreatesAMissingFileAndAddsTheSection) {
  fake::PLIBCFileExist.Returns(0);
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(Steps(),
              ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kMakesFile}, {kAddsSection, kFreesHash})));
}

TEST_F(ApSave, OfADisabledAccessPointOnlySwitchesItOff) {
  conf_.blEnable = FALSE;
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking, kPutsEnable,
                                   kPutsUnblock, kSwitchesOff, kFreesHash));
  Begin();
  fake::PLIBCFileExist.Returns(0);
  conf_.blWifiUnblock = TRUE;
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, kAsksForFile, kMakesFile, kPutsEnable,
                                   "PLIBCSzHashSetValue(&, unblock, yes)", kSwitchesOff, kFreesHash));
}

TEST_F(ApSave, OfADisabledAccessPointCaresForNothingElseInTheRecord) {
  conf_.blEnable = FALSE;
  conf_.hostapConf.encryption = AP_ENCRYPT_MAX;
  conf_.hostapConf.guestNet.encryption = AP_ENCRYPT_WPA_EAP;
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(ApSave, TakesWhateverAnswerIsNoFailureForSuccess) {
  fake::PLIBCFileExist.Returns(-1);  // not zero: it exists
  fake::PLIBCFileSetSection.Returns(2);
  EXPECT_EQ(Run(), TRUE);
  EXPECT_EQ(fake::PLIBCFileSetSection.calls(), 1);
  fake::PLIBCFileExist.Returns(0);
  fake::PLIBCFileTouch.Returns(1);
  fake::PLIBCFileAddSection.Returns(2);
  EXPECT_EQ(Run(), TRUE);
  EXPECT_EQ(fake::PLIBCFileAddSection.calls(), 1);
  conf_.blEnable = FALSE;
  fake::PLIBCFileSetSectionValue.Returns(1);
  EXPECT_EQ(Run(), TRUE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

// A hash moves when it grows, and a platform may hand out another one.
TEST_F(ApSave, WritesAndFreesTheHashThatThePlatformLeaves) {
  PPLIBSZHASH pshMoved = nullptr;
  fake::PLIBCSzHashSetValue.Does([&](PPLIBSZHASH* ppshHash, const char*, const char*) {
    if (pshMoved != nullptr) {
      EXPECT_EQ(*ppshHash, pshMoved);
    }
    fake::PLIBCSzHashFree.Real(*ppshHash);
    pshMoved = *ppshHash = fake::PLIBCSzHashAlloc.Real(1024);
    return 1;
  });
  fake::PLIBCFileSetSection.Does([&](const char*, const char*, const char*, const PLIBSZHASH* pshHash, const char*) {
    EXPECT_EQ(pshHash, pshMoved);
    return 1;
  });
  fake::PLIBCSzHashFree.Does([&](PPLIBSZHASH pshHash) {
    EXPECT_EQ(pshHash, pshMoved);
    fake::PLIBCSzHashFree.Real(pshHash);
  });
  EXPECT_EQ(Run(), TRUE);
  EXPECT_EQ(fake::PLIBCSzHashFree.calls(), 1);
}

// ---- Whether the section exists ----

TEST_F(ApSave, LooksForTheNameAsItIsWhateverTheShellWouldMakeOfIt) {
  const struct {
    const char* szName;
    const char* szPattern;
  } rows[] = {
      {"RT-5370", "RT-5370"},
      {"802.11n WLAN Stick", "802.11n WLAN Stick"},
      {"", ""},
      {"it's; <a> & |b| #c (d) *~!?", "it's; <a> & |b| #c (d) *~!?"},
      {"$(touch /tmp/x)", "\\$(touch /tmp/x)"},
      {"`touch /tmp/x`", "\\`touch /tmp/x\\`"},
      {"\";touch /tmp/x\"", "\\\";touch /tmp/x\\\""},
      {"a\\", "a\\\\"},
      {"$$$$$$$$$$$$$$$$$$$$$$$$$$$$$$$",
       "\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$\\$"
       "\\$\\$\\$\\$\\$"},
      {"a\nb", "a\nb"},
      {"%s%n", "%s%n"},
      {"\xff\x80", "\xff\x80"},
  };
  for (const auto& row : rows) {
    Begin();
    std::strcpy(conf_.szSecName, row.szName);
    EXPECT_EQ(Run(), TRUE);
    EXPECT_THAT(fake::EffectsOf({"popen"}),
                ElementsAre(std::string("popen(grep -i \"\\[") + row.szPattern + "\\]\" " + kSettings + ", r)"));
    EXPECT_THAT(fake::EffectsOf({"PLIBCFileSetSection"}),
                ElementsAre("PLIBCFileSetSection(" + kSettings + ", " + row.szName + ", null, &, " + kFormat + ")"));
  }
}

TEST_F(ApSave, FindsTheSectionWhereverTheFirstLineThatComesHasAByte) {
  const struct {
    std::string output;
    bool exists;
  } rows[] = {
      {"", false}, {std::string(1, '\0'), false}, {"\n", true},     {" ", true},
      {"x", true}, {"# see [rt-5370]\n", true},   {"x\ny\n", true}, {std::string(5000, 'x'), true},
  };
  for (const auto& row : rows) {
    Begin();
    fake::PipesGive({row.output});
    EXPECT_EQ(Run(), TRUE);
    EXPECT_EQ(fake::PLIBCFileSetSection.calls(), row.exists ? 1 : 0) << row.output;
    EXPECT_EQ(fake::PLIBCFileAddSection.calls(), row.exists ? 0 : 1) << row.output;
    EXPECT_EQ(fake::pclose.calls(), 1);
  }
}

// ---- Failures ----

TEST_F(ApSave, RejectsNullAndTouchesNothing) {
  EXPECT_EQ(MEROWirelessSetAPConfig(nullptr), FALSE);
  EXPECT_THAT(Steps(), ElementsAre(Report("Bad parameters")));
}

TEST_F(ApSave, FailsWithoutMemoryForTheHashAndTouchesNothing) {
  for (const BOOL blEnable : {TRUE, FALSE}) {
    Begin();
    fake::PLIBCSzHashAlloc.Returns(nullptr);
    conf_.blEnable = blEnable;
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, Report("Failed to alloc memory")));
  }
}

TEST_F(ApSave, FailsWhenTheSectionCannotBeLookedFor) {
  for (const BOOL blEnable : {TRUE, FALSE}) {
    Begin();
    fake::PipesGive({fake::kNoPipe});
    conf_.blEnable = blEnable;
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, kAsksForFile, kLooksForSection, Report("Failed to execute command"),
                                     kFreesHash));
  }
}

TEST_F(ApSave, FailsWhenTheFileCannotBeCreated) {
  for (const int result : {-1, -5}) {
    Begin();
    fake::PLIBCFileExist.Returns(0);
    fake::PLIBCFileTouch.Returns(result);
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, kAsksForFile, kMakesFile, Report("Failed to touch " + kSettings),
                                     kFreesHash));
  }
}

TEST_F(ApSave, FailsWhenTheSectionCannotBeReplacedAndTellsTheErrorCode) {
  const std::string message = "Failed to set section: " + kModel + " from " + kSettings + ", errno=";
  for (const auto& [result, code, text] : {std::tuple(0, 0xBEEF, "0xBEEF"), {-1, 0, "0x0"}, {-1, -1, "0xFFFFFFFF"}}) {
    Begin();
    fake::PLIBCFileSetSection.Returns(result);
    fake::PLIBCErrGet.Returns(code);
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(Steps(),
                ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking},
                                                  {kSetsSection, kAsksForError, Report(message + text), kFreesHash})));
  }
}

TEST_F(ApSave, FailsWhenTheSectionCannotBeAddedAndTellsTheErrorCode) {
  const std::string message = "Failed to add section: " + kModel + " from " + kSettings + ", errno=";
  for (const auto& [result, code, text] : {std::tuple(0, 0xBEEF, "0xBEEF"), {-1, 0, "0x0"}, {-1, -1, "0xFFFFFFFF"}}) {
    Begin();
    fake::PipesGive({""});
    fake::PLIBCFileAddSection.Returns(result);
    fake::PLIBCErrGet.Returns(code);
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(Steps(),
                ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking},
                                                  {kAddsSection, kAsksForError, Report(message + text), kFreesHash})));
  }
}

TEST_F(ApSave, FailsWhenTheAccessPointCannotBeSwitchedOff) {
  conf_.blEnable = FALSE;
  for (const int result : {-1, INT_MIN}) {
    Begin();
    fake::PLIBCFileSetSectionValue.Returns(result);
    EXPECT_EQ(Run(), FALSE);
    EXPECT_THAT(
        Steps(),
        ElementsAre(kAsksForHash, kAsksForFile, kLooksForSection, kEndsLooking, kPutsEnable, kPutsUnblock, kSwitchesOff,
                    Report("Failed to set key[enable] of sec[" + kModel + "] in file[" + kSettings + "]."),
                    kFreesHash));
  }
}

// A platform may give no result of setting a pair at all.
TEST_F(ApSave, DoesNotLookAtWhatSettingAPairGives) {
  for (const int result : {0, -1, 7}) {
    Begin();
    fake::PLIBCSzHashSetValue.Returns(result);
    EXPECT_EQ(Run(), TRUE) << result;
    EXPECT_TRUE(HasWritten()) << result;
    EXPECT_THAT(fake::Messages(), IsEmpty()) << result;
  }
}

TEST_F(ApSave, RefusesAnEncryptionThatIsNoneOrNoneForAGuestNetwork) {
  const std::string wrong = "wireless_ap_conf_set:# Wrong encryption";
  const std::string noEap = "wireless_ap_conf_set:# Guest Network does not have EAP encryption";
  const struct {
    int encryption;
    int guestEncryption;
    std::string message;
  } rows[] = {
      {AP_ENCRYPT_MAX, AP_ENCRYPT_OPEN, wrong},
      {7, AP_ENCRYPT_OPEN, wrong},
      {-1, AP_ENCRYPT_OPEN, wrong},
      {INT_MAX, AP_ENCRYPT_OPEN, wrong},
      {INT_MIN, AP_ENCRYPT_OPEN, wrong},
      {AP_ENCRYPT_OPEN, AP_ENCRYPT_MAX, wrong},
      {AP_ENCRYPT_OPEN, -1, wrong},
      {AP_ENCRYPT_OPEN, INT_MIN, wrong},
      {AP_ENCRYPT_OPEN, AP_ENCRYPT_WPA_EAP, noEap},
      {AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WPA_EAP, noEap},
      {-1, AP_ENCRYPT_WPA_EAP, wrong},
  };
  for (const int exists : {1, 0}) {
    for (const auto& row : rows) {
      Begin();
      fake::PLIBCFileExist.Returns(exists);
      conf_.hostapConf.encryption = static_cast<MERO_AP_ENCRYPT>(row.encryption);
      conf_.hostapConf.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(row.guestEncryption);
      EXPECT_EQ(Run(), FALSE);
      EXPECT_THAT(WithoutLines(fake::Messages()), ElementsAre(row.message))
          << row.encryption << ' ' << row.guestEncryption;
      EXPECT_EQ(fake::PLIBCFileTouch.calls(), 1 - exists);
      EXPECT_EQ(fake::PLIBCSzHashFree.calls(), 1);
      EXPECT_FALSE(HasWritten());
    }
  }
}

}  // namespace
