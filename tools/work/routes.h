// The IPv4 routes that somebody has given an interface. The kernel drops them when the interface goes down.
#ifndef MERO_TOOLS_ROUTES_H
#define MERO_TOOLS_ROUTES_H

#include <string>
#include <vector>

class Routes {
 public:
  // Those that an interface has. The kernel's own, which come with an address, are not among them.
  static Routes Of(const std::string& interface);

  bool empty() const { return messages_.empty(); }

  // Adds those that are missing. False when the kernel refuses one.
  bool PutBack() const;

 private:
  std::vector<std::string> messages_;  // as the kernel tells of them, and takes them
};

// The gateway of an interface's default route, of the one that counts first where it has several; empty without one.
std::string GatewayOf(const std::string& interface);

#endif  // MERO_TOOLS_ROUTES_H
