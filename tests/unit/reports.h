// What the code under test did, step by step, and its reports, whichever line of the source they come from.
#ifndef MERO_TESTS_UNIT_REPORTS_H
#define MERO_TESTS_UNIT_REPORTS_H

#include <regex>
#include <string>
#include <vector>

#include "fakes.h"

using Effects = std::vector<std::string>;

inline Effects operator+(Effects before, const Effects& behind) {
  before.insert(before.end(), behind.begin(), behind.end());
  return before;
}

// Effects or messages with "#" for the line of each report: "syslog(3, wireless_ifcfg_set:# Bad parameters)".
inline std::vector<std::string> WithoutLines(std::vector<std::string> texts) {
  using namespace std::regex_constants;
  static const std::regex kLine("((?:syslog\\(3, )?[a-z_]+):[1-9][0-9]* ");
  for (std::string& text : texts) text = std::regex_replace(text, kLine, "$1:# ", match_continuous | format_first_only);
  return texts;
}

// What the code under test did.
inline Effects Steps() {
  return WithoutLines(fake::Effects());
}

// The effect of running a command.
inline std::string RunOf(const std::string& command) {
  return "system(" + command + ")";
}

// The last of the texts; an empty one when there is none.
inline std::string Last(const std::vector<std::string>& texts) {
  return texts.empty() ? "" : texts.back();
}

#endif  // MERO_TESTS_UNIT_REPORTS_H
