// The course of enabling an access point, and what ends it early.
#include <climits>

#include "ap_enable.h"

namespace {

using namespace enabling;
using testing::ElementsAreArray;

class EnablingAnAccessPoint : public EnableTest {};

TEST_F(EnablingAnAccessPoint, WritesTheFilesAndStartsTheNetwork) {
  ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
  EXPECT_EQ(ReadText(kInfoFile), "enable=\"yes\"\n");
  EXPECT_EQ(ReadText(kInterfaceScript),
            "ONBOOT=yes\nDEVICE=wlan0\nBRIDGE=lbr0\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\nBOOTPROTO=static\n");
}

TEST_F(EnablingAnAccessPoint, WritesTheDaemonsFilesFromTheSettings) {
  SettingsAre("\tenable=yes\n\tssid=Office\n\tbridge=br3\n\tchannel=11\n");
  EXPECT_EQ(Enable(), TRUE);
  const std::string file = ReadText(kHostFile);
  for (const char* szLine : {"interface=wlan0\n", "ssid=Office\n", "bridge=br3\n", "channel=11\n"}) {
    EXPECT_THAT(file, testing::HasSubstr(szLine));
  }
}

TEST_F(EnablingAnAccessPoint, KeepsWhatElseTheFilesHold) {
  WriteText(kInfoFile, "# mine\nenable=no\nOTHER=x\n");
  WriteText(kInterfaceScript, "# mine\nBOOTPROTO=dhcp\nMTU=1400\nBRIDGE=\"old\"\n");
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_EQ(ReadText(kInfoFile), "# mine\nenable=\"yes\"\nOTHER=x\n");
  EXPECT_EQ(ReadText(kInterfaceScript),
            "# mine\nBOOTPROTO=static\nMTU=1400\nBRIDGE=lbr0\nONBOOT=yes\nDEVICE=wlan0\nIPADDR=10.1.14.1\n"
            "NETMASK=255.255.255.0\n");
}

TEST_F(EnablingAnAccessPoint, HoldsTheMarkerAndTheWholeFilesWhileTheNetworkStarts) {
  fake::PLIBCExec.Does([](const char* szPath, const char*, const char*, const char*, const char*) {
    EXPECT_TRUE(Exists(kMarker)) << szPath;
    if (std::string_view(szPath) == "/etc/rc.network") {
      EXPECT_EQ(ReadText(kInfoFile), "enable=\"yes\"\n");
      EXPECT_THAT(ReadText(kInterfaceScript), testing::EndsWith("\nBOOTPROTO=static\n"));
    }
    return 0;
  });
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_FALSE(Exists(kMarker));
}

TEST_F(EnablingAnAccessPoint, NamesABridgeOfUpTo15CharactersToTheStartScript) {
  SettingsAre("\tenable=yes\n\tbridge=fifteen-letters-and-more\n");
  ExpectEnabledBy(kPrepares + AsksForBridge("fifteen-letters") + kMakesBridge, "fifteen-letters");
}

TEST_F(EnablingAnAccessPoint, DoesNotMindAMarkerThatCannotBeMadeOrRemoved) {
  fake::PLIBCFileTouch.Returns(-1);
  fake::PLIBCSysUnlink.Returns(-1);
  ExpectEnabledBy(kPrepares + kMakesNatBridge, "lbr0");
}

TEST_F(EnablingAnAccessPoint, CanBeRepeated) {
  EXPECT_EQ(Enable(), TRUE);
  const std::string before = ReadText(kInterfaceScript);
  EXPECT_EQ(Enable(), TRUE);
  EXPECT_EQ(ReadText(kInterfaceScript), before);
}

// ---- What keeps from it ----

TEST_F(EnablingAnAccessPoint, IsRefusedWhileAnotherAttemptIsGoingAndClearsItsMarker) {
  WriteText(kMarker, "");
  EXPECT_EQ(Enable(), FALSE);
  EXPECT_THAT(Steps(), ElementsAreArray(Effects{kBegins.front()} +
                                        Effects{EnableReport("Another ap construction is going")} + kEnds));
  EXPECT_FALSE(Exists(kMarker));
  EXPECT_FALSE(Exists(kHostFile));

  EXPECT_EQ(Enable(), TRUE);
}

TEST_F(EnablingAnAccessPoint, NeedsToKnowTheAdapter) {
  const Effects kUnnamed = {EnableReport("Failed to get section name of ")};
  WriteText(kAdapterInfo, "VENDOR=0x148f\n");
  ExpectGivenUpAfter(kNamesSection + kUnnamed);

  Begin();
  std::filesystem::remove(kAdapterInfo);
  ExpectGivenUpAfter(Effects{kNamesSection.front(), fake::Report("wireless_ap_config_sec_name_get:# File[" +
                                                                 kAdapterInfo + "] does not exist.")} +
                     kUnnamed);
}

TEST_F(EnablingAnAccessPoint, NeedsSettingsOfTheAdapter) {
  const Effects kUnread = {EnableReport("Failed to get ap info of secname[RT-5370]")};
  std::filesystem::remove(kSettings);
  ExpectGivenUpAfter(kNamesSection + Effects{kReadsSection.front()} + kUnread);

  Begin();
  WriteText(kSettings, "[Other]\n\tenable=yes\n\tbridge=lbr0\n");
  ExpectGivenUpAfter(kReadsSettings + kUnread);

  Begin();
  fake::PLIBCFileGetSection.Returns(-1);
  ExpectGivenUpAfter(kReadsSettings + kUnread);
}

TEST_F(EnablingAnAccessPoint, DoesNothingForOneThatIsSwitchedOff) {
  for (const char* szLines : {"\tenable=no\n\tbridge=lbr0\n", "\tbridge=lbr0\n", "\tenable=\n", "\tenable=YES\n"}) {
    Begin();
    SettingsAre(szLines);
    ExpectGivenUpAfter(kReadsSettings);  // reported by the last message alone
    EXPECT_FALSE(Exists(kHostFile)) << szLines;
    EXPECT_FALSE(Exists(kInfoFile)) << szLines;
  }
}

TEST_F(EnablingAnAccessPoint, IsGivenUpWhenTheDaemonsFilesCannotBeWritten) {
  fake::PLIBCExec.Returns(1);
  ExpectGivenUpAfter(kReadsSettings + Effects(kWritesDaemonsFiles.begin(), kWritesDaemonsFiles.end() - 1) +
                     Effects{fake::Report("wireless_hostap_conf_set:# Failed to mkdir /etc/hostapd"),
                             EnableReport("Failed to set hostapd conf of interface [wlan0].")});
  EXPECT_FALSE(Exists(kInfoFile));
}

TEST_F(EnablingAnAccessPoint, IsGivenUpWhenItCannotBeSwitchedOn) {
  for (const int result : {0, -1, INT_MIN}) {
    Begin();
    fake::PLIBCFileSetKeyValue.Returns(result);
    ExpectGivenUpAfter(kPrepares + Effects{EnableReport("Failed to set key[enable] in [" + kInfoFile + "].")});
    EXPECT_TRUE(Exists(kHostFile));
  }
}

TEST_F(EnablingAnAccessPoint, IsGivenUpWithoutABridgeAfterItsFilesWereWritten) {
  for (const char* szLines : {"\tenable=yes\n", "\tenable=yes\n\tbridge=\n"}) {
    Begin();
    SettingsAre(szLines);
    ExpectGivenUpAfter(kPrepares + Effects{EnableReport("Failed to find bridge interface.")});
    EXPECT_TRUE(Exists(kHostFile));
    EXPECT_EQ(ReadText(kInfoFile), "enable=\"yes\"\n");
    EXPECT_FALSE(Exists(kInterfaceScript));
  }
}

TEST_F(EnablingAnAccessPoint, IsGivenUpAtTheFirstKeyThatCannotBeSet) {
  const Effects kKeys = WritesScript("lbr0");
  for (int key = 0; key < static_cast<int>(kKeys.size()); ++key) {
    for (const int result : {0, -1}) {
      Begin();
      fake::PLIBCErrGet.Returns(0x0500);
      fake::PLIBCFileSetKeyValue.FailsAt(key + 2, result);  // the first switches it on
      ExpectGivenUpAfter(
          kPrepares + kMakesNatBridge + Effects(kKeys.begin(), kKeys.begin() + key + 1) +
          Effects{"PLIBCErrGet()", EnableReport("Failed to set " + kInterfaceScript + " meroerr=[0x0500]")});
      EXPECT_EQ(fake::EffectsOf({"PLIBCFileSetKeyValue"}).size(), static_cast<size_t>(key) + 2);
    }
  }
}

TEST_F(EnablingAnAccessPoint, ReportsTheErrorCodeInFourDigits) {
  for (const auto& [code, text] :
       {std::pair(0, "0x0000"), std::pair(0x1ABCD, "0x1ABCD"), std::pair(-1, "0xFFFFFFFF")}) {
    Begin();
    fake::PLIBCErrGet.Returns(code);
    fake::PLIBCFileSetKeyValue.FailsAt(2, -1);
    EXPECT_EQ(Enable(), FALSE);
    EXPECT_THAT(Steps(),
                testing::Contains(EnableReport("Failed to set " + kInterfaceScript + " meroerr=[" + text + "]")));
  }
}

TEST_F(EnablingAnAccessPoint, FailsWhenTheNetworkDoesNotStartAndKeepsWhatWasWritten) {
  for (const int result : {1, 255, -1, INT_MIN}) {
    Begin();
    fake::PLIBCExec.Returns(0, result);
    EXPECT_EQ(Enable(), FALSE) << result;
    EXPECT_THAT(Steps(),
                ElementsAreArray(kBegins + kPrepares + kMakesNatBridge + WritesScript("lbr0") + Starts("lbr0") +
                                 Effects{EnableReport("Failed to restart /etc/rc.network")} + kEnds));
    EXPECT_FALSE(Exists(kMarker));
    EXPECT_EQ(ReadText(kInfoFile), "enable=\"yes\"\n");
    EXPECT_TRUE(Exists(kInterfaceScript));
  }
}

// ---- Memory ----

TEST_F(EnablingAnAccessPoint, EndsAsItIsSaidToWheneverMemoryRunsOut) {
  int failures = 0;
  memory::FailEach([] { return MEROWirelessAPEnable(); },
                   [&](int n, BOOL result) {
                     EXPECT_EQ(memory::Held(), 0u) << n;
                     EXPECT_FALSE(Exists(kMarker)) << n;
                     EXPECT_EQ(Last(Steps()), kEnds.front()) << n;
                     if (result == FALSE) {
                       EXPECT_EQ(Last(WithoutLines(fake::Messages())), "wireless_ap_enable:# Failed to enable AP.")
                           << n;
                     } else {
                       EXPECT_EQ(result, TRUE);
                       EXPECT_THAT(ReadText(kInterfaceScript), testing::EndsWith("\nBOOTPROTO=static\n")) << n;
                     }
                     failures += result == FALSE ? 1 : 0;
                     Begin();
                   });
  EXPECT_GT(failures, 5);
}

}  // namespace
