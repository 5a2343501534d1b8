// The end of a scan that is under way, whoever has asked for it.
#ifndef MERO_COMMON_SCAN_END_H
#define MERO_COMMON_SCAN_END_H

#include <net/if.h>  // first: the kernel's own headers make room for it

#include <linux/wireless.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <algorithm>
#include <chrono>
#include <string>

#include "common/descriptor.h"
#include "common/nl80211.h"
#include "common/text.h"

namespace nl80211 {

// Whether the radio of an interface scans: the kernel gives no results by its older interface meanwhile.
inline bool IsScanning(const std::string& interface) {
  const Descriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  char results[1];
  iwreq request{};
  if (interface.size() >= sizeof request.ifr_name) return false;
  CopyText(request.ifr_name, interface);
  request.u.data.pointer = results;
  return ::ioctl(control.get(), SIOCGIWSCAN, &request) < 0 && errno == EAGAIN;
}

// What the kernel tells of scans from now on; nothing when it does not.
inline Socket NewsOfScans() {
  Socket socket(nl_socket_alloc());
  if (!socket) throw std::bad_alloc();
  if (genl_connect(socket.get()) < 0) return nullptr;
  const int group = genl_ctrl_resolve_grp(socket.get(), NL80211_GENL_NAME, NL80211_MULTICAST_GROUP_SCAN);
  if (group < 0 || nl_socket_add_membership(socket.get(), group) < 0) return nullptr;
  return socket;
}

// Takes the next piece of news; whether it is that the interface has scanned to the end.
inline bool TellsOfResults(nl_sock* news, unsigned interface) {
  alignas(nlmsghdr) char bytes[8192];
  const ssize_t size = ::recv(nl_socket_get_fd(news), bytes, sizeof bytes, MSG_DONTWAIT);
  auto* message = reinterpret_cast<nlmsghdr*>(bytes);
  if (size < 0 || nlmsg_ok(message, static_cast<int>(size)) == 0 || genlmsg_valid_hdr(message, 0) == 0) return false;
  const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
  if (header->cmd != NL80211_CMD_NEW_SCAN_RESULTS) return false;
  const nlattr* index = nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), NL80211_ATTR_IFINDEX);
  return index != nullptr && nla_get_u32(index) == interface;
}

// Waits until the scan that is under way on an interface's radio has ended. True when there was one and it heard all
// channels; false when there was none, when it was broken off, and when it lasts longer than `patience`.
inline bool AwaitScanEnd(const std::string& interface, std::chrono::milliseconds patience) {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds kLook{1000};  // in between, since news can be lost
  if (!IsScanning(interface)) return false;
  const unsigned index = ::if_nametoindex(interface.c_str());
  const Socket news = NewsOfScans();
  const auto deadline = Clock::now() + patience;
  // Asked again once the news come, so that no end is missed.
  while (news && IsScanning(interface)) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0) break;
    pollfd waited{nl_socket_get_fd(news.get()), POLLIN, 0};
    if (::poll(&waited, 1, static_cast<int>(std::min(left, kLook).count())) <= 0) continue;
    if (TellsOfResults(news.get(), index)) return true;
  }
  return false;
}

}  // namespace nl80211

#endif  // MERO_COMMON_SCAN_END_H
