// Numbers that begin a text.
#ifndef MERO_PLATFORM_NUMBER_H
#define MERO_PLATFORM_NUMBER_H

#include <optional>
#include <string_view>

// Takes a decimal number off the beginning of a text. When there is none, or an int cannot hold it, the text stays and
// the result is empty. from_chars() does the same, and takes ten times the room.
std::optional<int> TakeNumber(std::string_view& text);

#endif  // MERO_PLATFORM_NUMBER_H
