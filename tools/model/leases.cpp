// What the appliance's DHCP servers have leased.
#include "model/leases.h"

#include <cstdint>
#include <ctime>
#include <optional>
#include <sstream>

#include "base/whole_file.h"
#include "common/paths.h"
#include "platform.h"

namespace {

// The server's settings may name another file than the network start script does.
std::string PathOf(const std::string& bridge) {
  const InterfacePath conf(kDhcpConfFormat, bridge.c_str(), bridge.c_str());
  char szPath[4096];
  if (PLIBCFileGetKeyValue(conf.c_str(), "dhcp-leasefile", szPath, sizeof szPath, 0) > 0) return szPath;
  return InterfacePath(kLeasesFormat, bridge.c_str()).c_str();
}

// A line is "END ADDRESS IP NAME ID". An end of 0 is none, and "*" is no name. Lines of another kind, as those about
// IPv6, have no such address.
std::optional<Lease> LeaseIn(const std::string& line) {
  std::istringstream words(line);
  std::int64_t end = 0;
  std::string address;
  Lease lease;
  if (!(words >> end >> address >> lease.ip >> lease.name)) return std::nullopt;
  const auto parsed = ParseAddress(address);
  if (!parsed || !IsIpAddress(lease.ip) || (end != 0 && end < std::time(nullptr))) return std::nullopt;
  lease.address = *parsed;
  if (lease.name == "*") lease.name.clear();
  return lease;
}

}  // namespace

std::vector<Lease> LeasesOf(const std::string& bridge) {
  std::vector<Lease> leases;
  std::istringstream lines(TextOfFile(PathOf(bridge)).value_or(""));
  for (std::string line; std::getline(lines, line);) {
    if (auto lease = LeaseIn(line)) leases.push_back(*std::move(lease));
  }
  return leases;
}
