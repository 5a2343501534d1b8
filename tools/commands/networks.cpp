// The commands about networks: scan, known, save, forget.
#include "commands/networks.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <functional>

#include "base/clock.h"
#include "common/paths.h"
#include "model/access_points.h"
#include "model/country.h"
#include "model/join_failures.h"
#include "model/last_scan.h"
#include "model/library.h"
#include "model/network_extras.h"
#include "model/obstacles.h"
#include "model/saved_networks.h"
#include "model/security.h"
#include "show/signal.h"

namespace {

// A name in hexadecimal, for one that is no UTF-8 and so cannot be given as text.
Value NameInHex(std::string_view name) {
  return IsUtf8(name) ? Value(nullptr) : Value(Hex(name));
}

// ---- Rows ----

Value AuthOf(const Network& network) {
  return std::string(MEROWirelessAuthStringGet(network.auth));
}

Value EncryptionOf(const Network& network) {
  return std::string(MEROWirelessEncryptStringGet(network.encrypt, 0));
}

// A network in range, and what it is to this appliance.
struct Found {
  Network network;
  bool isJoined;  // through this access point
  bool isKnown;
  std::string obstacle;  // how it is protected, where that cannot be joined
};

Shown ShowKnown(const Found& of, bool) {
  if (of.isJoined) return {"joined", Tone::kGood};
  return of.isKnown ? Shown{"yes"} : Shown{"-", Tone::kFaint};
}

Shown ShowSecurity(const Found& of) {
  if (of.obstacle.empty()) return {SecurityText(of.network.auth, of.network.encrypt)};
  return {of.obstacle, Tone::kFaint};
}

constexpr Field<Found> kFoundFields[] = {
    {"name", "NAME", [](const Found& of) { return Value(of.network.szEssid); }, Layout::kElastic},
    {"signal", "  SIGNAL", [](const Found& of) { return Value(int64_t{of.network.signal}); }, Layout::kLeft,
     [](const Found& of, bool utf8) { return ShowSignal(of.network.signal, utf8); }},
    {"channel", "CH", [](const Found& of) { return Value(int64_t{of.network.channel}); }, Layout::kRight},
    {"auth", "SECURITY", [](const Found& of) { return AuthOf(of.network); }, Layout::kLeft,
     [](const Found& of, bool) { return ShowSecurity(of); }},
    {"encryption", "", [](const Found& of) { return EncryptionOf(of.network); }},
    {"standard", "STANDARD", [](const Found& of) { return Value(MEROWirelessProtocolStringGet(of.network.protocol)); }},
    {"address", "ACCESS POINT", [](const Found& of) { return Value(AddressText(of.network.bssid)); }},
    {"name_hex", "", [](const Found& of) { return NameInHex(of.network.szEssid); }},
    {"joined", "", [](const Found& of) { return Value(of.isJoined); }},
    {"known", "KNOWN", [](const Found& of) { return Value(of.isKnown); }, Layout::kLeft, ShowKnown},
    {"unsupported", "", [](const Found& of) { return Value(of.obstacle); }},
};

Value AddressesOf(const SavedNetwork& of) {
  std::string addresses;
  for (const Address& address : of.addresses) {
    if (!addresses.empty()) addresses += ' ';
    addresses += AddressText(address);
  }
  return addresses;
}

// One access point by its address; of several, how many there are.
Shown ShowAccessPoints(const SavedNetwork& of, bool) {
  const std::size_t count = of.addresses.size();
  return {count == 1 ? AddressText(of.addresses.front()) : std::to_string(count) + " access points"};
}

// Whether a network is joined by itself, and with which priority where it has one.
Shown ShowAutojoin(const SavedNetwork& of, bool) {
  const Extras extras = ExtrasOf(of.newest);
  if (!extras.autojoin) return {"no", Tone::kFair};
  return {extras.priority == 0 ? "yes" : "yes, " + std::to_string(extras.priority)};
}

constexpr Field<SavedNetwork> kWithSecret[] = {
    {"name", "NAME", [](const SavedNetwork& of) { return Value(of.newest.network.szEssid); }, Layout::kElastic},
    {"auth", "SECURITY", [](const SavedNetwork& of) { return AuthOf(of.newest.network); }, Layout::kLeft,
     [](const SavedNetwork& of, bool) {
       return Shown{SecurityText(of.newest.network.auth, of.newest.network.encrypt)};
     }},
    {"encryption", "", [](const SavedNetwork& of) { return EncryptionOf(of.newest.network); }},
    {"mode", "", [](const SavedNetwork& of) { return Value(MEROWirelessOpmodeStringGet(of.newest.network.opmode)); }},
    {"ip", "ADDRESS", [](const SavedNetwork& of) { return Value(of.newest.szIp); }},
    {"mask", "", [](const SavedNetwork& of) { return Value(of.newest.szMask); }},
    {"gateway", "", [](const SavedNetwork& of) { return Value(of.newest.szGateway); }},
    {"saved", "SAVED",
     [](const SavedNetwork& of) { return of.newest.atime == 0 ? nullptr : Value(UtcText(of.newest.atime)); },
     Layout::kLeft,
     [](const SavedNetwork& of, bool) {
       return of.newest.atime == 0 ? Shown{"-", Tone::kFaint} : Shown{LocalText(of.newest.atime, "%F %R")};
     }},
    {"address", "ACCESS POINT", [](const SavedNetwork& of) { return Value(AddressText(of.newest.network.bssid)); },
     Layout::kLeft, ShowAccessPoints},
    {"name_hex", "", [](const SavedNetwork& of) { return NameInHex(of.newest.network.szEssid); }},
    {"has_secret", "", [](const SavedNetwork& of) { return Value(of.newest.szKey[0] != '\0'); }},
    {"secret", "SECRET", [](const SavedNetwork& of) { return Value(of.newest.szKey); }},
    {"addresses", "", AddressesOf},
    {"name_servers", "", [](const SavedNetwork& of) { return Value(ExtrasOf(of.newest).nameServers); }},
    {"priority", "", [](const SavedNetwork& of) { return Value(int64_t{ExtrasOf(of.newest).priority}); }},
    {"autojoin", "AUTO", [](const SavedNetwork& of) { return Value(ExtrasOf(of.newest).autojoin); }, Layout::kLeft,
     ShowAutojoin},
};

constexpr auto kWithoutSecret = [] {
  std::array<Field<SavedNetwork>, std::size(kWithSecret) - 1> fields{};
  std::ranges::copy_if(kWithSecret, fields.begin(),
                       [](const Field<SavedNetwork>& field) { return field.key != "secret"; });
  return fields;
}();

// ---- Saving ----

// A network that no scan shows, since it hides its name or is out of range, as the user describes it.
Network Described(const NetworkToSave& wanted) {
  const auto address = ParseAddress(wanted.address);
  if (!address || !IsStation(*address)) {
    throw Failure(Exit::kUsage, "--bssid is no access point's address", "write it as 00:11:22:33:44:55");
  }
  Network network{};
  std::ranges::copy(*address, network.bssid);
  RequireName(wanted.name);
  SetNetworkName(network.szEssid, wanted.name);
  if (!SetSecurity(network, wanted.security)) {
    throw Failure(Exit::kUsage, "with --bssid, --security says how the network is protected", kSecurityNames);
  }
  return network;
}

// ---- Scanning ----

// Whether the adapter's last results say what is in range now.
bool AreUsable() {
  constexpr std::chrono::seconds kOldest{30};
  const LastScan last = ReadLastScan(MEROWirelessInterfaceGet());
  return last.age && *last.age <= kOldest;
}

// One of a known name that is protected otherwise is another network, or pretends to be that one.
bool IsSame(const Network& one, const Network& other) {
  return std::string_view(one.szEssid) == other.szEssid && IsProtectedAlike(one, other);
}

std::vector<Found> FoundAmong(const std::vector<Network>& networks) {
  const auto known = Known(Order::kAsSaved);
  const auto joined = ReadLastScan(MEROWirelessInterfaceGet()).joined;
  const Obstacles obstacles = Obstacles::Read();
  std::vector<Found> found;
  found.reserve(networks.size());
  for (const Network& network : networks) {
    found.push_back({.network = network,
                     .isJoined = joined && std::ranges::equal(*joined, network.bssid),
                     .isKnown = std::ranges::any_of(
                         known, [&](const KnownNetwork& other) { return IsSame(other.network, network); }),
                     .obstacle = obstacles.Of(network)});
  }
  return found;
}

// The network that is to be saved. One that is known by its name is changed by it only when none of its access points
// in range is protected as it was: others may only bear the name.
Network ToBeSaved(const Program& program, const std::string& name) {
  const Network strongest = FindInRange(program, name);
  if (name != strongest.szEssid) return strongest;
  for (const SavedNetwork& saved : SavedAs(name)) {
    if (const auto config = Through(saved, LookFor(program, saved))) return config->network;
  }
  return strongest;
}

std::string NoneInRange() {
  const std::string more = SavedCountry().empty() ? "; `merowireless country CC` sets it" : "";
  return "no network is in range" + WhereRulesHold() + more;
}

}  // namespace

