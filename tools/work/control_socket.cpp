// The control sockets of the supplicant and of the access-point daemon.
#include "work/control_socket.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <cerrno>

#include "base/require.h"

// The kernel chooses the address to which the answers come, so that no file is left behind.
Descriptor ConnectToDaemon(const std::string& path) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path.size() >= sizeof address.sun_path) return errno = ENAMETOOLONG, Descriptor();
  std::ranges::copy(path, address.sun_path);

  Descriptor socket(Require(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0), "socket"));
  const auto* any = reinterpret_cast<const sockaddr*>(&address);
  const bool connected =
      ::bind(socket.get(), any, sizeof address.sun_family) == 0 && ::connect(socket.get(), any, sizeof address) == 0;
  return connected ? std::move(socket) : Descriptor();
}

bool SendToDaemon(const Descriptor& socket, std::string_view request) {
  return ::send(socket.get(), request.data(), request.size(), MSG_DONTWAIT | MSG_NOSIGNAL) ==
         static_cast<ssize_t>(request.size());
}

std::optional<std::string> AskDaemon(const std::string& path, std::string_view request,
                                     std::chrono::milliseconds patience) {
  const Descriptor socket = ConnectToDaemon(path);
  if (!socket.valid() || !SendToDaemon(socket, request)) return std::nullopt;
  pollfd waited{socket.get(), POLLIN, 0};
  if (::poll(&waited, 1, static_cast<int>(patience.count())) <= 0) return std::nullopt;
  char answer[4096];
  const ssize_t size = ::recv(socket.get(), answer, sizeof answer, 0);
  if (size < 0) return std::nullopt;
  std::string text(answer, static_cast<std::size_t>(size));
  if (text.ends_with('\n')) text.pop_back();
  return text;
}
