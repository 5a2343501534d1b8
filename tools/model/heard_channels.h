// What was heard on each channel, and which of them is the quietest.
#ifndef MERO_TOOLS_HEARD_CHANNELS_H
#define MERO_TOOLS_HEARD_CHANNELS_H

#include <optional>
#include <span>
#include <vector>

#include "model/air.h"
#include "wireless.h"

struct HeardChannel {
  int number = 0;
  bool is5GHz = false;
  std::optional<ChannelUse> use;  // nothing for a channel that the radio does not know
  int networks = 0;               // on the channel itself
  std::optional<int> strongest;   // the signal of the strongest of them
  int load = 0;                   // the signals of those that disturb there, in per cent, together
  bool isQuietest = false;        // of its band, for an access point
};

// The channels that the radio could use for an access point, and those on which something was heard, in ascending
// order.
//
// At 2.4 GHz a channel takes the room of four to each side, so that a network there disturbs too: the nearer, the more.
// The quietest has the least load. Where several have, it is one that need not be listened to for radar, then one of
// the three at 2.4 GHz that leave each other room, then the first.
std::vector<HeardChannel> HeardChannels(const std::vector<WIRELESS_NETWORK>& networks,
                                        const std::vector<Channel>& channels);

// Nothing when an access point may use no channel of the band.
std::optional<int> QuietestOf(std::span<const HeardChannel> channels, bool is5GHz);

#endif  // MERO_TOOLS_HEARD_CHANNELS_H
