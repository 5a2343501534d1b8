// What stands behind a descriptor that people may be looking at.
#ifndef MERO_TOOLS_TERMINAL_H
#define MERO_TOOLS_TERMINAL_H

#include <cstddef>

struct Terminal {
  bool isTerminal;
  bool colour;        // not with NO_COLOR in the environment
  bool utf8;          // as the locale says
  std::size_t width;  // in columns; 0 where lines may have any length
};

// The program's locale must have been set before.
Terminal TerminalOf(int fd);

#endif  // MERO_TOOLS_TERMINAL_H
