// An operation in a child process whose system calls this process watches.
//
// The child has the kernel ask this process about each of its calls (seccomp user notification), which works the same
// way on every architecture. Only its calls to Mark() and what it reports afterwards go through unasked.
#include "tests/fault/supervised.h"

#include <dlfcn.h>
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
#include <bit>
#include <cerrno>
#include <climits>
#include <csignal>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <set>
#include <utility>

#include "platform.h"
#include "tests/platform/system_log.h"

namespace {

// No operation makes this call; the child does to say that the operation begins and that it has ended.
constexpr int kMark = SYS_getppid;

void Require(bool done, const char* szWhat) {
  if (done) return;
  std::perror(szWhat);
  std::abort();
}

std::set<pid_t> ChildrenOfThis() {
  const std::string pid = std::to_string(::getpid());
  std::ifstream file("/proc/" + pid + "/task/" + pid + "/children");
  return {std::istream_iterator<pid_t>(file), std::istream_iterator<pid_t>()};
}

void WriteAll(int fd, const void* data, size_t size) {
  Require(::write(fd, data, size) == static_cast<ssize_t>(size), "write to the supervisor");
}

// Where this process's libraries lie, and hardly ever those of a program that it becomes: the upper half of their
// addresses. A program that has the same half is asked about throughout, which takes longer, and is otherwise the same;
// on a machine of 32 bits, and where addresses are hardly random, that is every one.
uint32_t UpperHalfOfLibraries() {
  const auto address = reinterpret_cast<uintptr_t>(::dlsym(RTLD_NEXT, "syscall"));
  return static_cast<uint32_t>(static_cast<uint64_t>(address) >> 32);
}

// Has the kernel ask about every call of this process, except those that end it and writes to `report`; of the programs
// that it starts, about those with which they begin and end, since to ask about all of theirs takes long. Gives the
// descriptor that it asks through.
int HaveCallsAsked(int report) {
  constexpr size_t kUpperHalf = std::endian::native == std::endian::little ? 4 : 0;
  sock_filter filter[] = {
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, instruction_pointer) + kUpperHalf),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, UpperHalfOfLibraries(), 4, 0),
      // A program's.
      BPF_STMT(BPF_LD | BPF_W | BPF_ABS, offsetof(seccomp_data, nr)),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_execve, 8, 0),
      BPF_JUMP(BPF_JMP | BPF_JEQ | BPF_K, SYS_exit_group, 7, 0),
      BPF_STMT(BPF_RET | BPF_K, SECCOMP_RET_ALLOW),
      // This process's.
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
  // A signal does not have a call asked about twice. Kernels before 5.19 know no such flag.
  constexpr unsigned long kUninterrupted = 1UL << 5;
  constexpr unsigned long kFlags = SECCOMP_FILTER_FLAG_NEW_LISTENER;
  long asked = ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, kFlags | kUninterrupted, &program);
  if (asked < 0) asked = ::syscall(SYS_seccomp, SECCOMP_SET_MODE_FILTER, kFlags, &program);
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
    before_ = ChildrenOfThis();
    process_ = static_cast<int>(::syscall(SYS_pidfd_open, child_, 0));
    asked_ = static_cast<int>(::syscall(SYS_pidfd_getfd, process_, there, 0));
    Require(asked_ >= 0, "get what the child is asked through");
  }
  Supervisor(const Supervisor&) = delete;
  Supervisor& operator=(const Supervisor&) = delete;
  ~Supervisor() {
    ::close(asked_);
    ::close(process_);
  }

  Outcome Supervise() {
    while (NextCall()) Answer();
    outcome_.cost.processes = static_cast<int>(others_.size());
    if (!outcome_.killed) ReadReport();
    for (const pid_t other : others_) EndOther(other);
    return std::move(outcome_);
  }

 private:
  static constexpr int kPatienceBehind = 5000;  // milliseconds for what the child has led to, when it has ended
  static constexpr int kLook = 10;

  // Waits for the next call of the child or of those that it has led to; false when there will be none.
  bool NextCall() {
    while (true) {
      pollfd ready[] = {{asked_, POLLIN, 0}, {ended_ ? -1 : process_, POLLIN, 0}};
      const int count = ::poll(ready, std::size(ready), ended_ ? kLook : plan_.patience);
      Require(count >= 0 || errno == EINTR, "wait for a system call");
      if (count < 0) continue;
      const bool asks = (ready[0].revents & POLLIN) != 0;
      if (asks && Receive()) return true;
      if (asks) continue;
      if (ready[1].revents != 0) NoteEnd();
      if (count == 0 && !ended_) EndHungChild();
      if (ended_ && (ready[0].revents != 0 || (patience_ -= kLook) < 0 || !IsAnyOtherThere())) return false;
    }
  }

  bool Receive() {
    call_ = {};
    if (::ioctl(asked_, SECCOMP_IOCTL_NOTIF_RECV, &call_) == 0) return true;
    Require(errno == ENOENT, "receive a system call");  // who made it was killed in between
    return false;
  }

  void NoteEnd() {
    int state = 0;
    Require(::waitpid(child_, &state, 0) == child_, "wait for the child");
    outcome_.killed = WIFSIGNALED(state);
    ended_ = true;
  }

  void EndHungChild() {
    outcome_.hung = true;
    patience_ = 0;
    Require(::kill(child_, SIGKILL) == 0, "kill the child");
  }

  // What the child has led to is this process's by now, also what has not made a call yet.
  bool IsAnyOtherThere() {
    for (const pid_t other : ChildrenOfThis()) {
      if (!before_.contains(other)) others_.insert(other);
    }
    return std::ranges::any_of(others_, [](pid_t other) { return ::waitpid(other, nullptr, WNOHANG) == 0; });
  }

  // A process asks about no more calls a moment before its end.
  void EndOther(pid_t other) {
    const int most = outcome_.hung ? 1 : kPatienceBehind / kLook;
    for (int looks = 0; looks < most; ++looks) {
      if (::waitpid(other, nullptr, WNOHANG) != 0) return;
      ::poll(nullptr, 0, looks == 0 ? 1 : kLook);
    }
    ++outcome_.processesLeft;
    ::kill(other, SIGKILL);
    ::waitpid(other, nullptr, 0);
  }

  // 0 when there is no such process.
  static pid_t ParentOf(pid_t pid) {
    std::ifstream file("/proc/" + std::to_string(pid) + "/stat");
    std::string text((std::istreambuf_iterator<char>(file)), {});
    const size_t name = text.rfind(") ");
    return name != std::string::npos ? static_cast<pid_t>(std::atoi(text.c_str() + name + 4)) : 0;
  }

  // Only the calls of the operation itself count, but for the processes that those which it started start.
  void Answer() {
    const int number = call_.data.nr;
    const bool own = call_.pid == static_cast<__u32>(child_);
    if (own && number == kMark) return PassMark();
    if (!own) others_.insert(static_cast<pid_t>(call_.pid));
    if (!inOperation_) return LetThrough();
    if (!own || IsAllocators(number)) return LetThrough();
    ++outcome_.cost.calls;
    if (plan_.withoutSleeps && IsSleep(number)) return SkipSleep();
    if (plan_.all) return AnswerCounted(CallByObject());
    if (const SystemCall* call = CallOnFiles(number); call != nullptr) return AnswerCounted(*call);
    LetThrough();
  }

  // A call on a pipe or a socket cannot fail as one on a file can.
  SystemCall CallByObject() const {
    SystemCall call = AnyCall(call_.data.nr);
    constexpr int kOnDescriptors[] = {
        SYS_read,       SYS_write, SYS_close,
#ifdef SYS_fstat
        SYS_fstat,
#endif
#ifdef SYS_newfstatat
        SYS_newfstatat,
#endif
    };
    if (std::ranges::find(kOnDescriptors, call.number) == std::end(kOnDescriptors)) return call;
    const std::string object = OpenObject();
    if (object.starts_with("pipe:") || object.starts_with("socket:")) call.name += " of a stream";
    return call;
  }

  // What the descriptor that is the call's first argument leads to.
  std::string OpenObject() const {
    char szObject[PATH_MAX] = {};
    const std::string link =
        "/proc/" + std::to_string(child_) + "/fd/" + std::to_string(static_cast<int>(call_.data.args[0]));
    (void)::readlink(link.c_str(), szObject, sizeof szObject - 1);
    return szObject;
  }

  // The path of what the call is about. A path may lie at the end of what can be read.
  std::string PathOfCall() const {
    const int argument = PathArgumentOf(call_.data.nr);
    if (argument < 0) return OpenObject();
    const auto address = static_cast<uintptr_t>(call_.data.args[argument]);
    char szPath[PATH_MAX] = {};
    constexpr size_t kPart = 256;
    for (size_t at = 0; at + kPart < sizeof szPath && ::strnlen(szPath, at) == at; at += kPart) {
      const iovec here = {szPath + at, kPart};
      const iovec there = {reinterpret_cast<void*>(address + at), kPart};
      if (::process_vm_readv(child_, &here, 1, &there, 1, 0) <= 0) break;
    }
    return *szPath != '\0' ? szPath : OpenObject();
  }

  void AnswerCounted(const SystemCall& call) {
    if (plan_.interference == Interference::kWatch) plan_.meanwhile();
    if (IsPlanned(call)) {
      outcome_.reached = true;
      outcome_.call = call;
      return Interfere();
    }
    if (outcome_.reached && plan_.onwards && CanGive(call, plan_.error)) return Fail();
    if (!outcome_.reached) outcome_.before.push_back(call);
    LetThrough();
  }

  static bool CanGive(const SystemCall& call, int error) { return std::ranges::count(ErrorsOf(call.name), error) > 0; }

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
    return counts && ++calls_ == plan_.call && (plan_.expected.empty() || plan_.expected == call.name);
  }

  // The operation begins, or has ended.
  void PassMark() {
    inOperation_ = !inOperation_;
    if (inOperation_) {
      descriptorsBefore_ = CountDescriptors();
    } else {
      outcome_.descriptorsLeft = CountDescriptors() - descriptorsBefore_;
      outcome_.childrenLeft =
          static_cast<int>(std::ranges::count_if(others_, [&](pid_t other) { return ParentOf(other) == child_; }));
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
    const bool writes = outcome_.call.number == SYS_write;
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
        return Fail();
      case Interference::kShorten:
        if (outcome_.call.number == SYS_read) return ReadHalf();
        return writes ? Reply(WriteHalf(), 0, 0) : LetThrough();
      case Interference::kMeanwhile:
        plan_.meanwhile();
        return LetThrough();
      case Interference::kWatch:
        return LetThrough();
    }
  }

  void Fail() {
    outcome_.failed.push_back({CallByObject().name, PathOfCall()});
    if (call_.data.nr == SYS_close) Close();
    Reply(0, -plan_.error, 0);
  }

  // A close that fails has closed the descriptor all the same. Here it leads nowhere from then on.
  void Close() {
    const int nowhere = ::open("/dev/null", O_RDWR | O_CLOEXEC);
    seccomp_notif_addfd put = {};
    put.id = call_.id;
    put.flags = SECCOMP_ADDFD_FLAG_SETFD;
    put.srcfd = static_cast<__u32>(nowhere);
    put.newfd = static_cast<__u32>(call_.data.args[0]);
    put.newfd_flags = O_CLOEXEC;
    Require(::ioctl(asked_, SECCOMP_IOCTL_NOTIF_ADDFD, &put) >= 0, "close a descriptor");
    ::close(nowhere);
    ++outcome_.closesFailed;
  }

  // The child's descriptor of the call, in this process.
  int FileOfCall() const {
    const int file = static_cast<int>(::syscall(SYS_pidfd_getfd, process_, static_cast<int>(call_.data.args[0]), 0));
    Require(file >= 0, "get a descriptor of the child's");
    return file;
  }

  // Does half of the child's read in its place. Where nothing can be read yet, it is let through.
  void ReadHalf() {
    const int file = FileOfCall();
    int left = 0;
    const bool known = ::ioctl(file, FIONREAD, &left) == 0 && left > 1;
    std::string half(std::min<size_t>(known ? static_cast<size_t>(left) : 0, call_.data.args[2]) / 2, '\0');
    const ssize_t size = half.empty() ? 0 : ::read(file, half.data(), half.size());
    ::close(file);
    if (size <= 0) return LetThrough();
    const iovec here = {half.data(), static_cast<size_t>(size)};
    const iovec there = {reinterpret_cast<void*>(static_cast<uintptr_t>(call_.data.args[1])),
                         static_cast<size_t>(size)};
    Require(::process_vm_writev(child_, &here, 1, &there, 1, 0) == size, "give what was read");
    Reply(size, 0, 0);
  }

  // Does half of the child's write in its place.
  ssize_t WriteHalf() const {
    std::string half(static_cast<size_t>(call_.data.args[2] + 1) / 2, '\0');
    const iovec here = {half.data(), half.size()};
    const iovec there = {reinterpret_cast<void*>(static_cast<uintptr_t>(call_.data.args[1])), half.size()};
    Require(::process_vm_readv(child_, &here, 1, &there, 1, 0) == static_cast<ssize_t>(half.size()),
            "read what it writes");
    const int file = FileOfCall();
    Require(::write(file, half.data(), half.size()) == static_cast<ssize_t>(half.size()), "write a half");
    ::close(file);
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
  int process_ = -1;
  int asked_ = -1;
  seccomp_notif call_ = {};
  bool inOperation_ = false;
  bool ended_ = false;
  int patience_ = kPatienceBehind;
  std::set<pid_t> before_;  // this process's children, the one that is watched among them
  std::set<pid_t> others_;
  int calls_ = 0;
  int descriptorsBefore_ = 0;
  Outcome outcome_;
};

}  // namespace

Outcome RunSupervised(const Plan& plan, const std::function<int()>& operation) {
  Require(::prctl(PR_SET_CHILD_SUBREAPER, 1, 0, 0, 0) == 0, "take over what the child leaves");
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
