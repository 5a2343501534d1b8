// The lines of the library that the program recognises.
#include "model/library_lines.h"

#include <algorithm>
#include <cstddef>
#include <string>

#include "work/library_log.h"

namespace {

constexpr LibraryLine kLines[] = {
    {Report::kInterfaceStaysDown, "wireless_network_scan", "Failed to activate network interface %s"},
    {Report::kAnotherJoin, "wireless_network_connect", "Another connection construction is going"},
    {Report::kUnknownSecurity, "wireless_network_connect", "Failed to detect authentication/encryption type"},
    {Report::kSupplicantNotConfigured, "wireless_network_connect", "Failed to set [%s]"},
    {Report::kJoinNotRecorded, "wireless_network_connect", "Failed to record this connection."},
    {Report::kNoLease, "wireless_ifcfg_set", "Failed to get IP from DHCP"},
    {Report::kAnotherAp, "wireless_ap_enable", "Another ap construction is going"},
    {Report::kScriptFailed, "wireless_ap_enable", "Failed to restart /etc/rc.network"},
    {Report::kNeverAnAp, "wireless_ap_disable", "File[%s] does not exist."},
};

consteval bool HasARowForEachReport() {
  std::size_t rows = 0;
  for (const LibraryLine& line : kLines) {
    if (static_cast<std::size_t>(line.report) != rows++) return false;
  }
  return rows == static_cast<std::size_t>(Report::kCount);
}
static_assert(HasARowForEachReport(), "name the line of every report, in the order of the reports");

// Whether a text is of a format with one %s, or none.
bool IsOf(std::string_view text, std::string_view format) {
  const std::size_t value = format.find("%s");
  if (value == format.npos) return text == format;
  const std::string_view end = format.substr(value + 2);
  return text.size() >= value + end.size() && text.starts_with(format.substr(0, value)) && text.ends_with(end);
}

// A line is "UNIT:NUMBER TEXT".
bool Is(std::string_view line, const LibraryLine& wanted) {
  if (!line.starts_with(wanted.unit) || !line.substr(wanted.unit.size()).starts_with(':')) return false;
  const std::size_t space = line.find(' ');
  return space != line.npos && IsOf(line.substr(space + 1), wanted.format);
}

}  // namespace

std::span<const LibraryLine> LibraryLines() {
  return kLines;
}

bool WasReported(Report report) {
  const LibraryLine& wanted = kLines[static_cast<std::size_t>(report)];
  return std::ranges::any_of(library_log::Lines(), [&](const std::string& line) { return Is(line, wanted); });
}
