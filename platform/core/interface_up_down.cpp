// Network interfaces up and down.
#include "platform/base/interface.h"

#include "platform/base/failure.h"
#include "platform/core/radio.h"

namespace {

// A client's adapter that is down: neither in a network nor an access point.
bool IsIdleClient(const Radio& radio) {
  Result<bool> up = radio.IsUp();
  Result<WIRELESS_OPMODE> mode = radio.Mode();
  return up.ok() && !*up && mode.ok() && *mode == WIRELESS_OPMODE_MANAGED;
}

}  // namespace

// Whoever brings a client's adapter up asks next for the networks in range, so it scans meanwhile if it knows of none.
// Without that scan it is up all the same.
int PLIBNetIfUp(const char* szIfName) {
  if (szIfName == nullptr) return REFUSE_NULL(), 0;
  Result<Radio> radio = Radio::OfAdapter(szIfName);
  const bool scans = radio.ok() && IsIdleClient(*radio);
  if (const Status status = SetInterfaceUp(szIfName, true); !status.ok()) {
    return FAIL(status.error(), "Failed to bring up %s", szIfName), 0;
  }
  if (scans && !radio->KnowsNetworks()) (void)radio->Scan();
  return 1;
}

int PLIBNetIfDown(const char* szIfName) {
  if (szIfName == nullptr) return REFUSE_NULL(), 0;
  if (const Status status = SetInterfaceUp(szIfName, false); !status.ok()) {
    return FAIL(status.error(), "Failed to take down %s", szIfName), 0;
  }
  return 1;
}
