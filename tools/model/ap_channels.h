// The channels that an access point may use here and now.
#ifndef MERO_TOOLS_AP_CHANNELS_H
#define MERO_TOOLS_AP_CHANNELS_H

#include "model/ap_settings.h"

enum class ChannelCheck { kPassed, kNobodyCanTell };

// Asks the adapter's radio about the channel of these settings. Fails, and lists those that may be used, when it may
// not: it is disabled by the rules of this place, or the radio may only listen there.
ChannelCheck CheckChannel(const ApConf& conf);

#endif  // MERO_TOOLS_AP_CHANNELS_H
