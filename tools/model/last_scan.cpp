// What the kernel tells of the results of the last scan.
#include "model/last_scan.h"

#include <netlink/genl/genl.h>

#include <algorithm>
#include <cstring>

#include "model/wireless_stack.h"

namespace {

// The attributes of a result, by their kind.
struct Result {
  nlattr* parts[NL80211_BSS_MAX + 1];
};

// False when a message holds no result. The attributes lie within the message.
bool ReadResult(std::string& bytes, Result& result) {
  auto* message = reinterpret_cast<nlmsghdr*>(bytes.data());
  if (!genlmsg_valid_hdr(message, 0)) return false;
  const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
  nlattr* nest = nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), NL80211_ATTR_BSS);
  nla_policy policy[NL80211_BSS_MAX + 1] = {};
  policy[NL80211_BSS_BSSID].minlen = sizeof(Address);
  policy[NL80211_BSS_STATUS].type = NLA_U32;
  policy[NL80211_BSS_SEEN_MS_AGO].type = NLA_U32;
  return nest != nullptr && nla_parse_nested(result.parts, NL80211_BSS_MAX, nest, policy) == 0 &&
         result.parts[NL80211_BSS_BSSID] != nullptr;
}

bool IsJoined(const nlattr* status) {
  if (status == nullptr) return false;
  const auto value = nla_get_u32(status);
  return value == NL80211_BSS_STATUS_ASSOCIATED || value == NL80211_BSS_STATUS_IBSS_JOINED;
}

void Take(const Result& result, LastScan& last) {
  if (IsJoined(result.parts[NL80211_BSS_STATUS])) {
    std::memcpy(last.joined.emplace().data(), nla_data(result.parts[NL80211_BSS_BSSID]), sizeof(Address));
  } else if (const nlattr* seen = result.parts[NL80211_BSS_SEEN_MS_AGO]) {
    const std::chrono::milliseconds age(nla_get_u32(seen));
    last.age = std::min(last.age.value_or(age), age);
  }
}

}  // namespace

LastScan ReadLastScan(const std::string& interface) {
  LastScan last;
  for (std::string& message : AskWirelessStack(NL80211_CMD_GET_SCAN, interface, true)) {
    Result result;
    if (ReadResult(message, result)) Take(result, last);
  }
  return last;
}
