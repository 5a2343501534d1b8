// The DHCP client of an interface: busybox's, which stays behind to renew the lease, or to go on asking for one.
#ifndef MERO_PLATFORM_DHCP_CLIENT_H
#define MERO_PLATFORM_DHCP_CLIENT_H

#include "platform/base/result.h"

inline constexpr char kDhcpClientPath[] = "/bin/busybox";
inline constexpr char kDhcpClientProgram[] = "busybox";

// Ends the client of an interface, if it has one, and has the script take back what a lease has set, also when the
// client has ended by itself. It is no failure when the script is missing: without it no lease was ever applied.
Status EndDhcpClient(const char* szIfName);

#endif  // MERO_PLATFORM_DHCP_CLIENT_H
