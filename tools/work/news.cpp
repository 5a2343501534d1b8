// The kernel's news about links and addresses.
#include "work/news.h"

#include <linux/rtnetlink.h>
#include <sys/socket.h>

#include "base/require.h"

Descriptor News() {
  Descriptor socket(Require(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_ROUTE), "netlink"));
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR;
  Require(::bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address), "netlink");
  return socket;
}

void Drain(const Descriptor& news) {
  char drained[8192];
  while (::recv(news.get(), drained, sizeof drained, 0) > 0) continue;
}
