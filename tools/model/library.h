// The library in this program's own words: rings as vectors, results as failures with sentences.
#ifndef MERO_TOOLS_LIBRARY_H
#define MERO_TOOLS_LIBRARY_H

#include <algorithm>
#include <functional>
#include <iterator>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "model/failed.h"
#include "platform.h"
#include "wireless.h"
#include "work/program.h"

using Network = WIRELESS_NETWORK;
using KnownNetwork = WIRELESS_NETWORK_CONFIG;

enum class Order { kAsSaved, kByTime };

// The networks in range, the strongest first.
std::vector<Network> InRange(const Program& program, WIRELESS_SCAN scan);

// The networks that have been saved.
std::vector<KnownNetwork> Known(Order order);

// The same, for a join: the protection of those that cannot be joined is unknown.
std::vector<Network> InRangeToJoin(const Task& task, WIRELESS_SCAN scan);

// The same behind a call of the network of this name, which answers even if it hides. Whoever listens learns the name.
// Nothing when the driver does not call.
std::optional<std::vector<Network>> InRangeOnCall(const Program& program, const std::string& name);

// The same. Where the adapter's last results hold none that `isWanted`, the network of this name is called, or else the
// adapter scans.
std::vector<Network> LookFor(const Program& program, const std::string& name,
                             const std::function<bool(const Network&)>& isWanted);

// Whether a network has this name, or its access point this address. A text that is an address is no name: anybody may
// call a network like somebody else's access point.
bool IsNamed(const Network& network, const std::string& name);

// Fails when a text is an address: what is saved or made under it could never be named.
void RequireName(const std::string& name);

// The strongest access point in range of this name, or the one of this address; fails when there is none.
Network FindInRange(const Program& program, const std::string& name);

// All sections that were saved under a name that somebody has given, or the one of an address, the one saved last
// first.
std::vector<KnownNetwork> AllKnown(const std::string& name);

// All sections of a name that the kernel, the air or the settings tell, the one saved last first. It is a name even
// where it looks like an address: anybody may call a network so.
std::vector<KnownNetwork> AllCalled(const std::string& essid);

// The first of AllCalled().
std::optional<KnownNetwork> FindCalled(const std::string& essid);

// Fails when there is no adapter.
void RequireAdapter();

// Fails while the adapter is an access point's, which would have to leave its channel, and whoever is on it, for a
// scan.
void RequireScanning();

// Fails when the kernel lets nobody use the radio.
void RequireNoBlock();

// Fails when the user has switched the radio off, or when that cannot be told, or when the kernel blocks it.
void RequireRadio();

// The same, but for a switch of which nobody can tell: an access point may be started then.
void RefuseWhileRadioIsOff();

// The settings section of the adapter that is plugged in, or nothing when none has been announced.
std::string AdapterModelOrNone();

// The same; fails when there is none.
std::string AdapterModel();

// The failure of a call when no adapter is plugged in.
Failure NoAdapter();

// Copies a text into a field; fails when it does not fit. `what` names it in the failure.
template <std::size_t kSize>
void SetText(char (&field)[kSize], std::string_view text, std::string_view what) {
  if (text.size() >= kSize || text.find('\n') != text.npos || text.find('\0') != text.npos || text.ends_with('\r')) {
    throw Failure(Exit::kUsage, std::string(what) + " cannot be used",
                  "give one line of up to " + std::to_string(kSize - 1) + " bytes");
  }
  *std::copy(text.begin(), text.end(), std::begin(field)) = '\0';
}

// A network's name is 1 to 32 bytes on the air.
template <std::size_t kSize>
void SetNetworkName(char (&field)[kSize], std::string_view name, const std::string& what = "the name") {
  constexpr std::size_t kLongest = 32;
  if (name.empty() || name.size() > kLongest) throw Wrong(what + " cannot be this", "give 1 to 32 bytes");
  SetText(field, name, what);
}

#endif  // MERO_TOOLS_LIBRARY_H
