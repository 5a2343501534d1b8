// The text list: an array of copies.
//
// A caller that lists the sections of a file asks for one after another. Were the file read for each, that would take
// quadratic time, and show a different file from section to section. So a list keeps the text that it was made from,
// and a section that is asked for by the list's own pointer is found there. Nothing needs to tell whether the file is
// still the same: the list says how it was, and for how long is up to the caller. With the list goes all that it keeps.
#include "platform/core/text_list.h"

#include <algorithm>
#include <bit>
#include <cstdlib>
#include <cstring>
#include <new>

#include "common/text.h"
#include "platform/base/failure.h"

namespace {

constexpr int kBytesOfAnItem = 16;  // what a typical text takes, to turn a size hint into a number of items
constexpr int kMostItemsAtFirst = 1 << 16;

TextList* g_newest = nullptr;  // of the lists that keep a file

// The section of an item stands before its text.
std::string_view& SectionBefore(char* szItem) {
  return reinterpret_cast<std::string_view*>(szItem)[-1];
}

char* NewItem(std::string_view text, std::string_view section) {
  void* room = std::malloc(sizeof(std::string_view) + text.size() + 1);
  if (room == nullptr) return nullptr;
  char* szItem = reinterpret_cast<char*>(new (room) std::string_view(section) + 1);
  CopyText(szItem, text.size() + 1, text);
  return szItem;
}

void FreeItem(char* szItem) {
  std::free(&SectionBefore(szItem));
}

bool Has(const PLIBSZLIST& list, int index) {
  return index >= 0 && index < list.nItem;
}

bool Reserve(PLIBSZLIST& list, int nCapacity) {
  void* items = std::realloc(list.ppszItem, static_cast<size_t>(nCapacity) * sizeof(char*));
  if (items == nullptr) return false;
  list.ppszItem = static_cast<char**>(items);
  list.nCapacity = nCapacity;
  return true;
}

// The same for names that differ only in the case of their letters.
uint32_t HashOfName(const char* szName) {
  uint32_t hash = 2166136261u;
  for (; *szName != '\0'; ++szName) hash = (hash ^ static_cast<unsigned char>(ToLower(*szName))) * 16777619u;
  return hash;
}

// Has the items that repeat a name share the section of the first, which is the one that counts. False when memory ran
// out.
bool ShareRepeated(PLIBSZLIST& list) {
  const size_t nSlots = std::bit_ceil(2 * static_cast<size_t>(list.nItem));
  auto** slots = static_cast<char**>(std::calloc(nSlots, sizeof(char*)));
  if (slots == nullptr) return false;
  for (int i = 0; i < list.nItem; ++i) {
    char* szItem = list.ppszItem[i];
    size_t slot = HashOfName(szItem) & (nSlots - 1);
    while (slots[slot] != nullptr && !EqualIgnoringCase(slots[slot], szItem)) slot = (slot + 1) & (nSlots - 1);
    if (slots[slot] == nullptr) slots[slot] = szItem;
    SectionBefore(szItem) = SectionBefore(slots[slot]);
  }
  std::free(slots);
  return true;
}

// Takes a list out of those that keep a file.
void Unlink(const TextList& list) {
  TextList** at = &g_newest;
  while (*at != nullptr && *at != &list) at = &(*at)->older;
  if (*at != nullptr) *at = list.older;
}

}  // namespace

bool AppendToList(PLIBSZLIST& list, std::string_view text, std::string_view section) {
  if (list.nItem == list.nCapacity && !Reserve(list, 2 * list.nCapacity)) return false;
  char* szItem = NewItem(text, section);
  if (szItem == nullptr) return false;
  list.ppszItem[list.nItem++] = szItem;
  return true;
}

void TruncateList(PLIBSZLIST& list, int nItem) {
  while (list.nItem > nItem) FreeItem(list.ppszItem[--list.nItem]);
}

bool CanKeepFile(const PLIBSZLIST& list) {
  return list.nItem == 0 && static_cast<const TextList&>(list).file.view().empty();
}

void KeepFile(PLIBSZLIST& list, Bytes&& file) {
  auto& keeper = static_cast<TextList&>(list);
  // Without sections there is nothing to keep, and the list stays one that can.
  if (list.nItem == 0 || !ShareRepeated(list)) return;
  keeper.file = std::move(file);
  keeper.older = std::exchange(g_newest, &keeper);
}

std::optional<std::string_view> SectionOfItem(const char* szItem) {
  for (TextList* list = g_newest; list != nullptr; list = list->older) {
    char** const end = list->ppszItem + list->nItem;
    char** item = list->ppszItem + std::min(list->next, list->nItem);
    if (item == end || *item != szItem) item = std::find(list->ppszItem, end, szItem);
    if (item == end) continue;
    list->next = static_cast<int>(item - list->ppszItem) + 1;
    const std::string_view section = SectionBefore(*item);
    return section.empty() ? std::nullopt : std::optional(section);
  }
  return std::nullopt;
}

PPLIBSZLIST PLIBCSzListAlloc(int cbSize) {
  void* room = std::malloc(sizeof(TextList));
  if (room == nullptr) return FAIL(ENOMEM, "Failed to make a text list"), nullptr;
  auto* list = new (room) TextList{};
  if (!Reserve(*list, std::clamp(cbSize / kBytesOfAnItem, 1, kMostItemsAtFirst))) {
    std::free(list);
    return FAIL(ENOMEM, "Failed to make a text list"), nullptr;
  }
  return list;
}

void PLIBCSzListFree(PPLIBSZLIST pslList) {
  if (pslList == nullptr) return;
  auto* list = static_cast<TextList*>(pslList);
  TruncateList(*list, 0);
  std::free(list->ppszItem);
  Unlink(*list);
  list->~TextList();
  std::free(list);
}

const char* PLIBCSzListGet(const PLIBSZLIST* pslList, int index) {
  if (pslList == nullptr) return REFUSE_NULL(), nullptr;
  return Has(*pslList, index) ? pslList->ppszItem[index] : nullptr;
}

int PLIBCSzListFind(const PLIBSZLIST* pslList, const char* szText) {
  if (pslList == nullptr || szText == nullptr) return REFUSE_NULL(), -1;
  for (int i = 0; i < pslList->nItem; ++i) {
    if (std::strcmp(pslList->ppszItem[i], szText) == 0) return i;
  }
  return -1;
}

int PLIBCSzListRemove(PPLIBSZLIST pslList, int index) {
  if (pslList == nullptr) return REFUSE_NULL(), -1;
  if (!Has(*pslList, index)) return PLIBCErrSet(ERR_BAD_PARAMETERS), -1;
  char** item = pslList->ppszItem + index;
  FreeItem(*item);
  std::copy(item + 1, pslList->ppszItem + pslList->nItem, item);
  --pslList->nItem;
  return 0;
}
