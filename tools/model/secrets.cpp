// Secrets come from a file, the standard input or a prompt.
#include "model/secrets.h"

#include <fcntl.h>
#include <poll.h>
#include <termios.h>

#include <cstring>

#include "base/failure.h"
#include "base/require.h"
#include "base/signals.h"
#include "common/descriptor.h"
#include "model/security.h"

namespace {

constexpr std::size_t kLongest = 4096;

Failure Unusable(const std::string& what) {
  return {Exit::kSecretRefused, what, "give the secret as one line"};
}

// Waits for input. False when the program was stopped meanwhile, and has been continued.
bool WaitForInput(int fd, const Signals& signals) {
  pollfd waited[] = {{fd, POLLIN, 0}, {signals.fd(), POLLIN, 0}};
  while (::poll(waited, std::size(waited), -1) < 0 && errno == EINTR) continue;
  const int signal = signals.Next();
  if (signal != 0 && signal != SIGCONT) throw Interrupted{};
  return signal == 0;
}

std::string ReadAll(int fd, const std::string& from) {
  const Signals signals;
  std::string text;
  char bytes[1024];
  while (true) {
    WaitForInput(fd, signals);
    const ssize_t size = ::read(fd, bytes, sizeof bytes);
    if (size < 0 && errno == EINTR) continue;
    if (size < 0) throw Failure(Exit::kFailed, from + " cannot be read: " + std::strerror(errno), "check the file");
    if (size == 0) return text;
    text.append(bytes, static_cast<std::size_t>(size));
    if (text.size() > kLongest) throw Unusable(from + " holds more than a secret");
  }
}

std::string Checked(std::string text, const std::string& from) {
  if (text.ends_with('\n')) text.pop_back();
  if (text.ends_with('\r')) text.pop_back();
  if (text.find_first_of(std::string_view("\n\r\0", 3)) != text.npos) throw Unusable(from + " holds several lines");
  return text;
}

std::string ReadFile(const std::string& path) {
  const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) throw Failure(Exit::kFailed, path + " cannot be read: " + std::strerror(errno), "check the file");
  return Checked(ReadAll(file.get(), path), path);
}

// Keeps the terminal from showing what is typed, from Begin() until this holder ends.
class Silence {
 public:
  explicit Silence(int terminal) : terminal_(terminal), before_() {
    Require(::tcgetattr(terminal_, &before_), "tcgetattr");
  }
  Silence(const Silence&) = delete;
  Silence& operator=(const Silence&) = delete;
  ~Silence() {
    // A program in the background no longer owns the terminal; changing it would stop the program.
    if (::tcgetpgrp(terminal_) == ::getpgrp()) ::tcsetattr(terminal_, TCSAFLUSH, &before_);
  }

  void Begin() const {
    termios silent = before_;
    silent.c_lflag &= ~static_cast<tcflag_t>(ECHO);
    Require(::tcsetattr(terminal_, TCSAFLUSH, &silent), "tcsetattr");
  }

 private:
  int terminal_;
  termios before_;
};

void Say(int terminal, std::string_view text) {
  Require(static_cast<int>(::write(terminal, text.data(), text.size())), "the terminal");
}

std::string ReadLine(int terminal) {
  char line[kLongest];
  const int size = Require(static_cast<int>(::read(terminal, line, sizeof line)), "the terminal");
  return {line, static_cast<std::size_t>(size)};
}

std::string Prompt(int terminal, const std::string& prompt, bool isSecret) {
  const Signals signals({SIGCONT});
  const Silence silence(terminal);
  // When the program is stopped, the shell makes the terminal show again what is typed, so each round begins anew.
  do {
    if (isSecret) silence.Begin();
    Say(terminal, prompt + ": ");
  } while (!WaitForInput(terminal, signals));
  std::string line = ReadLine(terminal);
  if (isSecret) Say(terminal, "\n");
  return Checked(std::move(line), "what was typed");
}

std::optional<std::string> AskOnTerminal(const std::string& prompt, bool isSecret) {
  const Descriptor terminal(::open("/dev/tty", O_RDWR | O_CLOEXEC));
  if (!terminal.valid()) return std::nullopt;
  return Prompt(terminal.get(), prompt, isSecret);
}

}  // namespace

std::optional<std::string> ReadSecret(const SecretSource& source, const std::string& prompt) {
  if (!source.file.empty()) return ReadFile(source.file);
  // A standard input that is a terminal is not read: it would show the secret while it is typed. The prompt does not.
  if (source.standardInput && ::isatty(STDIN_FILENO) == 0)
    return Checked(ReadAll(STDIN_FILENO, "the standard input"), "the standard input");
  return AskOnTerminal(prompt, true);
}

std::string UserOf(const Program& program, const KnownNetwork& config, const std::string& given) {
  if (!NeedsUser(config.network.auth) || !given.empty()) return given;
  std::string user = AskOnTerminal("user of " + program.output.Name(config.network.szEssid), false).value_or("");
  if (user.empty()) throw Failure(Exit::kUsage, "this network asks who you are", "add --user NAME");
  return user;
}

void SetSecret(const Program& program, KnownNetwork& config, const SecretSource& source) {
  const std::string name = program.output.Name(config.network.szEssid);
  if (!NeedsSecret(config.network.auth)) {
    if (source.isGiven()) throw TakesNoSecret(name);
    return;
  }
  const auto secret = ReadSecret(source, "secret of " + name);
  if (!secret) {
    throw Failure(Exit::kUsage, name + " needs a secret, and there is no terminal to ask on",
                  "give it with --key-file or --key-stdin");
  }
  RequireSecretFor(config.network.auth, *secret);
  SetText(config.szKey, *secret, "the secret");
}

Failure TakesNoSecret(const std::string& name) {
  return Wrong(name + " is open and takes no secret", "give none");
}
