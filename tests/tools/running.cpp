// The program under test, run in a process of its own.
#include "running.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <sstream>
#include <utility>

#include "app/run.h"

namespace {

void Enter(const Surroundings& surroundings) {
  for (const char* szName : {"NO_COLOR", "COLUMNS", "LC_CTYPE", "LANG"}) ::unsetenv(szName);
  ::setenv("LC_ALL", "C.UTF-8", 1);
  ::setenv("TERM", "xterm", 1);
  for (const auto& [name, value] : surroundings.environment) ::setenv(name.c_str(), value.c_str(), 1);
  surroundings.before();
}

int RunHere(const std::vector<std::string>& arguments, const Surroundings& surroundings) {
  Enter(surroundings);
  std::vector<const char*> argv{"merowireless"};
  for (const std::string& argument : arguments) argv.push_back(argument.c_str());
  const int status = RunProgram(static_cast<int>(argv.size()), argv.data());
  std::fflush(nullptr);
  return status;
}

int RunCommandHere(const std::vector<std::string>& command, const Surroundings& surroundings) {
  Enter(surroundings);
  return Become(command);
}

// What the child shows on a terminal of so many columns, until it ends.
Ran OnTerminal(const std::function<int()>& child, unsigned short columns, const Typing& typing) {
  winsize size{.ws_row = 24, .ws_col = columns, .ws_xpixel = 0, .ws_ypixel = 0};
  int terminal = -1;
  const pid_t pid = ::forkpty(&terminal, nullptr, nullptr, &size);
  if (pid == 0) ::_exit(child());

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
  return StartedTool(arguments, surroundings).Wait();
}

Ran ToolOnTerminal(const std::vector<std::string>& arguments, unsigned short columns, const Surroundings& surroundings,
                   const Typing& typing) {
  return OnTerminal([&] { return RunHere(arguments, surroundings); }, columns, typing);
}

Ran CommandOnTerminal(const std::vector<std::string>& command, const Surroundings& surroundings, const Typing& typing) {
  return OnTerminal([&] { return RunCommandHere(command, surroundings); }, 80, typing);
}

std::vector<std::string> CommandsOf(std::vector<std::string> command) {
  command.emplace_back("--help");
  std::istringstream help(Tool(command).out);
  std::vector<std::string> commands;
  bool listed = false;
  for (std::string line; std::getline(help, line);) {
    if (listed && line.starts_with("  ")) commands.push_back(line.substr(2, line.find(' ', 2) - 2));
    listed = (listed && !line.empty()) || line == "Subcommands:";
  }
  return commands;
}

StartedTool::StartedTool(const std::vector<std::string>& arguments, const Surroundings& surroundings)
    : StartedChild([&] { return RunHere(arguments, surroundings); }, surroundings.input) {}

StartedDaemon::StartedDaemon(const std::string& program, const std::string& pidPath) {
  const std::string path = "/tmp/daemons/" + program;
  std::filesystem::create_directories("/tmp/daemons");
  std::filesystem::copy_file("/bin/sleep", path, std::filesystem::copy_options::skip_existing);
  pid_ = ::fork();
  if (pid_ == 0) ::_exit(Become({path, "60"}));
  EXPECT_TRUE(Soon([&] { return std::filesystem::read_symlink("/proc/" + std::to_string(pid_) + "/exe") == path; }));
  WriteText(pidPath, std::to_string(pid_) + "\n");
}

StartedDaemon::~StartedDaemon() {
  ::kill(pid_, SIGKILL);
  ::waitpid(pid_, nullptr, 0);
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