std::vector<Network> NetworksInRange(const Program& program, Results results) {
  const bool renew = results == Results::kNew || (results == Results::kUsable && !AreUsable());
  if (renew) RequireScanning();
  return InRange(program, renew ? WIRELESS_SCAN_RENEW : WIRELESS_SCAN_LAST);
}

void Scan(const Program& program, Results results) {
  RequireAdapter();
  const auto found = FoundAmong(NetworksInRange(program, results));
  program.output.List<Found>("networks", kFoundFields, found, found.empty() ? NoneInRange() : "");
}

void ListKnown(const Program& program, bool byTime, bool showSecrets) {
  const auto known = SavedNetworks(byTime ? Order::kByTime : Order::kAsSaved);
  const std::span<const Field<SavedNetwork>> fields =
      showSecrets ? std::span<const Field<SavedNetwork>>(kWithSecret) : kWithoutSecret;
  program.output.List<SavedNetwork>("networks", fields, known,
                                    "no network is known; `merowireless save NAME` saves one");
}

void Save(const Program& program, const NetworkToSave& wanted) {
  if (wanted.address.empty()) RequireAdapter();  // to look for the network
  KnownNetwork config{};
  SetAddressing(config, wanted.addressing);
  config.network = wanted.address.empty() ? ToBeSaved(program, wanted.name) : Described(wanted);
  RequireJoinable(program, config.network);
  if (config.network.opmode == WIRELESS_OPMODE_AUTO) config.network.opmode = WIRELESS_OPMODE_MANAGED;
  SetSecret(program, config, wanted.secret);
  const SavedNetwork saved = SaveNetwork(config, !ParseAddress(wanted.name));
  const std::string name = program.output.Name(config.network.szEssid);
  const std::string which = saved.addresses.size() == 1 ? AddressText(config.network.bssid)
                                                        : std::to_string(saved.addresses.size()) + " access points";
  program.output.Done<SavedNetwork>("saved " + name + " (" + which + ")", "network", kWithoutSecret, saved);
}

void SayChanged(const Program& program, const std::string& sentence, const std::vector<SavedNetwork>& networks) {
  program.output.ListDone<SavedNetwork>(sentence, "networks", kWithoutSecret, networks);
}

void Forget(const Program& program, const std::string& name) {
  const std::vector<SavedNetwork> known = SavedAs(name);
  const std::string shown = program.output.Name(name);
  if (known.empty()) throw NotKnown(program, name);
  for (const SavedNetwork& network : known) {
    for (const Address& address : network.addresses) {
      if (PLIBCFileRemoveSection(kKnownNetworksPath, AddressText(address).c_str()) > 0) continue;
      throw Failed(shown + " could not be forgotten", "its section is in " + std::string(kKnownNetworksPath));
    }
  }
  SayChanged(program, "forgot " + shown, known);
}
