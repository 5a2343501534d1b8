// A machine on which networks are joined: the files of a connection, the commands, and what they do to each other.
#ifndef MERO_TESTS_UNIT_CONNECTION_H
#define MERO_TESTS_UNIT_CONNECTION_H

#include <filesystem>
#include <string>
#include <vector>

#include "reports.h"
#include "tests/support/early.h"
#include "unit_test.h"

EARLY inline const std::string kMarker = "/var/tmp/.wireless_connecting";
EARLY inline const std::string kRecord = "/var/tmp/.wireless_current_connection";
EARLY inline const std::string kSupplicantConfig = "/usr/mero/etc/wpa_supplicant.conf";
EARLY inline const std::string kSupplicantPid = "/var/run/wpa_supplicant.pid";
EARLY inline const std::string kSystemSettings = "/etc/meroinfo.conf";
EARLY inline const std::string kResolver = "/etc/resolv.conf";
EARLY inline const std::string kResolverBackup = "/etc/resolv.conf.wireless.bak";
EARLY inline const std::string kApSettings = "/usr/mero/etc/wireless_ap.conf";
EARLY inline const std::string kAdapterInfo = "/tmp/wireless.info";

EARLY inline const std::string kStartsSupplicant =
    "/usr/sbin/wpa_supplicant -Dwext -iwlan0 -c/usr/mero/etc/wpa_supplicant.conf -B -P/var/run/wpa_supplicant.pid &> "
    "/dev/null";
EARLY inline const std::string kEndsSupplicant = "/usr/sbin/wpa_cli terminate > /dev/null 2>&1";
EARLY inline const std::string kAsksState = "/usr/sbin/wpa_cli status | grep wpa_state";
EARLY inline const std::string kSavesResolver = "/bin/cp /etc/resolv.conf /etc/resolv.conf.wireless.bak";

class ConnectionTest : public UnitTest {
 protected:
  ConnectionTest() { Begin(); }

  // From here on there is an adapter and nothing else: no settings, no connection. Commands start, and the supplicant
  // completes every connection at once.
  static void Begin() {
    fake::Begin();
    fake::sleep.Returns(0);
    fake::MEROWirelessAdapterNum.Returns(1);
    fake::MEROWirelessInterfaceGet.Returns("wlan0");
    fake::MEROMediaService.Returns(0);
    fake::system.Returns(0);
    fake::PipesGive({"wpa_state=COMPLETED\n"});
    for (const std::string& path : {kMarker, kRecord, kSupplicantConfig, kSupplicantPid, kSystemSettings, kResolver,
                                    kResolverBackup, kApSettings, kAdapterInfo}) {
      std::filesystem::remove_all(path);
    }
  }

  // Switches the radio off in the access-point settings.
  static void BlockRadio() {
    WriteText(kAdapterInfo, "PRODUCT=RT-5370\n");
    WriteText(kApSettings, "[RT-5370]\n\tunblock=no\n");
  }
};

inline std::string ConnectReport(const std::string& message) {
  return fake::Report("wireless_network_connect:# " + message);
}

#endif  // MERO_TESTS_UNIT_CONNECTION_H
