// Words of commands: whatever a value holds, a real shell hands a program exactly its bytes, as a word by itself and
// between double quotes; a value that is longer than any command makes a word that is, too.
//
// Runs: 30000
// Covers: lib/obsolete/shell_words.cpp
#include "lib/obsolete/shell_words.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdlib>

#include "tests/fuzz/support.h"

namespace {

constexpr std::size_t kLongestCommand = 1024;

// A shell that reads commands from a pipe, one after the other. It is nobody's, starts no process and writes no file,
// so that a value which is taken for a command does no harm.
class Shell {
 public:
  Shell() {
    int commands[2];
    int answers[2];
    if (::pipe2(commands, O_CLOEXEC) < 0 || ::pipe2(answers, O_CLOEXEC) < 0) std::abort();
    const pid_t pid = ::fork();
    if (pid == 0) Become(commands[0], answers[1]);
    ::close(commands[0]);
    ::close(answers[1]);
    commands_ = commands[1];
    answers_ = answers[0];
    std::signal(SIGPIPE, SIG_IGN);
  }

  // What the shell answers to a command: all up to the third NUL, or what there is when no more comes.
  std::string Answer(const std::string& command) const {
    if (::write(commands_, command.data(), command.size()) != static_cast<ssize_t>(command.size())) return "no shell";
    std::string answer;
    while (std::count(answer.begin(), answer.end(), '\0') < 3) {
      constexpr int kPatience = 20000;
      char bytes[8192];
      pollfd waited{answers_, POLLIN, 0};
      const ssize_t got = ::poll(&waited, 1, kPatience) > 0 ? ::read(answers_, bytes, sizeof bytes) : 0;
      if (got <= 0) return answer + "...";
      answer.append(bytes, static_cast<std::size_t>(got));
    }
    return answer;
  }

 private:
  [[noreturn]] static void Become(int commands, int answers) {
    constexpr uid_t kNobody = 65534;
    constexpr rlimit kNone = {0, 0};
    ::dup2(commands, STDIN_FILENO);
    ::dup2(answers, STDOUT_FILENO);
    ::dup2(answers, STDERR_FILENO);
    if (::setresuid(kNobody, kNobody, kNobody) < 0 && errno != EINVAL) std::abort();  // where there are no other users
    ::setrlimit(RLIMIT_NPROC, &kNone);
    ::setrlimit(RLIMIT_FSIZE, &kNone);
    ::execl("/bin/sh", "sh", nullptr);
    std::abort();
  }

  int commands_;
  int answers_;
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const Shell shell;
  const std::string value = Fields(data, size).Text();
  const ShellWord word(value);
  const ShellQuoted quoted(value);
  if (value.size() >= kLongestCommand) {
    Require(std::string_view(word.c_str()).size() >= kLongestCommand, "a long value makes a long word", {value});
    Require(std::string_view(quoted.c_str()).size() >= kLongestCommand, "a long value makes a long word", {value});
    return 0;
  }
  const std::string command = std::string("printf '%s\\0' ") + word.c_str() + " \"" + quoted.c_str() + "\" end\n";
  const std::string answer = shell.Answer(command);
  Require(answer == value + '\0' + value + '\0' + "end" + '\0', "the shell hands on exactly the bytes",
          {value, command, answer});
  return 0;
}
