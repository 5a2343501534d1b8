// What the terminal behind a descriptor can show, if there is one.
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

// Writes a line on the standard error output. A pipe that nobody reads any more does not end the program.
void Remark(const std::string& line);

#endif  // MERO_TOOLS_TERMINAL_H
