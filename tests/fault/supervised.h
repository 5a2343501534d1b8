// An operation in a child process whose system calls this process watches, and one of which it interferes with.
#ifndef MERO_TESTS_FAULT_SUPERVISED_H
#define MERO_TESTS_FAULT_SUPERVISED_H

#include <sys/types.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "tests/fault/system_calls.h"

// What happens in place of a system call.
enum class Interference {
  kNone,
  kKill,       // the process is killed
  kTearWrite,  // as kKill, but of a write one half is done first
  kFail,       // the call fails, without effect
  kShorten,    // of a read or a write only one half is done; other calls are let through
  kMeanwhile,  // something happens elsewhere, and the call is let through
  kWatch,      // as kMeanwhile, at each call, whichever the plan says
};

struct Plan {
  Interference interference = Interference::kNone;
  int call = 0;  // which of the operation's calls on files, from 1 on
  int error = 0;
  std::string name = {};                 // counts only calls of that name; empty for all
  std::function<void()> meanwhile = {};  // what happens, in this process
  bool withoutSleeps = false;            // a sleep of the operation is over at once
  bool all = false;                      // counts all of the operation's calls, but for an allocator's and its sleeps
  std::string expected = {};             // the name of the call; when it is another, nothing is done
  bool onwards = false;                  // with kFail: so do all calls behind it that can give the error
  int patience = 20'000;                 // milliseconds without a call of the operation until it counts as hung
};

// A call that was made to fail, and the path of what it was about; empty when that has none.
struct FailedCall {
  std::string name;
  std::string path;
};

// The costs of an operation.
struct Cost {
  int processes = 0;  // that it started, and that these started
  int calls = 0;      // that it made itself, but for those of an allocator
  int64_t bytesRead = 0;
  int64_t bytesWritten = 0;
  int64_t secondsSlept = 0;  // the naps of less than one aside
};

struct Outcome {
  bool reached = false;            // the operation made as many calls as the plan says
  SystemCall call;                 // the one interfered with
  std::vector<SystemCall> before;  // those that were let through until then
  std::vector<FailedCall> failed;
  bool killed = false;
  int result = -1;  // what follows is of an operation that was not killed
  int code = 0;
  std::vector<std::string> reports;
  Cost cost;
  int descriptorsLeft = 0;  // how many more are open behind the operation than before it
  int closesFailed = 0;     // each of them leaves a descriptor, of /dev/null, which no operation can get rid of
  int childrenLeft = 0;     // processes that the operation has started, and not waited for
  int processesLeft = 0;    // those that it has led to, and that did not end by themselves soon behind it
  bool hung = false;        // it made no call for so long that it was killed, with all that it has led to
};

// Runs an operation in a child of this process. What becomes of the child's children is watched too, whereupon this
// process is the one that they are left to.
Outcome RunSupervised(const Plan& plan, const std::function<int()>& operation);

#endif  // MERO_TESTS_FAULT_SUPERVISED_H
