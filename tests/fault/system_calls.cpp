// System calls: what they are called, the errors that they can give, and what they are about.
#include "tests/fault/system_calls.h"

#include <sys/syscall.h>

#include <algorithm>
#include <cerrno>
#include <iterator>
#include <map>

namespace {

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

// Those that have nothing to do with the content of files.
const SystemCall kOtherNames[] = {
#ifdef SYS_pipe
    {SYS_pipe, "pipe"},
#endif
#ifdef SYS_fork
    {SYS_fork, "clone"},
#endif
#ifdef SYS_vfork
    {SYS_vfork, "clone"},
#endif
#ifdef SYS_mkdir
    {SYS_mkdir, "mkdir"},
#endif
#ifdef SYS_poll
    {SYS_poll, "poll"},
#endif
#ifdef SYS_waitpid
    {SYS_waitpid, "wait"},
#endif
#ifdef SYS_send
    {SYS_send, "send"},
#endif
#ifdef SYS_recv
    {SYS_recv, "recv"},
#endif
#ifdef SYS_dup2
    {SYS_dup2, "dup"},
#endif
    {SYS_pipe2, "pipe"},
    {SYS_clone, "clone"},
    {SYS_clone3, "clone"},
    {SYS_wait4, "wait"},
    {SYS_mkdirat, "mkdir"},
    {SYS_getdents64, "getdents"},
    {SYS_socket, "socket"},
    {SYS_ioctl, "ioctl"},
    {SYS_sendto, "send"},
    {SYS_recvfrom, "recv"},
    {SYS_ppoll, "poll"},
    {SYS_getrandom, "getrandom"},
    {SYS_kill, "kill"},
    {SYS_pidfd_open, "pidfd_open"},
    {SYS_pidfd_send_signal, "pidfd_send_signal"},
    {SYS_lseek, "lseek"},
    {SYS_fcntl, "fcntl"},
    {SYS_umask, "umask"},
    {SYS_dup3, "dup"},
    {SYS_prlimit64, "prlimit"},
    {SYS_rt_sigaction, "sigaction"},
    {SYS_rt_sigprocmask, "sigprocmask"},
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

// The calls that take a path, and the argument that it is. All others take a descriptor, as their first argument.
constexpr struct {
  int number;
  int argument;
} kPathArguments[] = {
#ifdef SYS_open
    {SYS_open, 0},
#endif
#ifdef SYS_access
    {SYS_access, 0},
#endif
#ifdef SYS_readlink
    {SYS_readlink, 0},
#endif
#ifdef SYS_unlink
    {SYS_unlink, 0},
#endif
#ifdef SYS_rename
    {SYS_rename, 0},
#endif
#ifdef SYS_stat
    {SYS_stat, 0},
#endif
#ifdef SYS_mkdir
    {SYS_mkdir, 0},
#endif
#ifdef SYS_newfstatat
    {SYS_newfstatat, 1},
#endif
#ifdef SYS_fstatat64
    {SYS_fstatat64, 1},
#endif
#ifdef SYS_renameat
    {SYS_renameat, 1},
#endif
    {SYS_openat, 1},     {SYS_faccessat, 1}, {SYS_readlinkat, 1}, {SYS_unlinkat, 1},
    {SYS_renameat2, 1},  {SYS_mkdirat, 1},   {SYS_statx, 1},
};

bool IsAmong(const auto& numbers, int number) {
  return std::ranges::find(numbers, number) != std::end(numbers);
}

}  // namespace

const SystemCall* CallOnFiles(int number) {
  const SystemCall* call = std::ranges::find(kNames, number, &SystemCall::number);
  return call != std::end(kNames) ? call : nullptr;
}

SystemCall AnyCall(int number) {
  if (const SystemCall* call = CallOnFiles(number); call != nullptr) return *call;
  const SystemCall* call = std::ranges::find(kOtherNames, number, &SystemCall::number);
  return call != std::end(kOtherNames) ? *call : SystemCall{number, "call " + std::to_string(number)};
}

bool IsSleep(int number) {
  return IsAmong(kSleeps, number);
}

bool IsAllocators(int number) {
  return IsAmong(kMemory, number);
}

int PathArgumentOf(int number) {
  for (const auto& [known, argument] : kPathArguments) {
    if (known == number) return argument;
  }
  return -1;
}

const std::vector<int>& ErrorsOf(const std::string& name) {
  static const std::map<std::string, std::vector<int>> all = {
      {"open", {ENOSPC, EIO, EACCES, EROFS, EMFILE, EINTR, ENOMEM}},
      {"access", {EIO, EACCES, ENOMEM}},
      {"readlink", {EIO, EACCES, ENOMEM}},
      {"stat", {EIO, EACCES, ENOMEM}},
      {"unlink", {EIO, EACCES, EROFS, ENOMEM}},
      {"rename", {ENOSPC, EIO, EACCES, EROFS, ENOMEM}},
      {"read", {EIO, EINTR, ENOMEM}},
      {"write", {ENOSPC, EIO, EINTR}},
      {"fsync", {ENOSPC, EIO, EROFS}},
      {"close", {ENOSPC, EIO, EINTR}},
      {"read of a stream", {EINTR}},
      {"flock", {EINTR, ENOMEM}},
      {"fchmod", {EIO, EACCES, EROFS}},
      {"fchown", {EIO, EACCES, EROFS}},
      {"mkdir", {ENOSPC, EACCES, EROFS, ENOMEM}},
      {"getdents", {EIO, ENOMEM}},
      {"socket", {EACCES, EMFILE, ENOMEM}},
      {"ioctl", {EIO, EACCES, EINTR, ENOMEM}},
      {"send", {EACCES, EINTR, ENOMEM}},
      {"recv", {EINTR, ENOMEM}},
      {"pipe", {EMFILE, ENOMEM}},
      {"clone", {EAGAIN, ENOMEM}},
      {"wait", {EINTR}},
      {"poll", {EINTR, ENOMEM}},
      {"getrandom", {EINTR}},
      {"kill", {EACCES}},
      {"pidfd_open", {EMFILE, ENOMEM}},
      {"pidfd_send_signal", {EACCES}},
  };
  static const std::vector<int> none;
  const auto errors = all.find(name);
  return errors != all.end() ? errors->second : none;
}
