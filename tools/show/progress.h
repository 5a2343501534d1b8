// The line that tells what the program waits for, and how long it has waited.
#ifndef MERO_TOOLS_PROGRESS_H
#define MERO_TOOLS_PROGRESS_H

#include <chrono>
#include <string>

#include "base/terminal.h"

// Shows `doing` and the time since on the standard error output, where that is a terminal that can take the line back,
// from half a second on.
class Progress {
 public:
  Progress(const Terminal& terminal, std::string doing);
  Progress(const Progress&) = delete;
  Progress& operator=(const Progress&) = delete;
  ~Progress();

  void Update();

  // Takes the line back, before others are written.
  void Clear();

 private:
  Terminal terminal_;
  std::string doing_;
  std::chrono::steady_clock::time_point began_;
  bool shown_ = false;
};

#endif  // MERO_TOOLS_PROGRESS_H
