// A save: the questions to the platform, and the effect of their answers.
#include <cstring>
#include <limits>

#include "known_networks.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::SizeIs;

const std::string kTimeIsSaved = "1700000000";

// The pairs of the home network's section, in the order in which they are to be put into the hash.
std::vector<std::string> PairsPut() {
  std::vector<std::string> pairs;
  for (const char* szPair : {"KEY, correct horse", "IPADDR, 192.168.1.20", "NETMASK, 255.255.255.0",
                             "GATEWAY, 192.168.1.1", "ESSID, Home Net", "BSSID, 00:11:22:AA:BB:CC", "MODE, MANAGED",
                             "ACCESS_TIME, 1700000000", "AUTH, WPA2PSK", "ENCRYPT, AES"}) {
    pairs.push_back(std::string("PLIBCSzHashSetValue(&, ") + szPair + ")");
  }
  return pairs;
}

const std::string kAsksForHash = "PLIBCSzHashAlloc(1024)";
const std::string kFreesHash = "PLIBCSzHashFree(&)";
const std::string kAsksForFile = "PLIBCFileExist(" + kStore + ")";
const std::string kMakesFile = "PLIBCFileTouch(" + kStore + ")";
const std::string kReadsSection = "PLIBCFileGetSection(" + kStore + ", " + kHomeSection + ", &)";
const std::string kAddsSection = "PLIBCFileAddSection(" + kStore + ", " + kHomeSection + ", &, \t%s=%s\n)";
const std::string kSetsSection = "PLIBCFileSetSection(" + kStore + ", " + kHomeSection + ", null, &, \t%s=%s\n)";

// A save where the platform does as the test says: at first, all goes well and the section is there.
class Save : public UnitTest {
 protected:
  Save() {
    fake::NowIs(1700000000);
    fake::PLIBCFileExist.Returns(1);
    fake::PLIBCFileTouch.Returns(0);
    fake::PLIBCFileGetSection.Returns(1);
    fake::PLIBCFileAddSection.Returns(1);
    fake::PLIBCFileSetSection.Returns(1);
    fake::PLIBCErrGet.Returns(0xBEEF);
  }

  int Run() {
    return memory::Run(0, [this] { return MEROWirelessConfSet(&config_); });
  }

  // What was done, but for texts that were asked for.
  static std::vector<std::string> Steps() {
    return fake::EffectsOf({"PLIBCSzHashAlloc", "PLIBCSzHashFree", "PLIBCSzHashSetValue", "PLIBCFileExist",
                            "PLIBCFileTouch", "PLIBCFileGetSection", "PLIBCFileAddSection", "PLIBCFileSetSection",
                            "syslog"});
  }

  // The steps of a save that gets as far as the pairs: those before them, and those behind.
  static std::vector<std::string> StepsAroundPairs(std::vector<std::string> before, std::vector<std::string> behind) {
    std::vector<std::string> steps = std::move(before);
    for (std::string& pair : PairsPut()) steps.push_back(std::move(pair));
    for (std::string& step : behind) steps.push_back(std::move(step));
    return steps;
  }

  WIRELESS_NETWORK_CONFIG config_ = HomeNetwork();
};

TEST_F(Save, ReplacesTheSectionOfANetworkThatIsKnown) {
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(
                           StepsAroundPairs({kAsksForHash, kAsksForFile, kReadsSection}, {kSetsSection, kFreesHash})));
}

TEST_F(Save, AddsASectionForANetworkThatIsNotKnown) {
  fake::PLIBCFileGetSection.Returns(0);
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(
                           StepsAroundPairs({kAsksForHash, kAsksForFile, kReadsSection}, {kAddsSection, kFreesHash})));
}

TEST_F(Save, CreatesAMissingFileAndAddsTheSection) {
  fake::PLIBCFileExist.Returns(0);
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(Steps(),
              ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kMakesFile}, {kAddsSection, kFreesHash})));
}

