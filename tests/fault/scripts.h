// The kit's scripts, and what becomes of them when a command that they run goes wrong, or when they are killed.
#ifndef MERO_TESTS_FAULT_SCRIPTS_H
#define MERO_TESTS_FAULT_SCRIPTS_H

#include <string>
#include <vector>

#include "tests/fault/faults.h"

// The names of the rows.
std::vector<std::string> ScriptNames();

// The machine must be a private one, and no other script's.
Tally TryScript(const std::string& name, const Share& share);

#endif  // MERO_TESTS_FAULT_SCRIPTS_H
