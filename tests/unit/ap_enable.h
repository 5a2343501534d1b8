// A machine on which an access point is enabled: its settings, its files, and a network library that is told what it
// knows and tells what it was given.
#ifndef MERO_TESTS_UNIT_AP_ENABLE_H
#define MERO_TESTS_UNIT_AP_ENABLE_H

#include <filesystem>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "common/text.h"
#include "reports.h"
#include "tests/support/early.h"
#include "unit_test.h"

// Apart from those of other machines, which bear the same names.
namespace enabling {

EARLY inline const std::string kMarker = "/var/tmp/.wireless_ap_connecting";
EARLY inline const std::string kAdapterInfo = "/tmp/wireless.info";
EARLY inline const std::string kSettings = "/usr/mero/etc/wireless_ap.conf";
EARLY inline const std::string kHostFile = "/etc/hostapd/hostapd-wlan0-host.conf";
EARLY inline const std::string kInfoFile = "/etc/hostapd/hostapd-wlan0.info";
EARLY inline const std::string kScripts = "/etc/sysconfig/network-scripts";
EARLY inline const std::string kInterfaceScript = kScripts + "/ifcfg-wlan0";

EARLY inline const std::string kPlain = "%s=%s\n";
EARLY inline const std::string kQuoted = "%s=\"%s\"\n";

// ---- What is done, step by step ----

inline std::string SetOf(const std::string& path, const std::string& key, const std::string& value,
                         const std::string& format) {
  return "PLIBCFileSetKeyValue(" + path + ", " + key + ", " + value + ", " + format + ")";
}

inline std::string EnableReport(const std::string& message) {
  return fake::Report("wireless_ap_enable:# " + message);
}

EARLY inline const Effects kBegins = {"PLIBCFileExist(" + kMarker + ")", "PLIBCFileTouch(" + kMarker + ")"};
EARLY inline const Effects kNamesSection = {"PLIBCFileExist(" + kAdapterInfo + ")",
                                            "PLIBCFileGetKeyValue(" + kAdapterInfo + ", PRODUCT, &, 1024, 0)"};
EARLY inline const Effects kReadsSection = {"PLIBCFileExist(" + kSettings + ")",
                                            "PLIBCFileGetSection(" + kSettings + ", RT-5370, &)"};
EARLY inline const Effects kWritesDaemonsFiles = {
    "PLIBNetIfDown(wlan0)", "PLIBCSysUnlink(" + kHostFile + ")", "PLIBCExec(/bin/mkdir, -p, /etc/hostapd, null, null)",
    "PLIBCFileCheckKeyValue(/etc.defaults/meroinfo.conf, support_pci_wifi, yes, 0)"};
EARLY inline const Effects kSwitchesOn = {SetOf(kInfoFile, "enable", "yes", kQuoted)};
EARLY inline const Effects kFails = {EnableReport("Failed to enable AP.")};
EARLY inline const Effects kEnds = {"PLIBCSysUnlink(" + kMarker + ")"};

EARLY inline const Effects kReadsSettings = kNamesSection + kReadsSection;
EARLY inline const Effects kPrepares = kReadsSettings + kWritesDaemonsFiles + kSwitchesOn;

inline Effects AsksForBridge(const std::string& bridge) {
  return {"MERONetGetBridgeConfig(" + bridge + ", &, &)"};
}
EARLY inline const Effects kMakesBridge = {"MERONetSetBridgeConfig(&, &)"};

inline std::string BridgeScript(const std::string& bridge) {
  return kScripts + "/ifcfg-" + bridge;
}
inline Effects AsksForStartAtBoot(const std::string& bridge) {
  return {"PLIBCFileCheckKeyValue(" + BridgeScript(bridge) + ", ONBOOT, yes, 0)"};
}

inline Effects AsksForServer(const std::string& bridge) {
  return {"MERONetGetDhcpServerConf(" + bridge + ", " + bridge + ", &)"};
}
inline Effects ChecksAddress(const std::string& address, const std::string& ip, const std::string& mask) {
  return {"MERONetIsSameSubnet(" + address + ", " + ip + ", " + mask + ")"};
}
// An end of a new range: made a text, and only then, and before the other end, checked.
inline Effects MakesEnd(const std::string& address, const std::string& ip, const std::string& mask) {
  return Effects{"MERONetNtoa({})"} + ChecksAddress(address, ip, mask);
}
EARLY inline const Effects kWritesServer = {"MERONetSetDhcpServerConfigFiles(&, 1)"};

// What a new bridge "lbr0" brings.
EARLY inline const Effects kMakesServer = AsksForServer("lbr0") + MakesEnd("10.1.14.2", "10.1.14.1", "255.255.255.0") +
                                          MakesEnd("10.1.14.254", "10.1.14.1", "255.255.255.0") + kWritesServer;
EARLY inline const Effects kMakesNatBridge = AsksForBridge("lbr0") + kMakesBridge + kMakesServer;

inline Effects WritesScript(const std::string& bridge) {
  return {SetOf(kInterfaceScript, "ONBOOT", "yes", kPlain),
          SetOf(kInterfaceScript, "DEVICE", "wlan0", kPlain),
          SetOf(kInterfaceScript, "BRIDGE", bridge, kPlain),
          SetOf(kInterfaceScript, "IPADDR", "10.1.14.1", kPlain),
          SetOf(kInterfaceScript, "NETMASK", "255.255.255.0", kPlain),
          SetOf(kInterfaceScript, "BOOTPROTO", "static", kPlain)};
}
inline Effects Starts(const std::string& bridge) {
  return {"PLIBCExec(/etc/rc.network, start, wlan0, " + bridge + ", null)"};
}

// ---- The machine ----

struct Bridge {
  NETINFO netInfo;
  BRIDGE_INFO bridgeInfo;
};

inline Bridge NatBridge(const std::string& name, const std::string& ip, const std::string& mask) {
  Bridge bridge{};
  bridge.netInfo.blManual = TRUE;
  bridge.netInfo.blActive = TRUE;
  bridge.bridgeInfo.type = TYPE_NAT_MASTER;
  CopyText(bridge.netInfo.szInterface, name);
  CopyText(bridge.netInfo.szIp, ip);
  CopyText(bridge.netInfo.szMask, mask);
  CopyText(bridge.bridgeInfo.szIfName, name);
  return bridge;
}

class EnableTest : public UnitTest {
 protected:
  EnableTest() { Begin(); }

