// A machine on which a call does its work.
#include "tests/fault/scene.h"

#include <cstdio>
#include <filesystem>
#include <sstream>

#include "common/paths.h"
#include "tests/fault/machine_state.h"
#include "tests/platform/system_log.h"
#include "tests/support/files.h"

namespace fs = std::filesystem;

namespace {

void InstallCommands() {
  WriteText("/tmp/listing", Listing(), 0644);
  StandIn("/sbin/iwlist", "exec cat /tmp/listing");
  StandIn("/usr/sbin/wpa_cli", "echo " + std::string(kConnected.substr(0, kConnected.size() - 1)));
  for (const char* szCommand : {"/sbin/iwconfig", "/sbin/route", "/usr/sbin/wpa_supplicant", "/bin/ps", kLeaseScript,
                                kHotPlugScriptPath, kNetworkScriptPath}) {
    StandIn(szCommand, ":");
  }
  WriteText("/etc/meroinfo.conf", "runmediaservice=no\n", 0644);
  WriteText(kResolverPath, "nameserver 192.0.2.1\n", 0644);
}

void ForgetEverything() {
  for (const char* szDirectory : {"/usr/mero/etc", kInterfaceScriptDirectory, kHostapdDirectory, kDhcpDirectory}) {
    fs::remove_all(szDirectory);
    fs::create_directories(szDirectory);
  }
  for (const char* szFile :
       {kAdapterInfoPath, kConnectionRecordPath, kSupplicantPidPath, kJoinMarkerPath, kApMarkerPath}) {
    fs::remove(szFile);
  }
}

}  // namespace

std::string Listing() {
  std::string listing = "CH   ESSID                            BSSID             SIGNAL PROTOCOL SECURITY\n----\n";
  for (int i = 0; i < kNetworks; ++i) {
    char row[128];
    std::snprintf(row, sizeof row, "%-4d %-32s 00:00:00:00:00:%02X %6d %-9s %s\n", 1 + i,
                  ("Network " + std::to_string(i)).c_str(), i, -30 - i, "11b/g/n", "WPA2PSK/AES");
    listing += row;
  }
  return listing;
}

Scene::Scene(const std::function<void(SimulatedDriver&)>& prepare)
    : interface_("wlan0"), shown_({{"lo", ""}, {"wlan0", "phy80211"}}), driver_("wlan0") {
  driver_.hasResults = true;
  ForgetEverything();
  InstallCommands();
  prepare(driver_);
  Shell("ip link set wlan0 up");
  driver_.told.clear();
  driver_.told.reserve(100);  // so that a call without memory can be noted, too
  TakeCommands();
  TakeLog();
}

void StandIn(const std::string& path, const std::string& work) {
  const std::string known = fs::weakly_canonical(fs::path(path).parent_path()) / fs::path(path).filename();
  WriteScript(path, "echo \"" + known + " $*\" >>" + kCommandRecord + "\n" + work + "\n");
}

std::vector<std::string> TakeCommands() {
  std::vector<std::string> commands;
  std::istringstream record(TextOrNothing(kCommandRecord));
  for (std::string line; std::getline(record, line);) commands.push_back(line);
  fs::remove(kCommandRecord);
  return commands;
}
