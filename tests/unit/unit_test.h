// What every test of a unit starts from.
#ifndef MERO_TESTS_UNIT_UNIT_TEST_H
#define MERO_TESTS_UNIT_UNIT_TEST_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <search.h>

#include <cstddef>
#include <cstdlib>
#include <string>
#include <vector>

#include "fakes.h"
#include "memory.h"
#include "wireless.h"

// Fakes record, sleeps take no time, and a test that leaves a descriptor or counted memory behind has failed.
class UnitTest : public testing::Test {
 protected:
  UnitTest();
  ~UnitTest() override;

 private:
  size_t nDescriptors_;
};

// The whole file; empty when there is none.
std::string ReadText(const std::string& path);
void WriteText(const std::string& path, const std::string& text);

// A file that the shell runs.
void WriteScript(const std::string& path, const std::string& text);

// The head of a list, and the records in it, which end with it. At first it is as a head that nobody has set.
template <class Record>
class Ring {
 public:
  Ring() = default;
  Ring(const Ring&) = delete;
  Ring& operator=(const Ring&) = delete;
  ~Ring() { Clear(); }

  WIRELESS_LIST* head() { return &head_; }
  bool IsSet() const { return head_.q_forw != kUnset || head_.q_back != kUnset; }

  // The records from first to last, where each node leads back to the one before it.
  std::vector<Record*> Records() {
    EXPECT_TRUE(IsSet());
    if (!IsSet()) return {};
    std::vector<Record*> records;
    WIRELESS_LIST* before = &head_;
    for (WIRELESS_LIST* node = head_.q_forw; node != &head_; before = node, node = node->q_forw) {
      EXPECT_EQ(node->q_back, before);
      records.push_back(reinterpret_cast<Record*>(reinterpret_cast<char*>(node) - offsetof(Record, list)));
    }
    EXPECT_EQ(head_.q_back, before);
    return records;
  }

  // A member of each record, from first to last.
  template <class Member>
  std::vector<Member> Each(Member Record::*member) {
    std::vector<Member> values;
    for (const Record* record : Records()) values.push_back(record->*member);
    return values;
  }

  void Clear() {
    if (!IsSet()) return;
    for (Record* record : Records()) {
      remque(&record->list);
      std::free(record);
    }
    head_ = {kUnset, kUnset};
  }

 private:
  static inline WIRELESS_LIST* const kUnset = reinterpret_cast<WIRELESS_LIST*>(sizeof(WIRELESS_LIST));

  WIRELESS_LIST head_ = {kUnset, kUnset};
};

#endif  // MERO_TESTS_UNIT_UNIT_TEST_H
