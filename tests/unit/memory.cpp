// The allocator in front of the real one. Built without sanitizers, since it is called before they are ready.
#include "memory.h"

#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <utility>

// NOLINTBEGIN(bugprone-reserved-identifier): the names of the real allocators, libc's and, where there is one, the
// sanitizer's. Looking them up at run time would allocate.
extern "C" {
void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);
void __libc_free(void* block);
[[gnu::weak]] void* __interceptor_malloc(size_t size);
[[gnu::weak]] void* __interceptor_calloc(size_t count, size_t size);
[[gnu::weak]] void* __interceptor_realloc(void* block, size_t size);
[[gnu::weak]] void __interceptor_free(void* block);
}

namespace {

constexpr size_t kMostHeld = size_t{1} << 16;

bool g_counted = false;
int g_untilFailure = 0;
bool g_failed = false;
uintptr_t g_held[kMostHeld];
size_t g_nHeld = 0;

bool FindsMemory() {
  if (!g_counted || g_untilFailure == 0 || --g_untilFailure > 0) return true;
  g_failed = true;
  errno = ENOMEM;
  return false;
}

void Hold(uintptr_t block) {
  if (g_nHeld == kMostHeld) std::abort();
  g_held[g_nHeld++] = block;
}

// Whether the block was held. The youngest go first, mostly.
bool LetGo(uintptr_t block) {
  for (size_t i = g_nHeld; i > 0; --i) {
    if (g_held[i - 1] != block) continue;
    g_held[i - 1] = g_held[--g_nHeld];
    return true;
  }
  return false;
}

void* Counted(void* block) {
  if (g_counted && block != nullptr) Hold(reinterpret_cast<uintptr_t>(block));
  return block;
}

}  // namespace

extern "C" void* malloc(size_t size) {
  if (!FindsMemory()) return nullptr;
  return Counted(__interceptor_malloc != nullptr ? __interceptor_malloc(size) : __libc_malloc(size));
}

extern "C" void* calloc(size_t count, size_t size) {
  if (!FindsMemory()) return nullptr;
  return Counted(__interceptor_calloc != nullptr ? __interceptor_calloc(count, size) : __libc_calloc(count, size));
}

extern "C" void* realloc(void* block, size_t size) {
  if (!FindsMemory()) return nullptr;
  const auto old = reinterpret_cast<uintptr_t>(block);
  const bool held = LetGo(old);
  void* moved = __interceptor_realloc != nullptr ? __interceptor_realloc(block, size) : __libc_realloc(block, size);
  const bool failed = moved == nullptr && size > 0;
  if (failed && held) Hold(old);
  if (moved != nullptr && (held || g_counted)) Hold(reinterpret_cast<uintptr_t>(moved));
  return moved;
}

extern "C" void free(void* block) {
  LetGo(reinterpret_cast<uintptr_t>(block));
  if (__interceptor_free != nullptr) return __interceptor_free(block);
  __libc_free(block);
}
// NOLINTEND(bugprone-reserved-identifier)

namespace memory {

void Begin(int failing) {
  g_counted = true;
  g_untilFailure = failing;
  g_failed = false;
}

void End() {
  g_counted = false;
}

bool HasFailed() {
  return g_failed;
}

size_t Held() {
  return g_nHeld;
}

Pause::Pause() : counted_(std::exchange(g_counted, false)) {}

Pause::~Pause() {
  g_counted = counted_;
}

}  // namespace memory
