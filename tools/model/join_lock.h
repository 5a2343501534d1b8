// Keeps other joins away.
#ifndef MERO_TOOLS_JOIN_LOCK_H
#define MERO_TOOLS_JOIN_LOCK_H

#include "common/descriptor.h"

// Held from before a join touches anything to its end. Fails when another command holds one. It ends with its process
// and the worker of that, which goes on when the process is killed; programs that are run do not hold it.
class JoinLock {
 public:
  JoinLock();

 private:
  Descriptor held_;
};

// Fails when the library joins a network for another program. Removes a marker that tells of nothing any more: the
// library would take it for another join.
void RequireNoOtherJoin();

#endif  // MERO_TOOLS_JOIN_LOCK_H
