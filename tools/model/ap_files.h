// The files that the access-point daemon is started from.
#ifndef MERO_TOOLS_AP_FILES_H
#define MERO_TOOLS_AP_FILES_H

#include <optional>
#include <string>

#include "model/ap_settings.h"

// Whether the daemon of an interface, and the rules for guests, were given other settings than these, or another
// country than that of the appliance; nothing when the daemon was given none.
std::optional<bool> WasGivenOthers(const std::string& interface, const ApConf& conf);

// Whether an access point was set up on an interface and not disabled since, and whether it is switched on: a change of
// the adapter's mode switches it off and on.
enum class ApSwitch { kNone, kOff, kOn };
ApSwitch ApSwitchOf(const std::string& interface);

#endif  // MERO_TOOLS_AP_FILES_H
