// One fault, and what has become of the call that has met it.
#ifndef MERO_TESTS_FAULT_FAULT_H
#define MERO_TESTS_FAULT_FAULT_H

#include <string>
#include <vector>

#include "tests/fault/failing_memory.h"
#include "tests/fault/machine_state.h"
#include "tests/fault/subjects.h"
#include "tests/fault/supervised.h"

enum class CommandFault { kNone, kFails, kTakesLong, kNeverEnds, kIsMissing };

// By what brings it about.
struct Fault {
  std::string text;
  Plan plan = {};
  int allocation = 0;
  bool allocationsBehind = false;
  std::string command = {};
  CommandFault commandFault = CommandFault::kNone;

  bool kills() const {
    return plan.interference == Interference::kKill || plan.interference == Interference::kTearWrite;
  }
};

struct Seen {
  Outcome outcome;
  Answer answer = Answer::kWrong;
  MemoryOutcome memory;
  MachineState state;
  std::vector<std::string> commands;  // that were run, and what the driver was told
};

#endif  // MERO_TESTS_FAULT_FAULT_H
