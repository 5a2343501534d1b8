// The signals by which somebody ends the program, while it waits for something.
#include "signals.h"

#include <poll.h>
#include <sys/signalfd.h>

namespace {

bool IsIgnored(int signal) {
  struct sigaction action {};
  return ::sigaction(signal, nullptr, &action) == 0 && action.sa_handler == SIG_IGN;
}

sigset_t EndingSignals() {
  sigset_t ending;
  sigemptyset(&ending);
  for (int signal : {SIGINT, SIGTERM, SIGHUP}) {
    if (!IsIgnored(signal)) sigaddset(&ending, signal);
  }
  return ending;
}

}  // namespace

Signals::Signals() : before_() {
  const sigset_t ending = EndingSignals();
  fd_ = Descriptor(Require(::signalfd(-1, &ending, SFD_CLOEXEC | SFD_NONBLOCK), "signalfd"));
  Require(::sigprocmask(SIG_BLOCK, &ending, &before_), "sigprocmask");
}

// What came meanwhile and was seen by nobody ends the program now.
Signals::~Signals() {
  RestoreMask();
}

bool Signals::HasCome() const {
  signalfd_siginfo info;
  return ::read(fd_.get(), &info, sizeof info) == sizeof info;
}

void Signals::RestoreMask() const {
  ::sigprocmask(SIG_SETMASK, &before_, nullptr);
}
