// Says whether access-point mode is supported.
#include "wireless.h"

BOOL MEROWirelessAPIsSupported(void) {
  return FALSE;  // access-point mode is not announced, whatever the hardware
}
