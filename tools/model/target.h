// Which network is joined when somebody names one, and through which of its access points.
#ifndef MERO_TOOLS_TARGET_H
#define MERO_TOOLS_TARGET_H

#include <string>
#include <vector>

#include "model/library.h"

struct Target {
  KnownNetwork config;  // with its secret and addressing, as far as they are known
  bool isInRange;
  std::vector<Network> trusted = {};  // access points that are tried alone where another one refuses the secret
};

// A network that was saved under a name, of those that there are.
Target SavedTarget(const Program& program, const std::string& essid);

// The network that was saved under a name, or with an access point of this address; or else one in range. With
// `isChanged` the protection on the air is accepted, whatever was saved. Fails when it cannot be joined, when one that
// was not saved is not in range, and when it is not what was saved.
Target FindTarget(const Program& program, const std::string& name, bool isChanged);

// Fails when the secret that was saved for a network can be none.
void RequireSavedSecret(const Program& program, const KnownNetwork& config);

// The failure where one that was saved is not worth an attempt, since it is not in range.
Failure NotInRange(const Program& program, const Target& target);

#endif  // MERO_TOOLS_TARGET_H
