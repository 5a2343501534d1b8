// The signals by which somebody ends the program, while it waits for something.
#include "base/signals.h"

#include <sys/signalfd.h>

#include "base/require.h"

namespace {

const Signals* g_outermost = nullptr;

bool IsIgnored(int signal) {
  struct sigaction action{};
  return ::sigaction(signal, nullptr, &action) == 0 && action.sa_handler == SIG_IGN;
}

sigset_t EndingSignalsAnd(std::initializer_list<int> others) {
  sigset_t held;
  sigemptyset(&held);
  for (const int signal : {SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
    if (!IsIgnored(signal)) sigaddset(&held, signal);
  }
  for (const int signal : others) sigaddset(&held, signal);
  return held;
}

}  // namespace

Signals::Signals(std::initializer_list<int> others) : before_() {
  const sigset_t held = EndingSignalsAnd(others);
  fd_ = Descriptor(Require(::signalfd(-1, &held, SFD_CLOEXEC | SFD_NONBLOCK), "signalfd"));
  Require(::sigprocmask(SIG_BLOCK, &held, &before_), "sigprocmask");
  if (g_outermost == nullptr) g_outermost = this;
}

// A signal that has come and was not read by Next() ends the program now.
Signals::~Signals() {
  if (g_outermost == this) g_outermost = nullptr;
  ::sigprocmask(SIG_SETMASK, &before_, nullptr);
}

int Signals::Next() const {
  signalfd_siginfo info;
  return ::read(fd_.get(), &info, sizeof info) == sizeof info ? static_cast<int>(info.ssi_signo) : 0;
}

void Signals::RestoreMask() {
  ::sigprocmask(SIG_SETMASK, &g_outermost->before_, nullptr);
}
