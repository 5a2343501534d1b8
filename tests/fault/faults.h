// Every fault that an exported function can meet, and what becomes of it.
#ifndef MERO_TESTS_FAULT_FAULTS_H
#define MERO_TESTS_FAULT_FAULTS_H

#include <map>
#include <set>
#include <string>
#include <vector>

#include "tests/fault/calls.h"

// How much is tried of what there is: all of it, or of each kind so many faults, spread evenly over the function, with
// one of the errors that a system call can give.
struct Share {
  int most = 0;  // 0 for all
};

// The faults of a function, and what has become of them.
struct Tally {
  int allocations = 0;
  int calls = 0;
  int commands = 0;
  int kills = 0;

  int done = 0;      // the function has done its work all the same,
  int less = 0;      // or as much as its contract says,
  int failed = 0;    // or has failed as its contract says,
  int cutShort = 0;  // or was killed, with files that are old or new

  int refused =
      0;           // behind it, the next call was refused because of a marker, or did less, and the one behind that not
  int missed = 0;  // behind it, the next call did its work, and left a file as it was

  std::set<std::string> names;         // of the system calls that it makes
  std::map<std::string, int> reasons;  // for which it may do otherwise than all others, and how often it did
  std::vector<std::string> losses;

  int faults() const { return allocations + calls + commands + kills; }
};

// The machine must be a private one.
Tally TryFaults(const Exported& function, const Share& share);

#endif  // MERO_TESTS_FAULT_FAULTS_H
