// The system log as a test sees it: syslog() reports to this program instead of to the machine.
#ifndef MERO_TESTS_PLATFORM_SYSTEM_LOG_H
#define MERO_TESTS_PLATFORM_SYSTEM_LOG_H

#include <gmock/gmock.h>
#include <syslog.h>

#include <ostream>
#include <string>
#include <vector>

// One report, "unit:line text". The unit is empty when it was not made in that form.
struct LogLine {
  int priority;
  std::string unit;
  int line;
  std::string text;

  friend std::ostream& operator<<(std::ostream& to, const LogLine& logged) {
    return to << logged.unit << ':' << logged.line << ' ' << logged.text;
  }
};

// What was reported since the last call, oldest first.
std::vector<LogLine> TakeLog();

// An error report with this text, whichever unit and line it comes from.
MATCHER_P(Says, text, "says \"" + std::string(text) + "\"") {
  return arg.priority == LOG_ERR && !arg.unit.empty() && arg.line > 0 && arg.text == text;
}

// An error report of this unit and line, with this text.
MATCHER_P3(SaysAt, unit, line, text, std::string(unit) + ":" + std::to_string(line) + " " + text) {
  return arg.priority == LOG_ERR && arg.unit == unit && arg.line == line && arg.text == text;
}

#endif  // MERO_TESTS_PLATFORM_SYSTEM_LOG_H
