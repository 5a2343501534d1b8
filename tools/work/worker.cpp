// Calls of the library that may take long, in a process of their own.
#include "work/worker.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>

extern "C" {
#include <sys/pidfd.h>  // says nothing of the language of its functions
}

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <fstream>
#include <optional>
#include <utility>
#include <vector>

#include "base/failure.h"
#include "base/signals.h"
#include "base/text.h"
#include "show/progress.h"
#include "work/library_log.h"

namespace {

using std::chrono::milliseconds;

constexpr milliseconds kTick{100};
constexpr milliseconds kGrace{2000};  // for a process to end by itself

// ---- What the worker sends: frames of a kind, a size and that many bytes ----

enum class Kind : char { kLine = 'L', kResult = 'R' };

struct Head {
  Kind kind;
  uint32_t size;
};

void WriteAll(int fd, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(fd, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) ::_exit(EXIT_FAILURE);  // nobody is left who wants to know
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
}

void SendFrame(int fd, Kind kind, std::string_view bytes) {
  const Head head{kind, static_cast<uint32_t>(bytes.size())};
  WriteAll(fd, {reinterpret_cast<const char*>(&head), sizeof head});
  WriteAll(fd, bytes);
}

class Frames {
 public:
  // Reads what there is; false at the end.
  bool Read(int fd) {
    char bytes[65536];
    const ssize_t size = ::read(fd, bytes, sizeof bytes);
    if (size < 0) return errno == EINTR || errno == EAGAIN;
    received_.append(bytes, static_cast<std::size_t>(size));
    return size > 0;
  }

  std::optional<std::pair<Kind, std::string>> Next() {
    Head head;
    if (received_.size() < sizeof head) return std::nullopt;
    std::memcpy(&head, received_.data(), sizeof head);
    if (received_.size() < sizeof head + head.size) return std::nullopt;
    std::pair<Kind, std::string> frame{head.kind, received_.substr(sizeof head, head.size)};
    received_.erase(0, sizeof head + head.size);
    return frame;
  }

 private:
  std::string received_;
};

// ---- The worker ----

// What the worker's commands print on their standard error output, in memory: whoever writes there neither waits nor
// breaks. Daemons may keep the descriptor, so it takes nothing more when this holder ends.
class Errors {
 public:
  Errors() : fd_(Require(::memfd_create("errors", MFD_CLOEXEC | MFD_ALLOW_SEALING), "memfd_create")) {}
  Errors(const Errors&) = delete;
  Errors& operator=(const Errors&) = delete;
  ~Errors() { ::fcntl(fd_.get(), F_ADD_SEALS, F_SEAL_GROW); }

  int fd() const { return fd_.get(); }

  // Leaves the offset alone, which is the writers'.
  void Show() const {
    std::ifstream text("/proc/self/fd/" + std::to_string(fd_.get()));
    for (std::string line; std::getline(text, line);) Remark(Harmless(line, false));
  }

 private:
  Descriptor fd_;
};

// Commands inherit the worker's standard descriptors.
void Redirect(int errors) {
  const int nowhere = Require(::open("/dev/null", O_RDWR | O_CLOEXEC), "/dev/null");
  Require(::dup2(nowhere, STDIN_FILENO), "dup2");
  Require(::dup2(nowhere, STDOUT_FILENO), "dup2");
  Require(::dup2(errors, STDERR_FILENO), "dup2");
}

[[noreturn]] void Work(int results, int errors, const Signals& signals, const std::function<std::string()>& call) {
  ::setpgid(0, 0);
  try {
    Redirect(errors);
    signals.RestoreMask();
    library_log::SendTo([results](std::string_view line) { SendFrame(results, Kind::kLine, line); });
    SendFrame(results, Kind::kResult, call());
  } catch (const std::exception& failure) {
    SendFrame(results, Kind::kLine, failure.what());
    ::_exit(EXIT_FAILURE);
  }
  ::_exit(EXIT_SUCCESS);
}

// ---- Its end ----

// Waits until a child has ended, for so long at most.
bool EndsWithin(pid_t pid, milliseconds time) {
  const Descriptor process(::pidfd_open(pid, 0));  // without one the time passes, and the child is taken to live
  pollfd ended{process.get(), POLLIN, 0};
  if (::poll(&ended, 1, static_cast<int>(time.count())) == 0) return false;
  return ::waitpid(pid, nullptr, 0) == pid;
}

using Pids = std::vector<pid_t>;

Pids Children() {
  std::ifstream children("/proc/thread-self/children");
  Pids pids;
  for (pid_t pid = 0; children >> pid;) pids.push_back(pid);
  return pids;
}

// Daemons that the worker started are this process's children by now, beside those that it had before.
Pids OrphansBeside(const Pids& others) {
  Pids pids = Children();
  std::erase_if(pids, [&](pid_t pid) { return std::ranges::find(others, pid) != others.end(); });
  return pids;
}

void End(pid_t pid, pid_t target) {
  ::kill(target, SIGTERM);
  if (EndsWithin(pid, kGrace)) return;
  ::kill(target, SIGKILL);
  ::waitpid(pid, nullptr, 0);
}

void EndEverything(pid_t worker, const Pids& others) {
  End(worker, -worker);
  ::kill(-worker, SIGKILL);  // what is left of its group had its time
  // One that ends may leave children of its own.
  for (Pids orphans = OrphansBeside(others); !orphans.empty(); orphans = OrphansBeside(others)) {
    for (pid_t pid : orphans) End(pid, pid);
  }
}

bool Exists(const char* szPath) {
  return szPath != nullptr && ::access(szPath, F_OK) == 0;
}

// ---- Both together ----

// A call that does not come to its end, for whatever reason, ends with its Worker, and is undone.
class Worker {
 public:
  Worker(const Task& task, const std::function<std::string()>& call)
      : task_(task), hadMarker_(Exists(task.szMarker)), others_(Children()), progress_(task.errors, task.doing) {
    int ends[2];
    Require(::pipe2(ends, O_CLOEXEC), "pipe");
    results_ = Descriptor(ends[0]);
    const Descriptor writer(ends[1]);

    std::fflush(nullptr);
    Require(::prctl(PR_SET_CHILD_SUBREAPER, 1), "prctl");
    // What fails from here on must do so in Result(): there is no destructor yet.
    pid_ = Require(::fork(), "fork");
    if (pid_ == 0) {
      results_.Close();  // writing is to fail when this process is gone
      Work(writer.get(), errors_.fd(), signals_, call);
    }
    ::setpgid(pid_, pid_);  // here too: whoever is first, the group exists before it is ended
  }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

