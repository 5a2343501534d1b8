// The kernel's wireless stack, in the hands of a test: the program under test comes upon its answers.
#ifndef MERO_TESTS_TOOLS_KERNEL_FAKES_H
#define MERO_TESTS_TOOLS_KERNEL_FAKES_H

#include <cstdint>
#include <vector>

#include "base/text.h"

namespace kernel {

// The access point of library::Network().
inline constexpr Address kHome = {0x0A, 0x0A, 0x0A, 0x0A, 0x0A, 0x0A};

// A result of the last scan.
struct Result {
  Address address;
  std::uint32_t msAgo = 0;
  bool isJoined = false;
};

// Those that there are from now on; at first there are none.
void Heard(std::vector<Result> results);

}  // namespace kernel

#endif  // MERO_TESTS_TOOLS_KERNEL_FAKES_H
