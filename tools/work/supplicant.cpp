// What the supplicant says about a join that is under way.
#include "work/supplicant.h"

#include <sys/socket.h>

#include <algorithm>
#include <cstring>
#include <iterator>
#include <utility>

#include "work/control_socket.h"

namespace {

// Events are recognised by how they begin and end. Names from the air stand between, and are not looked at.
struct Clue {
  std::string_view start;
  std::string_view end;
  Verdict verdict;
  bool isFinal = false;
};

constexpr Clue kClues[] = {
    {"CTRL-EVENT-SSID-TEMP-DISABLED", "reason=WRONG_KEY", Verdict::kSecretRefused, true},
    {"CTRL-EVENT-SSID-TEMP-DISABLED", "reason=AUTH_FAILED", Verdict::kSecretRefused, true},  // of EAP
    {"WPA: 4-Way Handshake failed", "pre-shared key may be incorrect", Verdict::kSecretRefused},
    {"CTRL-EVENT-EAP-FAILURE", "", Verdict::kSecretRefused},
    {"CTRL-EVENT-AUTH-REJECT", "status_code=15", Verdict::kSecretRefused},  // the answer to WEP's challenge was wrong
    {"CTRL-EVENT-AUTH-REJECT", "", Verdict::kRefused},
    {"CTRL-EVENT-ASSOC-REJECT", "", Verdict::kRefused},
    {"CTRL-EVENT-NETWORK-NOT-FOUND", "", Verdict::kNotFound},
};

constexpr std::string_view kLeaving = "CTRL-EVENT-TERMINATING";

// An event without its priority, such as "<3>".
std::string_view WithoutLevel(std::string_view event) {
  if (event.starts_with('<')) event.remove_prefix(std::min(event.find('>'), event.size() - 1) + 1);
  return event;
}

const Clue* ClueOf(std::string_view event) {
  event = WithoutLevel(event);
  while (event.ends_with(' ')) event.remove_suffix(1);
  const auto* found = std::ranges::find_if(
      kClues, [&](const Clue& clue) { return event.starts_with(clue.start) && event.ends_with(clue.end); });
  return found != std::end(kClues) ? found : nullptr;
}

}  // namespace

Verdict VerdictOf(std::string_view event) {
  const Clue* clue = ClueOf(event);
  return clue != nullptr ? clue->verdict : Verdict::kNone;
}

bool IsFinal(std::string_view event) {
  const Clue* clue = ClueOf(event);
  return clue != nullptr && clue->isFinal;
}

std::optional<Address> AccessPointIn(std::string_view event) {
  constexpr std::string_view kStart = "Associated with ";
  constexpr std::size_t kAddressSize = std::string_view("00:11:22:33:44:55").size();
  event = WithoutLevel(event);
  return event.starts_with(kStart) ? ParseAddress(event.substr(kStart.size(), kAddressSize)) : std::nullopt;
}

SupplicantListener::SupplicantListener(std::string path, std::function<void()> greet)
    : path_(std::move(path)), greet_(std::move(greet)) {}

bool SupplicantListener::Attach() {
  socket_ = ConnectToDaemon(path_);
  return socket_.valid() && SendToDaemon(socket_, "ATTACH");
}

void SupplicantListener::Tick() {
  constexpr std::chrono::seconds kPatience{1};
  const auto now = std::chrono::steady_clock::now();
  if (!socket_.valid()) {
    lastAsked_ = now;
    if (!Attach()) {
      socket_.Close();
    } else if (const auto greet = std::exchange(greet_, nullptr)) {
      greet();
    }
    return;
  }
  if (now - lastAsked_ < kPatience) return;
  lastAsked_ = now;
  if (!SendToDaemon(socket_, "PING") && errno != EAGAIN) socket_.Close();
}

// A supplicant that comes up is greeted before it does anything by itself.
std::chrono::milliseconds SupplicantListener::interval() const {
  return std::chrono::milliseconds(socket_.valid() ? 100 : 10);
}

void SupplicantListener::Receive() {
  char event[4096];
  while (socket_.valid()) {
    const ssize_t size = ::recv(socket_.get(), event, sizeof event, 0);
    if (size < 0) {
      if (errno != EAGAIN && errno != EINTR) socket_.Close();
      return;
    }
    const std::string_view text(event, static_cast<std::size_t>(size));
    verdict_ = std::max(verdict_, VerdictOf(text));
    final_ = final_ || IsFinal(text);
    if (const auto asked = AccessPointIn(text)) accessPoints_.push_back(*asked);
    if (WithoutLevel(text).starts_with(kLeaving)) socket_.Close();
  }
}
