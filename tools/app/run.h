// What every command is given.
#ifndef MERO_TOOLS_PROGRAM_H
#define MERO_TOOLS_PROGRAM_H

#include <string>

#include "base/terminal.h"
#include "show/output.h"
#include "work/worker.h"

struct Program {
  Output output;
  Terminal errors;
  bool verbose = false;

  Task Doing(std::string what) const { return {.errors = errors, .verbose = verbose, .doing = std::move(what)}; }
};

// Runs the program. Gives its exit status.
int RunProgram(int argc, const char* const* argv);

#endif  // MERO_TOOLS_PROGRAM_H
