// Rings of records, as the library fills them for its callers and as its fakes do. Without GoogleTest, since the lab's
// caller has them too.
#ifndef MERO_TESTS_SUPPORT_RING_H
#define MERO_TESTS_SUPPORT_RING_H

#include <search.h>

#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "wireless.h"

// The head of a ring, and the records in it, which end with it. At first it is as a head that nobody has set. Where a
// node does not lead back to the one before it, the program ends.
template <class Record>
class Ring {
 public:
  Ring() = default;
  Ring(const Ring&) = delete;
  Ring& operator=(const Ring&) = delete;
  ~Ring() { Clear(); }

  WIRELESS_LIST* head() { return &head_; }
  bool IsSet() const { return head_.q_forw != kUnset || head_.q_back != kUnset; }

  // Takes no memory.
  template <class Look>
  void ForEach(Look look) {
    if (!IsSet()) return;
    WIRELESS_LIST* before = &head_;
    for (WIRELESS_LIST* node = head_.q_forw; node != &head_; before = node, node = node->q_forw) {
      RequireLink(node, before);
      look(RecordOf(node));
    }
    RequireLink(&head_, before);
  }

  // The records of a ring that is set, from first to last.
  std::vector<Record*> Records() {
    if (!IsSet()) Fail("the head of a ring was not set");
    std::vector<Record*> records;
    ForEach([&](Record& record) { records.push_back(&record); });
    return records;
  }

  // A member of each record, from first to last.
  template <class Member>
  std::vector<Member> Each(Member Record::* member) {
    std::vector<Member> values;
    for (const Record* record : Records()) values.push_back(record->*member);
    return values;
  }

  // Takes no memory.
  void Clear() {
    if (!IsSet()) return;
    while (head_.q_forw != &head_) {
      WIRELESS_LIST* node = head_.q_forw;
      RequireLink(node, &head_);
      ::remque(node);
      std::free(&RecordOf(node));
    }
    RequireLink(&head_, &head_);
    head_ = {kUnset, kUnset};
  }

 private:
  static inline WIRELESS_LIST* const kUnset = reinterpret_cast<WIRELESS_LIST*>(sizeof(WIRELESS_LIST));

  static Record& RecordOf(WIRELESS_LIST* node) {
    return *reinterpret_cast<Record*>(reinterpret_cast<char*>(node) - offsetof(Record, list));
  }

  [[noreturn]] static void Fail(const char* szMessage) {
    std::fprintf(stderr, "%s\n", szMessage);
    std::abort();
  }

  static void RequireLink(const WIRELESS_LIST* node, const WIRELESS_LIST* before) {
    if (node->q_back != before) Fail("a node of a ring does not lead back to the one before it");
  }

  WIRELESS_LIST head_ = {kUnset, kUnset};
};

// Sets a head, and puts copies of the records behind it, as the library does: the caller frees them.
template <class Record>
void FillRing(WIRELESS_LIST* head, const std::vector<Record>& records) {
  head->q_forw = head->q_back = head;
  for (const Record& record : records) {
    auto* copy = static_cast<Record*>(std::malloc(sizeof(Record)));
    std::memcpy(copy, &record, sizeof record);
    ::insque(&copy->list, head->q_back);
  }
}

#endif  // MERO_TESTS_SUPPORT_RING_H
