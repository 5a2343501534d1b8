// Joins the most recently saved network that can be joined.
#include <net/if.h>

#include "common/log.h"
#include "common/text.h"
#include "platform.h"
#include "ring.h"
#include "wireless.h"

namespace {

// The next step for a saved network, after a look at the networks in range.
enum class Verdict { kTry, kPassOver, kLookAgain };

// A network that was not seen may hide its name, or be out of range: it is tried when its security is known. When its
// protocol was never seen, there is one more look, unless this call has `lookedAgain` already.
Verdict JudgeUnseen(const WIRELESS_NETWORK& saved, bool lookedAgain) {
  if (saved.auth == WIRELESS_AUTH_UNKNOWN || saved.encrypt == WIRELESS_ENCRYPT_UNKNOWN) return Verdict::kPassOver;
  if (saved.protocol == WIRELESS_PROTO_UNKNOWN && !lookedAgain) return Verdict::kLookAgain;
  return Verdict::kTry;
}

// Looks a saved network up. When it is in range, its record takes over everything that the scan found.
Verdict LookUp(WIRELESS_NETWORK& saved, bool lookedAgain) {
  WIRELESS_NETWORK seen{};
  const char* szBssid = reinterpret_cast<const char*>(saved.bssid);
  if (MEROWirelessNetworkGet(szBssid, WIRELESS_FILTER_BSSID, &seen) < 1) return JudgeUnseen(saved, lookedAgain);
  saved = seen;
  return Verdict::kTry;
}

int ConnectAP(const char* szIfName, WIRELESS_NETWORK_CONFIG* pNetConfig) {
  if (szIfName == nullptr || pNetConfig == nullptr) return LOG("Bad parameters"), -1;

  OwnRing<WIRELESS_NETWORK_CONFIG> known;
  WIRELESS_LIST& head = known.head();
  if (MEROWirelessConfEnumByAtime(&head) < 0) {
    return LOG("Failed to enumerate wireless network configurations"), -1;
  }

  bool lookedAgain = false;  // the whole call has one second look, for the first network that needs it
  for (WIRELESS_LIST* node = head.q_forw; node != &head; node = node->q_forw) {
    WIRELESS_NETWORK_CONFIG& config = RecordOf<WIRELESS_NETWORK_CONFIG>(*node);
    Verdict verdict = LookUp(config.network, lookedAgain);
    if (verdict == Verdict::kLookAgain) {
      lookedAgain = true;
      verdict = LookUp(config.network, lookedAgain);
    }
    if (verdict == Verdict::kPassOver || MEROWirelessNetworkConnect(&config) != 0) continue;
    *pNetConfig = config;
    return 0;
  }
  return -1;
}

bool IsConnected() {
  WIRELESS_INFO info{};
  (void)MEROWirelessCurInfoGet(REQUEST_STATUS, &info);  // has reported; unknown is not connected
  return info.status == WIRELESS_STATUS_CONNECTED_MANAGED || info.status == WIRELESS_STATUS_CONNECTED_ADHOC;
}

// Fails, and leaves nothing connected.
int Disconnect() {
  (void)MEROWirelessNetworkDisconnect();  // has reported
  return -1;
}

}  // namespace

int MEROWirelessAutoConnect(void) {
  if (IsConnected()) return LOG("Connection exists"), Disconnect();

  char szIfName[IFNAMSIZ] = {};
  CopyText(szIfName, MEROWirelessInterfaceGet());
  WIRELESS_NETWORK_CONFIG config{};
  if (ConnectAP(szIfName, &config) < 0) return LOG("Failed to connect any access point"), Disconnect();
  if (MEROWirelessIfconfigSet(szIfName, config) < 0) {
    return LOG("Failed to set interface configuration"), Disconnect();
  }
  return 0;
}
