// What the terminal behind a descriptor can show.
#include "base/terminal.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <string_view>

#include "base/text.h"

namespace {

std::string_view Environment(const char* szName) {
  const char* szValue = std::getenv(szName);
  return szValue != nullptr ? szValue : "";
}

std::size_t WidthOf(int fd, bool isTerminal) {
  constexpr std::size_t kCustomary = 80;
  const auto wanted = ParseNumber(Environment("COLUMNS"));
  if (wanted && *wanted > 0) return static_cast<std::size_t>(*wanted);
  if (!isTerminal) return 0;
  winsize size{};
  return ::ioctl(fd, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : kCustomary;
}

}  // namespace

Terminal TerminalOf(int fd) {
  const bool isTerminal = ::isatty(fd) == 1;
  const bool obeys = isTerminal && Environment("TERM") != "dumb";
  return {
      .isTerminal = isTerminal,
      .obeys = obeys,
      .colour = obeys && Environment("NO_COLOR").empty(),
      .utf8 = std::string_view(::nl_langinfo(CODESET)) == "UTF-8",
      .width = WidthOf(fd, isTerminal),
  };
}

void Remark(const std::string& line) {
  const Terminal errors = TerminalOf(STDERR_FILENO);
  const std::string lines = Wrapped(line, errors.width, kSentenceIndent, errors.utf8);
  const auto before = std::signal(SIGPIPE, SIG_IGN);
  std::fprintf(stderr, "%s\n", lines.c_str());
  std::signal(SIGPIPE, before);
}
