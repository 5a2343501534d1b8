// Setting the operating mode of the client interface.
#include "platform/base/failure.h"
#include "platform/core/radio.h"

int MEROWirelessOpmodeSet(WIRELESS_OPMODE opmode) {
  const char* szIfName = MEROWirelessInterfaceGet();
  if (opmode < WIRELESS_OPMODE_AUTO || opmode >= WIRELESS_OPMODE_UNKNOWN) {
    return FAIL(EINVAL, "Failed to set the mode of %s", szIfName), -1;
  }
  Result<Radio> radio = Radio::OfAdapter(szIfName);
  const Status status = radio.ok() ? radio->SetMode(opmode) : radio.status();
  if (!status.ok()) return FAIL(status.error(), "Failed to set the mode of %s", szIfName), -1;
  return 0;
}
