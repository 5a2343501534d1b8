// Whether the adapter may be made to join a network.
#ifndef MERO_TOOLS_SITUATION_H
#define MERO_TOOLS_SITUATION_H

#include "model/status.h"

enum class Situation {
  kConnected,
  kFree,
  kLeftAlone,    // the same, and somebody has disconnected it
  kCell,         // somebody has made an ad-hoc cell, which the driver has not found or begun yet
  kAccessPoint,  // also one that is being set up, or off the air for hours of its schedule
  kNoAdapter,
  kRadioOff,
  kUnannounced,  // it has just been plugged in, and nobody knows whether its radio may be used
  kUntold        // in another mode, or its driver does not say whether it is connected
};

Situation SituationOf(const Status& status);

// Whether the adapter is an access point's, or is to be one: the hot-plug script or a schedule may start it any time.
bool IsForAccessPoint();

#endif  // MERO_TOOLS_SITUATION_H
