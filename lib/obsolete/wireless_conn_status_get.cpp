// Tells the state of the connection.
#include "platform.h"
#include "wireless.h"

WIRELESS_STATUS MEROWirelessConnStatusGet(void) {
  WIRELESS_INFO info{};
  info.status = WIRELESS_STATUS_UNKNOWN;
  (void)MEROWirelessCurInfoGet(REQUEST_STATUS, &info);  // has reported; unknown is the answer then
  return info.status;
}
