// The help, on a screen of any width.
#ifndef MERO_TOOLS_HELP_H
#define MERO_TOOLS_HELP_H

#include <cstddef>
#include <string>

// `help`, as CLI11 writes it, in lines that are no wider than `width`, if no word is.
std::string FittedHelp(const std::string& help, std::size_t width);

#endif  // MERO_TOOLS_HELP_H