  ~Worker() {
    progress_.Clear();
    if (pid_ > 0) EndIt();
    if (task_.verbose) errors_.Show();
  }

  std::string Result() {
    process_ = Descriptor(Require(::pidfd_open(pid_, 0), "pidfd_open"));
    while (Wait()) Take();
    Take();
    if (task_.listener != nullptr) task_.listener->Receive();
    if (!result_) {
      throw Failure(Exit::kFailed, "the library broke off", "run the command again with -v to see how far it came");
    }
    ::waitpid(std::exchange(pid_, -1), nullptr, 0);  // at once: it has ended
    return *result_;
  }

 private:
  // False when the worker has ended and everything that it said has been read. The end of what it says would not do:
  // a daemon that it has started may hold the pipe open.
  bool Wait() {
    pollfd waited[] = {
        {results_.get(), POLLIN, 0}, {signals_.fd(), POLLIN, 0}, {process_.get(), POLLIN, 0}, {-1, POLLIN, 0}};
    const auto& [results, signals, process, events] = waited;
    if (task_.listener != nullptr) {
      task_.listener->Tick();
      waited[3].fd = task_.listener->fd();
    }
    const int ready = ::poll(waited, std::size(waited), static_cast<int>(kTick.count()));
    Reap();
    progress_.Update();
    if (ready <= 0) return true;
    if (signals.revents != 0 && signals_.HasCome()) throw Interrupted{};
    if (events.revents != 0) task_.listener->Receive();
    if (results.revents == 0) return process.revents == 0;
    return frames_.Read(results_.get()) || process.revents == 0;
  }

  // Scripts that end a daemon wait until it is no process any more.
  void Reap() const {
    for (pid_t pid : OrphansBeside(others_)) {
      if (pid != pid_) ::waitpid(pid, nullptr, WNOHANG);
    }
  }

  void Take() {
    while (const auto frame = frames_.Next()) {
      if (frame->first == Kind::kResult) {
        result_ = frame->second;
        continue;
      }
      progress_.Clear();
      library_log::Keep(frame->second);
    }
  }

  void EndIt() const {
    EndEverything(pid_, others_);
    if (!hadMarker_ && Exists(task_.szMarker)) ::unlink(task_.szMarker);
    Undo(task_);
    while (signals_.HasCome()) continue;  // who interrupts this too interrupts none of what follows
  }

  const Task& task_;
  bool hadMarker_;
  Pids others_;
  Signals signals_;
  Progress progress_;
  Errors errors_;
  Descriptor results_;
  pid_t pid_ = -1;      // until it has ended
  Descriptor process_;  // readable when it has
  Frames frames_;
  std::optional<std::string> result_;
};

}  // namespace

void Undo(const Task& task) {
  try {
    task.undo();
  } catch (const std::exception& failure) {
    Remark(std::string("merowireless: ") + failure.what());
  } catch (const Interrupted&) {
    Remark("merowireless: interrupted again, and something may be left");
  }
}

std::string RunBytes(const Task& task, const std::function<std::string()>& call) {
  return Worker(task, call).Result();
}
