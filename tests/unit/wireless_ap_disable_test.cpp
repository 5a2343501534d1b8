// The course of disabling an access point, and what it does to the files.
#include <sys/mount.h>

#include <climits>
#include <cstring>
#include <filesystem>

#include "reports.h"
#include "tests/support/shell.h"
#include "unit_test.h"

namespace {

using testing::ElementsAreArray;
using testing::IsEmpty;

const std::string kInfoFile = "/etc/hostapd/hostapd-wlan0.info";
const std::string kScripts = "/etc/sysconfig/network-scripts";
const std::string kInterfaceScript = kScripts + "/ifcfg-wlan0";
const std::string kBridgeScript = kScripts + "/ifcfg-lbr0";
const std::string kMembers = "/tmp/members";
const std::string kPlain = "%s=%s\n";

std::string DisableReport(const std::string& message) {
  return fake::Report("wireless_ap_disable:# " + message);
}

const Effects kRemovesInfo = {"PLIBCFileExist(" + kInfoFile + ")", "PLIBCSysRemove(" + kInfoFile + ")"};
const Effects kMissesInfo = {"PLIBCFileExist(" + kInfoFile + ")"};
const Effects kAsksForBridge = {"PLIBCFileExist(" + kInterfaceScript + ")",
                                "PLIBCFileGetKeyValue(" + kInterfaceScript + ", BRIDGE, &, 16, 0)"};
const Effects kMakesList = {"PLIBCSzListAlloc(1024)"};
const Effects kAsksForMembers = kMakesList + Effects{"PLIBNetBridgeSlaveEnum(lbr0, &)"};
const Effects kLooksForOwn = {"PLIBCSzListFind(&, wlan0)"};
const Effects kKeepsFromBoot = {"PLIBCFileSetKeyValue(" + kBridgeScript + ", ONBOOT, no, " + kPlain + ")"};
const Effects kFreesList = {"PLIBCSzListFree(&)"};
const Effects kForgetsBridge = {"PLIBCFileRemoveKey(" + kInterfaceScript + ", BRIDGE)"};
const Effects kForgetsLan = {"PLIBCFileRemoveKey(" + kInterfaceScript + ", LOCAL_LAN)"};
const Effects kAsksForServer = {"MERONetGetDhcpServerConf(lbr0, lbr0, &)"};
const Effects kStopsServer = {"MERONetSetDhcpServerConfigFiles(&, 0)"};
const Effects kRestarts = {"PLIBCExec(/etc/rc.network, restart, wlan0, lbr0, null)"};
const Effects kFails = {DisableReport("Failed to set AP config files.")};

const Effects kEnters = kRemovesInfo + kAsksForBridge;
const Effects kLeaves = kForgetsBridge + kForgetsLan + kAsksForServer + kStopsServer + kRestarts;
const Effects kOnlyMember = kAsksForMembers + kLooksForOwn + kKeepsFromBoot + kFreesList;

Effects PassesOn(int own, const std::string& primary) {
  return {"PLIBCSzListRemove(&, " + std::to_string(own) + ")", "PLIBCSzListGet(&, 0)",
          "PLIBCFileSetKeyValue(" + kBridgeScript + ", PRIMARY, " + primary + ", " + kPlain + ")"};
}

// The effects without one of them, or with others in its place.
Effects Without(Effects effects, const Effects& part, const Effects& instead = {}) {
  const auto at = std::search(effects.begin(), effects.end(), part.begin(), part.end());
  EXPECT_NE(at, effects.end()) << part.front();
  const Effects behind(at + static_cast<std::ptrdiff_t>(part.size()), effects.end());
  return Effects(effects.begin(), at) + instead + behind;
}

class DisablingAnAccessPoint : public UnitTest {
 protected:
  DisablingAnAccessPoint() { Begin(); }

