// What the connection runs over at this moment.
#include "model/link.h"

#include <cstdint>

#include "base/failure.h"
#include "base/text.h"
#include "model/air.h"
#include "model/attributes.h"
#include "model/name_servers.h"
#include "model/wireless_stack.h"
#include "work/radio.h"
#include "work/routes.h"

namespace {

// The kernel tells it in tenths of a megabit, and in 16 bits where it is an older one.
std::optional<int> RateOf(const nlattr* description) {
  constexpr int kTenth = 100;
  const Nest<NL80211_RATE_INFO_MAX> rate(description);
  if (const auto all = rate.As<std::uint32_t>(NL80211_RATE_INFO_BITRATE32)) return static_cast<int>(*all) * kTenth;
  if (const auto low = rate.As<std::uint16_t>(NL80211_RATE_INFO_BITRATE)) return *low * kTenth;
  return std::nullopt;
}

void AddStation(Link& link, std::string& message) {
  if (const auto address = ValueIn<Address>(AttributeOf(message, NL80211_ATTR_MAC))) {
    link.accessPoint = AddressText(*address);
  }
  const Nest<NL80211_STA_INFO_MAX> station(AttributeOf(message, NL80211_ATTR_STA_INFO));
  link.signal = station.As<std::int8_t>(NL80211_STA_INFO_SIGNAL);
  link.rate = RateOf(station.parts[NL80211_STA_INFO_TX_BITRATE]);
  if (const auto seconds = station.As<std::uint32_t>(NL80211_STA_INFO_CONNECTED_TIME)) {
    link.since = std::time(nullptr) - static_cast<std::time_t>(*seconds);
  }
}

// To a client, its access point is the one station that there is; a cell has as many as there are others in it.
void AddAir(Link& link, const std::string& interface, LinkTo to) {
  const auto air = AirOf(interface);
  if (air && air->channel != 0) link.channel = air->channel;
  if (to == LinkTo::kCell) return;
  auto stations = AskWirelessStack(NL80211_CMD_GET_STATION, interface, true);
  if (!stations.empty()) AddStation(link, stations.front());
}

}  // namespace

Link LinkOf(const std::string& interface, LinkTo to) {
  Link link;
  try {
    AddAir(link, interface, to);
  } catch (const Failure&) {  // NOLINT(bugprone-empty-catch)
    // An adapter may be pulled while it is asked: that stays unknown, and the rest is told all the same.
  }
  if (link.accessPoint.empty()) {
    if (const auto address = AccessPointOf(interface)) link.accessPoint = AddressText(*address);
  }
  link.gateway = GatewayOf(interface);
  link.nameServers = WithBlanks(NameServersOf(interface));
  return link;
}
