// The access point that is on the air before another one is tried in its place.
#include "model/ap_former.h"

#include <fcntl.h>
#include <net/if.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <utility>

#include "base/whole_file.h"
#include "common/descriptor.h"
#include "common/paths.h"
#include "platform.h"

namespace {

// Removes a file, unless it is to stay.
class NewFile {
 public:
  explicit NewFile(std::string path) : path_(std::move(path)) {}
  NewFile(const NewFile&) = delete;
  NewFile& operator=(const NewFile&) = delete;
  ~NewFile() {
    if (!path_.empty()) ::unlink(path_.c_str());
  }

  bool Rename(const std::string& path) {
    if (std::rename(path_.c_str(), path.c_str()) < 0) return false;
    path_.clear();
    return true;
  }

 private:
  std::string path_;
};

// In one step: whoever reads the file, and whoever switches the machine off, finds the old text or the new one.
bool Replace(const std::string& path, const std::string& text, mode_t mode) {
  std::string name = path + ".XXXXXX";
  const Descriptor file(::mkostemp(name.data(), O_CLOEXEC));
  if (!file.valid()) return false;
  NewFile made(name);
  return ::write(file.get(), text.data(), text.size()) == static_cast<ssize_t>(text.size()) &&
         ::fchmod(file.get(), mode) == 0 && ::fsync(file.get()) == 0 && made.Rename(path);
}

bool Remove(const std::string& path) {
  return PLIBCSysUnlink(path.c_str()) == 0;
}

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

void FormerAp::Keep(const std::string& path) {
  struct stat status {};
  const bool exists = ::stat(path.c_str(), &status) == 0;
  files_.push_back({path, exists ? TextOfFile(path) : std::nullopt, status.st_mode & ALLPERMS});
}

bool FormerAp::PutBack() const {
  const bool back = std::ranges::all_of(files_, [](const File& file) {
    if (TextOfFile(file.path) == file.text) return true;
    return file.text ? Replace(file.path, *file.text, file.mode) : Remove(file.path);
  });
  return back && PLIBCExec(kNetworkScriptPath, "start", interface_.c_str(), bridge_.c_str(), nullptr) == 0;
}