  // From here on an access point is enabled in the bridge lbr0, whose only member it is, and which has a server.
  void Begin() {
    fake::Begin();
    fake::PLIBCExec.Returns(0);
    for (const std::string& directory : {std::string("/etc/hostapd"), std::string("/etc/sysconfig")}) {
      std::filesystem::remove_all(directory);
    }
    std::filesystem::create_directories("/etc/hostapd");
    std::filesystem::create_directories(kScripts);
    WriteText(kInfoFile, "enable=\"yes\"\n");
    WriteText(kInterfaceScript,
              "ONBOOT=yes\nDEVICE=wlan0\nBRIDGE=lbr0\nLOCAL_LAN=1\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\n"
              "BOOTPROTO=static\n");
    WriteText(kBridgeScript, kBridgeText);
    MembersAre({"wlan0"});

    std::memset(static_cast<void*>(&stored_), 0x5A, sizeof stored_);
    fake::MERONetGetDhcpServerConf.Does([this](const char*, const char*, PMERO_DHCPD_CONF pConf) {
      *pConf = stored_;
      return 1;
    });
    fake::MERONetSetDhcpServerConfigFiles.Does([this](const MERO_DHCPD_CONF* pConf, int) {
      EXPECT_EQ(std::memcmp(pConf, &stored_, sizeof stored_), 0);  // as it was read
      return 1;
    });
  }

  // The names are put into the list by what reads sections.
  static void MembersAre(const std::vector<std::string>& names) {
    std::string sections;
    for (const std::string& name : names) sections += "[" + name + "]\n";
    WriteText(kMembers, sections);
    fake::PLIBNetBridgeSlaveEnum.Does(
        [](const char*, PPLIBSZLIST* ppslList) { return fake::PLIBCFileEnumSection.Real(kMembers.c_str(), ppslList); });
  }

  static void ExpectDisabledBy(const Effects& steps) {
    EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
    EXPECT_THAT(Steps(), ElementsAreArray(steps));
  }

  static void ExpectFailureAfter(const Effects& steps) {
    EXPECT_EQ(MEROWirelessAPDisable(), FALSE);
    EXPECT_THAT(Steps(), ElementsAreArray(steps));
  }

  static constexpr char kBridgeText[] = "DEVICE=lbr0\nONBOOT=\"yes\"\nPRIMARY=wlan0\nTYPE=Bridge\n";
  static constexpr char kInterfaceText[] =
      "ONBOOT=yes\nDEVICE=wlan0\nIPADDR=10.1.14.1\nNETMASK=255.255.255.0\nBOOTPROTO=static\n";

