// Known networks as people think of them. The library keeps a section for each access point; a network is all of those
// that have its name and its protection, with the same secret.
#ifndef MERO_TOOLS_SAVED_NETWORKS_H
#define MERO_TOOLS_SAVED_NETWORKS_H

#include <string>
#include <vector>

#include "base/text.h"
#include "model/library.h"

struct SavedNetwork {
  KnownNetwork newest;             // what was saved last, which holds for the whole network
  std::vector<Address> addresses;  // of the access points that it was saved with, the newest one's first

  // Access points that were saved with the same name and protection, but another secret: they are another network's.
  std::vector<Address> others;

  // Whether it stands for one access point, and is to be joined through that alone.
  bool isOneAccessPoint = false;

  void LeaveOnly(const Network& accessPoint);
  bool isCell() const { return newest.network.opmode == WIRELESS_OPMODE_ADHOC; }
};

std::vector<SavedNetwork> SavedNetworks(Order order);

// Those that were saved under a name that somebody has given, the newest first; or else the access point of this
// address alone.
std::vector<SavedNetwork> SavedAs(const std::string& name);

// Those of a name that the kernel, the air or the settings tell, also where it looks like an address.
std::vector<SavedNetwork> SavedUnder(const std::string& essid);

// Those that are joined without being asked for, in the order in which they are tried: by their priority, and then the
// newest first.
std::vector<SavedNetwork> NetworksToTry();

// Saves a network by its access point's address. With `isWhole` the network is changed as one thing: all access points
// that were saved with its name and protection are saved anew, or, when its protection has changed, all of its name.
SavedNetwork SaveNetwork(const KnownNetwork& config, bool isWhole);

// The failure of a search for a network that was not saved.
Failure NotKnown(const Program& program, const std::string& name);

#endif  // MERO_TOOLS_SAVED_NETWORKS_H
