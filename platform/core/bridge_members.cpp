// The bridges that the kernel has.
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "platform/base/directory.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/core/text_list.h"

namespace {

constexpr char kMembersFormat[] = "/sys/class/net/%s/brif";

// The directory with an entry for each member; ENOENT when the kernel has no bridge of that name, and ENODEV when it
// cannot have one.
Result<Directory> OpenMembers(const char* szBridge) {
  if (!IsInterfaceName(szBridge)) return Status::Failed(ENODEV);
  char szPath[sizeof kMembersFormat + IFNAMSIZ];
  std::snprintf(szPath, sizeof szPath, kMembersFormat, szBridge);
  Directory directory(::opendir(szPath));
  if (!directory) return Status::Failed(errno);
  return directory;
}

Status AppendNames(DIR* directory, PLIBSZLIST& list) {
  while (true) {
    errno = 0;
    const dirent* entry = ::readdir(directory);
    if (entry == nullptr) return errno == 0 ? Status::Ok() : Status::Failed(errno);
    if (entry->d_name[0] == '.') continue;
    if (!AppendToList(list, entry->d_name)) return Status::Failed(ENOMEM);
  }
}

Status AppendMembers(const char* szBridge, PLIBSZLIST& list) {
  Result<Directory> directory = OpenMembers(szBridge);
  if (directory.error() == ENOENT) return Status::Ok();  // a bridge that is not there has no members
  if (!directory.ok()) return directory.status();

  const int before = list.nItem;
  if (Status status = AppendNames(directory->get(), list); !status.ok()) {
    TruncateList(list, before);
    return status;
  }
  std::qsort(list.ppszItem + before, static_cast<size_t>(list.nItem - before), sizeof(char*),
             [](const void* a, const void* b) {
               return ::strverscmp(*static_cast<char* const*>(a), *static_cast<char* const*>(b));
             });
  return Status::Ok();
}

}  // namespace

int PLIBNetBridgeSlaveEnum(const char* szBridge, PPLIBSZLIST* ppslList) {
  if (szBridge == nullptr || ppslList == nullptr || *ppslList == nullptr) return REFUSE_NULL(), -1;
  PLIBSZLIST& list = **ppslList;
  const int before = list.nItem;
  if (const Status status = AppendMembers(szBridge, list); !status.ok()) {
    return FAIL(status.error(), "Failed to list the members of %s", szBridge), -1;
  }
  return list.nItem - before;
}
