// Attempts to join a network, and the steps that they are made of.
#ifndef MERO_TESTS_UNIT_JOINING_H
#define MERO_TESTS_UNIT_JOINING_H

#include <utility>

#include "connection.h"
#include "known_networks.h"

inline const Effects kBegins = {"MEROWirelessAdapterNum()", "PLIBCFileExist(" + kApSettings + ")",
                                "PLIBCFileExist(" + kMarker + ")", "PLIBCFileTouch(" + kMarker + ")"};
inline const Effects kConfigures = {"PLIBCFileExist(" + kSupplicantConfig + ")"};
inline const Effects kAsksForSupplicant = {"PLIBCFileExist(" + kSupplicantPid + ")"};
inline const Effects kEndsOldSupplicant = {RunOf(kEndsSupplicant)};
inline const Effects kStarts = {RunOf(kStartsSupplicant)};
inline const Effects kPolls = {"sleep(1)", "popen(" + kAsksState + ", r)", "pclose(&)"};
inline const Effects kPollsInVain = {"sleep(1)", "popen(" + kAsksState + ", r)"};
inline const Effects kRecords = {"PLIBCSysUnlink(" + kRecord + ")"};
inline const Effects kFinishes = {"PLIBCFileCheckKeyValue(" + kSystemSettings + ", runmediaservice, yes, 0)",
                                  "PLIBCFileExist(" + kResolver + ")"};
inline const Effects kFails = {ConnectReport("Failed to connect network.")};
inline const Effects kEnds = {"PLIBCSysUnlink(" + kMarker + ")"};
inline const Effects kTimesOut = {ConnectReport("Time out to connect AP, kill wpa_supplicant."),
                                  RunOf(kEndsSupplicant)};

inline const Effects kStartsAnew = kBegins + kConfigures + kAsksForSupplicant + kStarts;

inline Effects ReportsOf(const std::string& message) {
  return {ConnectReport(message)};
}

inline Effects Times(int count, const Effects& part) {
  Effects all;
  for (int i = 0; i < count; ++i) all = std::move(all) + part;
  return all;
}

class JoiningTest : public ConnectionTest {
 protected:
  int Join() {
    return memory::Run(0, [this] { return MEROWirelessNetworkConnect(&config_); });
  }

  // What was done, but for questions that could come at any time.
  static Effects Steps() {
    Effects steps = ::Steps();
    std::erase_if(steps, [](const std::string& step) {
      return step.starts_with("MEROWirelessInterfaceGet(") || step.starts_with("MEROWirelessBssidStringGet(") ||
             step.starts_with("MEROWirelessEncryptStringGet(");
    });
    return steps;
  }

  WIRELESS_NETWORK_CONFIG config_ = HomeNetwork();
};

#endif  // MERO_TESTS_UNIT_JOINING_H
