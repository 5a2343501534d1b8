// What the library reports. It speaks to the system log, whose function this program has one of its own of: each line
// is kept and passed on.
#ifndef MERO_TOOLS_LIBRARY_LOG_H
#define MERO_TOOLS_LIBRARY_LOG_H

#include <deque>
#include <functional>
#include <string>
#include <string_view>

namespace library_log {

// The lines that are kept, the oldest first.
const std::deque<std::string>& Lines();

// Keeps a line, in place of the oldest when there are very many, and shows it on the standard error output when that is
// asked for.
void Keep(std::string_view line);

// Shows the lines as they come.
void ShowLines();

// Gives the lines of this process to `take` from now on.
void SendTo(std::function<void(std::string_view line)> take);

}  // namespace library_log

#endif  // MERO_TOOLS_LIBRARY_LOG_H
