// The name servers that an interface has brought to the resolver.
#include "model/name_servers.h"

#include <algorithm>
#include <fstream>
#include <sstream>
#include <string_view>

#include "base/text.h"
#include "common/paths.h"
#include "model/library.h"

namespace {

// The servers of a block, which counts when it has its last line.
std::vector<std::string> ServersBetween(const std::string& first, const std::string& last) {
  constexpr std::string_view kServer = "nameserver ";
  std::vector<std::string> servers;
  std::ifstream file(kResolverPath);
  bool inside = false;
  for (std::string line; std::getline(file, line);) {
    if (line == first) servers.clear();
    if (inside && line == last) return servers;
    inside = inside || line == first;
    if (inside && line.starts_with(kServer)) servers.push_back(line.substr(kServer.size()));
  }
  return {};
}

std::vector<std::string> Saved(const std::string& interface) {
  return ServersBetween(InterfacePath(kSavedServersBegin, interface.c_str()).c_str(),
                        InterfacePath(kSavedServersEnd, interface.c_str()).c_str());
}

// Whether it can be the address of one other machine, as the kit's script sees it.
bool IsHost(const std::string& server) {
  const int first = std::atoi(server.c_str());
  return IsIpAddress(server) && first >= 1 && first <= 223 && first != 127;
}

}  // namespace

std::vector<std::string> NameServersOf(const std::string& interface) {
  std::vector<std::string> servers = Saved(interface);
  if (!servers.empty()) return servers;
  return ServersBetween(InterfacePath(kLeasedServersBegin, interface.c_str()).c_str(),
                        InterfacePath(kLeasedServersEnd, interface.c_str()).c_str());
}

std::string SavedNameServersOf(const std::string& interface) {
  return WithBlanks(Saved(interface));
}

void SetNameServers(const std::string& interface, const std::string& servers) {
  if (SavedNameServersOf(interface) == servers) return;
  if (PLIBCExec(kLeaseScript, "servers", interface.c_str(), servers.c_str(), nullptr) == 0) return;
  throw Failed("the name servers could not be set", "-v shows what the lease script reports");
}

// The C library asks no more than three.
std::string CheckedNameServers(const std::string& text) {
  constexpr std::size_t kMost = 3;
  std::string blanks = text;
  std::ranges::replace(blanks, ',', ' ');
  std::istringstream in(blanks);
  std::vector<std::string> servers;
  for (std::string server; in >> server;) servers.push_back(server);
  if (servers.empty() || servers.size() > kMost || !std::ranges::all_of(servers, IsHost)) {
    throw Wrong("these can be no name servers",
                "give one to three addresses, such as 192.168.1.1,192.168.1.2, or none");
  }
  return WithBlanks(servers);
}
