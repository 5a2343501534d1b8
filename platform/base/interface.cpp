// Network interfaces, asked and told through ioctls.
#include "platform/base/interface.h"

#include <netinet/in.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

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

Status RemoveAddresses(const char* szIfName) {
  Result<Descriptor> control = OpenControl();
  if (!control.ok()) return control.status();

  // The kernel shows one address at a time, and promotes the next when that one goes.
  while (true) {
    Result<ifreq> request = RequestFor<ifreq>(szIfName);
    if (!request.ok()) return request.status();
    if (::ioctl(control->get(), SIOCGIFADDR, &*request) < 0) {
      return errno == EADDRNOTAVAIL ? Status::Ok() : Status::Failed(errno);
    }
    reinterpret_cast<sockaddr_in&>(request->ifr_addr).sin_addr.s_addr = INADDR_ANY;
    if (::ioctl(control->get(), SIOCSIFADDR, &*request) < 0) return Status::Failed(errno);
  }
}
