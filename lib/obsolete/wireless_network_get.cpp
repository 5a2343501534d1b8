// Looks up a network in range.
#include <cstring>

#include "common/log.h"
#include "ring.h"
#include "wireless.h"

namespace {

// An unknown filter matches every network.
bool Matches(const WIRELESS_NETWORK& network, const char* szValue, WIRELESS_FILTER filter) {
  if (filter == WIRELESS_FILTER_ESSID) return std::strcmp(network.szEssid, szValue) == 0;
  if (filter == WIRELESS_FILTER_BSSID) return std::memcmp(network.bssid, szValue, sizeof network.bssid) == 0;
  return true;
}

}  // namespace

int MEROWirelessNetworkGet(const char* szValue, const WIRELESS_FILTER filter, WIRELESS_NETWORK* pNetwork) {
  if (szValue == nullptr || pNetwork == nullptr) return LOG_LINE(30, "Bad parameters"), -1;

  OwnRing<WIRELESS_NETWORK> ring;
  WIRELESS_LIST& head = ring.head();
  if (MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, &head) < 0) {
    return LOG_LINE(35, "Failed to scan wireless networks"), -1;
  }
  if (IsEmpty(head) && MEROWirelessNetworkScan(WIRELESS_SCAN_RENEW, &head) < 0) {
    return LOG_LINE(40, "Failed to scan wireless networks"), -1;
  }

  for (WIRELESS_LIST* node = head.q_forw; node != &head; node = node->q_forw) {
    const WIRELESS_NETWORK& network = RecordOf<WIRELESS_NETWORK>(*node);
    if (!Matches(network, szValue, filter)) continue;
    *pNetwork = network;
    return 1;
  }
  return 0;
}
