// The program under test, run in a process of its own.
#include "running.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <sstream>
#include <utility>

#include "app/run.h"

namespace {

int Memory(const std::string& text = "") {
  const int fd = ::memfd_create("stream", MFD_CLOEXEC);
  if (fd < 0 || ::write(fd, text.data(), text.size()) < 0) std::abort();
  ::lseek(fd, 0, SEEK_SET);
  return fd;
}

// The offset is the writer's too, and stays where it is.
std::string TextSoFar(int fd) {
  struct stat status {};
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

void Enter(const Surroundings& surroundings) {
  for (const char* szName : {"NO_COLOR", "LC_CTYPE", "LANG"}) ::unsetenv(szName);
  ::setenv("LC_ALL", "C.UTF-8", 1);
  ::setenv("TERM", "xterm", 1);
  for (const auto& [name, value] : surroundings.environment) ::setenv(name.c_str(), value.c_str(), 1);
  surroundings.before();
}

[[noreturn]] void RunHere(const std::vector<std::string>& arguments, const Surroundings& surroundings) {
  Enter(surroundings);
  std::vector<const char*> argv{"merowireless"};
  for (const std::string& argument : arguments) argv.push_back(argument.c_str());
  const int status = RunProgram(static_cast<int>(argv.size()), argv.data());
  std::fflush(nullptr);
  ::_exit(status);
}

[[noreturn]] void RunCommandHere(const std::vector<std::string>& command, const Surroundings& surroundings) {
  Enter(surroundings);
  std::vector<char*> argv;
  for (const std::string& word : command) argv.push_back(const_cast<char*>(word.c_str()));
  argv.push_back(nullptr);
  ::execvp(argv[0], argv.data());
  std::fprintf(stderr, "cannot run %s: %s\n", argv[0], std::strerror(errno));
  ::_exit(127);
}

pid_t Start(const std::vector<std::string>& arguments, const Surroundings& surroundings, int out, int err) {
  const int in = Memory(surroundings.input);
  const pid_t pid = ::fork();
  if (pid == 0) {
    ::setsid();  // without a terminal
    ::dup2(in, STDIN_FILENO);
    ::dup2(out, STDOUT_FILENO);
    ::dup2(err, STDERR_FILENO);
    RunHere(arguments, surroundings);
  }
  ::close(in);
  return pid;
}

int StatusOf(pid_t pid) {
  int status = 0;
  ::waitpid(pid, &status, 0);
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

// What the child shows on a terminal of so many columns, until it ends.
Ran OnTerminal(const std::function<void()>& child, unsigned short columns, const Typing& typing) {
  winsize size{.ws_row = 24, .ws_col = columns, .ws_xpixel = 0, .ws_ypixel = 0};
  int terminal = -1;
  const pid_t pid = ::forkpty(&terminal, nullptr, nullptr, &size);
  if (pid == 0) child();

  Ran ran;
  bool typed = typing.prompt.empty();
  char bytes[4096];
  for (ssize_t got; (got = ::read(terminal, bytes, sizeof bytes)) > 0;) {  // fails when the other side is closed
    ran.out.append(bytes, static_cast<std::size_t>(got));
    if (typed || ran.out.find(typing.prompt) == ran.out.npos) continue;
    typed = ::write(terminal, typing.text.data(), typing.text.size()) > 0;
  }
  ::close(terminal);
  ran.status = StatusOf(pid);
  return ran;
}

}  // namespace

Ran Tool(const std::vector<std::string>& arguments, const Surroundings& surroundings) {
  const int out = Memory();
  const int err = Memory();
  const int status = StatusOf(Start(arguments, surroundings, out, err));
  return {status, TextOf(out), TextOf(err)};
}

Ran ToolOnTerminal(const std::vector<std::string>& arguments, unsigned short columns, const Surroundings& surroundings,
                   const Typing& typing) {
  return OnTerminal([&] { RunHere(arguments, surroundings); }, columns, typing);
}

Ran CommandOnTerminal(const std::vector<std::string>& command, const Surroundings& surroundings, const Typing& typing) {
  return OnTerminal([&] { RunCommandHere(command, surroundings); }, 80, typing);
}

std::vector<std::string> CommandsOf(std::vector<std::string> command) {
  command.emplace_back("--help");
  std::istringstream help(Tool(command).out);
  std::vector<std::string> commands;
  bool listed = false;
  for (std::string line; std::getline(help, line);) {
    if (listed && line.starts_with("  ")) commands.push_back(line.substr(2, line.find(' ', 2) - 2));
    listed = listed || line == "Subcommands:";
  }
  return commands;
}

StartedTool::StartedTool(const std::vector<std::string>& arguments, const Surroundings& surroundings)
    : out_(Memory()), err_(Memory()) {
  pid_ = Start(arguments, surroundings, out_, err_);
}

StartedTool::~StartedTool() {
  if (pid_ < 0) return;
  ::kill(pid_, SIGKILL);
  Wait();
}

std::string StartedTool::OutputSoFar() const {
  return TextSoFar(out_);
}

Ran StartedTool::Wait() {
  const int status = StatusOf(pid_);
  pid_ = -1;
  return {status, TextOf(out_), TextOf(err_)};
}

Lifeline::Lifeline() {
  if (::pipe2(ends_, O_CLOEXEC) < 0) std::abort();
}

Lifeline::~Lifeline() {
  for (int end : ends_) ::close(end);
}

bool Lifeline::IsFree() {
  ::close(std::exchange(ends_[1], -1));
  pollfd held{ends_[0], POLLIN, 0};
  return ::poll(&held, 1, 0) > 0;
}

bool Soon(const std::function<bool()>& happens) {
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (!happens()) {
    if (std::chrono::steady_clock::now() > end) return false;
    ::poll(nullptr, 0, 5);
  }
  return true;
}

std::string ReadText(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), {}};
}

void WriteText(const std::string& path, const std::string& text) {
  std::ofstream(path, std::ios::binary) << text;
}
