// What the library reports. It speaks to the system log, whose function this program has one of its own of: each line
// is kept and passed on.
#ifndef MERO_TOOLS_LIBRARY_LOG_H
#define MERO_TOOLS_LIBRARY_LOG_H

#include <functional>
#include <string>
#include <string_view>
#include <vector>

namespace library_log {

// The lines so far, in order.
const std::vector<std::string>& Lines();

// Whether a line holds this text.
bool Says(std::string_view text);

// Keeps a line, and shows it on the standard error output when that is asked for.
void Keep(std::string_view line);

// Shows the lines as they come.
void ShowLines();

// Gives the lines of this process to `take` from now on.
void SendTo(std::function<void(std::string_view line)> take);

// Forgets everything that was said and asked for.
void Reset();

}  // namespace library_log

#endif  // MERO_TOOLS_LIBRARY_LOG_H
