// Daemons that keep their pid in a file.
#include "platform/base/daemon.h"

#include <poll.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>

#include "common/descriptor.h"
#include "common/pidfd.h"
#include "common/text.h"
#include "platform/base/file_read.h"
#include "platform/base/number.h"

namespace {

constexpr int kPatience = 2000;  // milliseconds

// The pid that a file holds; 0 when it holds none.
pid_t PidIn(std::string_view text) {
  text = Trim(text);
  const pid_t pid = TakeNumber(text).value_or(0);
  return text.empty() && pid > 0 ? pid : 0;
}

// Whether a process runs a program, by the name that the kernel knows it by. A pid file may have been left by a process
// that ended long ago, and another process may have its pid now.
bool Runs(pid_t pid, const char* szProgram) {
  char szPath[64];
  std::snprintf(szPath, sizeof szPath, "/proc/%d/exe", pid);
  char target[4096];
  const ssize_t size = ::readlink(szPath, target, sizeof target);
  if (size < 0) return false;
  std::string_view name(target, static_cast<size_t>(size));
  name.remove_prefix(name.rfind('/') + 1);
  // The program's file may have been replaced since, by an upgrade say.
  constexpr std::string_view kReplaced = " (deleted)";
  if (EndsWith(name, kReplaced)) name.remove_suffix(kReplaced.size());
  return name == szProgram;
}

// Whether the process ended within the time.
bool EndsWithin(int process, int milliseconds) {
  pollfd ended{process, POLLIN, 0};
  return ::poll(&ended, 1, milliseconds) > 0;
}

Status End(pid_t pid, const char* szProgram) {
  // The process is held before its name is looked at, so that its pid cannot become another process's in between.
  const Descriptor process(PidfdOpen(pid));
  if (!process.valid()) return errno == ESRCH ? Status::Ok() : Status::Failed(errno);
  if (!Runs(pid, szProgram)) return Status::Ok();

  for (const int signal : {SIGTERM, SIGKILL}) {
    if (PidfdSendSignal(process.get(), signal) < 0) {
      return errno == ESRCH ? Status::Ok() : Status::Failed(errno);
    }
    if (EndsWithin(process.get(), kPatience)) return Status::Ok();
  }
  return Status::Failed(ETIMEDOUT);
}

}  // namespace

bool IsDaemonThere(const char* szPidPath, const char* szProgram) {
  Result<Bytes> file = ReadFile(szPidPath);
  return file.ok() && Runs(PidIn(file->view()), szProgram);
}

Status EndDaemon(const char* szPidPath, const char* szProgram) {
  Result<Bytes> file = ReadFile(szPidPath);
  if (file.error() == ENOENT) return Status::Ok();
  if (!file.ok()) return file.status();
  if (const pid_t pid = PidIn(file->view()); pid != 0) {
    if (Status status = End(pid, szProgram); !status.ok()) return status;
  }
  // The daemon may have removed it itself.
  return ::unlink(szPidPath) < 0 && errno != ENOENT ? Status::Failed(errno) : Status::Ok();
}
