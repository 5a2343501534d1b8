// The course of joining a network: what is asked, run and removed, in which order, and what ends it early.
#include <fcntl.h>

#include <climits>
#include <set>

#include "joining.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

class Joining : public JoiningTest {};

TEST_F(Joining, StartsTheSupplicantAndWaitsUntilItIsConnected) {
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + kPolls + kRecords + kFinishes + kEnds));
}

TEST_F(Joining, EndsTheSupplicantOfTheConnectionBefore) {
  EXPECT_EQ(Join(), 0);
  Begin();
  WriteText(kSupplicantConfig, "old");
  WriteText(kSupplicantPid, "1\n");
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kBegins + kConfigures + Effects{"PLIBCSysUnlink(" + kSupplicantConfig + ")"} +
                                        kAsksForSupplicant + kEndsOldSupplicant + kStarts + kPolls + kRecords +
                                        kFinishes + kEnds));
  EXPECT_EQ(ReadText(kSupplicantPid), "1\n");  // which is the supplicant's own affair
}

TEST_F(Joining, RunsTheSupplicantOnTheInterfaceThatThePlatformNames) {
  fake::MEROWirelessInterfaceGet.Returns("wireless-interface-17");
  EXPECT_EQ(Join(), 0);
  std::string command = kStartsSupplicant;
  command.replace(command.find("wlan0"), 5, "wireless-interface-17");
  EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(command)));
}

TEST_F(Joining, HoldsTheMarkerAndTheWholeConfigurationWhileCommandsRun) {
  WriteText(kSupplicantPid, "1\n");
  WriteText(kRecord, "old");
  fake::system.Does([](const char* szCommand) {
    EXPECT_TRUE(Exists(kMarker)) << szCommand;
    EXPECT_THAT(ReadText(kSupplicantConfig), testing::EndsWith("\n}\n")) << szCommand;
    EXPECT_EQ(ReadText(kRecord), "old") << szCommand;
    return 0;
  });
  fake::sleep.Does([](unsigned) {
    EXPECT_TRUE(Exists(kMarker));
    EXPECT_EQ(ReadText(kRecord), "old");
    return 0u;
  });
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::system.calls(), 2);
  EXPECT_NE(ReadText(kRecord), "old");
  EXPECT_FALSE(Exists(kMarker));
}

TEST_F(Joining, GoesThroughTheSupplicantInEveryModeButAdHoc) {
  for (const int opmode : {0, 2, 3, 4, 5, 6, 7, 8, -1, 257}) {
    Begin();
    config_.network.opmode = static_cast<WIRELESS_OPMODE>(opmode);
    EXPECT_EQ(Join(), 0);
    EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAreArray(kStarts)) << opmode;
  }
}

TEST_F(Joining, HandsNoFileOfItsOwnToCommands) {
  WriteText(kSupplicantPid, "1\n");
  WriteText(kResolver, "");
  const std::set<int> before = OpenDescriptors();
  const auto expectNoneHandedOn = [&](const char* szCommand) {
    for (const int fd : OpenDescriptors()) {
      EXPECT_TRUE(before.contains(fd) || (fcntl(fd, F_GETFD) & FD_CLOEXEC) != 0) << szCommand;
    }
    return 0;
  };
  fake::system.Does(expectNoneHandedOn);
  fake::popen.Does([&](const char* szCommand, const char* szMode) {
    expectNoneHandedOn(szCommand);
    return fake::popen.Real("echo wpa_state=COMPLETED", szMode);
  });
  fake::pclose.Does([&](FILE* pipe) {
    expectNoneHandedOn("whatever is run beside it");
    return fake::pclose.Real(pipe);
  });
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::system.calls() + fake::popen.calls() + fake::pclose.calls(), 5);
}

TEST_F(Joining, DoesNotMindHowCommandsEnd) {
  for (const int status : {1, 256, 65280, INT_MAX}) {
    Begin();
    WriteText(kSupplicantPid, "1\n");
    WriteText(kResolver, "");
    fake::system.Returns(status);
    EXPECT_EQ(Join(), 0) << status;
    EXPECT_EQ(fake::system.calls(), 3);
    EXPECT_THAT(fake::Messages(), IsEmpty());
  }
}

TEST_F(Joining, DoesNotMindAMarkerThatCannotBeMade) {
  fake::PLIBCFileTouch.Returns(-1);
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + kPolls + kRecords + kFinishes + kEnds));
}

