// What the exported functions cost: processes, system calls and bytes, beside the least that their contract allows.
#ifndef MERO_TESTS_FAULT_CALLS_H
#define MERO_TESTS_FAULT_CALLS_H

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "tests/fault/subjects.h"
#include "tests/fault/supervised.h"

// What a function cannot do without, by its contract: the commands that it runs, one reading of each file that it goes
// by, and one writing of each file that it leaves.
struct Least {
  int programs = 0;   // that are run and waited for: a process, and a wait
  int commands = 0;   // of a shell: a second process, since Debian's shell does not become the program
  int pipes = 0;      // such commands whose output is read: a pipe, two closes and a read more
  int besides = 0;    // further processes of those: of pipelines
  int listings = 0;   // of the adapters: open, two getdents, close, and a look at the one that is there
  int sockets = 0;    // to the kernel's network: socket, close
  int asks = 0;       // and what it is asked or told through them
  int looks = 0;      // whether a file is there
  int removals = 0;   // of files
  int sleeps = 0;     // which the documented order of the steps has
  int64_t piped = 0;  // bytes of the commands' output
  std::vector<std::string> reads = {};  // files: open, read, close
  // Durably: open, write, fsync, close, rename; open, fsync, close of the directory.
  std::vector<std::string> replaced = {};
  std::vector<std::string> written = {};  // for as long as the machine runs: open, write, close

  int processes() const { return programs + 2 * commands + 2 * pipes + besides; }
  int opens() const;
  int calls() const;
};

// The processes that a function starts, and the files and directories that it opens.
struct Today {
  int processes;
  int opens;
};

struct Exported {
  const char* szName;
  Today today;
  const char* szState;
  std::function<void(SimulatedDriver&)> prepare;
  std::function<Answer()> call;
  Least least;
};

struct Measured {
  bool done = false;
  Cost cost;
  std::vector<SystemCall> calls;  // on files
  std::vector<std::string> reports;
  int64_t leastRead = 0;     // bytes of the files that it goes by and of its commands' output
  int64_t leastWritten = 0;  // and of those that it leaves

  int Count(const char* szCall) const;
};

// Every exported function, in a state in which it does its work. The machine must be a private one.
const std::vector<Exported>& ExportedFunctions();

// Puts the machine into the function's state, and calls it.
Measured Measure(const Exported& function);

#endif  // MERO_TESTS_FAULT_CALLS_H
