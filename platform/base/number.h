// Numbers that begin a text.
#ifndef MERO_PLATFORM_NUMBER_H
#define MERO_PLATFORM_NUMBER_H

#include <optional>
#include <string_view>

// Takes a decimal number off the beginning of a text; none, and all stays, when there is none, or one that an int
// cannot hold. As from_chars() has it, for a tenth of the room.
std::optional<int> TakeNumber(std::string_view& text);

#endif  // MERO_PLATFORM_NUMBER_H
