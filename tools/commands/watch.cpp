// watch: the status as it changes.
#include "commands/watch.h"

#include <linux/rtnetlink.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdio>
#include <iterator>

#include "base/require.h"
#include "base/signals.h"
#include "common/descriptor.h"
#include "model/status.h"

namespace {

// Readable whenever the kernel has news about links and addresses.
Descriptor News() {
  Descriptor socket(Require(::socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_ROUTE), "netlink"));
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR;
  Require(::bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address), "netlink");
  return socket;
}

// Waits for news, and a second at most, since some drivers do not announce every change. False when the program is to
// end: a signal says so, or nobody reads its output any more.
bool WaitForNews(const Descriptor& news, const Signals& signals) {
  constexpr int kPatience = 1000;
  pollfd waited[] = {{news.get(), POLLIN, 0}, {signals.fd(), POLLIN, 0}, {STDOUT_FILENO, 0, 0}};
  if (::poll(waited, std::size(waited), kPatience) <= 0) return true;
  if (signals.HasCome() || (waited[2].revents & (POLLERR | POLLHUP)) != 0) return false;
  char drained[8192];
  while (::recv(news.get(), drained, sizeof drained, 0) > 0) continue;
  return true;
}

// False when it could not be written.
bool Show(const Program& program, const Status& status) {
  program.output.One("status", StatusFields(), status);
  if (program.output.form() == Form::kHuman) std::fputs("\n", stdout);
  return std::fflush(stdout) == 0;
}

}  // namespace

void Watch(const Program& program, int times) {
  const Signals signals;
  const Descriptor news = News();
  Status shown = ReadStatus();
  for (int count = 1; Show(program, shown) && count != times; ++count) {
    Status status = shown;
    while (status == shown) {
      if (!WaitForNews(news, signals)) return;
      status = ReadStatus();
    }
    shown = std::move(status);
  }
}
