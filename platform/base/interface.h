// Network interfaces.
#ifndef MERO_PLATFORM_INTERFACE_H
#define MERO_PLATFORM_INTERFACE_H

#include <net/if.h>

#include <cstdint>
#include <string_view>

#include "common/descriptor.h"
#include "common/text.h"
#include "platform/base/result.h"

// Whether the kernel would take a text for an interface's name. One that it would not take stands for no interface, and
// must not become part of a path.
bool IsInterfaceName(std::string_view name);

// A socket to pass ioctls through, or the reason why there is none.
Result<Descriptor> OpenControl();

// Brings an interface up, or takes it down.
Status SetInterfaceUp(const char* szIfName, bool up);

// Removes every IPv4 address of an interface.
Status RemoveAddresses(const char* szIfName);

// Gives an interface one IPv4 address, in host order, with the usual broadcast address, and removes all others. If it
// has that address, that stays, and so do the routes that go with it. After a failure it has the addresses that it had.
Status SetOnlyAddress(const char* szIfName, uint32_t address, uint32_t mask);

// A request of the kernel's (`struct ifreq`, `struct iwreq`) that names its interface. ENODEV when the name is longer
// than any interface's, so that a name that was cut never reaches another interface.
template <class Request>
Result<Request> RequestFor(const char* szIfName) {
  Request request{};
  auto& name = reinterpret_cast<char(&)[IFNAMSIZ]>(request);
  if (std::strlen(szIfName) >= sizeof name) return Status::Failed(ENODEV);
  CopyText(name, szIfName);
  return request;
}

#endif  // MERO_PLATFORM_INTERFACE_H
