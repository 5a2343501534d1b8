// The name servers that an interface has brought to the resolver.
#include "model/name_servers.h"

#include <fstream>
#include <string_view>

#include "common/paths.h"

std::vector<std::string> NameServersOf(const std::string& interface) {
  constexpr std::string_view kServer = "nameserver ";
  const std::string first = InterfacePath(kNameServersBegin, interface.c_str()).c_str();
  const std::string last = InterfacePath(kNameServersEnd, interface.c_str()).c_str();
  std::vector<std::string> servers;
  std::ifstream file(kResolverPath);
  bool inside = false;
  for (std::string line; std::getline(file, line);) {
    if (line == first) servers.clear();  // what stands behind one that has no end is not the interface's
    if (inside && line == last) return servers;
    inside = inside || line == first;
    if (inside && line.starts_with(kServer)) servers.push_back(line.substr(kServer.size()));
  }
  return {};
}
