// The lines that the library reports. It calls syslog(), which this program replaces by a function of its own: that
// keeps each line and passes it on to the system log.
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

// Shows each line from now on, as Keep() gets it.
void ShowLines();

// From now on, what the library reports in this process goes to `take` instead of Keep().
void SendTo(std::function<void(std::string_view line)> take);

}  // namespace library_log

#endif  // MERO_TOOLS_LIBRARY_LOG_H
