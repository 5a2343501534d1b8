// Lists the known networks in file order.
#include "known_networks.h"
#include "wireless.h"

int MEROWirelessConfEnum(WIRELESS_LIST* pHead) {
  return ListKnownNetworks({"wireless_conf_enum", 47}, pHead);
}
