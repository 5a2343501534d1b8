// Memory that runs out: this program's malloc() and its kin may be told to fail.
#ifndef MERO_TESTS_FAULT_FAILING_MEMORY_H
#define MERO_TESTS_FAULT_FAILING_MEMORY_H

#include <functional>
#include <string_view>

struct MemoryOutcome {
  bool failed = false;  // an allocation has failed
  int result = 0;
  int blocksLeft = 0;  // how many blocks more are in use behind the operation than before it
  int made = 0;        // how many allocations the operation has tried
};

// Runs an operation whose nth allocation fails, from 1 on, and no other; or all behind it, too.
MemoryOutcome RunWithoutMemory(int n, const std::function<int()>& operation, bool onwards = false);

// How many of the blocks that an operation frees hold a text still.
int CountFreedWith(std::string_view text, const std::function<void()>& operation);

#endif  // MERO_TESTS_FAULT_FAILING_MEMORY_H
