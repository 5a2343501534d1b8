// The network-script file of an interface or a bridge.
#include "platform/sdk/network_script.h"

#include <cstdio>

#include "platform/base/directory.h"
#include "platform/base/failure.h"

namespace {

constexpr const char* kDirectories[] = {"/etc/sysconfig", "/etc/sysconfig/network-scripts"};
constexpr char kPathFormat[] = "/etc/sysconfig/network-scripts/ifcfg-%s";
constexpr char kLineFormat[] = "%s=%s\n";

// A stock machine has no such directories.
bool MakeDirectories() {
  for (const char* szDirectory : kDirectories) {
    if (Status status = MakeDirectory(szDirectory); !status.ok()) {
      return FAIL(status.error(), "Failed to make %s", szDirectory), false;
    }
  }
  return true;
}

}  // namespace

NetworkScript::NetworkScript(const char* szIfName) {
  std::snprintf(szPath_, sizeof szPath_, kPathFormat, szIfName);
}

bool NetworkScript::exists() const {
  return PLIBCFileExist(szPath_) != 0;
}

void NetworkScript::Get(const char* szKey, char* szValue, size_t cbValue) const {
  if (PLIBCFileGetKeyValue(szPath_, szKey, szValue, cbValue, 0) <= 0) szValue[0] = '\0';
}

void NetworkScript::Set(const char* szKey, const char* szValue) {
  written_ = written_ && MakeDirectories() && PLIBCFileSetKeyValue(szPath_, szKey, szValue, kLineFormat) > 0;
}

void NetworkScript::Remove(const char* szKey) {
  written_ = written_ && PLIBCFileRemoveKey(szPath_, szKey) >= 0;
}
