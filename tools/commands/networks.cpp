// The commands about networks: scan, known, save, forget.
#include "commands/networks.h"

#include <algorithm>
#include <chrono>
#include <functional>

#include "base/clock.h"
#include "common/paths.h"
#include "model/last_scan.h"
#include "model/library.h"
#include "model/security.h"

namespace {

// A name in hexadecimal, for one that is no UTF-8 and so cannot be given as text.
Value NameInHex(std::string_view name) {
  return IsUtf8(name) ? Value(nullptr) : Value(Hex(name));
}

// ---- Signals ----

// In per cent. Some drivers give dBm, which is below 0: by custom -50 dBm is all and -100 dBm nothing.
int QualityOf(int signal) {
  return std::clamp(signal < 0 ? 2 * (signal + 100) : signal, 0, 100);
}

Shown ShowSignal(int signal, bool utf8) {
  constexpr std::string_view kBars[] = {"▂", "▄", "▆", "█"};
  const int quality = QualityOf(signal);
  const auto lit = static_cast<std::size_t>((quality + 24) / 25);
  std::string text;
  for (std::size_t i = 0; i < std::size(kBars); ++i) {
    text += utf8 ? (i < lit ? kBars[i] : "▁") : (i < lit ? "#" : ".");
  }
  const std::string figure = std::to_string(signal);
  text += std::string(figure.size() < 4 ? 4 - figure.size() : 1, ' ') + figure;
  return {text, quality >= 60 ? Tone::kGood : quality >= 30 ? Tone::kFair : Tone::kBad};
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
};

Shown ShowKnown(const Found& of, bool) {
  if (of.isJoined) return {"joined", Tone::kGood};
  return of.isKnown ? Shown{"yes"} : Shown{"-", Tone::kFaint};
}

constexpr Field<Found> kFoundFields[] = {
    {"name", "NAME", [](const Found& of) { return Value(of.network.szEssid); }, Layout::kElastic},
    {"signal", "  SIGNAL", [](const Found& of) { return Value(int64_t{of.network.signal}); }, Layout::kLeft,
     [](const Found& of, bool utf8) { return ShowSignal(of.network.signal, utf8); }},
    {"channel", "CH", [](const Found& of) { return Value(int64_t{of.network.channel}); }, Layout::kRight},
    {"auth", "SECURITY", [](const Found& of) { return AuthOf(of.network); }, Layout::kLeft,
     [](const Found& of, bool) { return Shown{SecurityText(of.network.auth, of.network.encrypt)}; }},
    {"encryption", "", [](const Found& of) { return EncryptionOf(of.network); }},
    {"standard", "STANDARD", [](const Found& of) { return Value(MEROWirelessProtocolStringGet(of.network.protocol)); }},
    {"address", "ACCESS POINT", [](const Found& of) { return Value(AddressText(of.network.bssid)); }},
    {"name_hex", "", [](const Found& of) { return NameInHex(of.network.szEssid); }},
    {"joined", "", [](const Found& of) { return Value(of.isJoined); }},
    {"known", "KNOWN", [](const Found& of) { return Value(of.isKnown); }, Layout::kLeft, ShowKnown},
};

// The secret is the last field, so that it can be left out.
constexpr Field<KnownNetwork> kKnownFields[] = {
    {"name", "NAME", [](const KnownNetwork& of) { return Value(of.network.szEssid); }, Layout::kElastic},
    {"auth", "SECURITY", [](const KnownNetwork& of) { return AuthOf(of.network); }, Layout::kLeft,
     [](const KnownNetwork& of, bool) { return Shown{SecurityText(of.network.auth, of.network.encrypt)}; }},
    {"encryption", "", [](const KnownNetwork& of) { return EncryptionOf(of.network); }},
    {"mode", "", [](const KnownNetwork& of) { return Value(MEROWirelessOpmodeStringGet(of.network.opmode)); }},
    {"ip", "ADDRESS", [](const KnownNetwork& of) { return Value(of.szIp); }},
    {"mask", "", [](const KnownNetwork& of) { return Value(of.szMask); }},
    {"gateway", "", [](const KnownNetwork& of) { return Value(of.szGateway); }},
    {"saved", "SAVED", [](const KnownNetwork& of) { return of.atime == 0 ? nullptr : Value(UtcText(of.atime)); },
     Layout::kLeft,
     [](const KnownNetwork& of, bool) {
       return of.atime == 0 ? Shown{"-", Tone::kFaint} : Shown{LocalText(of.atime, "%F %R")};
     }},
    {"address", "ACCESS POINT", [](const KnownNetwork& of) { return Value(AddressText(of.network.bssid)); }},
    {"name_hex", "", [](const KnownNetwork& of) { return NameInHex(of.network.szEssid); }},
    {"has_secret", "", [](const KnownNetwork& of) { return Value(of.szKey[0] != '\0'); }},
    {"secret", "SECRET", [](const KnownNetwork& of) { return Value(of.szKey); }},
};

constexpr std::span kWithSecret(kKnownFields);
constexpr std::span kWithoutSecret = kWithSecret.first(kWithSecret.size() - 1);

// ---- Saving ----

// Whether an address can be an access point's: it is not all zeros, and not a group's.
bool IsStation(const Address& address) {
  return address != Address{} && (address[0] & 1) == 0;
}

// A network that no scan shows, since it hides its name or is out of range, as the user describes it.
Network Described(const NetworkToSave& wanted) {
  const auto address = ParseAddress(wanted.address);
  if (!address || !IsStation(*address)) {
    throw Failure(Exit::kUsage, "--bssid is no access point's address", "write it as 00:11:22:33:44:55");
  }
  Network network{};
  std::ranges::copy(*address, network.bssid);
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
  return std::string_view(one.szEssid) == other.szEssid &&
         SecurityText(one.auth, WIRELESS_ENCRYPT_UNKNOWN) == SecurityText(other.auth, WIRELESS_ENCRYPT_UNKNOWN);
}

// The networks, the strongest first.
std::vector<Found> FoundAmong(std::vector<Network> networks) {
  const auto known = Known(Order::kAsSaved);
  const auto joined = ReadLastScan(MEROWirelessInterfaceGet()).joined;
  std::ranges::stable_sort(networks, std::greater{}, &Network::signal);
  std::vector<Found> found;
  found.reserve(networks.size());
  for (const Network& network : networks) {
    found.push_back({.network = network,
                     .isJoined = joined && std::ranges::equal(*joined, network.bssid),
                     .isKnown = std::ranges::any_of(
                         known, [&](const KnownNetwork& other) { return IsSame(other.network, network); })});
  }
  return found;
}

Failure NotSaved() {
  return Failed("the network could not be saved", "is there room on the disk? -v shows more");
}

}  // namespace

