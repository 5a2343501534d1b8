// A daemon that calls end.
#include "tests/fault/daemon.h"

#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <utility>

#include "tests/support/files.h"

namespace fs = std::filesystem;

Daemon::Daemon(std::string name, std::vector<std::string> pidFiles)
    : name_(std::move(name)), pidFiles_(std::move(pidFiles)) {}

Daemon::~Daemon() {
  if (!IsRunning()) return;
  ::kill(pid_, SIGKILL);
  ::waitpid(pid_, nullptr, 0);
}

void Daemon::Renew() {
  if (!IsRunning()) Start();
  const std::string pid = std::to_string(pid_) + "\n";
  for (const std::string& file : pidFiles_) {
    if (Exists(file) && TextOrNothing(file) != pid) WriteText(file, pid, 0644);
  }
}

bool Daemon::IsRunning() const {
  return pid_ > 0 && ::waitpid(pid_, nullptr, WNOHANG) == 0;
}

// A process bears the name of the file that it runs. That one is no part of the machine's state.
void Daemon::Start() {
  const std::string program = "/mnt/daemons/" + name_;
  fs::create_directories("/mnt/daemons");
  if (!Exists(program)) fs::copy("/bin/sleep", program);
  pid_ = ::fork();
  if (pid_ != 0) return;
  ::prctl(PR_SET_PDEATHSIG, SIGKILL);
  ::execl(program.c_str(), name_.c_str(), "1000", nullptr);
  ::_exit(127);
}
