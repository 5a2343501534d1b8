// What the connection runs over at this moment, as the kernel and the resolver have it.
#ifndef MERO_TOOLS_LINK_H
#define MERO_TOOLS_LINK_H

#include <ctime>
#include <optional>
#include <string>

// What cannot be told is absent.
struct Link {
  std::string accessPoint;    // its address, or the cell's
  std::optional<int> signal;  // in dBm
  std::optional<int> channel;
  std::optional<int> rate;  // at which it is sent, in 1000 bits a second
  std::string gateway;      // the interface's own, the one that counts first
  std::string nameServers;  // that the interface has brought, with blanks between them
  std::optional<std::time_t> since;

  // A link that has become another one is no news: some of it changes all the time.
  bool operator==(const Link&) const { return true; }
};

// Of an interface that is connected: to an access point, or in a cell.
enum class LinkTo { kAccessPoint, kCell };
Link LinkOf(const std::string& interface, LinkTo to);

#endif  // MERO_TOOLS_LINK_H
