// What the terminal behind a descriptor can show, if there is one.
#ifndef MERO_TOOLS_TERMINAL_H
#define MERO_TOOLS_TERMINAL_H

#include <cstddef>
#include <string>

struct Terminal {
  bool isTerminal;
  bool obeys;         // it takes control sequences
  bool colour;        // not with NO_COLOR in the environment
  bool utf8;          // as the locale says
  std::size_t width;  // in columns, by COLUMNS in the environment or as it is; 0 where lines may have any length
};

// Before each line of a sentence but the first.
inline constexpr std::size_t kSentenceIndent = 2;

// The program's locale must have been set before.
Terminal TerminalOf(int fd);

// Writes a sentence on the standard error output, in lines that fit it. A pipe that nobody reads any more does not end
// the program.
void Remark(const std::string& line);

#endif  // MERO_TOOLS_TERMINAL_H
