// What the kernel is asked of a wireless interface where the library has no function for it.
#include "work/radio.h"

#include <net/if.h>  // first: the kernel's own headers make room for it

#include <linux/wireless.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstring>

#include "base/await.h"
#include "base/require.h"
#include "common/descriptor.h"
#include "common/scan_end.h"

namespace {

bool Ask(const std::string& interface, unsigned long what, iwreq& request) {
  const Descriptor control(Require(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0), "socket"));
  if (interface.size() >= sizeof request.ifr_name) return errno = ENODEV, false;
  std::ranges::copy(interface, request.ifr_name);
  return ::ioctl(control.get(), what, &request) == 0;
}

}  // namespace

std::optional<Address> AccessPointOf(const std::string& interface) {
  iwreq request{};
  if (!Ask(interface, SIOCGIWAP, request)) return std::nullopt;
  Address address;
  std::memcpy(address.data(), request.u.ap_addr.sa_data, address.size());
  return address == Address{} ? std::nullopt : std::optional(address);
}

std::string WepKeyOf(const std::string& interface) {
  char key[IW_ENCODING_TOKEN_MAX];
  iwreq request{};
  request.u.encoding.pointer = key;
  request.u.encoding.length = sizeof key;
  if (!Ask(interface, SIOCGIWENCODE, request) || (request.u.encoding.flags & IW_ENCODE_DISABLED) != 0) return "";
  return Hex({key, request.u.encoding.length});
}

bool ListenTo(const std::string& interface, int channel) {
  iw_scan_req listening{};
  listening.scan_type = IW_SCAN_TYPE_PASSIVE;
  listening.num_channels = 1;
  listening.channel_list[0].m = channel;
  iwreq request{};
  request.u.data.pointer = &listening;
  request.u.data.length = sizeof listening;
  return Ask(interface, SIOCSIWSCAN, request);
}

// One scan at a time: the supplicant's own, after it has lost a network, comes to its end first.
bool CallNetwork(const std::string& interface, const std::string& name) {
  constexpr std::chrono::milliseconds kPause{100};
  constexpr std::chrono::seconds kPatience{10};
  iw_scan_req call{};
  call.essid_len = static_cast<__u8>(std::min(name.size(), sizeof call.essid));
  std::memcpy(call.essid, name.data(), call.essid_len);
  iwreq request{};
  request.u.data.pointer = &call;
  request.u.data.length = sizeof call;
  request.u.data.flags = IW_SCAN_THIS_ESSID;
  bool called = false;
  const auto isAnswered = [&] {
    (void)nl80211::AwaitScanEnd(interface, kPatience);
    called = Ask(interface, SIOCSIWSCAN, request);
    return called || errno != EBUSY;
  };
  if (!Await(kPatience, kPause, isAnswered) || !called) return false;
  (void)nl80211::AwaitScanEnd(interface, kPatience);  // one that lasts longer is looked at as it is
  return true;
}
