// Whether the adapter is an access point's at this moment.
#include "model/on_air.h"

#include "base/failure.h"
#include "base/pid_file.h"
#include "common/paths.h"
#include "model/marker.h"
#include "platform.h"

bool IsOnAir() {
  WIRELESS_INFO info{};
  if (MEROWirelessCurInfoGet(REQUEST_MODE, &info) == 0 && info.opmode == WIRELESS_OPMODE_MASTER) return true;
  return IsDaemonThere(InterfacePath(kHostapdPidFormat, MEROWirelessInterfaceGet()).c_str(), "hostapd");
}

void RequireNoAccessPoint() {
  if (IsUnderWay(kApMarkerPath)) {
    throw Failure(Exit::kBusy, "the adapter is about to be an access point",
                  "wait until it is on the air; `merowireless ap disable` takes it down");
  }
  if (IsOnAir()) {
    throw Failure(Exit::kBusy, "the adapter is an access point, and would be none any more",
                  "`merowireless ap disable` takes that down first");
  }
}
