// The forms of a WEP key. Its length alone tells which form it has.
#ifndef MERO_COMMON_WEP_KEY_H
#define MERO_COMMON_WEP_KEY_H

#include <string_view>

enum class WepKeyForm {
  kText,    // 40 or 104 bits as 5 or 13 characters
  kDigits,  // the same as 10 or 26 hexadecimal digits
  kWrong,
};

inline WepKeyForm FormOfWepKey(std::string_view key) {
  switch (key.size()) {
    case 5:
    case 13:
      return WepKeyForm::kText;
    case 10:
    case 26:
      return WepKeyForm::kDigits;
    default:
      return WepKeyForm::kWrong;
  }
}

#endif  // MERO_COMMON_WEP_KEY_H