  MERO_DHCPD_CONF stored_;
};

TEST_F(DisablingAnAccessPoint, UndoesWhatEnablingWroteAndRestartsTheNetwork) {
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
  EXPECT_FALSE(std::filesystem::exists(kInfoFile));
  EXPECT_EQ(ReadText(kInterfaceScript), kInterfaceText);
  EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=no\nPRIMARY=wlan0\nTYPE=Bridge\n");
}

TEST_F(DisablingAnAccessPoint, StillRestartsTheNetworkTheSecondTime) {
  EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
  const std::string bridge = ReadText(kBridgeScript);
  fake::Begin();
  fake::PLIBCExec.Returns(0);
  fake::MERONetGetDhcpServerConf.Returns(0);
  ExpectDisabledBy(kMissesInfo + kAsksForBridge + kForgetsLan +
                   Effects{"MERONetGetDhcpServerConf(, , &)", "PLIBCExec(/etc/rc.network, restart, wlan0, , null)"});
  EXPECT_EQ(ReadText(kInterfaceScript), kInterfaceText);
  EXPECT_EQ(ReadText(kBridgeScript), bridge);
}

TEST_F(DisablingAnAccessPoint, TouchesNoBridgeWhenTheInterfaceIsInNone) {
  for (const int result : {0, -1}) {
    Begin();
    fake::PLIBCFileGetKeyValue.Returns(result);
    fake::MERONetGetDhcpServerConf.Returns(0);
    ExpectDisabledBy(kEnters + kForgetsLan +
                     Effects{"MERONetGetDhcpServerConf(, , &)", "PLIBCExec(/etc/rc.network, restart, wlan0, , null)"});
    EXPECT_EQ(ReadText(kBridgeScript), kBridgeText);
    EXPECT_THAT(ReadText(kInterfaceScript), testing::Not(testing::HasSubstr("LOCAL_LAN")));
  }
}

TEST_F(DisablingAnAccessPoint, DoesNotMindAnInfoFileThatIsNotThere) {
  std::filesystem::remove(kInfoFile);
  ExpectDisabledBy(kMissesInfo + kAsksForBridge + kOnlyMember + kLeaves);
}

TEST_F(DisablingAnAccessPoint, DoesNotMindAnInfoFileThatStays) {
  fake::PLIBCSysRemove.Returns(-1);
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
}

TEST_F(DisablingAnAccessPoint, NeedsTheInterfacesScriptOnceTheInfoFileIsGone) {
  std::filesystem::remove(kInterfaceScript);
  ExpectFailureAfter(kRemovesInfo + Effects{kAsksForBridge.front()} +
                     Effects{DisableReport("File[" + kInterfaceScript + "] does not exist.")} + kFails);
  EXPECT_FALSE(std::filesystem::exists(kInfoFile));
  EXPECT_FALSE(std::filesystem::exists(kInterfaceScript));
}

TEST_F(DisablingAnAccessPoint, NamesABridgeOfUpTo15Characters) {
  WriteText(kInterfaceScript, "BRIDGE=fifteen-letters-and-more\n");
  EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
  EXPECT_THAT(fake::EffectsOf({"PLIBNetBridgeSlaveEnum", "MERONetGetDhcpServerConf", "PLIBCExec"}),
              testing::ElementsAre("PLIBNetBridgeSlaveEnum(fifteen-letters, &)",
                                   "MERONetGetDhcpServerConf(fifteen-letters, fifteen-letters, &)",
                                   "PLIBCExec(/etc/rc.network, restart, wlan0, fifteen-letters, null)"));
}

// ---- The bridge ----

TEST_F(DisablingAnAccessPoint, KeepsABridgeThatWouldBeEmptyFromStartingAtBoot) {
  for (const std::vector<std::string>& members : {std::vector<std::string>{}, std::vector<std::string>{"wlan0"}}) {
    Begin();
    MembersAre(members);
    ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
    EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=no\nPRIMARY=wlan0\nTYPE=Bridge\n");
  }
}

TEST_F(DisablingAnAccessPoint, PassesTheFirstPlaceOnToTheMemberThatIsFirstThen) {
  const struct {
    std::vector<std::string> members;
    int own;
    std::string primary;
  } rows[] = {
      {{"wlan0", "eth0"}, 0, "eth0"},
      {{"eth0", "wlan0"}, 1, "eth0"},
      {{"eth1", "eth0", "wlan0", "wlan1"}, 2, "eth1"},
      {{"wlan0", "wlan1", "eth0"}, 0, "wlan1"},
  };
  for (const auto& row : rows) {
    Begin();
    MembersAre(row.members);
    ExpectDisabledBy(kEnters + kAsksForMembers + kLooksForOwn + PassesOn(row.own, row.primary) + kFreesList + kLeaves);
    EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=\"yes\"\nPRIMARY=" + row.primary + "\nTYPE=Bridge\n");
  }
}

TEST_F(DisablingAnAccessPoint, LeavesABridgeOfOthersAlone) {
  for (const std::vector<std::string>& members :
       {std::vector<std::string>{"eth0"}, std::vector<std::string>{"eth0", "wlan00", "WLAN0", "wlan"}}) {
    Begin();
    MembersAre(members);
    ExpectDisabledBy(kEnters + kAsksForMembers + kLooksForOwn + kFreesList + kLeaves);
    EXPECT_EQ(ReadText(kBridgeScript), kBridgeText);
  }
}

// ---- What it goes on after ----

TEST_F(DisablingAnAccessPoint, GoesOnWithoutMemoryForTheMembers) {
  fake::PLIBCSzListAlloc.Returns(static_cast<PPLIBSZLIST>(nullptr));
  ExpectDisabledBy(kEnters + kMakesList + Effects{DisableReport("Failed to alloc pList"), "PLIBCErrSet(512)"} +
                   kLeaves);
  EXPECT_EQ(ReadText(kBridgeScript), kBridgeText);
}

TEST_F(DisablingAnAccessPoint, GoesOnWhenTheMembersCannotBeListed) {
  for (const int result : {-1, INT_MIN}) {
    Begin();
    fake::PLIBNetBridgeSlaveEnum.Returns(result);
    ExpectDisabledBy(kEnters + kAsksForMembers +
                     Effects{DisableReport("Failed to get number of slave for bridge [lbr0].")} + kFreesList + kLeaves);
    EXPECT_EQ(ReadText(kBridgeScript), kBridgeText);
  }
}

