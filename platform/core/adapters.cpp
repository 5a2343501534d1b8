// The wireless adapters that the kernel has.
#include "platform/core/adapters.h"

#include <net/if.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>

#include "common/paths.h"
#include "common/text.h"
#include "platform/base/directory.h"
#include "platform/base/failure.h"

namespace {

constexpr char kInterfaces[] = "/sys/class/net";

// An interface may have gone since it was listed, and a file that is no interface stands among them where there is
// bonding.
Result<bool> HasEntry(const char* szIfName, const char* szEntry) {
  char szPath[sizeof kInterfaces + NAME_MAX + 16];
  std::snprintf(szPath, sizeof szPath, "%s/%s/%s", kInterfaces, szIfName, szEntry);
  if (::access(szPath, F_OK) == 0) return true;
  return errno == ENOENT || errno == ENOTDIR ? Result<bool>(false) : Status::Failed(errno);
}

// The guest network's interface is not an adapter: it is a second interface on an adapter's radio.
Result<bool> IsAdapter(const char* szIfName) {
  if (szIfName[0] == '.' || std::strcmp(szIfName, kGuestInterface) == 0) return false;
  Result<bool> modern = HasEntry(szIfName, "phy80211");
  return modern.ok() && !*modern ? HasEntry(szIfName, "wireless") : modern;
}

// Calls `visit(name)` for each adapter, in no order. One that cannot be looked at hides no other.
template <class Visit>
Status VisitAdapters(Visit visit) {
  const Directory directory(::opendir(kInterfaces));
  if (!directory) return Status::Failed(errno);
  Status seen = Status::Ok();
  while (true) {
    errno = 0;
    const dirent* entry = ::readdir(directory.get());
    if (entry == nullptr) return errno == 0 ? seen : Status::Failed(errno);
    Result<bool> adapter = IsAdapter(entry->d_name);
    if (!adapter.ok()) {
      seen = adapter.status();
    } else if (*adapter) {
      visit(entry->d_name);
    }
  }
}

template <class Visit>
void ForEachAdapter(Visit visit) {
  const Status status = VisitAdapters(visit);
  if (!status.ok()) FAIL(status.error(), "Failed to list %s", kInterfaces);
}

}  // namespace

Result<int> CountAdapters() {
  int count = 0;
  const Status status = VisitAdapters([&](const char*) { ++count; });
  return count > 0 || status.ok() ? Result<int>(count) : status;
}

int MEROWirelessAdapterNum(void) {
  int count = 0;
  ForEachAdapter([&](const char*) { ++count; });
  return count;
}

const char* MEROWirelessInterfaceGet(void) {
  static char s_szFirst[IFNAMSIZ];
  s_szFirst[0] = '\0';
  ForEachAdapter([](const char* szIfName) {
    // strverscmp() puts wlan2 before wlan10, as people do.
    if (s_szFirst[0] == '\0' || ::strverscmp(szIfName, s_szFirst) < 0) CopyText(s_szFirst, szIfName);
  });
  return s_szFirst[0] != '\0' ? s_szFirst : kFirstAdapter;
}
