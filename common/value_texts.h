// Tables between texts and the values of an enumeration, walked in both directions.
#ifndef MERO_COMMON_VALUE_TEXTS_H
#define MERO_COMMON_VALUE_TEXTS_H

#include <span>

#include "common/text.h"
#include "wireless.h"

using Literals = std::span<const WIRELESS_LITERAL_MAPPING>;

// The text of a value; that of the table's first row, the unknown, when no row has the value.
constexpr const char* TextOf(Literals literals, int32_t value) {
  for (const WIRELESS_LITERAL_MAPPING& literal : literals) {
    if (literal.type.value == value) return literal.str;
  }
  return literals.front().str;
}

// The value of a text, in any case of its ASCII letters; that of the first row when no row has the text.
inline int32_t ValueOf(Literals literals, const char* szText) {
  if (szText != nullptr) {
    for (const WIRELESS_LITERAL_MAPPING& literal : literals) {
      if (EqualIgnoringCase(literal.str, szText)) return literal.type.value;
    }
  }
  return literals.front().type.value;
}

#endif  // MERO_COMMON_VALUE_TEXTS_H