TEST_F(DisablingAnAccessPoint, GoesOnWhenTheBridgeCannotBeKeptFromBoot) {
  for (const std::vector<std::string>& members : {std::vector<std::string>{}, std::vector<std::string>{"wlan0"}}) {
    Begin();
    MembersAre(members);
    fake::PLIBCFileSetKeyValue.Returns(-1);
    const Effects kReports = {DisableReport("Failed to set file[" + kBridgeScript + "].")};
    ExpectDisabledBy(kEnters + Without(kOnlyMember, kFreesList, kReports + kFreesList) + kLeaves);
  }
}

TEST_F(DisablingAnAccessPoint, TakesOnlyNegativeAnswersForAFailureToKeepItFromBoot) {
  fake::PLIBCFileSetKeyValue.Returns(0);
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
}

TEST_F(DisablingAnAccessPoint, GoesOnSilentlyWhenTheFirstPlaceCannotBePassedOn) {
  MembersAre({"wlan0", "eth0"});
  fake::PLIBCFileSetKeyValue.Returns(-1);
  ExpectDisabledBy(kEnters + kAsksForMembers + kLooksForOwn + PassesOn(0, "eth0") + kFreesList + kLeaves);
}

TEST_F(DisablingAnAccessPoint, GoesOnWhenTheBridgeCannotBeForgotten) {
  fake::PLIBCFileRemoveKey.Returns(-1, 0);
  const Effects kReports = {DisableReport("Failed to remove key BRIDGE in [" + kInterfaceScript + "].")};
  ExpectDisabledBy(kEnters + kOnlyMember + Without(kLeaves, kForgetsBridge, kForgetsBridge + kReports));
}

TEST_F(DisablingAnAccessPoint, GoesOnSilentlyWhenTheLocalNetworkCannotBeForgotten) {
  fake::PLIBCFileRemoveKey.Returns(0, -1);
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
}

TEST_F(DisablingAnAccessPoint, GoesOnWithoutAServer) {
  fake::MERONetGetDhcpServerConf.Returns(0);
  ExpectDisabledBy(kEnters + kOnlyMember + Without(kLeaves, kStopsServer));
}

// ---- What ends it ----

TEST_F(DisablingAnAccessPoint, FailsWhenTheServerCannotBeStoppedAndKeepsWhatWasChanged) {
  fake::MERONetSetDhcpServerConfigFiles.Returns(0);
  ExpectFailureAfter(kEnters + kOnlyMember + Without(kLeaves, kRestarts, kFails));
  EXPECT_FALSE(std::filesystem::exists(kInfoFile));
  EXPECT_EQ(ReadText(kInterfaceScript), kInterfaceText);
}

TEST_F(DisablingAnAccessPoint, TakesAnyAnswerButZeroForAServerThatWasStopped) {
  fake::MERONetSetDhcpServerConfigFiles.Returns(-1);
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
}

TEST_F(DisablingAnAccessPoint, FailsWhenTheNetworkDoesNotRestart) {
  for (const int result : {1, 255, -1, INT_MIN}) {
    Begin();
    fake::PLIBCExec.Returns(result);
    ExpectFailureAfter(kEnters + kOnlyMember + kLeaves + Effects{DisableReport("Failed to restart /etc/rc.network")});
    EXPECT_EQ(ReadText(kInterfaceScript), kInterfaceText);
  }
}

// The marker keeps two constructions apart, and this is none.
TEST_F(DisablingAnAccessPoint, LeavesTheMarkerOfAConstructionAlone) {
  const std::string marker = "/var/tmp/.wireless_ap_connecting";
  WriteText(marker, "");
  ExpectDisabledBy(kEnters + kOnlyMember + kLeaves);
  EXPECT_TRUE(std::filesystem::exists(marker));
}

// ---- With the real network library, and the kernel ----

