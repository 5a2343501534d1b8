// Rings of records: a head, and records threaded through their `list` member. Linked and unlinked by insque() and
// remque() alone.
#ifndef MERO_LIB_RING_H
#define MERO_LIB_RING_H

#include <search.h>

#include <cstddef>

#include "holders.h"
#include "wireless.h"

inline void ResetRing(WIRELESS_LIST& head) {
  head.q_forw = &head;
  head.q_back = &head;
}

inline bool IsEmpty(const WIRELESS_LIST& head) {
  return head.q_forw == &head;
}

inline void Append(WIRELESS_LIST& head, WIRELESS_LIST& node) {
  ::insque(&node, head.q_back);
}

// Unlinks the first node of a ring that is not empty.
inline WIRELESS_LIST& TakeFirst(WIRELESS_LIST& head) {
  WIRELESS_LIST* node = head.q_forw;
  ::remque(node);
  return *node;
}

// The record that a node is a part of.
template <class Record>
Record& RecordOf(WIRELESS_LIST& node) {
  return *reinterpret_cast<Record*>(reinterpret_cast<char*>(&node) - offsetof(Record, list));
}

// Unlinks and frees every record.
template <class Record>
void ClearRing(WIRELESS_LIST& head) {
  while (!IsEmpty(head)) std::free(&RecordOf<Record>(TakeFirst(head)));
}

// A ring of records of its own.
template <class Record>
class OwnRing {
 public:
  OwnRing() { ResetRing(head_); }
  OwnRing(const OwnRing&) = delete;
  OwnRing& operator=(const OwnRing&) = delete;
  ~OwnRing() { ClearRing<Record>(head_); }

  WIRELESS_LIST& head() { return head_; }

 private:
  WIRELESS_LIST head_;
};

#endif  // MERO_LIB_RING_H
