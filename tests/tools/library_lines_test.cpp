// The lines of the library that the program recognises, beside the sources of the library.
#include "model/library_lines.h"

#include <regex>
#include <set>

#include "running.h"
#include "work/library_log.h"

namespace {

// The formats of all that a unit of the library reports.
std::set<std::string> FormatsOf(std::string_view unit) {
  const std::string source = ReadText(MERO_SOURCE "/lib/obsolete/" + std::string(unit) + ".cpp");
  static const std::regex kLog(R"re(LOG(?:_LINE\([0-9]+,|\()\s*"([^"]*)")re");
  std::set<std::string> formats;
  for (std::sregex_iterator log(source.begin(), source.end(), kLog), end; log != end; ++log) formats.insert((*log)[1]);
  return formats;
}

TEST(LibraryLines, StandInTheUnitsThatReportThem) {
  for (const auto& [report, unit, format] : LibraryLines()) {
    EXPECT_THAT(FormatsOf(unit), testing::Contains(format)) << unit;
  }
}

TEST(LibraryLines, AreKnownByTheirUnitAndTheirWholeText) {
  const char* const others[] = {
      "wireless_ap_config_sec_name_get:9 File[/tmp/wireless.info] does not exist.",
      "wireless_ap_disable:63 File[/etc/script] does not exist. Really",
      "wireless_ap_disable:63 The File[/etc/script] does not exist.",
      "wireless_ap_disable: File[",
      "wireless_ap_disable",
      "",
  };
  for (const char* szLine : others) library_log::Keep(szLine);
  EXPECT_FALSE(WasReported(Report::kNeverAnAp));
  library_log::Keep("wireless_ap_disable:63 File[/etc/script] does not exist.");
  EXPECT_TRUE(WasReported(Report::kNeverAnAp));
}

}  // namespace
