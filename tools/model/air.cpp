// What the kernel says of an interface and its radio.
#include "model/air.h"

#include <netlink/genl/genl.h>

#include <algorithm>
#include <array>

#include "common/channel.h"
#include "model/wireless_stack.h"

namespace {

// The attributes of a message, by their kind. They lie within the message.
using Attributes = std::array<nlattr*, NL80211_ATTR_MAX + 1>;
using ChannelAttributes = std::array<nlattr*, NL80211_FREQUENCY_ATTR_MAX + 1>;

std::optional<Attributes> AttributesOf(std::string& message) {
  nla_policy policy[NL80211_ATTR_MAX + 1] = {};
  policy[NL80211_ATTR_IFTYPE].type = NLA_U32;
  policy[NL80211_ATTR_WIPHY_FREQ].type = NLA_U32;
  Attributes attributes;
  auto* header = reinterpret_cast<nlmsghdr*>(message.data());
  if (genlmsg_parse(header, 0, attributes.data(), NL80211_ATTR_MAX, policy) < 0) return std::nullopt;
  return attributes;
}

// Calls `visit(attribute)` for each attribute within another.
template <class Visit>
void ForEachIn(const nlattr* outer, Visit visit) {
  const auto* attribute = static_cast<const nlattr*>(nla_data(outer));
  for (int left = nla_len(outer); nla_ok(attribute, left) != 0; attribute = nla_next(attribute, &left))
    visit(attribute);
}

ChannelUse UseOf(const ChannelAttributes& channel) {
  if (channel[NL80211_FREQUENCY_ATTR_DISABLED] != nullptr) return ChannelUse::kNone;
  if (channel[NL80211_FREQUENCY_ATTR_NO_IR] != nullptr) return ChannelUse::kListening;
  return channel[NL80211_FREQUENCY_ATTR_RADAR] != nullptr ? ChannelUse::kAllAfterRadar : ChannelUse::kAll;
}

void AddChannel(std::vector<Channel>& channels, const nlattr* description) {
  nla_policy policy[NL80211_FREQUENCY_ATTR_MAX + 1] = {};
  policy[NL80211_FREQUENCY_ATTR_FREQ].type = NLA_U32;
  ChannelAttributes channel;
  if (nla_parse_nested(channel.data(), NL80211_FREQUENCY_ATTR_MAX, const_cast<nlattr*>(description), policy) < 0)
    return;
  if (channel[NL80211_FREQUENCY_ATTR_FREQ] == nullptr) return;
  const unsigned megahertz = nla_get_u32(channel[NL80211_FREQUENCY_ATTR_FREQ]);
  channels.push_back({.number = ChannelOf(megahertz), .megahertz = static_cast<int>(megahertz), .use = UseOf(channel)});
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
  const auto attributes = AttributesOf(messages.front());
  if (!attributes || (*attributes)[NL80211_ATTR_IFTYPE] == nullptr) return std::nullopt;

  Air air;
  air.isAccessPoint = nla_get_u32((*attributes)[NL80211_ATTR_IFTYPE]) == NL80211_IFTYPE_AP;
  if (const nlattr* frequency = (*attributes)[NL80211_ATTR_WIPHY_FREQ]) {
    air.megahertz = static_cast<int>(nla_get_u32(frequency));
    air.channel = ChannelOf(nla_get_u32(frequency));
  }
  if (const nlattr* name = (*attributes)[NL80211_ATTR_SSID]) {
    air.name.assign(static_cast<const char*>(nla_data(name)), static_cast<std::size_t>(nla_len(name)));
  }
  return air;
}

// A radio has more to tell than one message holds, so each may have a part of the channels.
std::vector<Channel> ChannelsOf(const std::string& interface) {
  std::vector<Channel> channels;
  for (std::string& message : AskWirelessStack(NL80211_CMD_GET_WIPHY, interface, true)) {
    const auto attributes = AttributesOf(message);
    if (attributes && (*attributes)[NL80211_ATTR_WIPHY_BANDS] != nullptr) {
      AddChannels(channels, (*attributes)[NL80211_ATTR_WIPHY_BANDS]);
    }
  }
  std::ranges::sort(channels, {}, &Channel::megahertz);
  return channels;
}
