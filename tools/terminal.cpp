// What stands behind a descriptor that people may be looking at.
#include "terminal.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cstdlib>
#include <string_view>

namespace {

std::string_view Environment(const char* szName) {
  const char* szValue = std::getenv(szName);
  return szValue != nullptr ? szValue : "";
}

std::size_t WidthOf(int fd) {
  constexpr std::size_t kCustomary = 80;
  winsize size{};
  return ::ioctl(fd, TIOCGWINSZ, &size) == 0 && size.ws_col > 0 ? size.ws_col : kCustomary;
}

}  // namespace

Terminal TerminalOf(int fd) {
  const bool isTerminal = ::isatty(fd) == 1;
  return {
      .isTerminal = isTerminal,
      .colour = isTerminal && Environment("NO_COLOR").empty() && Environment("TERM") != "dumb",
      .utf8 = std::string_view(::nl_langinfo(CODESET)) == "UTF-8",
      .width = isTerminal ? WidthOf(fd) : 0,
  };
}
