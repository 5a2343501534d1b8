// Memory that runs out.
//
// The real allocators are called by their other names: looking them up by dlsym() would take memory.
#include "tests/fault/failing_memory.h"

#include <malloc.h>

#include <cerrno>
#include <cstddef>
#include <cstring>

#ifdef MERO_SANITIZE
#define REAL(name) __interceptor_##name
#else
#define REAL(name) __libc_##name
#endif

extern "C" {
void* REAL(malloc)(size_t size);
void* REAL(calloc)(size_t count, size_t size);
void* REAL(realloc)(void* block, size_t size);
void REAL(free)(void* block);
}

namespace {

int g_untilFailure = 0;  // allocations until the one that fails; 0 when none is to
bool g_onwards = false;  // those behind it fail too
bool g_failed = false;
int g_made = 0;
int g_blocks = 0;
// The text that freed blocks are searched for; none when it is null. No class: free() is called before the sanitizer
// has made ready, and the functions of a class may be the checked ones of another source.
const char* g_watched = nullptr;
size_t g_watchedSize = 0;
int g_freedWithIt = 0;

bool Fails() {
  ++g_made;
  if (g_untilFailure == 0 || --g_untilFailure > 0) return false;
  if (g_onwards) g_untilFailure = 1;
  g_failed = true;
  errno = ENOMEM;
  return true;
}

void* Counted(void* block) {
  if (block != nullptr) ++g_blocks;
  return block;
}

// What a new block, or the new part of one, holds was left there by others: it is taken away while freed blocks are
// searched.
void* Emptied(void* block, size_t from) {
  if (block == nullptr || g_watched == nullptr) return block;
  const size_t size = ::malloc_usable_size(block);
  if (size > from) std::memset(static_cast<char*>(block) + from, 0, size - from);
  return block;
}

}  // namespace

// In place of libc's, or of those that the sanitizer has put in place of libc's.
extern "C" {

void* malloc(size_t size) {
  return Fails() ? nullptr : Counted(Emptied(REAL(malloc)(size), 0));
}

void* calloc(size_t count, size_t size) {
  return Fails() ? nullptr : Counted(REAL(calloc)(count, size));
}

void* realloc(void* block, size_t size) {
  if (Fails()) return nullptr;
  const size_t before = block != nullptr && g_watched != nullptr ? ::malloc_usable_size(block) : 0;
  void* moved = Emptied(REAL(realloc)(block, size), before);
  return block == nullptr ? Counted(moved) : moved;
}

void free(void* block) {
  if (block != nullptr) --g_blocks;
  const bool holdsIt = block != nullptr && g_watched != nullptr &&
                       ::memmem(block, ::malloc_usable_size(block), g_watched, g_watchedSize) != nullptr;
  if (holdsIt) ++g_freedWithIt;
  REAL(free)(block);
}

// The sanitizer's does not come to malloc() by its name.
char* strndup(const char* szText, size_t limit) {
  const size_t size = ::strnlen(szText, limit);
  char* szCopy = static_cast<char*>(malloc(size + 1));
  if (szCopy == nullptr) return nullptr;
  std::memcpy(szCopy, szText, size);
  szCopy[size] = '\0';
  return szCopy;
}

}  // extern "C"

MemoryOutcome RunWithoutMemory(int n, const std::function<int()>& operation, bool onwards) {
  g_failed = false;
  g_onwards = onwards;
  const int before = g_blocks;
  g_made = 0;
  g_untilFailure = n;
  const int result = operation();
  g_untilFailure = 0;
  return {g_failed, result, g_blocks - before, g_made};
}

int CountFreedWith(std::string_view text, const std::function<void()>& operation) {
  g_freedWithIt = 0;
  g_watchedSize = text.size();
  g_watched = text.data();
  operation();
  g_watched = nullptr;
  return g_freedWithIt;
}
