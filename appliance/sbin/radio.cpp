#include "appliance/sbin/radio.h"

#include <net/if.h>

#include <array>
#include <cstring>
#include <stdexcept>
#include <tuple>
#include <utility>

#include "appliance/sbin/elements.h"
#include "common/channel.h"
#include "common/nl80211.h"

namespace iwlist {
namespace {

[[noreturn]] void RefuseInterface(const std::string& interface) {
  throw std::runtime_error(interface + ": not a wireless interface");
}

// The attributes of a network in a message, by their kind.
using Attributes = std::array<nlattr*, NL80211_BSS_MAX + 1>;

// False when the message describes no network.
bool ReadAttributes(nlmsghdr* message, Attributes& bss) {
  nla_policy policy[NL80211_BSS_MAX + 1] = {};
  policy[NL80211_BSS_BSSID].minlen = std::tuple_size_v<decltype(Network::bssid)>;
  policy[NL80211_BSS_FREQUENCY].type = NLA_U32;
  policy[NL80211_BSS_CAPABILITY].type = NLA_U16;
  policy[NL80211_BSS_SIGNAL_MBM].minlen = sizeof(std::int32_t);
  policy[NL80211_BSS_SIGNAL_UNSPEC].type = NLA_U8;
  policy[NL80211_BSS_SEEN_MS_AGO].type = NLA_U32;

  if (!genlmsg_valid_hdr(message, 0)) return false;
  const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
  nlattr* description = nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), NL80211_ATTR_BSS);
  return description != nullptr && nla_parse_nested(bss.data(), NL80211_BSS_MAX, description, policy) == 0 &&
         bss[NL80211_BSS_BSSID] != nullptr && bss[NL80211_BSS_FREQUENCY] != nullptr;
}

int SignalOf(const Attributes& bss) {
  // The figure of a network whose driver gives none: the weakest that a driver gives.
  constexpr int kWeakest = -100;
  if (const nlattr* mbm = bss[NL80211_BSS_SIGNAL_MBM]) return nla_get_s32(mbm) / 100;
  // A share of the best signal, in per cent. By custom 100 % is -50 dBm and 2 % is 1 dB.
  if (const nlattr* share = bss[NL80211_BSS_SIGNAL_UNSPEC]) return kWeakest + nla_get_u8(share) / 2;
  return kWeakest;
}

Bytes ElementsOf(const Attributes& bss) {
  // The answer to a probe tells the name that a beacon may hide.
  const nlattr* elements = bss[NL80211_BSS_INFORMATION_ELEMENTS];
  if (elements == nullptr) elements = bss[NL80211_BSS_BEACON_IES];
  if (elements == nullptr) return {};
  return {static_cast<const std::uint8_t*>(nla_data(elements)), static_cast<std::size_t>(nla_len(elements))};
}

}  // namespace

std::optional<Network> NetworkOfMessage(nlmsghdr* message) {
  Attributes bss;
  if (!ReadAttributes(message, bss)) return {};
  const unsigned megahertz = nla_get_u32(bss[NL80211_BSS_FREQUENCY]);
  const unsigned capability = bss[NL80211_BSS_CAPABILITY] == nullptr ? 0 : nla_get_u16(bss[NL80211_BSS_CAPABILITY]);

  Network network;
  std::memcpy(network.bssid.data(), nla_data(bss[NL80211_BSS_BSSID]), network.bssid.size());
  network.channel = ChannelOf(megahertz);
  network.signal = SignalOf(bss);
  if (const nlattr* age = bss[NL80211_BSS_SEEN_MS_AGO]) network.seenMsAgo = nla_get_u32(age);
  network.description = Describe(ElementsOf(bss), capability, megahertz);
  return network;
}

std::vector<Network> ReadScanResults(const std::string& interface) {
  const unsigned index = if_nametoindex(interface.c_str());
  if (index == 0) throw std::runtime_error(interface + ": no such interface");

  nl80211::Answer answer = nl80211::Ask({NL80211_CMD_GET_SCAN, true, index});
  if (answer.saysNotWireless()) RefuseInterface(interface);
  if (answer.error != 0 || answer.failure < 0) {
    throw std::runtime_error(interface + ": cannot read the scan results: " + answer.reason());
  }
  std::vector<Network> networks;
  for (std::string& message : answer.messages) {
    if (auto network = NetworkOfMessage(reinterpret_cast<nlmsghdr*>(message.data()))) {
      networks.push_back(std::move(*network));
    }
  }
  return networks;
}

}  // namespace iwlist
