// Every fault that a call can meet, and what becomes of it.
#ifndef MERO_TESTS_FAULT_FAULTS_H
#define MERO_TESTS_FAULT_FAULTS_H

#include <map>
#include <set>
#include <string>
#include <vector>

struct Subject;

// How much is tried of what there is: all of it, or of each kind so many faults, spread evenly over the call, with one
// of the errors that a system call can give.
struct Share {
  int most = 0;  // 0 for all
};

// The faults of a call, and what has become of them.
struct Tally {
  int allocations = 0;
  int calls = 0;
  int commands = 0;
  int kills = 0;
  int unmet = 0;  // faults that the call did not meet, since it took another way

  int done = 0;      // it has done its work all the same,
  int less = 0;      // or as much as its contract says,
  int failed = 0;    // or has failed as its contract says,
  int waiting = 0;   // or waits for a command that does not end, as its contract says,
  int cutShort = 0;  // or was killed, with files that are old or new

  int left = 0;     // behind it, a file was left over: a lock, the beginning of a new file, a marker
  int refused = 0;  // the next call was refused because of a marker, or did less, and the one behind that not
  int staying = 0;  // the next call did its work, and left what was left over
  int missed = 0;   // the next call did its work, and left a file as it was

  std::set<std::string> names;         // of the system calls that it makes
  std::map<std::string, int> reasons;  // for which it may do otherwise than all others, and how often it did
  std::vector<std::string> losses;

  int faults() const { return allocations + calls + commands + kills; }
};

// The machine must be a private one.
Tally TryFaults(const Subject& subject, const Share& share);

#endif  // MERO_TESTS_FAULT_FAULTS_H
