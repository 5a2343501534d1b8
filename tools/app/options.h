// The command line.
#ifndef MERO_TOOLS_OPTIONS_H
#define MERO_TOOLS_OPTIONS_H

#include <functional>
#include <string>

#include "base/failure.h"
#include "show/output.h"
#include "work/program.h"

struct Options {
  Form form = Form::kHuman;
  bool verbose = false;
  std::function<void(const Program&)> command;
};

// The help that was asked for instead of a command.
struct Help {
  std::string text;
};

// A command line that cannot be understood: why, and the form in which to say so.
struct WrongUsage {
  Form form;
  Failure why;
};

// Throws Help or WrongUsage.
Options ParseOptions(int argc, const char* const* argv);

#endif  // MERO_TOOLS_OPTIONS_H
