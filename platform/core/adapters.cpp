// The wireless adapters that the kernel has.
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

bool HasEntry(const char* szIfName, const char* szEntry) {
  char szPath[sizeof kInterfaces + NAME_MAX + 16];
  std::snprintf(szPath, sizeof szPath, "%s/%s/%s", kInterfaces, szIfName, szEntry);
  return ::access(szPath, F_OK) == 0;
}

// The guest network's interface is not an adapter: it is a second interface on an adapter's radio.
bool IsAdapter(const char* szIfName) {
  if (szIfName[0] == '.' || std::strcmp(szIfName, kGuestInterface) == 0) return false;
  return HasEntry(szIfName, "phy80211") || HasEntry(szIfName, "wireless");
}

// Calls `visit(name)` for each adapter, in no order.
template <class Visit>
void ForEachAdapter(Visit visit) {
  const Directory directory(::opendir(kInterfaces));
  if (!directory) return FAIL(errno, "Failed to list %s", kInterfaces);
  while (const dirent* entry = ::readdir(directory.get())) {
    if (IsAdapter(entry->d_name)) visit(entry->d_name);
  }
}

}  // namespace

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
