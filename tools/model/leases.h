// What the appliance's DHCP servers have leased.
#ifndef MERO_TOOLS_LEASES_H
#define MERO_TOOLS_LEASES_H

#include <string>
#include <vector>

#include "base/text.h"

struct Lease {
  Address address;  // of the hardware
  std::string ip;
  std::string name;  // that the client has given itself; empty without one
};

// Those of a bridge's server that have not ended; none without such a server.
std::vector<Lease> LeasesOf(const std::string& bridge);

#endif  // MERO_TOOLS_LEASES_H