void Scan(const Program& program, Results results) {
  RequireAdapter();
  const bool renew = results == Results::kNew || (results == Results::kUsable && !AreUsable());
  if (renew) RequireScanning();
  const auto networks = InRange(program, renew ? WIRELESS_SCAN_RENEW : WIRELESS_SCAN_LAST);
  program.output.List<Found>("networks", kFoundFields, FoundAmong(networks), "no network is in range");
}

void ListKnown(const Program& program, bool byTime, bool showSecrets) {
  const auto known = Known(byTime ? Order::kByTime : Order::kAsSaved);
  program.output.List<KnownNetwork>("networks", showSecrets ? kWithSecret : kWithoutSecret, known,
                                    "no network is known; `merowireless save NAME` saves one");
}

void Save(const Program& program, const NetworkToSave& wanted) {
  if (wanted.address.empty()) RequireAdapter();  // to look for the network
  KnownNetwork config{};
  SetAddressing(config, wanted.addressing);
  config.network = wanted.address.empty() ? FindInRange(program, wanted.name) : Described(wanted);
  if (config.network.opmode == WIRELESS_OPMODE_AUTO) config.network.opmode = WIRELESS_OPMODE_MANAGED;
  SetSecret(program, config, wanted.secret);
  if (MEROWirelessConfSet(&config) < 0) throw NotSaved();
  const std::string name = program.output.Name(config.network.szEssid);
  program.output.Done<KnownNetwork>("saved " + name + " (" + AddressText(config.network.bssid) + ")", "network",
                                    kWithoutSecret, config);
}

void Forget(const Program& program, const std::string& name) {
  const std::vector<KnownNetwork> known = AllKnown(name);
  const std::string shown = program.output.Name(name);
  if (known.empty()) {
    throw Failure(Exit::kOutOfRange, "no network named " + shown + " is known",
                  "`merowireless known` lists those that are");
  }
  for (const KnownNetwork& network : known) {
    if (PLIBCFileRemoveSection(kKnownNetworksPath, AddressText(network.network.bssid).c_str()) > 0) continue;
    throw Failed(shown + " could not be forgotten", "its section is in " + std::string(kKnownNetworksPath));
  }
  program.output.ListDone<KnownNetwork>("forgot " + shown, "networks", kWithoutSecret, known);
}
