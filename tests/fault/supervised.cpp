// An operation in a child process whose system calls this process watches.
//
// The child has the kernel ask this process about each of its calls (seccomp user notification), which works the same
// way on every architecture. Only its calls to Mark() and what it reports afterwards go through unasked.
#include "tests/fault/supervised.h"

#include <fcntl.h>
#include <linux/filter.h>
#include <linux/seccomp.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <sys/uio.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>

#include "platform.h"
#include "tests/platform/system_log.h"

namespace {

// No operation makes this call; the child does to say that the operation begins and that it has ended.
constexpr int kMark = SYS_getppid;

const SystemCall kNames[] = {
#ifdef SYS_open
    {SYS_open, "open"},
#endif
#ifdef SYS_access
    {SYS_access, "access"},
#endif
#ifdef SYS_readlink
    {SYS_readlink, "readlink"},
#endif
#ifdef SYS_unlink
    {SYS_unlink, "unlink"},
#endif
#ifdef SYS_rename
    {SYS_rename, "rename"},
#endif
#ifdef SYS_stat
    {SYS_stat, "stat"},
#endif
#ifdef SYS_fstat
    {SYS_fstat, "stat"},
#endif
#ifdef SYS_newfstatat
    {SYS_newfstatat, "stat"},
#endif
#ifdef SYS_fstatat64
    {SYS_fstatat64, "stat"},
#endif
#ifdef SYS_renameat
    {SYS_renameat, "rename"},
#endif
#ifdef SYS_fchown32
    {SYS_fchown32, "fchown"},
#endif
    {SYS_statx, "stat"},        {SYS_openat, "open"},      {SYS_faccessat, "access"}, {SYS_readlinkat, "readlink"},
    {SYS_unlinkat, "unlink"},   {SYS_renameat2, "rename"}, {SYS_read, "read"},        {SYS_write, "write"},
    {SYS_fsync, "fsync"},       {SYS_close, "close"},      {SYS_flock, "flock"},      {SYS_fchmod, "fchmod"},
    {SYS_fchown, "fchown"},
};

// Null for a call that no operation on files makes: for memory, the time and the like.
const SystemCall* CallOf(int number) {
  const SystemCall* call = std::ranges::find(kNames, number, &SystemCall::number);
  return call != std::end(kNames) ? call : nullptr;
}

// Those by which processes come into being.
constexpr int kForks[] = {
#ifdef SYS_fork
    SYS_fork,
#endif
#ifdef SYS_vfork
    SYS_vfork,
#endif
    SYS_clone,
    SYS_clone3,
};

constexpr int kSleeps[] = {
    SYS_clock_nanosleep,
#ifdef SYS_clock_nanosleep_time64
    SYS_clock_nanosleep_time64,
#endif
};

// Those of an allocator, which calls the kernel whenever it happens to need memory.
constexpr int kMemory[] = {
#ifdef SYS_mmap
    SYS_mmap,
#endif
#ifdef SYS_mmap2
    SYS_mmap2,
#endif
    SYS_brk,   SYS_madvise, SYS_mprotect, SYS_mremap, SYS_munmap,
};

bool IsAmong(const auto& numbers, int number) {
  return std::ranges::find(numbers, number) != std::end(numbers);
}

void Require(bool done, const char* szWhat) {
  if (done) return;
  std::perror(szWhat);
  std::abort();
}

void WriteAll(int fd, const void* data, size_t size) {
  Require(::write(fd, data, size) == static_cast<ssize_t>(size), "write to the supervisor");
}

// Has the kernel ask about every call, except those that end the process and writes to `report`. Gives the descriptor
// that it asks through.
int HaveCallsAsked(int report) {
  sock_filter filter[] = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_exit_group, 3, 0),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_write, 0, 3),
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, args[0])),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, static_cast<__u32>(report), 0, 1),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_USER_NOTIF),
  };
  const sock_fprog program = {std::size(filter), filter};
  Require(::prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0, "no new privileges");
  const long asked = ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, SECCOMP_FILTER_FLAG_NEW_LISTENER, &program);
  Require(asked >= 0, "have system calls asked about");
  return static_cast<int>(asked);
}

