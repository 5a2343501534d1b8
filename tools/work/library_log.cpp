// The lines that the library reports.
#include "work/library_log.h"

#include <syslog.h>
#include <unistd.h>

#include <cstdarg>
#include <cstdio>

#include "base/terminal.h"
#include "base/text.h"

namespace library_log {
namespace {

constexpr std::size_t kMost = 1000;

std::deque<std::string> g_lines;
std::function<void(std::string_view)> g_take;
bool g_shown = false;

void Report(int priority, const char* szFormat, va_list values) {
  char szLine[1024];
  va_list again;
  va_copy(again, values);
  // NOLINTNEXTLINE(clang-analyzer-valist.Uninitialized): both callers have started it
  std::vsnprintf(szLine, sizeof szLine, szFormat, values);  // first: %m is the errno of this moment
  ::vsyslog(priority, szFormat, again);
  va_end(again);
  g_take ? g_take(szLine) : Keep(szLine);
}

}  // namespace

const std::deque<std::string>& Lines() {
  return g_lines;
}

void Keep(std::string_view line) {
  if (g_lines.size() == kMost) g_lines.pop_front();
  g_lines.emplace_back(line);
  if (g_shown) Remark("library: " + Harmless(line, false));
}

void ShowLines() {
  g_shown = true;
}

void SendTo(std::function<void(std::string_view)> take) {
  g_take = std::move(take);
}

}  // namespace library_log

// The dynamic linker finds these before libc's.
extern "C" void syslog(int priority, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  library_log::Report(priority, szFormat, values);
  va_end(values);
}

// A library that is built with _FORTIFY_SOURCE calls this instead of syslog().
// NOLINTNEXTLINE(bugprone-reserved-identifier)
extern "C" void __syslog_chk(int priority, int, const char* szFormat, ...) {
  va_list values;
  va_start(values, szFormat);
  library_log::Report(priority, szFormat, values);
  va_end(values);
}
