// The control sockets of the supplicant and of the access-point daemon.
#ifndef MERO_TOOLS_CONTROL_SOCKET_H
#define MERO_TOOLS_CONTROL_SOCKET_H

#include <chrono>
#include <optional>
#include <string>
#include <string_view>

#include "common/descriptor.h"

// Leads to the daemon's socket, and does not block; invalid when no daemon is behind it, and errno tells why.
Descriptor ConnectToDaemon(const std::string& path);

// False when the daemon does not take it now.
bool SendToDaemon(const Descriptor& socket, std::string_view request);

// The answer to a request without a line end; nothing when none comes in time.
std::optional<std::string> AskDaemon(const std::string& path, std::string_view request,
                                     std::chrono::milliseconds patience);

#endif  // MERO_TOOLS_CONTROL_SOCKET_H
