// The text list: an array of copies.
#include "platform/core/text_list.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

#include "platform/base/failure.h"

namespace {

constexpr int kBytesOfAnItem = 16;  // what a typical text takes, to turn a size hint into a number of items
constexpr int kMostItemsAtFirst = 1 << 16;

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

}  // namespace

bool AppendToList(PLIBSZLIST& list, std::string_view text) {
  if (list.nItem == list.nCapacity && !Reserve(list, 2 * list.nCapacity)) return false;
  char* szItem = ::strndup(text.data(), text.size());
  if (szItem == nullptr) return false;
  list.ppszItem[list.nItem++] = szItem;
  return true;
}

void TruncateList(PLIBSZLIST& list, int nItem) {
  while (list.nItem > nItem) std::free(list.ppszItem[--list.nItem]);
}

PPLIBSZLIST PLIBCSzListAlloc(int cbSize) {
  auto* list = static_cast<PLIBSZLIST*>(std::calloc(1, sizeof(PLIBSZLIST)));
  if (list == nullptr) return FAIL(ENOMEM, "Failed to make a text list"), nullptr;
  if (!Reserve(*list, std::clamp(cbSize / kBytesOfAnItem, 1, kMostItemsAtFirst))) {
    std::free(list);
    return FAIL(ENOMEM, "Failed to make a text list"), nullptr;
  }
  return list;
}

void PLIBCSzListFree(PPLIBSZLIST pslList) {
  if (pslList == nullptr) return;
  TruncateList(*pslList, 0);
  std::free(pslList->ppszItem);
  std::free(pslList);
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
  std::free(*item);
  std::copy(item + 1, pslList->ppszItem + pslList->nItem, item);
  --pslList->nItem;
  return 0;
}
