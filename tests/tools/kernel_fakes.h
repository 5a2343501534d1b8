// The kernel's wireless stack, in the hands of a test: the program under test comes upon its answers.
#ifndef MERO_TESTS_TOOLS_KERNEL_FAKES_H
#define MERO_TESTS_TOOLS_KERNEL_FAKES_H

#include <linux/nl80211.h>

#include <cstdint>
#include <map>
#include <string>
#include <string_view>
#include <vector>

#include "base/text.h"

namespace kernel {

// The access point of library::Network().
inline constexpr Address kHome = {0x0A, 0x0A, 0x0A, 0x0A, 0x0A, 0x0A};

// A result of the last scan.
struct Result {
  Address address;
  std::uint32_t msAgo = 0;
  bool isJoined = false;
};

// Those that there are from now on; at first there are none.
void Heard(std::vector<Result> results);

// How much a driver tells of stations: all, their traffic in 32 bits, no traffic, or not even which there are.
enum class Driver { kTellsAll, kCountsTo32Bits, kDoesNotCount, kListsNone };

// An interface, as the kernel tells of it; on the air as an access point when it has a name.
struct Interface {
  bool isThere;
  nl80211_iftype type;
  unsigned megahertz;  // of its channel; 0 for none
  char szName[33];
  int stations = 0;         // that it has as an access point, 02:00:00:00:00:00 and so on
  int signal = 0;           // of the access point that it is joined to; 0 while it is joined to none
  unsigned rate = 0;        // in tenths of a megabit
  unsigned secondsAgo = 0;  // when it was joined
  int joining = 0;          // how many of its stations, the last ones, it has not let in yet
  Driver driver = Driver::kTellsAll;
};

// wlan0 and the guests'. Processes of the program's own see them too, and change them for all.
Interface& Main();
Interface& Guests();

// What the radio may do on a channel.
struct Channel {
  unsigned megahertz;
  nl80211_frequency_attr flag = NL80211_FREQUENCY_ATTR_FREQ;  // DISABLED, NO_IR or RADAR
};
extern std::vector<Channel> g_channels;

// Those of a country, where they are others.
extern std::map<std::string, std::vector<Channel>> g_channelsIn;

// Whose rules radios keep to: the kernel's, those of wlan0's radio where it has its own, and those that the kernel
// takes when it is asked for a country that it knows, where that is not that country.
struct Rules {
  char szKernel[3];
  char szRadio[3];
  char szTaken[3];
  char szKnown[16];
};
Rules& RulesNow();

// wlan0 is a client's, the radio tells of no channels, and its rules are the world's.
void Reset();

// wlan0 is a client's, or an access point's on the air.
void BecomeClient();
void BecomeAccessPoint(std::string_view name, unsigned megahertz = 2437);

// wlan0 is a client's that has been joined to kHome for an hour.
void BecomeJoined();

// wlan0 is an access point's on the air, too, once there is a file at this path: a script can make one.
void AppearWith(const char* szPath, std::string_view name);

// wlan0 is in the bridge lbr0, as the kernel shows it among its files, from now on.
void PutInBridge();

}  // namespace kernel

#endif  // MERO_TESTS_TOOLS_KERNEL_FAKES_H
