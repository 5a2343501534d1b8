// What meets faults: an exported function or an operation of the platform, the state in which it does its work, and
// what its contract says of failures.
#ifndef MERO_TESTS_FAULT_SUBJECTS_H
#define MERO_TESTS_FAULT_SUBJECTS_H

#include <functional>
#include <string>
#include <vector>

#include "tests/fault/contracts.h"
#include "tests/platform/simulated_radio.h"

// What a call has come to, as its caller sees it.
enum class Answer {
  kDone,    // success, with all its work done
  kLess,    // what its contract gives for success, or for an answer, when it found less than there is
  kFailed,  // what its contract gives for a failure
  kWrong,   // anything else
};

struct Subject {
  std::string name;
  std::function<void(SimulatedDriver&)> prepare;
  std::function<Answer()> call;  // takes no memory of its own
  Contract contract;
  std::function<void()> renew = {};  // before each call: a process that a call has ended is there again
};

// The exported functions, and the operations of the platform that write or run something.
const std::vector<Subject>& AllSubjects();

// The latter, which have a table of their own.
std::vector<Subject> PlatformOperations();

#endif  // MERO_TESTS_FAULT_SUBJECTS_H
