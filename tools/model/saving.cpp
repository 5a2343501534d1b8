// Saves what a network was joined by.
#include "model/saving.h"

#include <algorithm>
#include <string_view>

#include "model/saved_networks.h"
#include "model/security.h"

namespace {

// By all that the access points of a network have in common.
bool IsKnown(const KnownNetwork& config) {
  return std::ranges::any_of(Known(Order::kAsSaved), [&](const KnownNetwork& known) {
    return std::string_view(known.network.szEssid) == config.network.szEssid &&
           std::string_view(known.szKey) == config.szKey && IsProtectedAlike(known.network, config.network);
  });
}

}  // namespace

// A connection that has just been made is not given up for a failure of this.
Saving SaveWhatWorked(const KnownNetwork& config, bool isWhole) {
  try {
    if (IsKnown(config)) return Saving::kNothing;
    (void)SaveNetwork(config, isWhole);
    return Saving::kDone;
  } catch (const Failure&) {
    return Saving::kFailed;
  }
}

Failure JoinedAndNotSaved(const std::string& name) {
  return Failed(name + " is joined, but could not be saved", "is there room on the disk? -v shows more");
}
