// The system log as a test sees it.
#include "tests/platform/system_log.h"

#include <array>
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <string_view>

#include "common/text.h"

namespace {

// Fixed room: what is under test may have run out of memory.
struct Record {
  int priority;
  char szUnit[64];  // empty when the format does not begin with unit and line
  int line;
  char szText[1024];  // all of it
};
std::array<Record, 600> g_records;
size_t g_count = 0;

constexpr std::string_view kPrefix = "%s:%d ";

void TakeUnitAndLine(Record& record, const char* szFormat, va_list arguments) {
  if (!std::string_view(szFormat).starts_with(kPrefix)) return;
  CopyText(record.szUnit, va_arg(arguments, const char*));
  record.line = va_arg(arguments, int);
}

std::string WithoutPrefix(const Record& record) {
  const std::string text = record.szText;
  return record.szUnit[0] != '\0' ? text.substr(text.find(' ') + 1) : text;
}

}  // namespace

// In place of libc's. What does not fit the room is lost, which no test has reason to reach.
extern "C" void syslog(int priority, const char* szFormat, ...) {
  const int reason = errno;  // for %m
  if (g_count == g_records.size()) return;
  Record& record = g_records[g_count++];
  record = {};
  record.priority = priority;

  va_list arguments;
  va_start(arguments, szFormat);
  TakeUnitAndLine(record, szFormat, arguments);
  va_end(arguments);

  va_start(arguments, szFormat);
  errno = reason;
  std::vsnprintf(record.szText, sizeof record.szText, szFormat, arguments);
  va_end(arguments);
}

std::vector<LogLine> TakeLog() {
  std::vector<LogLine> lines;
  for (size_t i = 0; i < g_count; ++i) {
    const Record& record = g_records[i];
    lines.push_back({record.priority, record.szUnit, record.line, WithoutPrefix(record)});
  }
  g_count = 0;
  return lines;
}
