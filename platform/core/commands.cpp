// Running a program without a shell.
#include <spawn.h>
#include <sys/wait.h>

#include <csignal>

#include "platform/core/error.h"
#include "platform/core/result.h"

extern char** environ;

namespace {

// The program starts as if nobody had touched signals, whatever this process does with them.
Status Spawn(const char* const* argv, pid_t& pid) {
  posix_spawnattr_t attributes;
  if (const int error = ::posix_spawnattr_init(&attributes); error != 0) return Status::Failed(error);

  sigset_t none;
  sigset_t all;
  ::sigemptyset(&none);
  ::sigfillset(&all);
  int error = ::posix_spawnattr_setflags(&attributes, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  if (error == 0) error = ::posix_spawnattr_setsigmask(&attributes, &none);
  if (error == 0) error = ::posix_spawnattr_setsigdefault(&attributes, &all);
  if (error == 0) error = ::posix_spawn(&pid, argv[0], nullptr, &attributes, const_cast<char* const*>(argv), environ);
  ::posix_spawnattr_destroy(&attributes);
  return Status::Failed(error);
}

// The program's exit status; EINTR when a signal ended it.
Result<int> WaitFor(pid_t pid) {
  int state = 0;
  while (::waitpid(pid, &state, 0) < 0) {
    if (errno != EINTR) return Status::Failed(errno);
  }
  if (!WIFEXITED(state)) return Status::Failed(EINTR);
  return WEXITSTATUS(state);
}

}  // namespace

int PLIBCExec(const char* szPath, const char* szArg1, const char* szArg2, const char* szArg3, const char* szArg4) {
  if (szPath == nullptr) return REFUSE_NULL(), -1;
  const char* argv[] = {szPath, szArg1, szArg2, szArg3, szArg4, nullptr};

  pid_t pid = -1;
  if (Status status = Spawn(argv, pid); !status.ok()) {
    FAIL(status.error(), "run", szPath);
    return PLIBCErrSet(ERR_COMMAND_FAILED), -1;
  }
  Result<int> exitStatus = WaitFor(pid);
  if (!exitStatus.ok()) {
    FAIL(exitStatus.error(), "run", szPath);
    return PLIBCErrSet(ERR_COMMAND_FAILED), -1;
  }
  return *exitStatus;
}
