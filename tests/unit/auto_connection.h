// Automatic connections: what is saved, what is in range, and what is joined.
#ifndef MERO_TESTS_UNIT_AUTO_CONNECTION_H
#define MERO_TESTS_UNIT_AUTO_CONNECTION_H

#include <algorithm>
#include <set>

#include "connection.h"
#include "known_networks.h"
#include "listing.h"
#include "tests/support/early.h"

EARLY inline const std::string kAsksForStatus = "MEROWirelessCurInfoGet(4, &)";
EARLY inline const std::string kLooks = "PLIBNetIfUp(wlan0)";  // once for each look at what is in range
EARLY inline const std::string kAddresses = "MERONetSetCard1(&, 0)";
EARLY inline const std::string kDisconnects = "MEROWirelessNetworkDisconnect()";

inline std::string JoinOf(const std::string& name) {
  return "join(" + name + ")";
}

inline std::string AutoConnectReport(const std::string& message) {
  return fake::Report("wireless_auto_connect:# " + message);
}

EARLY inline const std::string kFailsToConnect = AutoConnectReport("Failed to connect any access point");

// A saved network, with the last octet of its access point's address.
struct Saved {
  std::string name;
  int octet = 0;
  long long time = 0;
  std::string rest = "\tMODE=MANAGED\n\tAUTH=WPA2PSK\n\tENCRYPT=AES\n";
};

inline std::string AddressOf(int octet) {
  char szAddress[32];
  std::snprintf(szAddress, sizeof szAddress, "02:00:00:00:00:%02X", static_cast<unsigned>(octet));
  return szAddress;
}

inline std::string SectionOf(const Saved& saved) {
  const std::string address = AddressOf(saved.octet);
  return "[" + address + "]\n\tKEY=secret of " + saved.name + "\n\tIPADDR=10.0.0." + std::to_string(saved.octet) +
         "\n\tNETMASK=255.0.0." + std::to_string(saved.octet) + "\n\tESSID=" + saved.name + "\n\tBSSID=" + address +
         "\n\tACCESS_TIME=" + std::to_string(saved.time) + "\n" + saved.rest;
}

// A network in range.
inline std::string InRange(const std::string& name, int octet, const std::string& rest = " -40 11n WPA2PSK/AES") {
  return RowOf("6", name, " " + AddressOf(octet) + rest + "\n");
}

// There is always somebody else's network in range, so that one look is one scan.
EARLY inline const std::string kNeighbour = InRange("Neighbour", 0xff);

class AutoConnectTest : public ConnectionTest {
 protected:
  AutoConnectTest() { Begin(); }

  // From here on nothing is connected, nothing is saved, and only the neighbour is in range. Every network whose
  // supplicant is started is joined.
  void Begin() {
    ConnectionTest::Begin();
    std::filesystem::remove_all(kStore);
    fake::PLIBNetIfUp.Returns(1);
    fake::PLIBNetIfDown.Returns(1);
    fake::MEROWirelessOpmodeSet.Returns(0);
    fake::MEROWirelessNetworkDisconnect.Returns(0);
    StatusIs(WIRELESS_STATUS_DISCONNECTED);
    fake::MERONetSetCard1.Does([this](const NETINFO* pNetInfo, int) {
      addressed_ = pNetInfo->szIp + std::string("/") + pNetInfo->szMask;
      return 0;
    });
    fake::system.Does([this](const char* szCommand) { return Run(szCommand); });
    fake::PipesAnswer([this](std::string_view command) -> fake::Output {
      if (command.starts_with("/sbin/iwlist")) return kHeadings + kNeighbour + listings_[std::min(Looks(), 9)];
      return "wpa_state=COMPLETED\n";
    });
    std::ranges::fill(listings_, "");
    outOfReach_.clear();
    addressed_.clear();
  }

  static void StatusIs(WIRELESS_STATUS status, int result = 0) {
    fake::MEROWirelessCurInfoGet.Does([=](WIRELESS_REQUEST, PWIRELESS_INFO pInfo) {
      pInfo->status = status;
      return result;
    });
  }

  static void Save(const std::vector<Saved>& networks) {
    std::string store;
    for (const Saved& network : networks) store += SectionOf(network);
    WriteText(kStore, store);
  }

  // What every look finds, and what those from the nth one on find, counted from 1.
  void Find(const std::string& rows) { std::ranges::fill(listings_, rows); }
  void FindFrom(int n, const std::string& rows) { std::fill(std::begin(listings_) + n, std::end(listings_), rows); }

  int Connect() {
    return memory::Run(0, [] { return MEROWirelessAutoConnect(); });
  }

  // What was done: the looks, the networks that were tried, and what is no part of either.
  static Effects Steps() {
    Effects steps = WithoutLines(
        fake::EffectsOf({"MEROWirelessCurInfoGet", "PLIBNetIfUp", "join", "PLIBNetIfDown", "MERONetSetCard1",
                         "MEROIGetDHCPTestNetInfo", "MEROWirelessNetworkDisconnect", "syslog"}));
    std::erase_if(steps, [](const std::string& step) {
      return step.starts_with("syslog(3, wireless_network_scan:") ||
             step.starts_with("syslog(3, wireless_network_connect:");
    });
    return steps;
  }

  // The steps of an attempt in which nothing is connected at first.
  static Effects Course(const Effects& steps) { return Effects{kAsksForStatus} + steps; }

  // Names of networks whose supplicant cannot be started.
  std::set<std::string> outOfReach_;
  std::string addressed_;

 private:
  static int Looks() { return fake::PLIBNetIfUp.calls(); }

  // Notes the network that the supplicant is started for.
  int Run(std::string_view command) {
    if (!command.starts_with("/usr/sbin/wpa_supplicant ")) return 0;
    const std::string config = ReadText(kSupplicantConfig);
    const size_t begin = config.find("ssid=\"") + 6;
    const std::string name = config.substr(begin, config.find("\"\n", begin) - begin);
    fake::Record("join", {name});
    return outOfReach_.contains(name) ? -1 : 0;
  }

  std::string listings_[10];
};

#endif  // MERO_TESTS_UNIT_AUTO_CONNECTION_H
