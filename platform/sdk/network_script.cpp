// The network-script file of an interface or a bridge.
#include "platform/sdk/network_script.h"

#include "platform/base/directory.h"
#include "platform/base/failure.h"

namespace {

constexpr const char* kDirectories[] = {"/etc/sysconfig", kInterfaceScriptDirectory};
constexpr char kLineFormat[] = "%s=%s\n";

// A stock machine has no such directories.
bool MakeDirectories() {
  for (const char* szDirectory : kDirectories) {
    if (const Status status = MakeDirectory(szDirectory); !status.ok()) {
      return FAIL(status.error(), "Failed to make %s", szDirectory), false;
    }
  }
  return true;
}

}  // namespace

bool NetworkScript::exists() const {
  return PLIBCFileExist(path_.c_str()) != 0;
}

void NetworkScript::Get(const char* szKey, char* szValue, size_t cbValue) const {
  if (PLIBCFileGetKeyValue(path_.c_str(), szKey, szValue, cbValue, 0) <= 0) szValue[0] = '\0';
}

void NetworkScript::Set(const char* szKey, const char* szValue) {
  written_ = written_ && MakeDirectories() && PLIBCFileSetKeyValue(path_.c_str(), szKey, szValue, kLineFormat) > 0;
}

void NetworkScript::Remove(const char* szKey) {
  written_ = written_ && PLIBCFileRemoveKey(path_.c_str(), szKey) >= 0;
}
