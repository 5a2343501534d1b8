// Keeps other joins away.
#ifndef MERO_TOOLS_JOIN_LOCK_H
#define MERO_TOOLS_JOIN_LOCK_H

#include "common/descriptor.h"

// Who wants the lock. An attempt of `autoconnect --keep` gives way to whatever somebody else wants.
enum class JoinLockFor {
  kCommand,
  kAddressing,  // a command that waits for the end of an attempt, which gives the interface an address, too
  kKeeper
};

// Held from before a command touches the adapter to its end. Fails when another command holds one; an attempt of the
// keeper is waited for. It ends with its process and the worker of that, which goes on when the process is killed;
// programs that are run do not hold it.
class JoinLock {
 public:
  explicit JoinLock(JoinLockFor who = JoinLockFor::kCommand);

 private:
  Descriptor keeper_;
  Descriptor held_;
};

// Whether a command waits until the keeper's attempt gives way.
bool IsKeeperInTheWay();

// Fails when the library joins a network for another program. Removes a marker that tells of nothing any more: the
// library would take it for another join.
void RequireNoOtherJoin();

#endif  // MERO_TOOLS_JOIN_LOCK_H
