// The clock as the known networks keep it.
#ifndef MERO_COMMON_CLOCK_H
#define MERO_COMMON_CLOCK_H

#include <algorithm>
#include <cstdint>
#include <limits>

// The 32-bit time nearest to `seconds`. From 2038 on that is the greatest one; it never wraps around.
constexpr int32_t SaturatedTime(int64_t seconds) {
  constexpr int64_t kLeast = std::numeric_limits<int32_t>::min();
  constexpr int64_t kGreatest = std::numeric_limits<int32_t>::max();
  return static_cast<int32_t>(std::clamp(seconds, kLeast, kGreatest));
}

#endif  // MERO_COMMON_CLOCK_H
