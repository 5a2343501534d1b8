// The access point that is on the air before another one is tried in its place.
#include "model/ap_former.h"

#include <net/if.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "base/whole_file.h"
#include "common/paths.h"
#include "model/failed.h"
#include "model/settings_change.h"
#include "platform.h"

namespace {

std::string BridgeOf(const std::string& script) {
  char szBridge[IFNAMSIZ];
  return PLIBCFileGetKeyValue(script.c_str(), "BRIDGE", szBridge, sizeof szBridge, 0) > 0 ? szBridge : "";
}

}  // namespace

FormerAp::FormerAp(std::string interface, const std::string& nextBridge) : interface_(std::move(interface)) {
  const std::string script = InterfacePath(kInterfaceScriptFormat, interface_.c_str()).c_str();
  bridge_ = BridgeOf(script);
  Keep(script);
  for (const char* szFormat : {kHostapdHostFormat, kHostapdGuestFormat, kHostapdGuestInfoFormat, kHostapdInfoFormat}) {
    Keep(InterfacePath(szFormat, interface_.c_str()).c_str());
  }
  for (const std::string& bridge : {bridge_, nextBridge}) {
    Keep(InterfacePath(kInterfaceScriptFormat, bridge.c_str()).c_str());
    for (const char* szFormat : {kDhcpConfFormat, kDhcpInfoFormat}) {
      Keep(InterfacePath(szFormat, bridge.c_str(), bridge.c_str()).c_str());
    }
  }
}

// A file that is there and cannot be read could not be put back either.
void FormerAp::Keep(const std::string& path) {
  auto text = TextOfFile(path);
  struct stat status{};
  if (text ? ::stat(path.c_str(), &status) < 0 : errno != ENOENT) {
    throw Failed(path + " cannot be read, and nothing was changed: " + std::strerror(errno),
                 "the access point that is on the air could not be brought back without it");
  }
  files_.push_back({path, std::move(text), status.st_mode & ALLPERMS});
}

bool FormerAp::PutBack() const {
  const bool back = std::ranges::all_of(files_, [](const File& file) {
    if (TextOfFile(file.path) == file.text) return true;
    return file.text ? ReplaceSettings(file.path, *file.text, file.mode) : RemoveSettings(file.path.c_str());
  });
  return back && PLIBCExec(kNetworkScriptPath, "start", interface_.c_str(), bridge_.c_str(), nullptr) == 0;
}
