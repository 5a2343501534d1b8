// The access-point daemon, in the hands of a test.
#include "hostapd_fake.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <string_view>

#include "kernel_fakes.h"
#include "library_fakes.h"

namespace {

constexpr char kDirectory[] = "/var/run/hostapd";
constexpr char kSocket[] = "/var/run/hostapd/wlan0";

void Answer(int fd, Hostapd::Manner manner) {
  char request[256];
  sockaddr_un asker{};
  socklen_t size = sizeof asker;
  const ssize_t length = ::recvfrom(fd, request, sizeof request, 0, reinterpret_cast<sockaddr*>(&asker), &size);
  if (length < 0) ::_exit(EXIT_FAILURE);
  library::Record({request, static_cast<std::size_t>(length)});
  if (manner == Hostapd::Manner::kObeys) --kernel::Main().stations;
  const std::string_view answer = manner == Hostapd::Manner::kRefuses ? "FAIL\n" : "OK\n";
  ::sendto(fd, answer.data(), answer.size(), 0, reinterpret_cast<sockaddr*>(&asker), size);
}

}  // namespace

Hostapd::Hostapd(Manner manner) {
  std::filesystem::create_directories(kDirectory);
  ::unlink(kSocket);
  const int fd = ::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  std::strcpy(address.sun_path, kSocket);
  if (::bind(fd, reinterpret_cast<const sockaddr*>(&address), sizeof address) < 0) std::abort();
  pid_ = ::fork();
  if (pid_ == 0) {
    while (true) Answer(fd, manner);
  }
  ::close(fd);
}

Hostapd::~Hostapd() {
  ::kill(pid_, SIGKILL);
  ::waitpid(pid_, nullptr, 0);
  ::unlink(kSocket);
}