TEST_F(Joining, DoesNotMindAMarkerThatCannotBeRemoved) {
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(fake::Messages(), IsEmpty());
}

// ---- What keeps from joining ----

TEST_F(Joining, NeedsAnAdapterAndRemovesTheMarkerWithoutOne) {
  BlockRadio();  // which is not looked at
  for (const int none : {0, -1, INT_MIN}) {
    fake::Begin();
    fake::MEROWirelessAdapterNum.Returns(none);
    WriteText(kMarker, "");
    EXPECT_EQ(Join(), -1);
    EXPECT_THAT(Steps(), ElementsAreArray(Effects{"MEROWirelessAdapterNum()"} +
                                          ReportsOf("There is no wireless USB adapter plugged") + kEnds));
    EXPECT_FALSE(Exists(kMarker));
  }
}

// The settings and the adapter of radios that must not be used, or of which that is not known.
const struct {
  const char* szSettings;
  const char* szInfo;
} kBlockedRadios[] = {
    {"[RT-5370]\n\tunblock=no\n", "PRODUCT=RT-5370\n"},
    {"[RT-5370]\n\tenable=yes\n", "PRODUCT=RT-5370\n"},
    {"[RT-5370]\n\tunblock=yes\n", ""},
};

TEST_F(Joining, IsSilentlyLeftOutWhileTheRadioIsBlocked) {
  for (const auto& radio : kBlockedRadios) {
    for (const int opmode : {WIRELESS_OPMODE_MANAGED, WIRELESS_OPMODE_ADHOC}) {
      Begin();
      WriteText(kApSettings, radio.szSettings);
      WriteText(kAdapterInfo, radio.szInfo);
      WriteText(kMarker, "");
      config_.network.opmode = static_cast<WIRELESS_OPMODE>(opmode);
      EXPECT_EQ(Join(), 0);
      EXPECT_THAT(fake::EffectsOf({"syslog", "system", "popen", "sleep", "PLIBCFileTouch", "PLIBNetIfDown",
                                   "MEROWirelessOpmodeSet", "PLIBCFileCheckKeyValue"}),
                  IsEmpty());
      EXPECT_EQ(Last(Steps()), kEnds.front());
      EXPECT_FALSE(Exists(kMarker));
      EXPECT_FALSE(Exists(kSupplicantConfig));
      EXPECT_FALSE(Exists(kRecord));
    }
  }
}

TEST_F(Joining, GoesOnWhenTheSettingsDoNotBlockTheRadio) {
  for (const char* szSettings :
       {"[RT-5370]\n\tunblock=yes\n", "[RT-5370]\n\tunblock=No\n", "[Other]\n\tunblock=no\n"}) {
    Begin();
    WriteText(kApSettings, szSettings);
    WriteText(kAdapterInfo, "PRODUCT=RT-5370\n");
    EXPECT_EQ(Join(), 0);
    EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAreArray(kStarts)) << szSettings;
  }
}

TEST_F(Joining, IsRefusedWhileAnotherAttemptIsGoingAndClearsItsMarker) {
  WriteText(kMarker, "");
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Effects(kBegins.begin(), kBegins.end() - 1) +
                                        ReportsOf("Another connection construction is going") + kEnds));
  EXPECT_FALSE(Exists(kMarker));
  EXPECT_FALSE(Exists(kSupplicantConfig));

  EXPECT_EQ(Join(), 0);
}

TEST_F(Joining, RejectsNullOnceTheMarkerIsMade) {
  EXPECT_EQ(memory::Run(0, [] { return MEROWirelessNetworkConnect(nullptr); }), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kBegins + ReportsOf("Bad parameters") + kFails + kEnds));
}

TEST_F(Joining, RejectsAnInterfaceWithoutAName) {
  fake::MEROWirelessInterfaceGet.Returns(static_cast<const char*>(nullptr));
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kBegins + ReportsOf("Bad parameters") + kFails + kEnds));
}

TEST_F(Joining, LeavesARunningSupplicantAloneWhenTheConfigurationCannotBeWritten) {
  config_.network.auth = WIRELESS_AUTH_WPANONE;
  WriteText(kSupplicantPid, "1\n");
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(),
              ElementsAreArray(kBegins + kConfigures + ReportsOf("Failed to detect authentication/encryption type") +
                               ReportsOf("Failed to set [" + kSupplicantConfig + "]") + kFails + kEnds));
}

