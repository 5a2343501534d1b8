// The command line.
#ifndef MERO_TOOLS_OPTIONS_H
#define MERO_TOOLS_OPTIONS_H

#include <functional>
#include <string>

#include "output.h"
#include "program.h"

struct Options {
  Form form = Form::kHuman;
  bool verbose = false;
  std::function<void(const Program&)> command;
};

// Text to be shown instead of running a command, and the exit status after it.
struct Usage {
  Exit exit;
  std::string text;
};

// Throws Usage for what is no command, and for requests for help.
Options ParseOptions(int argc, const char* const* argv);

#endif  // MERO_TOOLS_OPTIONS_H
