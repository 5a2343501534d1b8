// What the kernel tells of the results of the last scan.
#include "model/last_scan.h"

#include <algorithm>
#include <cstdint>

#include "model/attributes.h"
#include "model/wireless_stack.h"

namespace {

using Result = Nest<NL80211_BSS_MAX>;

bool IsJoined(const Result& result) {
  const auto status = result.As<std::uint32_t>(NL80211_BSS_STATUS);
  return status && (*status == NL80211_BSS_STATUS_ASSOCIATED || *status == NL80211_BSS_STATUS_IBSS_JOINED);
}

void Take(const Result& result, LastScan& last) {
  const auto address = result.As<Address>(NL80211_BSS_BSSID);
  if (!address) return;
  if (IsJoined(result)) {
    last.joined = *address;
  } else if (const auto seen = result.As<std::uint32_t>(NL80211_BSS_SEEN_MS_AGO)) {
    const std::chrono::milliseconds age(*seen);
    last.age = std::min(last.age.value_or(age), age);
  }
}

}  // namespace

LastScan ReadLastScan(const std::string& interface) {
  LastScan last;
  for (std::string& message : AskWirelessStack(NL80211_CMD_GET_SCAN, interface, true)) {
    Take(Result(AttributeOf(message, NL80211_ATTR_BSS)), last);
  }
  return last;
}