TEST_F(Joining, FailsWhenTheOldSupplicantCannotBeToldToEnd) {
  for (const int result : {-1, INT_MIN}) {
    Begin();
    WriteText(kSupplicantPid, "1\n");
    fake::system.Returns(result, 0);
    EXPECT_EQ(Join(), -1);
    EXPECT_THAT(Steps(), ElementsAreArray(kBegins + kConfigures + kAsksForSupplicant + kEndsOldSupplicant +
                                          ReportsOf("Failed to execute '" + kEndsSupplicant + "'") + kFails + kEnds));
  }
}

TEST_F(Joining, FailsWhenTheSupplicantCannotBeStarted) {
  fake::system.Returns(-1);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(kStartsAnew + ReportsOf("Failed to execute '" + kStartsSupplicant + "'") +
                                        kFails + kEnds));
  EXPECT_FALSE(Exists(kRecord));
}

// ---- Ad-hoc cells ----

const Effects kCreatesCell = {"MEROWirelessAdapterNum()",
                              "PLIBNetIfDown(wlan0)",
                              "MEROWirelessOpmodeSet(1)",
                              RunOf("/sbin/iwconfig wlan0 essid 'Home Net' > /dev/null 2>&1"),
                              RunOf("/sbin/iwconfig wlan0 key off"),
                              "PLIBNetIfUp(wlan0)"};

class JoiningACell : public Joining {
 protected:
  JoiningACell() {
    config_.network.opmode = WIRELESS_OPMODE_ADHOC;
    config_.network.encrypt = WIRELESS_ENCRYPT_NONE;
    fake::PLIBNetIfDown.Returns(1);
    fake::PLIBNetIfUp.Returns(1);
    fake::MEROWirelessOpmodeSet.Returns(0);
    for (const std::string& path : kSupplicantFiles) WriteText(path, "before");
  }

  ~JoiningACell() override {
    for (const std::string& path : kSupplicantFiles) EXPECT_EQ(ReadText(path), "before") << path;
    EXPECT_FALSE(Exists(kMarker));
  }

  const std::vector<std::string> kSupplicantFiles = {kSupplicantConfig, kSupplicantPid, kRecord};
};

TEST_F(JoiningACell, LeavesTheSupplicantAndItsFilesAlone) {
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(kBegins + kCreatesCell + kFinishes + kEnds));
}

TEST_F(JoiningACell, FailsWithoutFinishingWhenTheCellCannotBeCreated) {
  fake::PLIBNetIfUp.Returns(0);
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(
                           kBegins + kCreatesCell +
                           Effects{fake::Report("wireless_adhoc_create:# Failed to activate network interface wlan0")} +
                           kFails + kEnds));
}

TEST_F(JoiningACell, TakesNamesAsTheyAreAlsoWithALineFeed) {
  std::strcpy(config_.network.szEssid, "two\nlines");
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(Steps(), testing::Contains(RunOf("/sbin/iwconfig wlan0 essid 'two\nlines' > /dev/null 2>&1")));
}

// ---- Memory ----

TEST_F(Joining, EndsAsItIsSaidToWheneverMemoryRunsOut) {
  int failures = 0;
  const auto prepare = [] {
    Begin();
    WriteText(kSystemSettings, "runmediaservice=yes\nnetwork_mediaservice=wlan0\n");
    WriteText(kRecord, "old");
  };
  prepare();
  const auto join = [this] { return MEROWirelessNetworkConnect(&config_); };
  memory::FailEach(join, [&](int n, int result) {
    EXPECT_EQ(memory::Held(), 0u) << n;
    EXPECT_FALSE(Exists(kMarker)) << n;
    EXPECT_EQ(Last(Steps()), kEnds.front()) << n;
    if (result == 0) {
      EXPECT_THAT(ReadText(kSupplicantConfig), testing::EndsWith("\tpsk=\"correct horse\"\n}\n")) << n;
      EXPECT_EQ(ReadText(kRecord), "Home Net\n7\n5\n8\n00:11:22:AA:BB:CC\n") << n;
    } else {
      EXPECT_EQ(result, -1);
      EXPECT_THAT(WithoutLines(fake::Messages()),
                  testing::Contains("wireless_network_connect:# Failed to connect network."))
          << n;
    }
    failures += result == 0 ? 0 : 1;
    prepare();
  });
  EXPECT_GE(failures, 2);  // for the configuration and for the record
}

}  // namespace
