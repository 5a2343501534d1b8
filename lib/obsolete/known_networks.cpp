// Listing the known networks.
#include "known_networks.h"

#include "common/known_networks_file.h"
#include "common/log.h"
#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "ring.h"

int ListKnownNetworks(const ListingUnit& unit, WIRELESS_LIST* pHead) {
  if (pHead == nullptr) return LOG_AS(unit.szName, 26, "Bad parameters"), -1;
  ResetRing(*pHead);

  List names;
  if (!names) return LOG_AS(unit.szName, 30, "Failed to alloc memory"), -1;
  const int count = PLIBCFileEnumSection(kKnownNetworksPath, names.address());
  if (count < 0) {
    return LOG_AS(unit.szName, 35, "Failed to enumerate sections in '%s'", kKnownNetworksPath), -1;
  }

  for (int i = 0; i < count; ++i) {
    const char* szName = PLIBCSzListGet(names.get(), i);
    auto config = NewRecord<WIRELESS_NETWORK_CONFIG>();
    if (!config) return LOG_AS(unit.szName, unit.lineOfRecordAlloc, "Failed to alloc memory"), -1;
    if (MEROWirelessConfGet(szName, config.get()) >= 0) Append(*pHead, config.release()->list);
  }
  return 0;
}
