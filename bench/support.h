// What the measurements have in common.
#ifndef MERO_BENCH_SUPPORT_H
#define MERO_BENCH_SUPPORT_H

#include <search.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "wireless.h"

// Ends the program with the reason in errno, unless something has been done.
inline void Require(bool done, const char* szWhat) {
  if (done) return;
  std::perror(szWhat);
  std::exit(EXIT_FAILURE);
}

// Releases a ring of such records, and tells how many there were.
template <class Record>
int64_t CountAndFree(WIRELESS_LIST& head) {
  int64_t count = 0;
  for (; head.q_forw != &head; ++count) {
    WIRELESS_LIST* node = head.q_forw;
    ::remque(node);
    std::free(reinterpret_cast<char*>(node) - offsetof(Record, list));
  }
  return count;
}

#endif  // MERO_BENCH_SUPPORT_H
