// What the kernel is asked of a wireless interface where the library has no function for it.
#ifndef MERO_TOOLS_RADIO_H
#define MERO_TOOLS_RADIO_H

#include <optional>
#include <string>

#include "base/text.h"

// The access point that the interface is connected to, if there is one.
std::optional<Address> AccessPointOf(const std::string& interface);

// The WEP key that the interface encrypts with, in hexadecimal; empty when it does not, or when the driver does not
// tell.
std::string WepKeyOf(const std::string& interface);

// Calls a network by its name, so that it answers even if it hides, and waits for the answers; they stand in the
// results of the adapter's last scan then. False when the driver cannot do that.
bool CallNetwork(const std::string& interface, const std::string& name);

// Has the radio listen to one channel for as long as a beacon takes, and does not wait for that. False when it cannot,
// as while it scans.
bool ListenTo(const std::string& interface, int channel);

#endif  // MERO_TOOLS_RADIO_H
