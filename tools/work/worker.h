// Calls of the library that may take long, in a process of their own: the program can show how long they take and can
// be ended while they last, and what the commands that they run print goes nowhere near its output.
#ifndef MERO_TOOLS_WORKER_H
#define MERO_TOOLS_WORKER_H

#include <cstring>
#include <functional>
#include <string>
#include <type_traits>

#include "base/terminal.h"
#include "work/listener.h"

struct Task {
  Terminal errors;                     // where progress is shown
  bool verbose = false;                // show what commands print on their standard error output
  std::string doing;                   // "joining Home"
  const char* szMarker = nullptr;      // the file that exists while the library is at it
  Listener* listener = nullptr;        // hears what happens meanwhile
  std::function<void()> undo = [] {};  // takes back what a call has done that did not come to its end
  std::function<bool()> isPointless = [] { return false; };  // whether nothing is gained by waiting on for the call
};

// Thrown when a call was ended that had become pointless.
struct Pointless {};

// Undoes a task. When that fails, a remark says so.
void Undo(const Task& task);

// Runs `call` in a process of its own and gives its result. Fails when the call breaks off, or cannot be waited for;
// throws Interrupted when the user ends the program, and Pointless when the call has become so. Then all processes of
// the call have been ended, and the task has been undone.
std::string RunBytes(const Task& task, const std::function<std::string()>& call);

template <class Result>
Result Run(const Task& task, const std::function<Result()>& call) {
  static_assert(std::is_trivially_copyable_v<Result>);
  const std::string bytes = RunBytes(task, [&] {
    const Result result = call();
    return std::string(reinterpret_cast<const char*>(&result), sizeof result);
  });
  Result result;
  std::memcpy(&result, bytes.data(), sizeof result);
  return result;
}

#endif  // MERO_TOOLS_WORKER_H
