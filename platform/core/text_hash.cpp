// The text hash: chained buckets, with the entries threaded in order.
#include "platform/core/text_hash.h"

#include <algorithm>
#include <bit>
#include <cstdlib>
#include <cstring>

#include "platform/base/failure.h"

namespace {

constexpr uint32_t kBytesOfAnEntry = 32;  // what a typical key and value take, to turn a size hint into buckets
constexpr uint32_t kLeastChains = 8;
constexpr uint32_t kMostChainsAtFirst = 1u << 16;

uint32_t HashOf(std::string_view text) {
  uint32_t hash = 2166136261u;
  for (const char c : text) hash = (hash ^ static_cast<unsigned char>(c)) * 16777619u;
  return hash;
}

HashEntry** ChainOf(const PLIBSZHASH& hash, uint32_t value) {
  return &hash.chains[value & (hash.nChains - 1)];
}

HashEntry* Find(const PLIBSZHASH& hash, std::string_view key) {
  const uint32_t value = HashOf(key);
  for (HashEntry* entry = *ChainOf(hash, value); entry != nullptr; entry = entry->nextOfChain) {
    if (entry->hash == value && key == entry->szKey) return entry;
  }
  return nullptr;
}

char* CopyOf(std::string_view text) {
  char* szCopy = static_cast<char*>(std::malloc(text.size() + 1));
  if (szCopy == nullptr) return nullptr;
  if (!text.empty()) std::memcpy(szCopy, text.data(), text.size());
  szCopy[text.size()] = '\0';
  return szCopy;
}

void FreeEntry(HashEntry* entry) {
  std::free(entry->szKey);
  std::free(entry->szValue);
  std::free(entry);
}

// Keeps chains short. Not growing is no failure: it only costs time.
void GrowIfFull(PLIBSZHASH& hash) {
  if (hash.nEntries < hash.nChains) return;
  void* chains = std::calloc(size_t{hash.nChains} * 2, sizeof(HashEntry*));
  if (chains == nullptr) return;
  std::free(hash.chains);
  hash.chains = static_cast<HashEntry**>(chains);
  hash.nChains *= 2;
  for (HashEntry* entry = hash.first; entry != nullptr; entry = entry->next) {
    HashEntry** chain = ChainOf(hash, entry->hash);
    entry->nextOfChain = *chain;
    *chain = entry;
  }
}

bool Add(PLIBSZHASH& hash, std::string_view key, std::string_view value) {
  auto* entry = static_cast<HashEntry*>(std::calloc(1, sizeof(HashEntry)));
  if (entry == nullptr) return false;
  entry->hash = HashOf(key);
  entry->szKey = CopyOf(key);
  entry->szValue = CopyOf(value);
  if (entry->szKey == nullptr || entry->szValue == nullptr) {
    FreeEntry(entry);
    return false;
  }

  GrowIfFull(hash);
  HashEntry** chain = ChainOf(hash, entry->hash);
  entry->nextOfChain = *chain;
  *chain = entry;
  (hash.last != nullptr ? hash.last->next : hash.first) = entry;
  hash.last = entry;
  ++hash.nEntries;
  return true;
}

bool Replace(HashEntry& entry, std::string_view value) {
  char* szValue = CopyOf(value);
  if (szValue == nullptr) return false;
  std::free(entry.szValue);
  entry.szValue = szValue;
  return true;
}

}  // namespace

bool SetInHash(PLIBSZHASH& hash, std::string_view key, std::string_view value) {
  HashEntry* entry = Find(hash, key);
  const bool set = entry != nullptr ? Replace(*entry, value) : Add(hash, key, value);
  if (!set) hash.lacksPair = true;
  return set;
}

PPLIBSZHASH PLIBCSzHashAlloc(int cbSize) {
  auto* hash = static_cast<PLIBSZHASH*>(std::calloc(1, sizeof(PLIBSZHASH)));
  if (hash == nullptr) return FAIL(ENOMEM, "Failed to make a text hash"), nullptr;
  const uint32_t wanted = cbSize > 0 ? static_cast<uint32_t>(cbSize) / kBytesOfAnEntry : 0;
  hash->nChains = std::bit_ceil(std::clamp(wanted, kLeastChains, kMostChainsAtFirst));
  hash->chains = static_cast<HashEntry**>(std::calloc(hash->nChains, sizeof(HashEntry*)));
  if (hash->chains == nullptr) {
    std::free(hash);
    return FAIL(ENOMEM, "Failed to make a text hash"), nullptr;
  }
  return hash;
}

void PLIBCSzHashFree(PPLIBSZHASH pshHash) {
  if (pshHash == nullptr) return;
  for (HashEntry* entry = pshHash->first; entry != nullptr;) {
    HashEntry* next = entry->next;
    FreeEntry(entry);
    entry = next;
  }
  std::free(pshHash->chains);
  std::free(pshHash);
}

const char* PLIBCSzHashGetValue(const PLIBSZHASH* pshHash, const char* szKey) {
  if (pshHash == nullptr || szKey == nullptr) return REFUSE_NULL(), nullptr;
  const HashEntry* entry = Find(*pshHash, szKey);
  return entry != nullptr ? entry->szValue : nullptr;
}

int PLIBCSzHashSetValue(PPLIBSZHASH* ppshHash, const char* szKey, const char* szValue) {
  if (ppshHash == nullptr || *ppshHash == nullptr || szKey == nullptr || szValue == nullptr) return REFUSE_NULL(), -1;
  if (!SetInHash(**ppshHash, szKey, szValue)) return FAIL(ENOMEM, "Failed to set %s", szKey), -1;
  return 1;
}