TEST_F(DisablingAnAccessPoint, StopsTheServerOfARealBridgeAndKeepsItsSettings) {
  fake::MERONetGetDhcpServerConf.Reset();
  fake::MERONetSetDhcpServerConfigFiles.Reset();
  fake::PLIBNetBridgeSlaveEnum.Reset();
  Shell(
      "ip link add lbr0 type bridge && ip link add wlan0 type veth peer name eth0 &&"
      " ip link set wlan0 master lbr0 && ip link set eth0 master lbr0");
  MERO_DHCPD_CONF conf{};
  std::strcpy(conf.szInterface, "lbr0");
  std::strcpy(conf.szTag, "lbr0");
  std::strcpy(conf.szRouter, "10.1.14.1");
  ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  const std::string server = ReadText("/etc/dhcpd/dhcpd-lbr0-lbr0.conf");

  EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
  EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=\"yes\"\nPRIMARY=eth0\nTYPE=Bridge\n");
  EXPECT_EQ(ReadText("/etc/dhcpd/dhcpd-lbr0-lbr0.conf"), server);
  EXPECT_EQ(ReadText("/etc/dhcpd/dhcpd-lbr0-lbr0.info"), "auto_time=\"0\"\nenable=\"no\"\n");
  Shell("ip link delete wlan0 && ip link delete lbr0");
}

// After a change to client mode, or with the adapter pulled, the kernel has no such bridge, and it came up at every
// boot.
TEST_F(DisablingAnAccessPoint, KeepsABridgeFromBootThatTheKernelDoesNotHaveAnyMore) {
  fake::PLIBNetBridgeSlaveEnum.Reset();
  EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
  EXPECT_THAT(fake::Messages(), IsEmpty());
  EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=no\nPRIMARY=wlan0\nTYPE=Bridge\n");
}

// Where no file can be written at first, what one call could not do is left for the next.
TEST_F(DisablingAnAccessPoint, RepairsWhatACallLeftThatCouldWriteNothing) {
  fake::MERONetGetDhcpServerConf.Reset();
  fake::MERONetSetDhcpServerConfigFiles.Reset();
  fake::PLIBNetBridgeSlaveEnum.Reset();
  MERO_DHCPD_CONF conf{};
  std::strcpy(conf.szInterface, "lbr0");
  std::strcpy(conf.szTag, "lbr0");
  ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  ASSERT_EQ(::mount("/etc", "/etc", nullptr, MS_BIND, nullptr), 0);
  ASSERT_EQ(::mount(nullptr, "/etc", nullptr, MS_BIND | MS_REMOUNT | MS_RDONLY, nullptr), 0);
  EXPECT_EQ(MEROWirelessAPDisable(), FALSE);
  EXPECT_EQ(fake::PLIBCExec.calls(), 0);
  ASSERT_EQ(::umount("/etc"), 0);

  EXPECT_EQ(MEROWirelessAPDisable(), TRUE);
  EXPECT_EQ(Last(fake::EffectsOf({"PLIBCExec"})), "PLIBCExec(/etc/rc.network, restart, wlan0, lbr0, null)");
  EXPECT_FALSE(std::filesystem::exists(kInfoFile));
  EXPECT_EQ(ReadText(kInterfaceScript), kInterfaceText);
  EXPECT_EQ(ReadText(kBridgeScript), "DEVICE=lbr0\nONBOOT=no\nPRIMARY=wlan0\nTYPE=Bridge\n");
  EXPECT_EQ(ReadText("/etc/dhcpd/dhcpd-lbr0-lbr0.info"), "auto_time=\"0\"\nenable=\"no\"\n");
}

// ---- Memory ----

TEST_F(DisablingAnAccessPoint, LeavesNothingAllocatedWheneverMemoryRunsOut) {
  int reports = 0;
  memory::FailEach([] { return MEROWirelessAPDisable(); },
                   [&](int n, BOOL result) {
                     EXPECT_EQ(memory::Held(), 0u) << n;
                     EXPECT_EQ(result, TRUE) << n;  // each step that needs memory is one that it goes on after
                     EXPECT_EQ(fake::EffectsOf({"PLIBCExec"}).size(), 1u) << n;
                     reports += fake::Messages().empty() ? 0 : 1;
                     Begin();
                   });
  EXPECT_GT(reports, 2);
}

}  // namespace
