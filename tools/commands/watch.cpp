// watch: the status as it changes.
#include "commands/watch.h"

#include <poll.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <ctime>
#include <iterator>
#include <optional>
#include <vector>

#include "base/clock.h"
#include "base/signals.h"
#include "common/descriptor.h"
#include "model/status.h"
#include "work/news.h"

namespace {

using std::chrono::milliseconds;
using std::chrono::steady_clock;

// kEnd when the program is to end: a signal says so, or nobody reads its output any more.
enum class Heard { kNothing, kNews, kEnd };

// Waits for news, for so long at most.
Heard Listen(const Descriptor& news, const Signals& signals, milliseconds patience) {
  pollfd waited[] = {{news.get(), POLLIN, 0}, {signals.fd(), POLLIN, 0}, {STDOUT_FILENO, 0, 0}};
  if (::poll(waited, std::size(waited), static_cast<int>(patience.count())) <= 0) return Heard::kNothing;
  if (signals.HasCome() || (waited[2].revents & (POLLERR | POLLHUP)) != 0) return Heard::kEnd;
  Drain(news);
  return Heard::kNews;
}

// The status once there has been no news for a moment: an address is given in several steps, and none of those between
// is one that the interface has. Where news does not end, the status after some seconds; nothing when the program is to
// end.
std::optional<Status> SettledStatus(const Descriptor& news, const Signals& signals) {
  constexpr milliseconds kMoment{200};
  constexpr milliseconds kMost{3000};
  const auto latest = steady_clock::now() + kMost;
  while (true) {
    const Heard heard = Listen(news, signals, kMoment);
    if (heard == Heard::kEnd) return std::nullopt;
    const bool late = steady_clock::now() >= latest;
    if (heard == Heard::kNews && !late) continue;
    Status status = ReadStatus();
    const Heard meanwhile = Listen(news, signals, milliseconds(0));
    if (meanwhile == Heard::kEnd) return std::nullopt;
    if (meanwhile == Heard::kNothing || late) return status;
  }
}

// The status when it has become another one than `shown`; nothing when the program is to end.
std::optional<Status> NextStatus(const Status& shown, const Descriptor& news, const Signals& signals) {
  constexpr milliseconds kPatience{1000};  // some drivers do not announce every change
  while (Listen(news, signals, kPatience) != Heard::kEnd) {
    auto status = SettledStatus(news, signals);
    if (!status || *status != shown) return status;
  }
  return std::nullopt;
}

// The time stands behind the fields of a status.
std::vector<Field<Status>> FieldsWithTime() {
  const auto fields = StatusFields();
  std::vector<Field<Status>> all(fields.begin(), fields.end());
  all.push_back({"time", "time", [](const Status&) { return Value(UtcText(std::time(nullptr))); }, Layout::kLeft,
                 [](const Status&, bool) { return Shown{LocalText(std::time(nullptr), "%T")}; }});
  return all;
}

// False when it could not be written.
bool Show(const Program& program, const Status& status) {
  program.output.One<Status>("status", FieldsWithTime(), status);
  if (program.output.form() == Form::kHuman) std::fputs("\n", stdout);
  return std::fflush(stdout) == 0;
}

}  // namespace

void Watch(const Program& program, int times) {
  const Signals signals;
  const Descriptor news = News();
  std::optional<Status> shown = SettledStatus(news, signals);
  for (int count = 1; shown && Show(program, *shown) && count != times; ++count) {
    shown = NextStatus(*shown, news, signals);
  }
}
