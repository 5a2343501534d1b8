// What every command is given: where it shows its results, and where its progress.
#ifndef MERO_TOOLS_PROGRAM_H
#define MERO_TOOLS_PROGRAM_H

#include <string>
#include <utility>

#include "base/terminal.h"
#include "show/output.h"
#include "work/worker.h"

struct Program {
  Output output;
  Terminal errors;
  bool verbose = false;

  Task Doing(std::string what) const { return {.errors = errors, .verbose = verbose, .doing = std::move(what)}; }
};

#endif  // MERO_TOOLS_PROGRAM_H