  // From here on an access point "Home" in the bridge lbr0 is switched on in the settings, no daemon runs, and no
  // bridge and no server is known. Programs succeed, and so does the network library.
  void Begin() {
    fake::Begin();
    fake::PipesGive({""});
    fake::PLIBNetIfDown.Returns(1);
    fake::PLIBCExec.Returns(0);
    for (const char* szDirectory : {"/etc/hostapd", "/etc/sysconfig", "/etc/dhcpd"}) {
      std::filesystem::remove_all(szDirectory);
    }
    std::filesystem::remove_all(kMarker);
    for (const std::string& directory : {std::string("/etc/hostapd"), kScripts, std::string("/etc/dhcpd")}) {
      std::filesystem::create_directories(directory);
    }
    WriteText(kAdapterInfo, "PRODUCT=RT-5370\n");
    SettingsAre("\tenable=yes\n\tssid=Home\n\tbridge=lbr0\n");

    known_.reset();
    stored_.reset();
    made_.reset();
    written_.reset();
    fake::MERONetGetBridgeConfig.Does([this](const char*, PNETINFO pNetInfo, PBRIDGE_INFO pBridgeInfo) {
      if (!known_) return -1;
      *pNetInfo = known_->netInfo;
      *pBridgeInfo = known_->bridgeInfo;
      return 0;
    });
    fake::MERONetSetBridgeConfig.Does([this](const NETINFO* pNetInfo, const BRIDGE_INFO* pBridgeInfo) {
      made_ = Bridge{*pNetInfo, *pBridgeInfo};
      return 0;
    });
    fake::MERONetGetDhcpServerConf.Does([this](const char*, const char*, PMERO_DHCPD_CONF pConf) {
      if (stored_) *pConf = *stored_;
      return stored_ ? 1 : 0;
    });
    fake::MERONetSetDhcpServerConfigFiles.Does([this](const MERO_DHCPD_CONF* pConf, int) {
      written_ = *pConf;
      return 1;
    });
  }

  static void SettingsAre(const std::string& lines) { WriteText(kSettings, "[RT-5370]\n" + lines); }

  static BOOL Enable() {
    return memory::Run(0, [] { return MEROWirelessAPEnable(); });
  }

  // What was done, but for how the settings are taken from their section and running daemons are looked for.
  static Effects Steps() {
    Effects steps = ::Steps();
    std::erase_if(steps, [](const std::string& step) {
      return step.starts_with("PLIBCSzHash") || step.starts_with("popen(") || step.starts_with("pclose(");
    });
    return steps;
  }

  // It ends well after these steps.
  static void ExpectEnabledBy(const Effects& steps, const std::string& bridge) {
    EXPECT_EQ(Enable(), TRUE);
    EXPECT_THAT(Steps(), testing::ElementsAreArray(kBegins + steps + WritesScript(bridge) + Starts(bridge) + kEnds));
    EXPECT_FALSE(Exists(kMarker));
  }

  // It is given up after these steps, and nothing is done any more.
  static void ExpectGivenUpAfter(const Effects& steps) {
    EXPECT_EQ(Enable(), FALSE);
    EXPECT_THAT(Steps(), testing::ElementsAreArray(kBegins + steps + kFails + kEnds));
    EXPECT_FALSE(Exists(kMarker));
  }

  std::optional<Bridge> known_;             // the bridge that is configured
  std::optional<MERO_DHCPD_CONF> stored_;   // the server's settings that are kept
  std::optional<Bridge> made_;              // the bridge that was set
  std::optional<MERO_DHCPD_CONF> written_;  // the server's settings that were written
};

}  // namespace enabling

#endif  // MERO_TESTS_UNIT_AP_ENABLE_H
