// The text hash from inside: its entries in order.
#ifndef MERO_PLATFORM_TEXT_HASH_H
#define MERO_PLATFORM_TEXT_HASH_H

#include <cstdint>
#include <string_view>

#include "platform.h"

struct HashEntry {
  HashEntry* next;         // in the order in which keys were first set
  HashEntry* nextOfChain;  // in the same bucket
  uint32_t hash;
  char* szKey;
  char* szValue;
};

struct PLIBSZHASH {
  HashEntry** chains;
  uint32_t nChains;  // a power of two
  uint32_t nEntries;
  HashEntry* first;
  HashEntry* last;
  bool lacksPair;  // a pair that was to be set found no memory; callers may not have looked
};

// As PLIBCSzHashSetValue(), for texts that are not terminated. False when memory ran out, which the hash remembers.
[[nodiscard]] bool SetInHash(PLIBSZHASH& hash, std::string_view key, std::string_view value);

#endif  // MERO_PLATFORM_TEXT_HASH_H
