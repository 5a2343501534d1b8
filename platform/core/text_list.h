// The text list from inside: filling it.
#ifndef MERO_PLATFORM_TEXT_LIST_H
#define MERO_PLATFORM_TEXT_LIST_H

#include <string_view>

#include "platform.h"

// Appends a copy. False when memory ran out; the list stays as it was.
[[nodiscard]] bool AppendToList(PLIBSZLIST& list, std::string_view text);

// Removes the items from `nItem` on.
void TruncateList(PLIBSZLIST& list, int nItem);

#endif  // MERO_PLATFORM_TEXT_LIST_H
