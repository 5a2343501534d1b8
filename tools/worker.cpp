// Calls of the library that may take long, in a process of their own.
#include "worker.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/wait.h>

#include <chrono>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <fstream>
#include <optional>
#include <utility>
#include <vector>

#include "failure.h"
#include "library_log.h"
#include "progress.h"
#include "signals.h"

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

// Commands inherit the worker's standard descriptors. Daemons may keep them, so nothing here can run full or break.
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

// Readable when the child has ended.
Descriptor ProcessOf(pid_t pid) {
  return Descriptor(Require(static_cast<int>(::syscall(SYS_pidfd_open, pid, 0)), "pidfd_open"));
}

// Waits until a child has ended, for so long at most.
bool EndsWithin(pid_t pid, milliseconds time) {
  const Descriptor process = ProcessOf(pid);
  pollfd ended{process.get(), POLLIN, 0};
  if (::poll(&ended, 1, static_cast<int>(time.count())) == 0) return false;
  return ::waitpid(pid, nullptr, 0) == pid;
}

// Daemons that the worker started are this process's children by now.
std::vector<pid_t> Orphans() {
  std::ifstream children("/proc/thread-self/children");
  std::vector<pid_t> pids;
  for (pid_t pid = 0; children >> pid;) pids.push_back(pid);
  return pids;
}

void End(pid_t pid, pid_t target) {
  ::kill(target, SIGTERM);
  if (EndsWithin(pid, kGrace)) return;
  ::kill(target, SIGKILL);
  ::waitpid(pid, nullptr, 0);
}

void EndEverything(pid_t worker) {
  End(worker, -worker);
  ::kill(-worker, SIGKILL);  // what is left of its group had its time
  // One that ends may leave children of its own.
  for (std::vector<pid_t> orphans = Orphans(); !orphans.empty(); orphans = Orphans()) {
    for (pid_t pid : orphans) End(pid, pid);
  }
}

void ShowErrors(int errors) {
  char bytes[4096];
  Require(static_cast<int>(::lseek(errors, 0, SEEK_SET)), "lseek");
  for (ssize_t size; (size = ::read(errors, bytes, sizeof bytes)) > 0;) {
    std::fwrite(bytes, 1, static_cast<std::size_t>(size), stderr);
  }
}

bool Exists(const char* szPath) {
  return szPath != nullptr && ::access(szPath, F_OK) == 0;
}

// ---- Both together ----

class Worker {
 public:
  Worker(const Task& task, const std::function<std::string()>& call)
      : task_(task), hadMarker_(Exists(task.szMarker)), progress_(task.errors, task.doing) {
    errors_ = Descriptor(Require(::memfd_create("errors", MFD_CLOEXEC), "memfd_create"));
    int ends[2];
    Require(::pipe2(ends, O_CLOEXEC), "pipe");
    results_ = Descriptor(ends[0]);
    Descriptor writer(ends[1]);

    std::fflush(nullptr);
    Require(::prctl(PR_SET_CHILD_SUBREAPER, 1), "prctl");
    pid_ = Require(::fork(), "fork");
    if (pid_ == 0) Work(writer.get(), errors_.get(), signals_, call);
    process_ = ProcessOf(pid_);
    ::setpgid(pid_, pid_);  // here too: whoever is first, the group exists before it is ended
  }

  std::string Result() {
    while (Wait()) Take();
    Take();
    ::waitpid(pid_, nullptr, 0);  // at once: it has ended
    if (task_.listener != nullptr) task_.listener->Receive();
    progress_.Clear();
    if (task_.verbose) ShowErrors(errors_.get());
    if (result_) return *result_;
    throw Failure(Exit::kFailed, "the library broke off", "run the command again with -v to see how far it came");
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
    progress_.Update();
    if (ready <= 0) return true;
    if (signals.revents != 0 && signals_.HasCome()) Interrupt();
    if (events.revents != 0) task_.listener->Receive();
    if (results.revents == 0) return process.revents == 0;
    return frames_.Read(results_.get()) || process.revents == 0;
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

  [[noreturn]] void Interrupt() {
    EndEverything(pid_);
    if (!hadMarker_ && Exists(task_.szMarker)) ::unlink(task_.szMarker);
    task_.undo();
    throw Interrupted{};
  }

  const Task& task_;
  bool hadMarker_;
  Signals signals_;
  Progress progress_;
  Descriptor results_;
  Descriptor errors_;
  pid_t pid_ = -1;
  Descriptor process_;
  Frames frames_;
  std::optional<std::string> result_;
};

}  // namespace

std::string RunBytes(const Task& task, const std::function<std::string()>& call) {
  return Worker(task, call).Result();
}