TEST_F(Save, TakesWhateverAnswerIsNoFailureForSuccess) {
  fake::PLIBCFileExist.Returns(-1);  // not zero: it exists
  fake::PLIBCFileGetSection.Returns(7);
  fake::PLIBCFileSetSection.Returns(2);
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(fake::PLIBCFileSetSection.calls(), 1);
  fake::PLIBCFileExist.Returns(0);
  fake::PLIBCFileTouch.Returns(1);
  fake::PLIBCFileAddSection.Returns(2);
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(fake::PLIBCFileAddSection.calls(), 1);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

TEST_F(Save, RejectsNullAndTouchesNothing) {
  EXPECT_EQ(MEROWirelessConfSet(nullptr), -1);
  EXPECT_THAT(fake::Effects(), ElementsAre(fake::Report("wireless_conf_set:30 Bad parameters")));
}

TEST_F(Save, FailsWithoutMemoryForTheHashAndTouchesNothing) {
  fake::PLIBCSzHashAlloc.Returns(nullptr);
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, fake::Report("wireless_conf_set:33 Failed to alloc memory")));
}

TEST_F(Save, FailsWhenTheSectionCannotBeReadAndNamesThePathFirst) {
  for (const int result : {-1, -5}) {
    fake::Begin();
    fake::PLIBCFileExist.Returns(1);
    fake::PLIBCFileGetSection.Returns(result);
    fake::PLIBCErrGet.Returns(0xAB0);
    EXPECT_EQ(Run(), -1);
    EXPECT_THAT(Steps(), ElementsAre(kAsksForHash, kAsksForFile, kReadsSection,
                                     fake::Report("wireless_conf_set:42 Failed to get section: " + kStore + " from " +
                                                  kHomeSection + ", errno=0xAB0"),
                                     kFreesHash));
  }
}

TEST_F(Save, FailsWhenTheFileCannotBeCreated) {
  fake::PLIBCFileExist.Returns(0);
  for (const int result : {-1, -5}) {
    fake::PLIBCFileTouch.Returns(result);
    EXPECT_EQ(Run(), -1);
  }
  const std::vector<std::string> attempt = {kAsksForHash, kAsksForFile, kMakesFile,
                                            fake::Report("wireless_conf_set:47 Failed to touch " + kStore), kFreesHash};
  std::vector<std::string> attempts = attempt;
  attempts.insert(attempts.end(), attempt.begin(), attempt.end());
  EXPECT_THAT(Steps(), ElementsAreArray(attempts));
}

TEST_F(Save, FailsWhenTheSectionCannotBeAdded) {
  const std::string message = "wireless_conf_set:72 Failed to add section: " + kHomeSection + " from " + kStore;
  fake::PLIBCFileGetSection.Returns(0);
  fake::PLIBCFileAddSection.Returns(0, -1);
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kReadsSection},
                                                {kAddsSection, fake::Report(message + ", errno=0xBEEF"), kFreesHash})));
  fake::PLIBCErrGet.Returns(-1);
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(fake::Messages(), ElementsAre(message + ", errno=0xBEEF", message + ", errno=0xFFFFFFFF"));
}

TEST_F(Save, FailsWhenTheSectionCannotBeReplaced) {
  const std::string message = "wireless_conf_set:67 Failed to set section: " + kHomeSection + " from " + kStore;
  fake::PLIBCFileSetSection.Returns(0, -1);
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(StepsAroundPairs({kAsksForHash, kAsksForFile, kReadsSection},
                                                {kSetsSection, fake::Report(message + ", errno=0xBEEF"), kFreesHash})));
  fake::PLIBCErrGet.Returns(0);
  EXPECT_EQ(Run(), -1);
  EXPECT_THAT(fake::Messages(), ElementsAre(message + ", errno=0xBEEF", message + ", errno=0x0"));
}

// A platform may give no result of setting a pair at all.
TEST_F(Save, DoesNotLookAtWhatSettingAPairGives) {
  for (const int result : {0, -1, 7}) {
    fake::PLIBCSzHashSetValue.Returns(result);
    EXPECT_EQ(Run(), 0) << result;
    EXPECT_THAT(fake::Messages(), IsEmpty()) << result;
  }
}

