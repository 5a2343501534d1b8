// The access points that cannot be joined, whatever their secret, as the listing tool tells of them.
#ifndef MERO_TOOLS_OBSTACLES_H
#define MERO_TOOLS_OBSTACLES_H

#include <map>
#include <string>
#include <vector>

#include "base/text.h"
#include "wireless.h"

class Obstacles {
 public:
  // Those among the adapter's last results; none when the listing tool does not tell.
  static Obstacles Read();

  // How an access point is protected that cannot be joined, such as "WPA3"; empty for any other.
  std::string Of(const WIRELESS_NETWORK& accessPoint) const;

 private:
  std::map<Address, std::string> texts_;
};

// Has the protection of those that cannot be joined be unknown, as it is to the library where it knows no name for it.
void HideProtectionOfObstacles(std::vector<WIRELESS_NETWORK>& accessPoints);

#endif  // MERO_TOOLS_OBSTACLES_H
