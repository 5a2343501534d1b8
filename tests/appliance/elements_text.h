// Information elements written as in a protocol analyser: hexadecimal digits, blanks anywhere.
#ifndef MERO_TESTS_APPLIANCE_ELEMENTS_TEXT_H
#define MERO_TESTS_APPLIANCE_ELEMENTS_TEXT_H

#include <cctype>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

inline std::vector<std::uint8_t> Elements(std::string_view hex) {
  std::string digits;
  for (const char letter : hex) {
    if (std::isxdigit(static_cast<unsigned char>(letter)) != 0) digits += letter;
  }
  std::vector<std::uint8_t> bytes;
  for (std::size_t i = 0; i + 1 < digits.size(); i += 2) {
    bytes.push_back(static_cast<std::uint8_t>(std::stoul(digits.substr(i, 2), nullptr, 16)));
  }
  return bytes;
}

#endif  // MERO_TESTS_APPLIANCE_ELEMENTS_TEXT_H
