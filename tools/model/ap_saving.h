// Saves the access point's settings by the library.
#ifndef MERO_TOOLS_AP_SAVING_H
#define MERO_TOOLS_AP_SAVING_H

#include "base/failure.h"
#include "model/ap_settings.h"

// `radio off` may have saved settings that hold the switch alone, and so no bridge.
void SetBridgeDefault(ApConf& conf);

// Both fail when the settings could not be saved, with this.
Failure ApNotSaved();
void SaveApSwitch(ApConf conf, bool on);

// The library saves settings only when the access point is switched on in them. Where it was off, this saves twice: on,
// then off again, and a signal must not come between.
void SaveApKeepingSwitch(const ApConf& conf);

#endif  // MERO_TOOLS_AP_SAVING_H
