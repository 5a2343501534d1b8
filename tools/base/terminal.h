// What stands behind a descriptor that people may be looking at.
#ifndef MERO_TOOLS_TERMINAL_H
#define MERO_TOOLS_TERMINAL_H

#include <cstddef>
#include <string>

struct Terminal {
  bool obeys;         // a terminal, and one that takes control sequences
  bool colour;        // not with NO_COLOR in the environment
  bool utf8;          // as the locale says
  std::size_t width;  // in columns; 0 where lines may have any length
};

// The program's locale must have been set before.
Terminal TerminalOf(int fd);

// Writes a line on the standard error output. That nobody reads it any more ends nothing.
void Remark(const std::string& line);

#endif  // MERO_TOOLS_TERMINAL_H
