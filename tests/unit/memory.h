// The memory of the code under test: allocations that find none, and blocks that nobody freed.
#ifndef MERO_TESTS_UNIT_MEMORY_H
#define MERO_TESTS_UNIT_MEMORY_H

#include <cstddef>

namespace memory {

// From Begin() to End() allocations are counted, and the nth of them, from 1 on, finds no memory; with 0 all find some.
void Begin(int failing);
void End();

// Whether an allocation since the last Begin() found no memory.
bool HasFailed();

// The blocks that were allocated between a Begin() and an End() and are not freed yet.
size_t Held();

// Meanwhile allocations are those of the test, and do not count.
class Pause {
 public:
  Pause();
  Pause(const Pause&) = delete;
  Pause& operator=(const Pause&) = delete;
  ~Pause();

 private:
  bool counted_;
};

// Runs `call`, which gives a result, with its nth allocation finding no memory.
template <class Call>
auto Run(int failing, Call call) {
  Begin(failing);
  const auto result = call();
  End();
  return result;
}

// Runs `call` again and again, each time with one allocation more before the one that fails, and hands each result to
// `check`. The last result is that of a run in which none fails any more.
template <class Call, class Check>
void FailEach(Call call, Check check) {
  for (int n = 1;; ++n) {
    const auto result = Run(n, call);
    check(n, result);
    if (!HasFailed()) return;
  }
}

}  // namespace memory

#endif  // MERO_TESTS_UNIT_MEMORY_H
