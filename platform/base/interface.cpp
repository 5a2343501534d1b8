// Network interfaces, asked and told through ioctls.
#include "platform/base/interface.h"

#include <netinet/in.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <optional>

#include "platform/base/bytes.h"

bool IsInterfaceName(std::string_view name) {
  if (name.empty() || name.size() >= IFNAMSIZ || name == "." || name == "..") return false;
  return std::none_of(name.begin(), name.end(), [](char c) { return c == '/' || c == ':' || IsSpace(c); });
}

Result<Descriptor> OpenControl() {
  Descriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (!control.valid()) return Status::Failed(errno);
  return control;
}

Status SetInterfaceUp(const char* szIfName, bool up) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  Result<ifreq> request = RequestFor<ifreq>(szIfName);
  if (!request.ok()) return request.status();

  if (::ioctl(control->get(), SIOCGIFFLAGS, &*request) < 0) return Status::Failed(errno);
  const int flags = up ? request->ifr_flags | IFF_UP : request->ifr_flags & ~IFF_UP;
  request->ifr_flags = static_cast<short>(flags);
  return Status::Of(::ioctl(control->get(), SIOCSIFFLAGS, &*request));
}

namespace {

// All IPv4 addresses of the machine, each with its label: the interface's name, and maybe more behind a colon.
Result<Bytes> AllAddresses(const Descriptor& control) {
  Bytes addresses;
  ifconf request{};
  do {
    if (!addresses.Reserve(2 * addresses.capacity() + 16 * sizeof(ifreq))) return Status::Failed(ENOMEM);
    request.ifc_len = static_cast<int>(addresses.capacity());
    request.ifc_buf = addresses.data();
    if (::ioctl(control.get(), SIOCGIFCONF, &request) < 0) return Status::Failed(errno);
  } while (static_cast<size_t>(request.ifc_len) + sizeof(ifreq) > addresses.capacity());  // there may be more
  addresses.Grow(static_cast<size_t>(request.ifc_len));
  return addresses;
}

// One of the addresses of an interface; none when it has none.
Result<std::optional<ifreq>> AddressOf(const Descriptor& control, std::string_view ifName) {
  Result<Bytes> addresses = AllAddresses(control);
  if (!addresses.ok()) return addresses.status();
  for (std::string_view rest = addresses->view(); rest.size() >= sizeof(ifreq); rest.remove_prefix(sizeof(ifreq))) {
    ifreq address;
    std::memcpy(&address, rest.data(), sizeof address);
    const std::string_view label(address.ifr_name, ::strnlen(address.ifr_name, sizeof address.ifr_name));
    if (Slice(label, 0, label.find(':')) == ifName) return std::optional<ifreq>(address);
  }
  return std::optional<ifreq>();
}

}  // namespace

Status RemoveAddresses(const char* szIfName) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();
  // One by one: when one goes, the kernel removes others with it, or puts another in its place.
  while (true) {
    Result<std::optional<ifreq>> found = AddressOf(*control, szIfName);
    if (!found.ok()) return found.status();
    if (!*found) return Status::Ok();
    ifreq& address = **found;
    reinterpret_cast<sockaddr_in&>(address.ifr_addr).sin_addr.s_addr = INADDR_ANY;
    if (::ioctl(control->get(), SIOCSIFADDR, &address) < 0) return Status::Failed(errno);
  }
}
