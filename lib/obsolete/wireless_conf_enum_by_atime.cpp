// Lists the known networks, the most recently saved first.
#include "known_networks.h"
#include "ring.h"
#include "wireless.h"

namespace {

int32_t SaveTimeOf(WIRELESS_LIST& node) {
  return RecordOf<WIRELESS_NETWORK_CONFIG>(node).atime;
}

// Merges a sorted ring into another. Where times are equal, what is in `into` stays before what comes.
void MergeInto(WIRELESS_LIST& into, WIRELESS_LIST& from) {
  WIRELESS_LIST* at = into.q_forw;
  while (!IsEmpty(from)) {
    WIRELESS_LIST& node = TakeFirst(from);
    while (at != &into && SaveTimeOf(*at) >= SaveTimeOf(node)) at = at->q_forw;
    ::insque(&node, at->q_back);
  }
}

// A merge sort from the bottom up, since lists may be long and their order is any: runs[i] takes 2^i records at a time
// and passes them on when it has twice as many. Higher runs hold what is earlier in the file, which keeps the order of
// networks that were saved in the same second.
void SortBySaveTime(WIRELESS_LIST& head) {
  constexpr int kRuns = 32;  // for more records than memory can hold
  WIRELESS_LIST runs[kRuns];
  for (WIRELESS_LIST& run : runs) ResetRing(run);

  for (unsigned count = 1; !IsEmpty(head); ++count) {
    WIRELESS_LIST single;
    ResetRing(single);
    Append(single, TakeFirst(head));
    MergeInto(runs[0], single);
    for (int i = 0; (count & (1u << i)) == 0; ++i) MergeInto(runs[i + 1], runs[i]);
  }
  for (int i = 0; i + 1 < kRuns; ++i) MergeInto(runs[i + 1], runs[i]);
  MergeInto(head, runs[kRuns - 1]);
}

}  // namespace

int MEROWirelessConfEnumByAtime(WIRELESS_LIST* pHead) {
  const int result = ListKnownNetworks({"wireless_conf_enum_by_atime", 48}, pHead);
  if (pHead != nullptr) SortBySaveTime(*pHead);  // what was listed before a failure is the caller's, in order
  return result;
}
