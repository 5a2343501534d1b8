// Running programs without a shell.
#include "platform/base/program.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "common/umask.h"
#include "platform/base/directory.h"
#include "platform/base/number.h"

extern char** environ;

// In glibc since 2.34.
#ifdef __GLIBC_PREREQ
#if __GLIBC_PREREQ(2, 34)
#define MERO_CLOSES_FROM
#endif
#endif

namespace {

class Attributes {
 public:
  Attributes() : error_(::posix_spawnattr_init(&attributes_)) {}
  Attributes(const Attributes&) = delete;
  Attributes& operator=(const Attributes&) = delete;
  ~Attributes() { ::posix_spawnattr_destroy(&attributes_); }

  // The program starts as if nobody had touched signals, whatever this process does with them.
  int ResetSignals() {
    sigset_t none;
    sigset_t all;
    ::sigemptyset(&none);
    ::sigfillset(&all);
    if (error_ == 0) error_ = ::posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    if (error_ == 0) error_ = ::posix_spawnattr_setsigmask(&attributes_, &none);
    if (error_ == 0) error_ = ::posix_spawnattr_setsigdefault(&attributes_, &all);
    return error_;
  }

  const posix_spawnattr_t* get() const { return &attributes_; }

 private:
  posix_spawnattr_t attributes_;
  int error_;
};

class FileActions {
 public:
  FileActions() : error_(::posix_spawn_file_actions_init(&actions_)) {}
  FileActions(const FileActions&) = delete;
  FileActions& operator=(const FileActions&) = delete;
  ~FileActions() { ::posix_spawn_file_actions_destroy(&actions_); }

  int Set(Standard standard) {
    for (const int fd : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
      if (error_ != 0 || standard == Standard::kInherited) break;
      error_ = ::posix_spawn_file_actions_addopen(&actions_, fd, "/dev/null", O_RDWR, 0);
    }
    CloseOthers();
    return error_;
  }

  const posix_spawn_file_actions_t* get() const { return &actions_; }

 private:
  // What is open here is not for the program: a lock, a socket or a marker that it held might be held for ever.
#ifdef MERO_CLOSES_FROM
  void CloseOthers() {
    if (error_ == 0) error_ = ::posix_spawn_file_actions_addclosefrom_np(&actions_, STDERR_FILENO + 1);
  }
#else  // what another thread opens meanwhile is passed on, unless it is closed at exec
  void CloseOthers() {
    const Directory open(::opendir("/proc/self/fd"));
    if (error_ == 0 && !open) error_ = errno;
    while (const dirent* entry = open && error_ == 0 ? ::readdir(open.get()) : nullptr) {
      std::string_view name(entry->d_name);
      if (const int fd = TakeNumber(name).value_or(0); fd > STDERR_FILENO) {
        error_ = ::posix_spawn_file_actions_addclose(&actions_, fd);
      }
    }
  }
#endif

  posix_spawn_file_actions_t actions_;
  int error_;
};

Result<pid_t> Spawn(const char* const* argv, Standard standard) {
  Attributes attributes;
  if (const int error = attributes.ResetSignals(); error != 0) return Status::Failed(error);
  FileActions actions;
  if (const int error = actions.Set(standard); error != 0) return Status::Failed(error);
  const Umask umask(kOrdinaryUmask);
  pid_t pid = -1;
  const int error =
      ::posix_spawn(&pid, argv[0], actions.get(), attributes.get(), const_cast<char* const*>(argv), environ);
  if (error != 0) return Status::Failed(error);
  return pid;
}

}  // namespace

Result<int> RunProgram(const char* const* argv, Standard standard) {
  Result<pid_t> pid = Spawn(argv, standard);
  if (!pid.ok()) return pid.status();
  int state = 0;
  while (::waitpid(*pid, &state, 0) < 0) {
    if (errno != EINTR) return Status::Failed(errno);
  }
  if (!WIFEXITED(state)) return Status::Failed(EINTR);
  return WEXITSTATUS(state);
}
