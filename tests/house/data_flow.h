// The macros of common/log.h and platform/base/failure.h, for whoever does not understand how these are made.
#define MERO_COMMON_LOG_H
#define MERO_PLATFORM_FAILURE_H

#include <syslog.h>

#include <cerrno>

void Report(const char* szFormat, ...);
#define LOG(...) Report(__VA_ARGS__)
#define LOG_LINE(line, ...) Report(__VA_ARGS__)
#define LOG_AS(unit, line, ...) Report(__VA_ARGS__)
#define FAIL(error, ...) Report(__VA_ARGS__, error)
#define REFUSE_NULL() Report("")
