// The access points that cannot be joined, whatever their secret.
#include "model/obstacles.h"

#include <algorithm>
#include <cstdio>
#include <memory>
#include <string_view>

#include "platform.h"

namespace {

std::string OutputOf(const std::string& command) {
  const std::unique_ptr<std::FILE, int (*)(std::FILE*)> pipe(::popen(command.c_str(), "re"), ::pclose);
  std::string output;
  char bytes[1024];
  while (pipe != nullptr) {
    const std::size_t size = std::fread(bytes, 1, sizeof bytes, pipe.get());
    if (size == 0) break;
    output.append(bytes, size);
  }
  return output;
}

}  // namespace

// A line is an address, a blank, and how that is protected.
Obstacles Obstacles::Read() {
  Obstacles obstacles;
  const std::string interface = MEROWirelessInterfaceGet();
  const std::string output = OutputOf("/sbin/iwlist " + interface + " scanning mero unsupported 2>/dev/null");
  std::string_view lines = output;
  while (!lines.empty()) {
    const std::string_view line = lines.substr(0, lines.find('\n'));
    lines.remove_prefix(std::min(line.size() + 1, lines.size()));
    const std::size_t blank = line.find(' ');
    const auto address = ParseAddress(line.substr(0, blank));
    if (address && blank != line.npos) obstacles.texts_[*address] = line.substr(blank + 1);
  }
  return obstacles;
}

std::string Obstacles::Of(const WIRELESS_NETWORK& accessPoint) const {
  const auto found = texts_.find(std::to_array(accessPoint.bssid));
  return found != texts_.end() ? found->second : "";
}

void HideProtectionOfObstacles(std::vector<WIRELESS_NETWORK>& accessPoints) {
  const Obstacles obstacles = Obstacles::Read();
  for (WIRELESS_NETWORK& accessPoint : accessPoints) {
    if (obstacles.Of(accessPoint).empty()) continue;
    accessPoint.auth = WIRELESS_AUTH_UNKNOWN;
    accessPoint.encrypt = WIRELESS_ENCRYPT_UNKNOWN;
  }
}
