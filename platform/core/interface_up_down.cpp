// Network interfaces up and down.
#include "platform/base/interface.h"

#include "platform/base/failure.h"

int PLIBNetIfUp(const char* szIfName) {
  if (szIfName == nullptr) return REFUSE_NULL(), 0;
  if (Status status = SetInterfaceUp(szIfName, true); !status.ok()) {
    return FAIL(status.error(), "Failed to bring up %s", szIfName), 0;
  }
  return 1;
}

int PLIBNetIfDown(const char* szIfName) {
  if (szIfName == nullptr) return REFUSE_NULL(), 0;
  if (Status status = SetInterfaceUp(szIfName, false); !status.ok()) {
    return FAIL(status.error(), "Failed to take down %s", szIfName), 0;
  }
  return 1;
}
