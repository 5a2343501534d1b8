// Names the interface that serves as access point.
#include "wireless.h"

const char* MEROWirelessAPInterfaceGet(void) {
  return "wlan0";
}
