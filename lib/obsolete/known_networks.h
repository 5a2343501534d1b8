// Listing the known networks, for two units that do it in the same steps.
#ifndef MERO_LIB_KNOWN_NETWORKS_H
#define MERO_LIB_KNOWN_NETWORKS_H

#include "wireless.h"

// The unit that lists, and the line number that its report "out of memory" is known by.
struct ListingUnit {
  const char* szName;
  int lineOfRecordAlloc;
};

// Resets the ring and appends a record for each known network, in file order. 0, or -1 after a report.
int ListKnownNetworks(const ListingUnit& unit, WIRELESS_LIST* pHead);

#endif  // MERO_LIB_KNOWN_NETWORKS_H
