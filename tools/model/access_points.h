// The access points in range through which a known network can be joined.
#ifndef MERO_TOOLS_ACCESS_POINTS_H
#define MERO_TOOLS_ACCESS_POINTS_H

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "model/saved_networks.h"

// All access points in range, looked for where the last results have none that the network was saved with.
std::vector<Network> LookFor(const Program& program, const SavedNetwork& saved);

// How a network is joined through the strongest of its access points that are protected as it was saved. The
// supplicant may change to another one. Nothing when none is among those in range.
std::optional<KnownNetwork> Through(const SavedNetwork& saved, const std::vector<Network>& inRange);

// Those in range that it was saved with, the strongest first.
std::vector<Network> Trusted(const SavedNetwork& saved, const std::vector<Network>& inRange);

// Joins a network, and where none of these access points refuses its secret or does not answer, but another one,
// through each of them alone: the other may only pretend to be one of the network.
void JoinTrusting(const KnownNetwork& config, const std::vector<Network>& trusted,
                  const std::function<void(const KnownNetwork&)>& join);

// How a network is joined that no scan shows: it may hide, or come into range.
KnownNetwork AsSaved(const SavedNetwork& saved);

// The strongest of those that only bear the network's name: when none is protected as it was saved. It has changed, or
// another one pretends to be it.
std::optional<Network> Pretender(const SavedNetwork& saved, const std::vector<Network>& inRange);

// How a network is joined that has changed so. Its secret stays where it can be one.
KnownNetwork AsChanged(const SavedNetwork& saved, const Network& accessPoint);

// The failure of a join when there is one.
Failure NotAsSaved(const Program& program, const SavedNetwork& saved, const Network& pretender);

// Joins the first network that lets the appliance in, and gives how; fails with the failure that tells most. `join`
// fails when one does not. Those that no scan shows are called behind the others. A remark tells of each network that
// is passed over.
KnownNetwork JoinFirst(const Program& program, const std::vector<SavedNetwork>& networks,
                       const std::function<void(const KnownNetwork&)>& join);

#endif  // MERO_TOOLS_ACCESS_POINTS_H
