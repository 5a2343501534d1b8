// Processes held by descriptors, which cannot become other processes'. Not every libc has functions for it, and glibc
// does not declare its own as C for C++.
#ifndef MERO_COMMON_PIDFD_H
#define MERO_COMMON_PIDFD_H

#include <sys/syscall.h>
#include <sys/types.h>
#include <unistd.h>

// A descriptor, closed at exec, that becomes readable when the process ends; -1 and errno.
inline int PidfdOpen(pid_t pid) {
  return static_cast<int>(::syscall(SYS_pidfd_open, pid, 0));
}

// 0; -1 and errno.
inline int PidfdSendSignal(int process, int signal) {
  return static_cast<int>(::syscall(SYS_pidfd_send_signal, process, signal, nullptr, 0));
}

#endif  // MERO_COMMON_PIDFD_H
