// Names the interface that serves as access point.
#include "common/paths.h"
#include "wireless.h"

const char* MEROWirelessAPInterfaceGet(void) {
  return kFirstAdapter;
}