[[noreturn]] void BeChild(int report, const std::function<int()>& operation) {
  PLIBCErrSet(ERR_NONE);
  TakeLog();
  const int asked = HaveCallsAsked(report);
  WriteAll(report, &asked, sizeof asked);
  ::syscall(kMark);
  const int result = operation();
  ::syscall(kMark);

  const int numbers[] = {result, PLIBCErrGet()};
  WriteAll(report, numbers, sizeof numbers);
  for (const LogLine& line : TakeLog()) {
    const std::string text = line.unit + ":" + std::to_string(line.line) + " " + line.text + "\n";
    WriteAll(report, text.data(), text.size());
  }
  ::_exit(EXIT_SUCCESS);
}

class Supervisor {
 public:
  Supervisor(pid_t child, int report, const Plan& plan) : child_(child), report_(report), plan_(plan) {
    int there = -1;
    Require(::read(report_, &there, sizeof there) == sizeof there, "read where the child is asked");
    const int process = static_cast<int>(::syscall(SYS_pidfd_open, child_, 0));
    asked_ = static_cast<int>(::syscall(SYS_pidfd_getfd, process, there, 0));
    Require(asked_ >= 0, "get what the child is asked through");
    ::close(process);
  }
  ~Supervisor() { ::close(asked_); }

  Outcome Supervise() {
    while (NextCall()) Answer();
    int state = 0;
    Require(::waitpid(child_, &state, 0) == child_, "wait for the child");
    outcome_.killed = WIFSIGNALED(state);
    if (!outcome_.killed) ReadReport();
    return std::move(outcome_);
  }

 private:
  // Waits for the child's next call; false when it has ended.
  bool NextCall() {
    pollfd ready = {asked_, POLLIN, 0};
    while (::poll(&ready, 1, -1) < 0) Require(errno == EINTR, "wait for a system call");
    if ((ready.revents & POLLIN) == 0) return false;
    call_ = {};
    // ENOENT: the child was killed in between.
    if (::ioctl(asked_, SECCOMP_IOCTL_NOTIF_RECV, &call_) == 0) return true;
    Require(errno == ENOENT, "receive a system call");
    return NextCall();
  }

  // Only the calls of the operation itself count, but for the processes that those which it started start.
  void Answer() {
    const int number = call_.data.nr;
    const bool own = call_.pid == static_cast<__u32>(child_);
    if (own && number == kMark) return PassMark();
    if (!inOperation_) return LetThrough();
    if (IsAmong(kForks, number)) ++outcome_.cost.processes;
    if (!own) return LetThrough();
    if (!IsAmong(kMemory, number)) ++outcome_.cost.calls;
    if (plan_.withoutSleeps && IsAmong(kSleeps, number)) return SkipSleep();

    const SystemCall* call = CallOf(number);
    if (call == nullptr) return LetThrough();
    if (IsPlanned(*call)) {
      outcome_.reached = true;
      outcome_.call = *call;
      return Interfere();
    }
    if (!outcome_.reached) outcome_.before.push_back(*call);
    LetThrough();
  }

  // The time that is asked for begins with its seconds.
  void SkipSleep() {
    long seconds = 0;
    const iovec here = {&seconds, sizeof seconds};
    const iovec there = {reinterpret_cast<void*>(static_cast<uintptr_t>(call_.data.args[2])), sizeof seconds};
    Require(::process_vm_readv(child_, &here, 1, &there, 1, 0) == sizeof seconds, "read how long it sleeps");
    outcome_.cost.secondsSlept += seconds;
    Reply(0, 0, 0);
  }

  bool IsPlanned(const SystemCall& call) {
    const bool counts = plan_.name.empty() || plan_.name == call.name;
    return counts && ++calls_ == plan_.call;
  }

  // The operation begins, or has ended.
  void PassMark() {
    inOperation_ = !inOperation_;
    if (inOperation_) {
      descriptorsBefore_ = CountDescriptors();
    } else {
      outcome_.descriptorsLeft = CountDescriptors() - descriptorsBefore_;
    }
    CountBytes(inOperation_ ? -1 : 1);
    LetThrough();
  }

