// The command line.
#ifndef MERO_TOOLS_OPTIONS_H
#define MERO_TOOLS_OPTIONS_H

#include <functional>
#include <string>

#include "show/output.h"
#include "work/program.h"

struct Options {
  Form form = Form::kHuman;
  bool verbose = false;
  std::function<void(const Program&)> command;
};

// What is to be shown instead of running a command.
struct Help {
  std::string text;
};

// What is wrong with a command line, and the form in which that is to be told.
struct WrongUsage {
  Form form;
  std::string text;
};

// Throws these two.
Options ParseOptions(int argc, const char* const* argv);

#endif  // MERO_TOOLS_OPTIONS_H
