// Waits for what may pass.
#include "model/patience.h"

#include <algorithm>
#include <thread>

#include "base/failure.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kPause{2000};

bool MayPass(const Failure& failure) {
  return failure.exit() == Exit::kOutOfRange || failure.exit() == Exit::kBusy;
}

void Pause(const Task& task, Clock::duration time) {
  (void)Run<bool>(task, [time] { return std::this_thread::sleep_for(time), true; });
}

}  // namespace

void Patiently(const Program& program, const std::string& what, std::chrono::seconds time,
               const std::function<void()>& act) {
  const auto deadline = Clock::now() + time;
  while (true) {
    try {
      return act();
    } catch (const Failure& failure) {
      if (!MayPass(failure) || Clock::now() >= deadline) throw;
    }
    Pause(program.Doing("waiting for " + what), std::min<Clock::duration>(kPause, deadline - Clock::now()));
  }
}
