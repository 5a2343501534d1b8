// Lists the known networks, the most recently saved first.
#include <cstdlib>
#include <memory>

#include "holders.h"
#include "known_networks.h"
#include "ring.h"
#include "wireless.h"

namespace {

// A record as it is sorted. Sorting these is faster than sorting the records, which lie far apart in memory.
struct Place {
  int32_t time;
  uint32_t number;  // the position in the file: networks saved in the same second keep that order
  WIRELESS_LIST* node;
};

// Compares two places, for qsort().
int Compare(const void* a, const void* b) {
  const auto& [timeA, numberA, nodeA] = *static_cast<const Place*>(a);
  const auto& [timeB, numberB, nodeB] = *static_cast<const Place*>(b);
  if (timeA != timeB) return timeA > timeB ? -1 : 1;
  return numberA < numberB ? -1 : 1;
}

int32_t SaveTimeOf(WIRELESS_LIST& node) {
  return RecordOf<WIRELESS_NETWORK_CONFIG>(node).atime;
}

size_t LengthOf(const WIRELESS_LIST& head) {
  size_t length = 0;
  for (const WIRELESS_LIST* at = head.q_forw; at != &head; at = at->q_forw) ++length;
  return length;
}

// Sorts a ring without any memory, in quadratic time.
void SortSlowly(WIRELESS_LIST& head) {
  WIRELESS_LIST sorted;
  ResetRing(sorted);
  while (!IsEmpty(head)) {
    WIRELESS_LIST& node = TakeFirst(head);
    WIRELESS_LIST* at = &sorted;
    while (at->q_back != &sorted && SaveTimeOf(*at->q_back) < SaveTimeOf(node)) at = at->q_back;
    ::insque(&node, at->q_back);
  }
  while (!IsEmpty(sorted)) Append(head, TakeFirst(sorted));
}

void SortBySaveTime(WIRELESS_LIST& head) {
  if (IsEmpty(head)) return;
  const std::unique_ptr<Place[], FreeRecord> places(static_cast<Place*>(std::calloc(LengthOf(head), sizeof(Place))));
  if (!places) return SortSlowly(head);

  Place* end = places.get();
  for (WIRELESS_LIST* at = head.q_forw; at != &head; at = at->q_forw) {
    *end = {SaveTimeOf(*at), static_cast<uint32_t>(end - places.get()), at};
    ++end;
  }
  std::qsort(places.get(), static_cast<size_t>(end - places.get()), sizeof(Place), Compare);
  for (const Place* place = places.get(); place != end; ++place) {
    ::remque(place->node);
    Append(head, *place->node);
  }
}

}  // namespace

int MEROWirelessConfEnumByAtime(WIRELESS_LIST* pHead) {
  const int result = ListKnownNetworks({"wireless_conf_enum_by_atime", 48}, pHead);
  if (pHead != nullptr) SortBySaveTime(*pHead);  // after a failure too: the caller gets the records listed until then
  return result;
}
