// The scan results that a radio's driver holds, read through nl80211. Nothing here scans.
#ifndef MERO_APPLIANCE_RADIO_H
#define MERO_APPLIANCE_RADIO_H

#include <linux/netlink.h>

#include <optional>
#include <string>
#include <vector>

#include "appliance/sbin/network.h"

namespace iwlist {

// The networks that the driver of an interface heard last, in its order, possibly with several descriptions of one
// address. Throws std::runtime_error, which says why in a sentence. Does not wait for the radio.
std::vector<Network> ReadScanResults(const std::string& interface);

// The network of one message of the driver's answer; nothing when the message describes none.
std::optional<Network> NetworkOfMessage(nlmsghdr* message);

}  // namespace iwlist

#endif  // MERO_APPLIANCE_RADIO_H
