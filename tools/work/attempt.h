// A part of the program that may fail, in a process of its own: what it keeps in memory, the daemons that it starts and
// the signals that it takes are not those of a program that goes on for days.
#ifndef MERO_TOOLS_ATTEMPT_H
#define MERO_TOOLS_ATTEMPT_H

#include <sys/types.h>

#include <functional>
#include <optional>

#include "base/failure.h"
#include "common/descriptor.h"

class Attempt {
 public:
  // Begins `act`, which shows nothing on the standard output. It is told to end when this program ends.
  explicit Attempt(const std::function<void()>& act);
  Attempt(const Attempt&) = delete;
  Attempt& operator=(const Attempt&) = delete;
  ~Attempt();

  // Readable when it has ended.
  int fd() const { return ended_.get(); }

  // Has it take back what it has begun, and end.
  void Interrupt();

  // Waits for its end. Nothing when it has done all, or was interrupted.
  std::optional<Failure> Result();

 private:
  Descriptor words_;
  pid_t pid_;
  Descriptor ended_;
  bool interrupted_ = false;
};

#endif  // MERO_TOOLS_ATTEMPT_H
