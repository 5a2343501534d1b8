// Commands for the shell.
#include "shell_words.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>

#include "common/text.h"
#include "common/umask.h"

namespace {

bool IsOrdinary(char c) {
  constexpr std::string_view kMarks = "_.:/@%+=,-";
  return (c >= '0' && c <= '9') || (ToLower(c) >= 'a' && ToLower(c) <= 'z') || kMarks.find(c) != std::string_view::npos;
}

}  // namespace

ShellWord::ShellWord(std::string_view value) {
  constexpr std::string_view kQuoteInside = "'\\''";  // closes the quotes, adds an escaped quote, and opens them again
  char* to = szWord_;
  const auto put = [&](std::string_view text) { to = std::copy(text.begin(), text.end(), to); };

  value = Slice(value, 0, (sizeof szWord_ - 3) / kQuoteInside.size());
  const bool ordinary = !value.empty() && All(value, IsOrdinary);
  if (!ordinary) put("'");
  for (const char c : value) put(c == '\'' ? kQuoteInside : std::string_view(&c, 1));
  if (!ordinary) put("'");
  *to = '\0';
}

ShellQuoted::ShellQuoted(std::string_view value) {
  constexpr std::string_view kSpecial = "\"\\$`";
  char* to = szText_;
  for (const char c : Slice(value, 0, (sizeof szText_ - 1) / 2)) {
    if (kSpecial.find(c) != std::string_view::npos) *to++ = '\\';
    *to++ = c;
  }
  *to = '\0';
}

// Where no shell can be started, glibc's system() gives what a shell would that ends with 127, and sets errno; a signal
// during the wait sets it, too.
int RunShell(const char* szCommand) {
  constexpr int kNoShell = 127 << 8;
  const Umask umask(kOrdinaryUmask);
  errno = 0;
  const int status = std::system(szCommand);
  return status == kNoShell && errno != 0 && errno != EINTR ? -1 : status;
}

FILE* OpenShell(const char* szCommand) {
  const Umask umask(kOrdinaryUmask);
  FILE* pfOutput = ::popen(szCommand, "r");
  // A stream in memory has no descriptor.
  if (pfOutput != nullptr && ::fileno(pfOutput) >= 0) (void)::fcntl(::fileno(pfOutput), F_SETFD, FD_CLOEXEC);
  return pfOutput;
}

int RefuseShell() {
  errno = E2BIG;
  return -1;
}
