// The name servers that an interface has brought to the resolver.
#ifndef MERO_TOOLS_NAME_SERVERS_H
#define MERO_TOOLS_NAME_SERVERS_H

#include <string>
#include <vector>

// Those in the resolver's settings; not the ones that are there from elsewhere.
std::vector<std::string> NameServersOf(const std::string& interface);

#endif  // MERO_TOOLS_NAME_SERVERS_H
