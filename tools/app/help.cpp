// The help, on a screen of any width.
#include "app/help.h"

#include <sstream>
#include <string_view>

#include "base/text.h"

namespace {

// What an option or a command is for stands in this column, on its line or, where there is no room, on the next one.
constexpr std::size_t kColumn = 30;

// Below this width there is no room beside the options; what they are for stands below them.
constexpr std::size_t kNarrow = 60;

std::string FittedLine(const std::string& line, std::size_t width) {
  const bool isEntry =
      line.starts_with("  ") && line.size() > kColumn && line[kColumn - 1] == ' ' && line[kColumn] != ' ';
  const std::string indent(line.starts_with("  ") ? 6 : 0, ' ');
  if (!isEntry) return Wrapped(line, width, indent.size(), true);
  if (width >= kNarrow) return Wrapped(line, width, kColumn, true);
  const std::string name = line.substr(0, line.find_last_not_of(' ', kColumn - 1) + 1);  // blanks alone: no name
  const std::string text = Wrapped(indent + line.substr(kColumn), width, indent.size(), true);
  return name.empty() ? text : Wrapped(name, width, indent.size(), true) + "\n" + text;
}

}  // namespace

std::string FittedHelp(const std::string& help, std::size_t width) {
  std::string fitted;
  std::istringstream lines(help);
  for (std::string line; std::getline(lines, line);) fitted += FittedLine(line, width) + "\n";
  return fitted;
}
