// Tables between texts and the values of an enumeration, walked in both directions.
#ifndef MERO_COMMON_VALUE_TEXTS_H
#define MERO_COMMON_VALUE_TEXTS_H

#include <span>

#include "common/text.h"
#include "wireless.h"

using ValueTexts = std::span<const WIRELESS_LITERAL_MAPPING>;

// The text of a value; when no row has the value, the text of the first row, which stands for "unknown".
constexpr const char* TextOf(ValueTexts texts, int32_t value) {
  for (const WIRELESS_LITERAL_MAPPING& text : texts) {
    if (text.type.value == value) return text.str;
  }
  return texts.front().str;
}

// The value of a text, ignoring the case of ASCII letters; when no row has the text, the value of the first row.
inline int32_t ValueOf(ValueTexts texts, const char* szText) {
  if (szText != nullptr) {
    for (const WIRELESS_LITERAL_MAPPING& text : texts) {
      if (EqualIgnoringCase(text.str, szText)) return text.type.value;
    }
  }
  return texts.front().type.value;
}

#endif  // MERO_COMMON_VALUE_TEXTS_H
