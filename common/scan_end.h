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

// A request to the kernel's older interface; false when it is refused, and errno tells why.
inline bool AskRadio(const std::string& interface, unsigned long what, iwreq& request) {
  const Descriptor control(::socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  if (interface.size() >= sizeof request.ifr_name) return errno = ENODEV, false;
  CopyText(request.ifr_name, interface);
  return ::ioctl(control.get(), what, &request) == 0;
}

// Whether the radio of an interface scans: the kernel gives no results by its older interface meanwhile.
inline bool IsScanning(const std::string& interface) {
  char results[1];
  iwreq request{};
  request.u.data.pointer = results;
  return !AskRadio(interface, SIOCGIWSCAN, request) && errno == EAGAIN;
}

// How many channels the radio of an interface may use, or more than it can have where that is not told. Of more than 32
// no more are told.
inline unsigned CountChannels(const std::string& interface) {
  iw_range range{};
  iwreq request{};
  request.u.data.pointer = &range;
  request.u.data.length = sizeof range;
  return AskRadio(interface, SIOCGIWRANGE, request) ? range.num_frequency : IW_MAX_FREQUENCIES + 1;
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

// What a piece of news says.
enum class News {
  kOther,
  kPart,  // an interface has scanned to the end, but not all channels, or it has only called some network by its name
  kAll,   // an interface has scanned to the end, so many channels as all of them are
};

inline News NewsIn(nlmsghdr* message, unsigned interface, unsigned channels) {
  if (genlmsg_valid_hdr(message, 0) == 0) return News::kOther;
  const auto* header = static_cast<const genlmsghdr*>(nlmsg_data(message));
  const auto find = [&](int kind) { return nla_find(genlmsg_attrdata(header, 0), genlmsg_attrlen(header, 0), kind); };
  const nlattr* index = find(NL80211_ATTR_IFINDEX);
  const bool isResult =
      header->cmd == NL80211_CMD_NEW_SCAN_RESULTS && index != nullptr && nla_get_u32(index) == interface;
  if (!isResult) return News::kOther;

  const nlattr* frequencies = find(NL80211_ATTR_SCAN_FREQUENCIES);
  const nlattr* names = find(NL80211_ATTR_SCAN_SSIDS);
  if (frequencies == nullptr || names == nullptr) return News::kPart;
  unsigned heard = 0;
  bool callsAll = nla_len(names) == 0;  // or rather nobody: it only listens
  nlattr* one;
  int left;
  nla_for_each_nested(one, frequencies, left)++ heard;
  nla_for_each_nested(one, names, left) callsAll = callsAll || nla_len(one) == 0;
  return heard >= channels && callsAll ? News::kAll : News::kPart;
}

// Takes the next piece of news.
inline News Receive(nl_sock* news, unsigned interface, unsigned channels) {
  alignas(nlmsghdr) char bytes[8192];
  const ssize_t size = ::recv(nl_socket_get_fd(news), bytes, sizeof bytes, MSG_DONTWAIT);
  auto* message = reinterpret_cast<nlmsghdr*>(bytes);
  if (size < 0 || nlmsg_ok(message, static_cast<int>(size)) == 0) return News::kOther;
  return NewsIn(message, interface, channels);
}

// Waits until the scan that is under way on an interface's radio has ended. True when there was one, and it called
// everybody on all channels, or listened to them; false when there was none, when it looked for less, when it was
// broken off, and when it lasts longer than `patience`.
inline bool AwaitScanEnd(const std::string& interface, std::chrono::milliseconds patience) {
  using Clock = std::chrono::steady_clock;
  constexpr std::chrono::milliseconds kLook{1000};  // in between, since news can be lost
  if (!IsScanning(interface)) return false;
  const unsigned index = ::if_nametoindex(interface.c_str());
  const unsigned channels = CountChannels(interface);
  const Socket news = NewsOfScans();
  const auto deadline = Clock::now() + patience;
  // Asked again once the news come, so that no end is missed.
  while (news && IsScanning(interface)) {
    const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now());
    if (left.count() <= 0) break;
    pollfd waited{nl_socket_get_fd(news.get()), POLLIN, 0};
    if (::poll(&waited, 1, static_cast<int>(std::min(left, kLook).count())) <= 0) continue;
    const News told = Receive(news.get(), index, channels);
    if (told != News::kOther) return told == News::kAll;
  }
  return false;
}

}  // namespace nl80211

#endif  // MERO_COMMON_SCAN_END_H
