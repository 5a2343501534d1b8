// What the supplicant says about a join that is under way.
#include "supplicant.h"

#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <cstring>

namespace {

struct Clue {
  std::string_view text;
  Verdict verdict;
};

constexpr Clue kClues[] = {
    {"reason=WRONG_KEY", Verdict::kSecretRefused},       {"pre-shared key may be incorrect", Verdict::kSecretRefused},
    {"CTRL-EVENT-EAP-FAILURE", Verdict::kSecretRefused}, {"CTRL-EVENT-AUTH-REJECT", Verdict::kRefused},
    {"CTRL-EVENT-ASSOC-REJECT", Verdict::kRefused},      {"CTRL-EVENT-NETWORK-NOT-FOUND", Verdict::kNotFound},
};

constexpr std::string_view kLeaving = "CTRL-EVENT-TERMINATING";

bool Send(int fd, std::string_view request) {
  return ::send(fd, request.data(), request.size(), MSG_DONTWAIT | MSG_NOSIGNAL) ==
         static_cast<ssize_t>(request.size());
}

}  // namespace

Verdict VerdictOf(std::string_view event) {
  for (const auto& [text, verdict] : kClues) {
    if (event.find(text) != event.npos) return verdict;
  }
  return Verdict::kNone;
}

SupplicantListener::SupplicantListener(std::string path) : path_(std::move(path)) {}

// The answers come to an address that the kernel makes up, so that no file is left behind.
bool SupplicantListener::Attach() {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  if (path_.size() >= sizeof address.sun_path) return false;
  std::copy(path_.begin(), path_.end(), address.sun_path);

  socket_ = Descriptor(Require(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0), "socket"));
  const auto* any = reinterpret_cast<const sockaddr*>(&address);
  return ::bind(socket_.get(), any, sizeof address.sun_family) == 0 &&
         ::connect(socket_.get(), any, sizeof address) == 0 && Send(socket_.get(), "ATTACH");
}

void SupplicantListener::Tick() {
  constexpr std::chrono::seconds kPatience{1};
  const auto now = std::chrono::steady_clock::now();
  if (!socket_) {
    lastAsked_ = now;
    if (!Attach()) socket_.Close();
    return;
  }
  if (now - lastAsked_ < kPatience) return;
  lastAsked_ = now;
  if (!Send(socket_.get(), "PING") && errno != EAGAIN) socket_.Close();
}

void SupplicantListener::Receive() {
  char event[4096];
  while (socket_) {
    const ssize_t size = ::recv(socket_.get(), event, sizeof event, 0);
    if (size < 0) {
      if (errno != EAGAIN && errno != EINTR) socket_.Close();
      return;
    }
    const std::string_view text(event, static_cast<std::size_t>(size));
    verdict_ = std::max(verdict_, VerdictOf(text));
    if (text.find(kLeaving) != text.npos) socket_.Close();
  }
}
