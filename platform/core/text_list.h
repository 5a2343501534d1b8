// The text list from inside: filling it, and what it keeps of the file whose sections it lists.
#ifndef MERO_PLATFORM_TEXT_LIST_H
#define MERO_PLATFORM_TEXT_LIST_H

#include <optional>
#include <string_view>

#include "platform.h"
#include "platform/base/bytes.h"

// What callers see of a list, and behind it what they do not.
struct TextList : PLIBSZLIST {
  Bytes file{};               // in which the items with a section have it
  TextList* older = nullptr;  // the next list that keeps a file
  int next = 0;               // the item behind the one that was asked for last
};

// Appends a copy of `text`, with the section of that name in the file that the list is to keep, if it has one. False
// when memory ran out; the list stays as it was.
[[nodiscard]] bool AppendToList(PLIBSZLIST& list, std::string_view text, std::string_view section = {});

// Removes the items from `nItem` on.
void TruncateList(PLIBSZLIST& list, int nItem);

// Whether a list can keep a file still. It keeps one at most.
bool CanKeepFile(const PLIBSZLIST& list);

// Has a list keep the file that its items have their sections in, until it is freed. Without memory nothing is kept,
// and no item has a section.
void KeepFile(PLIBSZLIST& list, Bytes&& file);

// The section of an item, from its header on, by the very pointer that a list gives for it; none for any other text,
// and for an item without a section. Takes constant time when the items are asked for one after another.
std::optional<std::string_view> SectionOfItem(const char* szItem);

#endif  // MERO_PLATFORM_TEXT_LIST_H
