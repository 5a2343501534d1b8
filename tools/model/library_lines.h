// The lines of the library that the program recognises: they tell why a call failed, where its result does not.
#ifndef MERO_TOOLS_LIBRARY_LINES_H
#define MERO_TOOLS_LIBRARY_LINES_H

#include <span>
#include <string_view>

enum class Report {
  kInterfaceStaysDown,
  kAnotherJoin,
  kUnknownSecurity,
  kSupplicantNotConfigured,
  kJoinNotRecorded,
  kNoLease,
  kAnotherAp,
  kScriptFailed,
  kNeverAnAp,
  kCount
};

// The unit of the library that reports it, and the format that stands there; a %s in it is any text.
struct LibraryLine {
  Report report;
  std::string_view unit;
  std::string_view format;
};

// One for each report, in that order.
std::span<const LibraryLine> LibraryLines();

// Whether the library has reported this.
bool WasReported(Report report);

#endif  // MERO_TOOLS_LIBRARY_LINES_H
