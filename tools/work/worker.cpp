// Calls of the library that may take long, in a process of their own.
#include "work/worker.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <unistd.h>

#include <chrono>
#include <exception>
#include <fstream>
#include <optional>

#include "base/failure.h"
#include "base/require.h"
#include "base/signals.h"
#include "base/text.h"
#include "common/descriptor.h"
#include "show/progress.h"
#include "work/frames.h"
#include "work/library_log.h"
#include "work/process_tree.h"

namespace {

constexpr std::chrono::milliseconds kTick{100};

struct Pipe {
  Pipe() {
    int ends[2];
    Require(::pipe2(ends, O_CLOEXEC), "pipe");
    reader = Descriptor(ends[0]);
    writer = Descriptor(ends[1]);
  }

  Descriptor reader;
  Descriptor writer;
};

// A file in memory for what commands print on their standard error output, so that writing neither blocks nor fails.
// Daemons may keep the descriptor; the file is sealed when this holder ends, so that they cannot fill memory.
class Errors {
 public:
  Errors() : fd_(Require(::memfd_create("errors", MFD_CLOEXEC | MFD_ALLOW_SEALING), "memfd_create")) {}
  Errors(const Errors&) = delete;
  Errors& operator=(const Errors&) = delete;
  ~Errors() { ::fcntl(fd_.get(), F_ADD_SEALS, F_SEAL_GROW); }

  int fd() const { return fd_.get(); }

  // Opens the file anew, since the offset of this descriptor is the writers'.
  void Show() const {
    std::ifstream text("/proc/self/fd/" + std::to_string(fd_.get()));
    for (std::string line; std::getline(text, line);) Remark(Harmless(line, false));
  }

 private:
  Descriptor fd_;
};

// Sets the standard descriptors, which commands inherit.
void Redirect(int errors) {
  const int nowhere = Require(::open("/dev/null", O_RDWR | O_CLOEXEC), "/dev/null");
  Require(::dup2(nowhere, STDIN_FILENO), "dup2");
  Require(::dup2(nowhere, STDOUT_FILENO), "dup2");
  Require(::dup2(errors, STDERR_FILENO), "dup2");
}

bool Exists(const char* szPath) {
  return szPath != nullptr && ::access(szPath, F_OK) == 0;
}

// Runs a call. One that has given no result when its Worker ends is ended and undone.
class Worker {
 public:
  Worker(const Task& task, const std::function<std::string()>& call)
      : task_(task),
        hadMarker_(Exists(task.szMarker)),
        progress_(task.errors, task.doing),
        processes_([&] { Work(call); }) {
    pipe_.writer.Close();
  }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

  ~Worker() {
    progress_.Clear();
    if (processes_.End()) TakeBack();
    if (task_.verbose) errors_.Show();
  }

  std::string Result() {
    end_ = processes_.Watch();
    while (Wait()) {
      Take();
      if (!result_ && task_.isPointless()) throw Pointless{};
    }
    Take();
    if (task_.listener != nullptr) task_.listener->Receive();
    if (!result_) {
      throw Failure(Exit::kFailed, "the library broke off", "run the command again with -v to see how far it came");
    }
    processes_.Release();
    return *result_;
  }

 private:
  // The child's part.
  [[noreturn]] void Work(const std::function<std::string()>& call) {
    pipe_.reader.Close();  // so that writing fails when the program is gone
    const int out = pipe_.writer.get();
    try {
      Redirect(errors_.fd());
      Signals::RestoreMask();
      library_log::SendTo([out](std::string_view line) { SendFrame(out, Frame::Kind::kLine, line); });
      SendFrame(out, Frame::Kind::kResult, call());
    } catch (const std::exception& failure) {
      SendFrame(out, Frame::Kind::kLine, failure.what());
      ::_exit(EXIT_FAILURE);
    }
    ::_exit(EXIT_SUCCESS);
  }

  // False when the child has ended and everything that it sent has been read. The end of the pipe would not do: a
  // daemon that the child has started may hold it open.
  bool Wait() {
    pollfd waited[] = {
        {pipe_.reader.get(), POLLIN, 0}, {signals_.fd(), POLLIN, 0}, {end_.get(), POLLIN, 0}, {-1, POLLIN, 0}};
    const auto& [frames, signals, end, events] = waited;
    std::chrono::milliseconds patience = kTick;
    if (task_.listener != nullptr) {
      task_.listener->Tick();
      waited[3].fd = task_.listener->fd();
      patience = std::min(patience, task_.listener->interval());
    }
    const int ready = ::poll(waited, std::size(waited), static_cast<int>(patience.count()));
    processes_.Reap();
    progress_.Update();
    if (ready <= 0) return true;
    if (signals.revents != 0 && signals_.HasCome()) throw Interrupted{};
    if (events.revents != 0) task_.listener->Receive();
    if (frames.revents == 0) return end.revents == 0;
    return frames_.Read(pipe_.reader.get()) || end.revents == 0;
  }

  void Take() {
    while (const auto frame = frames_.Next()) {
      if (frame->kind == Frame::Kind::kResult) {
        result_ = frame->bytes;
        continue;
      }
      progress_.Clear();
      library_log::Keep(frame->bytes);
    }
  }

  void TakeBack() const {
    if (!hadMarker_ && Exists(task_.szMarker)) ::unlink(task_.szMarker);
    Undo(task_);
    while (signals_.HasCome()) continue;  // an interruption of this one interrupts nothing that follows
  }

  const Task& task_;
  bool hadMarker_;
  Signals signals_;
  Progress progress_;
  Errors errors_;
  Pipe pipe_;
  ProcessTree processes_;  // behind all that its child uses
  Descriptor end_;         // readable when the child has ended
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
