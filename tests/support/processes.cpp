// Processes of a test.
#include "tests/support/processes.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>

namespace {

int Memory(const std::string& text = "") {
  const int fd = ::memfd_create("stream", MFD_CLOEXEC);
  if (fd < 0 || ::write(fd, text.data(), text.size()) < 0) std::abort();
  ::lseek(fd, 0, SEEK_SET);
  return fd;
}

// The offset is the writer's too, and stays where it is.
std::string TextSoFar(int fd) {
  struct stat status{};
  if (::fstat(fd, &status) < 0) std::abort();
  std::string text(static_cast<std::size_t>(status.st_size), '\0');
  if (::pread(fd, text.data(), text.size(), 0) < 0) std::abort();
  return text;
}

std::string TextOf(int fd) {
  std::string text = TextSoFar(fd);
  ::close(fd);
  return text;
}

}  // namespace

int StatusOf(pid_t pid) {
  int state = 0;
  if (::waitpid(pid, &state, 0) != pid) return -1;
  return WIFEXITED(state) ? WEXITSTATUS(state) : -1;
}

int RunInChild(const std::function<int()>& act) {
  const pid_t pid = ::fork();
  if (pid == 0) ::_exit(act());
  return StatusOf(pid);
}

StartedChild::StartedChild(const std::function<int()>& act, const std::string& input) : out_(Memory()), err_(Memory()) {
  const int in = Memory(input);
  pid_ = ::fork();
  if (pid_ == 0) {
    ::setsid();
    ::dup2(in, STDIN_FILENO);
    ::dup2(out_, STDOUT_FILENO);
    ::dup2(err_, STDERR_FILENO);
    ::_exit(act());
  }
  ::close(in);
}

StartedChild::~StartedChild() {
  if (pid_ < 0) return;
  ::kill(pid_, SIGKILL);
  Wait();
}

std::string StartedChild::OutputSoFar() const {
  return TextSoFar(out_);
}

Ran StartedChild::Wait() {
  const int status = StatusOf(pid_);
  pid_ = -1;
  return {status, TextOf(out_), TextOf(err_)};
}

int Become(const std::vector<std::string>& command) {
  std::vector<char*> argv;
  for (const std::string& word : command) argv.push_back(const_cast<char*>(word.c_str()));
  argv.push_back(nullptr);
  ::execvp(argv[0], argv.data());
  std::fprintf(stderr, "cannot run %s: %s\n", argv[0], std::strerror(errno));
  return 127;
}

std::set<int> OpenDescriptors() {
  std::set<int> descriptors;
  for (const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) {
    descriptors.insert(std::stoi(entry.path().filename()));
  }
  std::erase_if(descriptors, [](int fd) { return ::fcntl(fd, F_GETFD) < 0; });  // that of the directory itself
  return descriptors;
}

bool Soon(const std::function<bool()>& happens, int seconds) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(seconds);
  while (!happens()) {
    if (std::chrono::steady_clock::now() > end) return false;
    ::poll(nullptr, 0, 5);
  }
  return true;
}
