// The one way to the system log.
#ifndef MERO_COMMON_LOG_H
#define MERO_COMMON_LOG_H

#include <syslog.h>

#include <cstddef>

// The name of a source file without its ending: "wireless_conf_set" for "wireless_conf_set.cpp".
template <size_t kSize>
struct UnitName {
  char text[kSize] = {};

  template <size_t kFileSize>
  consteval UnitName(const char (&file)[kFileSize]) {
    for (size_t i = 0; i < kSize && file[i] != '.'; ++i) text[i] = file[i];
  }
};

template <size_t kFileSize>
UnitName(const char (&file)[kFileSize]) -> UnitName<kFileSize - (sizeof ".cpp" - 1)>;

// Takes no more room than the name does: unless an alignment is asked for, compilers choose a larger one for an array.
template <UnitName kUnit>
alignas(1) inline constexpr UnitName kUnitName = kUnit;

template <UnitName kUnit>
constexpr const char* TextOfUnit() {
  return kUnitName<kUnit>.text;
}

// Reports `format` for a unit and a source line that are given. All three are expressions, so that a failure can be
// reported and returned in one statement.
#define LOG_AS(unit, line, format, ...) syslog(LOG_ERR, "%s:%d " format, unit, line __VA_OPT__(, ) __VA_ARGS__)

// Reports `format` for this unit, with the line number that the message is known by.
#define LOG_LINE(line, format, ...) LOG_AS(TextOfUnit<__FILE_NAME__>(), line, format __VA_OPT__(, ) __VA_ARGS__)

// Reports `format` for this unit and line.
#define LOG(format, ...) LOG_LINE(__LINE__, format __VA_OPT__(, ) __VA_ARGS__)

#endif  // MERO_COMMON_LOG_H
