// Numbers that begin a text.
#include "platform/base/number.h"

#include <cstddef>

std::optional<int> TakeNumber(std::string_view& text) {
  const int sign = text.starts_with('-') ? -1 : 1;
  size_t end = sign < 0 ? 1 : 0;
  const size_t first = end;
  int number = 0;
  for (; end < text.size() && text[end] >= '0' && text[end] <= '9'; ++end) {
    if (__builtin_mul_overflow(number, 10, &number)) return std::nullopt;
    if (__builtin_add_overflow(number, sign * (text[end] - '0'), &number)) return std::nullopt;
  }
  if (end == first) return std::nullopt;
  text.remove_prefix(end);
  return number;
}