// A hash moves when it grows, and a platform may hand out another one.
TEST_F(Save, WritesAndFreesTheHashThatThePlatformLeaves) {
  PPLIBSZHASH pshMoved = nullptr;
  const auto move = [&](PPLIBSZHASH* ppshHash) {
    fake::PLIBCSzHashFree.Real(*ppshHash);
    pshMoved = *ppshHash = fake::PLIBCSzHashAlloc.Real(1024);
  };
  fake::PLIBCFileGetSection.Does([&](const char*, const char*, PPLIBSZHASH* ppshHash) {
    move(ppshHash);
    return 1;
  });
  fake::PLIBCSzHashSetValue.Does([&](PPLIBSZHASH* ppshHash, const char*, const char*) {
    EXPECT_EQ(*ppshHash, pshMoved);
    move(ppshHash);
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
  EXPECT_EQ(Run(), 0);
  EXPECT_EQ(fake::PLIBCSzHashFree.calls(), 1);
}

TEST_F(Save, AsksThePlatformForTheTextsOfTheRecord) {
  config_.network.opmode = WIRELESS_OPMODE_ADHOC;
  config_.network.auth = WIRELESS_AUTH_SHARED;
  config_.network.encrypt = static_cast<WIRELESS_ENCRYPT>(12);
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(fake::EffectsOf({"MEROWirelessBssidStringGet", "MEROWirelessOpmodeStringGet"}),
              ElementsAre("MEROWirelessBssidStringGet(&, &, 1024)", "MEROWirelessOpmodeStringGet(1)"));
  EXPECT_THAT(fake::EffectsOf({"MEROWirelessAuthStringGet", "MEROWirelessEncryptStringGet"}),
              ElementsAre("MEROWirelessAuthStringGet(2)", "MEROWirelessEncryptStringGet(12, 0)"));
}

TEST_F(Save, CutsASectionNameThatIsTooLongButNotTheAddress) {
  const std::string address(1023, 'x');
  fake::MEROWirelessBssidStringGet.Does([&](const unsigned char* rgbBssid, char* szBssid, size_t) {
    EXPECT_EQ(rgbBssid, config_.network.bssid);
    return std::strcpy(szBssid, address.c_str());
  });
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(fake::EffectsOf({"PLIBCFileSetSection"}),
              ElementsAre("PLIBCFileSetSection(" + kStore + ", " + address.substr(0, 127) + ", null, &, \t%s=%s\n)"));
  EXPECT_THAT(fake::Effects(), testing::Contains("PLIBCSzHashSetValue(&, BSSID, " + address + ")"));
}

TEST_F(Save, StampsTheTimeOfTheSaveUpToTheGreatestOf32Bits) {
  constexpr int64_t kGreatest = std::numeric_limits<int32_t>::max();
  constexpr int64_t kLeast = std::numeric_limits<int32_t>::min();
  const struct {
    int64_t now;
    const char* szSaved;
  } rows[] = {
      {0, "0"},
      {1, "1"},
      {-5, "-5"},  // a clock that was never set, behind a time zone
      {kGreatest - 1, "2147483646"},
      {kGreatest, "2147483647"},
      {kGreatest + 1, "2147483647"},
      {4102444800, "2147483647"},
      {int64_t{1} << 33, "2147483647"},
      {kLeast, "-2147483648"},
  };
  for (const auto& row : rows) {
    fake::NowIs(row.now);
    fake::PLIBCSzHashSetValue.Does([&](PPLIBSZHASH*, const char* szKey, const char* szValue) {
      if (std::strcmp(szKey, "ACCESS_TIME") == 0) {
        EXPECT_STREQ(szValue, row.szSaved) << row.now;
      }
      return 1;
    });
    EXPECT_EQ(Run(), 0);
  }
}

TEST_F(Save, ReadsTheClockOnceAndBeforeThePairs) {
  EXPECT_EQ(Run(), 0);
  EXPECT_THAT(fake::EffectsOf({"time", "PLIBCFileGetSection", "PLIBCSzHashSetValue"}), SizeIs(12));
  EXPECT_EQ(fake::EffectsOf({"time", "PLIBCFileGetSection", "PLIBCSzHashSetValue"})[1], "time()");
}

TEST_F(Save, IgnoresTheTimeOnTheRecord) {
  for (const int32_t atime : {0, -1, 2147483647}) {
    config_.atime = atime;
    EXPECT_EQ(Run(), 0);
  }
  const std::vector<std::string> effects = fake::Effects();
  EXPECT_EQ(std::ranges::count(effects, "PLIBCSzHashSetValue(&, ACCESS_TIME, " + kTimeIsSaved + ")"), 3);
}

}  // namespace
