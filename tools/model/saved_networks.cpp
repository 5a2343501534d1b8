// Known networks as people think of them.
#include "model/saved_networks.h"

#include <algorithm>
#include <functional>
#include <string_view>
#include <utility>

#include "common/text.h"
#include "model/network_extras.h"
#include "model/security.h"

namespace {

Address AddressOf(const Network& network) {
  Address address;
  std::ranges::copy(network.bssid, address.begin());
  return address;
}

Address AddressOf(const KnownNetwork& section) {
  return AddressOf(section.network);
}

// A cell and a network with access points are two things, whatever they are called.
bool IsAlike(const KnownNetwork& one, const KnownNetwork& other) {
  const bool areCells = one.network.opmode == WIRELESS_OPMODE_ADHOC;
  return std::string_view(one.network.szEssid) == other.network.szEssid &&
         areCells == (other.network.opmode == WIRELESS_OPMODE_ADHOC) && IsProtectedAlike(one.network, other.network);
}

bool HasSameSecret(const KnownNetwork& one, const KnownNetwork& other) {
  return std::string_view(one.szKey) == other.szKey;
}

// Adds a section to a network that it belongs to.
void Add(const KnownNetwork& section, SavedNetwork& network) {
  const bool isNewest = section.atime > network.newest.atime;
  if (isNewest) network.newest = section;
  network.addresses.insert(isNewest ? network.addresses.begin() : network.addresses.end(), AddressOf(section));
}

std::vector<SavedNetwork> Grouped(const std::vector<KnownNetwork>& sections) {
  std::vector<SavedNetwork> networks;
  for (const KnownNetwork& section : sections) {
    const auto found = std::ranges::find_if(networks, [&](const SavedNetwork& network) {
      return IsAlike(network.newest, section) && HasSameSecret(network.newest, section);
    });
    if (found != networks.end()) {
      Add(section, *found);
    } else {
      networks.push_back({.newest = section, .addresses = {AddressOf(section)}, .others = {}});
    }
  }
  for (SavedNetwork& network : networks) {
    for (const KnownNetwork& section : sections) {
      const bool isAnothers = IsAlike(network.newest, section) && !HasSameSecret(network.newest, section);
      if (isAnothers) network.others.push_back(AddressOf(section));
    }
  }
  return networks;
}

void Save(const KnownNetwork& section) {
  if (MEROWirelessConfSet(&section) < 0) {
    throw Failed("the network could not be saved", "is there room on the disk? -v shows more");
  }
}

// Another access point of a network, with what is new of it.
KnownNetwork Renewed(KnownNetwork section, const KnownNetwork& config) {
  if (!IsProtectedAlike(section.network, config.network)) {
    section.network.auth = config.network.auth;
    section.network.encrypt = config.network.encrypt;
  }
  CopyText(section.szKey, config.szKey);
  CopyText(section.szIp, config.szIp);
  CopyText(section.szMask, config.szMask);
  CopyText(section.szGateway, config.szGateway);
  return section;
}

// The other access points that are saved anew with a network.
std::vector<KnownNetwork> Others(const KnownNetwork& config) {
  std::vector<KnownNetwork> others = Known(Order::kAsSaved);
  const bool isChanged =
      std::ranges::none_of(others, [&](const KnownNetwork& section) { return IsAlike(section, config); });
  std::erase_if(others, [&](const KnownNetwork& section) {
    const bool isNamed = std::string_view(section.network.szEssid) == config.network.szEssid &&
                         section.network.opmode != WIRELESS_OPMODE_ADHOC;
    return AddressOf(section) == AddressOf(config) || !(isChanged ? isNamed : IsAlike(section, config));
  });
  return others;
}

}  // namespace

void SavedNetwork::LeaveOnly(const Network& accessPoint) {
  addresses = {AddressOf(accessPoint)};
  others.clear();
  isOneAccessPoint = true;
}

std::vector<SavedNetwork> SavedNetworks(Order order) {
  return Grouped(Known(order));
}

std::vector<SavedNetwork> SavedAs(const std::string& name) {
  if (!ParseAddress(name)) return SavedUnder(name);
  std::vector<SavedNetwork> networks;
  for (const KnownNetwork& section : AllKnown(name)) {
    networks.push_back({.newest = section, .addresses = {AddressOf(section)}, .others = {}, .isOneAccessPoint = true});
  }
  return networks;
}

std::vector<SavedNetwork> SavedUnder(const std::string& essid) {
  std::vector<SavedNetwork> networks = SavedNetworks(Order::kByTime);
  std::erase_if(networks, [&](const SavedNetwork& network) { return essid != network.newest.network.szEssid; });
  return networks;
}

std::vector<SavedNetwork> NetworksToTry() {
  struct Turn {
    int priority;
    SavedNetwork network;
  };
  std::vector<Turn> turns;
  for (SavedNetwork& network : SavedNetworks(Order::kByTime)) {
    const Extras extras = ExtrasOf(network.newest);
    if (extras.autojoin) turns.push_back({extras.priority, std::move(network)});
  }
  std::ranges::stable_sort(turns, std::greater{}, &Turn::priority);
  std::vector<SavedNetwork> networks;
  networks.reserve(turns.size());
  for (Turn& turn : turns) networks.push_back(std::move(turn.network));
  return networks;
}

SavedNetwork SaveNetwork(const KnownNetwork& config, bool isWhole) {
  SavedNetwork saved{.newest = config, .addresses = {AddressOf(config)}, .others = {}};
  const auto others = isWhole ? Others(config) : std::vector<KnownNetwork>();
  const bool isAdded = !HasSection(config);
  Save(config);
  if (isAdded && !others.empty()) CopyExtras(others.front(), config);
  for (const KnownNetwork& section : others) {
    Save(Renewed(section, config));
    saved.addresses.push_back(AddressOf(section));
  }
  return saved;
}

Failure NotKnown(const Program& program, const std::string& name) {
  return {Exit::kOutOfRange, "no network named " + program.output.Name(name) + " is known",
          "`merowireless known` lists those that are"};
}
