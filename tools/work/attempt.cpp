// A part of the program that may fail, in a process of its own.
#include "work/attempt.h"

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <string>
#include <utility>

#include "base/require.h"
#include "base/signals.h"
#include "common/pidfd.h"

namespace {

// What a failure says goes to the program as it is, with a zero between its two sentences. It is shorter than what a
// pipe takes at once.
[[noreturn]] void End(int words, const Failure& failure) {
  const std::string text = failure.what() + std::string(1, '\0') + failure.advice();
  (void)!::write(words, text.data(), text.size());  // the status is told all the same
  ::_exit(static_cast<int>(failure.exit()));
}

[[noreturn]] void Act(int words, const std::function<void()>& act) {
  try {
    Signals::RestoreMask();
    Require(::prctl(PR_SET_PDEATHSIG, SIGTERM), "prctl");
    const Descriptor nowhere(Require(::open("/dev/null", O_WRONLY | O_CLOEXEC), "/dev/null"));
    Require(::dup2(nowhere.get(), STDOUT_FILENO), "dup2");
    act();
  } catch (const Failure& failure) {
    End(words, failure);
  } catch (const Interrupted&) {
    ::_exit(static_cast<int>(Exit::kInterrupted));
  } catch (const std::exception& failure) {
    End(words, {Exit::kFailed, failure.what(), "-v shows how far it came"});
  }
  ::_exit(EXIT_SUCCESS);
}

}  // namespace

Attempt::Attempt(const std::function<void()>& act) : pid_(-1) {
  int ends[2];
  Require(::pipe2(ends, O_CLOEXEC | O_NONBLOCK), "pipe");
  words_ = Descriptor(ends[0]);
  const Descriptor writer(ends[1]);
  std::fflush(nullptr);
  pid_ = Require(::fork(), "fork");
  if (pid_ == 0) Act(writer.get(), act);
  ended_ = Descriptor(Require(PidfdOpen(pid_), "pidfd_open"));
}

Attempt::~Attempt() {
  if (pid_ < 0) return;
  Interrupt();
  (void)Result();
}

void Attempt::Interrupt() {
  if (std::exchange(interrupted_, true)) return;
  ::kill(pid_, SIGTERM);
}

std::optional<Failure> Attempt::Result() {
  int status = 0;
  ::waitpid(std::exchange(pid_, -1), &status, 0);
  if (interrupted_ || status == 0) return std::nullopt;
  char words[4096];
  const ssize_t size = ::read(words_.get(), words, sizeof words);
  const std::string text(words, size > 0 ? static_cast<std::size_t>(size) : 0);
  const std::size_t end = text.find('\0');
  if (!WIFEXITED(status) || end == text.npos) {
    return Failure(Exit::kFailed, "the attempt broke off", "run `merowireless autoconnect -v` to see how far it comes");
  }
  return Failure(static_cast<Exit>(WEXITSTATUS(status)), text.substr(0, end), text.substr(end + 1));
}
