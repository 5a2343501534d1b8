// Numbers that begin a text.
#include "platform/base/number.h"

#include <cstddef>

std::optional<int> TakeNumber(std::string_view& text) {
  const bool negative = !text.empty() && text.front() == '-';
  const size_t first = negative ? 1 : 0;
  size_t end = first;
  int number = 0;
  for (; end < text.size() && text[end] >= '0' && text[end] <= '9'; ++end) {
    const int digit = text[end] - '0';
    if (__builtin_mul_overflow(number, 10, &number)) return std::nullopt;
    if (__builtin_add_overflow(number, negative ? -digit : digit, &number)) return std::nullopt;
  }
  if (end == first) return std::nullopt;
  text.remove_prefix(end);
  return number;
}
