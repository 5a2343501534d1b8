// The platform's hash and list for tests, released by themselves.
#ifndef MERO_TESTS_PLATFORM_CONTAINERS_H
#define MERO_TESTS_PLATFORM_CONTAINERS_H

#include <gtest/gtest.h>

#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

#include "platform.h"

class TextHash {
 public:
  using Pairs = std::vector<std::pair<std::string, std::string>>;

  TextHash() = default;
  TextHash(std::initializer_list<Pairs::value_type> pairs) : TextHash(Pairs(pairs)) {}
  explicit TextHash(const Pairs& pairs) {
    for (const auto& [key, value] : pairs) EXPECT_EQ(PLIBCSzHashSetValue(&hash_, key.c_str(), value.c_str()), 1);
  }
  TextHash(const TextHash&) = delete;
  TextHash& operator=(const TextHash&) = delete;
  ~TextHash() { PLIBCSzHashFree(hash_); }

  PPLIBSZHASH get() const { return hash_; }
  PPLIBSZHASH* address() { return &hash_; }
  // "(none)" when the key is absent.
  std::string operator[](const char* szKey) const {
    const char* szValue = PLIBCSzHashGetValue(hash_, szKey);
    return szValue != nullptr ? szValue : "(none)";
  }

 private:
  PPLIBSZHASH hash_ = PLIBCSzHashAlloc(1024);
};

class TextList {
 public:
  TextList() = default;
  TextList(const TextList&) = delete;
  TextList& operator=(const TextList&) = delete;
  ~TextList() { PLIBCSzListFree(list_); }

  PPLIBSZLIST get() const { return list_; }
  PPLIBSZLIST* address() { return &list_; }
  std::vector<std::string> items() const {
    std::vector<std::string> items;
    for (int i = 0; i < list_->nItem; ++i) items.emplace_back(PLIBCSzListGet(list_, i));
    return items;
  }

 private:
  PPLIBSZLIST list_ = PLIBCSzListAlloc(1024);
};

#endif  // MERO_TESTS_PLATFORM_CONTAINERS_H