  // What the child has read and written so far, in its main thread.
  void CountBytes(int sign) {
    const std::string pid = std::to_string(child_);
    std::ifstream counters("/proc/" + pid + "/task/" + pid + "/io");
    std::string name;
    int64_t bytes[2] = {};
    for (int64_t& count : bytes) counters >> name >> count;
    Require(counters.good(), "count bytes");
    outcome_.cost.bytesRead += sign * bytes[0];
    outcome_.cost.bytesWritten += sign * bytes[1];
  }

  void Interfere() {
    const bool writes = outcome_.call.name == "write";
    switch (plan_.interference) {
      case Interference::kNone:
        return LetThrough();
      case Interference::kTearWrite:
        if (writes) (void)WriteHalf();
        [[fallthrough]];
      case Interference::kKill:
        Require(::kill(child_, SIGKILL) == 0, "kill the child");
        return;
      case Interference::kFail:
        return Reply(0, -plan_.error, 0);
      case Interference::kShorten:
        return writes ? Reply(WriteHalf(), 0, 0) : LetThrough();
      case Interference::kMeanwhile:
        plan_.meanwhile();
        return LetThrough();
    }
  }

  // Does half of the child's write in its place.
  ssize_t WriteHalf() const {
    std::string half(static_cast<size_t>(call_.data.args[2] + 1) / 2, '\0');
    const iovec here = {half.data(), half.size()};
    const iovec there = {reinterpret_cast<void*>(static_cast<uintptr_t>(call_.data.args[1])), half.size()};
    Require(::process_vm_readv(child_, &here, 1, &there, 1, 0) == static_cast<ssize_t>(half.size()),
            "read what it writes");
    const int process = static_cast<int>(::syscall(SYS_pidfd_open, child_, 0));
    const int file = static_cast<int>(::syscall(SYS_pidfd_getfd, process, static_cast<int>(call_.data.args[0]), 0));
    Require(::write(file, half.data(), half.size()) == static_cast<ssize_t>(half.size()), "write a half");
    ::close(file);
    ::close(process);
    return static_cast<ssize_t>(half.size());
  }

  void LetThrough() { Reply(0, 0, SECCOMP_USER_NOTIF_FLAG_CONTINUE); }

  void Reply(long long value, int error, __u32 flags) {
    seccomp_notif_resp reply = {call_.id, value, error, flags};
    Require(::ioctl(asked_, SECCOMP_IOCTL_NOTIF_SEND, &reply) == 0 || errno == ENOENT, "answer a system call");
  }

  int CountDescriptors() const {
    const std::filesystem::directory_iterator all("/proc/" + std::to_string(child_) + "/fd");
    return static_cast<int>(std::distance(begin(all), end(all)));
  }

  void ReadReport() {
    int numbers[2] = {};
    Require(::read(report_, numbers, sizeof numbers) == sizeof numbers, "read the child's result");
    outcome_.result = numbers[0];
    outcome_.code = numbers[1];
    std::string line;
    for (char c; ::read(report_, &c, 1) == 1;) {
      if (c != '\n') {
        line += c;
      } else {
        outcome_.reports.push_back(std::exchange(line, {}));
      }
    }
  }

  pid_t child_;
  int report_;
  Plan plan_;
  int asked_ = -1;
  seccomp_notif call_ = {};
  bool inOperation_ = false;
  int calls_ = 0;
  int descriptorsBefore_ = 0;
  Outcome outcome_;
};

}  // namespace

Outcome RunSupervised(const Plan& plan, const std::function<int()>& operation) {
  int report[2];
  Require(::pipe2(report, O_CLOEXEC) == 0, "pipe");
  const pid_t child = ::fork();
  Require(child >= 0, "fork");
  if (child == 0) BeChild(report[1], operation);
  ::close(report[1]);
  Outcome outcome = Supervisor(child, report[0], plan).Supervise();
  ::close(report[0]);
  return outcome;
}
