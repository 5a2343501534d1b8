// What the kernel says of an interface and its radio.
#include "model/air.h"

#include <netlink/genl/genl.h>

#include <array>

#include "common/channel.h"
#include "model/wireless_stack.h"

namespace {

// The attributes of a message, by their kind. They lie within the message.
using Attributes = std::array<nlattr*, NL80211_ATTR_MAX + 1>;

std::optional<Attributes> AttributesOf(std::string& message) {
  nla_policy policy[NL80211_ATTR_MAX + 1] = {};
  policy[NL80211_ATTR_IFTYPE].type = NLA_U32;
  policy[NL80211_ATTR_WIPHY_FREQ].type = NLA_U32;
  Attributes attributes;
  auto* header = reinterpret_cast<nlmsghdr*>(message.data());
  if (genlmsg_parse(header, 0, attributes.data(), NL80211_ATTR_MAX, policy) < 0) return std::nullopt;
  return attributes;
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

int StationsOf(const std::string& interface) {
  return static_cast<int>(AskWirelessStack(NL80211_CMD_GET_STATION, interface, true).size());
}
