// What the kernel says of an interface and its radio.
#include "model/air.h"

#include <algorithm>
#include <cstdint>

#include "common/channel.h"
#include "model/attributes.h"
#include "model/wireless_stack.h"

namespace {

using ChannelAttributes = Nest<NL80211_FREQUENCY_ATTR_MAX>;

// Calls `visit(attribute)` for each attribute within another.
template <class Visit>
void ForEachIn(const nlattr* outer, Visit visit) {
  const auto* attribute = static_cast<const nlattr*>(nla_data(outer));
  for (int left = nla_len(outer); nla_ok(attribute, left) != 0; attribute = nla_next(attribute, &left))
    visit(attribute);
}

ChannelUse UseOf(const ChannelAttributes& channel) {
  if (channel.parts[NL80211_FREQUENCY_ATTR_DISABLED] != nullptr) return ChannelUse::kNone;
  if (channel.parts[NL80211_FREQUENCY_ATTR_NO_IR] != nullptr) return ChannelUse::kListening;
  return channel.parts[NL80211_FREQUENCY_ATTR_RADAR] != nullptr ? ChannelUse::kAllAfterRadar : ChannelUse::kAll;
}

void AddChannel(std::vector<Channel>& channels, const nlattr* description) {
  const ChannelAttributes channel(description);
  const auto megahertz = channel.As<std::uint32_t>(NL80211_FREQUENCY_ATTR_FREQ);
  if (!megahertz) return;
  channels.push_back(
      {.number = ChannelOf(*megahertz), .megahertz = static_cast<int>(*megahertz), .use = UseOf(channel)});
}

void AddChannels(std::vector<Channel>& channels, const nlattr* bands) {
  ForEachIn(bands, [&](const nlattr* band) {
    if (nla_type(band) != NL80211_BAND_2GHZ && nla_type(band) != NL80211_BAND_5GHZ) return;
    ForEachIn(band, [&](const nlattr* attribute) {
      if (nla_type(attribute) != NL80211_BAND_ATTR_FREQS) return;
      ForEachIn(attribute, [&](const nlattr* channel) { AddChannel(channels, channel); });
    });
  });
}

}  // namespace

std::optional<Air> AirOf(const std::string& interface) {
  auto messages = AskWirelessStack(NL80211_CMD_GET_INTERFACE, interface, false);
  if (messages.empty()) return std::nullopt;
  std::string& message = messages.front();
  const auto type = ValueIn<std::uint32_t>(AttributeOf(message, NL80211_ATTR_IFTYPE));
  if (!type) return std::nullopt;

  Air air;
  air.isAccessPoint = *type == NL80211_IFTYPE_AP;
  if (const auto megahertz = ValueIn<std::uint32_t>(AttributeOf(message, NL80211_ATTR_WIPHY_FREQ))) {
    air.megahertz = static_cast<int>(*megahertz);
    air.channel = ChannelOf(*megahertz);
  }
  if (const nlattr* name = AttributeOf(message, NL80211_ATTR_SSID)) {
    air.name.assign(static_cast<const char*>(nla_data(name)), static_cast<std::size_t>(nla_len(name)));
  }
  return air;
}

// A radio has more to tell than one message holds, so each may have a part of the channels.
std::vector<Channel> ChannelsOf(const std::string& interface) {
  std::vector<Channel> channels;
  for (std::string& message : AskWirelessStack(NL80211_CMD_GET_WIPHY, interface, true)) {
    if (const nlattr* bands = AttributeOf(message, NL80211_ATTR_WIPHY_BANDS)) AddChannels(channels, bands);
  }
  std::ranges::sort(channels, {}, &Channel::megahertz);
  return channels;
}
