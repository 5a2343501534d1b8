// Says whether an access point is being set up at this moment.
#include "common/paths.h"
#include "platform.h"
#include "wireless.h"

BOOL MEROWirelessTestAPMode(void) {
  return PLIBCFileExist(kApMarkerPath) != 0 ? TRUE : FALSE;
}
