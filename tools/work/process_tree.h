// A child process and all that it starts, daemons included.
#ifndef MERO_TOOLS_PROCESS_TREE_H
#define MERO_TOOLS_PROCESS_TREE_H

#include <sys/types.h>

#include <functional>
#include <vector>

#include "common/descriptor.h"

class ProcessTree {
 public:
  // Begins `act`, which does not return, in a child of a process group of its own.
  explicit ProcessTree(const std::function<void()>& act);
  ProcessTree(const ProcessTree&) = delete;
  ProcessTree& operator=(const ProcessTree&) = delete;
  ~ProcessTree() { End(); }

  // Ends all of it. False when the child was let go before.
  bool End();

  // Readable when the child has ended.
  Descriptor Watch() const;

  // Lets daemons that have ended go: scripts that end one wait until it is no process any more.
  void Reap() const;

  // Lets the child go, which has ended, and leaves the daemons that it has started.
  void Release();

 private:
  std::vector<pid_t> others_;  // the children that were there before
  pid_t pid_;                  // -1 when it was ended or let go
};

#endif  // MERO_TOOLS_PROCESS_TREE_H
