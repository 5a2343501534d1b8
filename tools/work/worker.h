// Calls of the library that may take long, in a process of their own: the program can show how long they take and can
// be ended while they last, and what the commands that they run print goes nowhere near its output.
#ifndef MERO_TOOLS_WORKER_H
#define MERO_TOOLS_WORKER_H

#include <cstring>
#include <functional>
#include <string>
#include <type_traits>

#include "base/terminal.h"
#include "work/supplicant.h"

struct Task {
  Terminal errors;                         // where progress is shown
  bool verbose = false;                    // show what commands print on their standard error output
  std::string doing;                       // "joining Home"
  const char* szMarker = nullptr;          // the file that exists while the library is at it
  SupplicantListener* listener = nullptr;  // told what happens meanwhile
  std::function<void()> undo = [] {};      // what to do when it comes to nothing
};

// Undoes a task. What cannot be undone is told.
void Undo(const Task& task);

// Gives what `call` gave. Interrupted when the user did not want to wait: then nothing of the call goes on and it is
// undone, as after any other failure to wait for it, and when it breaks off.
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
