// A child process and all that it starts.
#include "work/process_tree.h"

#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <utility>

#include "base/require.h"
#include "common/pidfd.h"

namespace {

using std::chrono::milliseconds;

constexpr milliseconds kGrace{2000};  // for a process to end by itself

using Pids = std::vector<pid_t>;

Pids Children() {
  std::ifstream children("/proc/thread-self/children");
  Pids pids;
  for (pid_t pid = 0; children >> pid;) pids.push_back(pid);
  return pids;
}

// The child, and the daemons that it has started: their parent has ended, which makes them this process's children.
Pids ChildrenBeside(const Pids& others) {
  Pids pids = Children();
  std::erase_if(pids, [&](pid_t pid) { return std::ranges::find(others, pid) != others.end(); });
  return pids;
}

pid_t Start(const std::function<void()>& act) {
  std::fflush(nullptr);
  Require(::prctl(PR_SET_CHILD_SUBREAPER, 1), "prctl");
  const pid_t pid = Require(::fork(), "fork");
  ::setpgid(pid, pid);  // in both processes: whichever is first, the group exists before it is ended
  if (pid > 0) return pid;
  act();
  ::_exit(EXIT_FAILURE);
}

// Waits until a child has ended, for so long at most.
bool EndsWithin(pid_t pid, milliseconds time) {
  const Descriptor process(PidfdOpen(pid));  // without it, poll() just waits, and the child counts as alive
  pollfd ended{process.get(), POLLIN, 0};
  if (::poll(&ended, 1, static_cast<int>(time.count())) == 0) return false;
  return ::waitpid(pid, nullptr, 0) == pid;
}

// Ends a child by a signal to `target`, the child or its group.
void EndChild(pid_t pid, pid_t target) {
  ::kill(target, SIGTERM);
  if (EndsWithin(pid, kGrace)) return;
  ::kill(target, SIGKILL);
  ::waitpid(pid, nullptr, 0);
}

}  // namespace

ProcessTree::ProcessTree(const std::function<void()>& act) : others_(Children()), pid_(Start(act)) {}

bool ProcessTree::End() {
  if (pid_ < 0) return false;
  EndChild(pid_, -pid_);
  ::kill(-pid_, SIGKILL);  // the rest of its group has had its time
  // A daemon that ends may leave children of its own.
  for (Pids daemons = ChildrenBeside(others_); !daemons.empty(); daemons = ChildrenBeside(others_)) {
    for (const pid_t pid : daemons) EndChild(pid, pid);
  }
  pid_ = -1;
  return true;
}

Descriptor ProcessTree::Watch() const {
  return Descriptor(Require(PidfdOpen(pid_), "pidfd_open"));
}

void ProcessTree::Reap() const {
  for (const pid_t pid : ChildrenBeside(others_)) {
    if (pid != pid_) ::waitpid(pid, nullptr, WNOHANG);
  }
}

void ProcessTree::Release() {
  ::waitpid(std::exchange(pid_, -1), nullptr, 0);
}
