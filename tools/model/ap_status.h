// What is so of the access point at this moment, by the kernel.
#ifndef MERO_TOOLS_AP_STATUS_H
#define MERO_TOOLS_AP_STATUS_H

#include <optional>
#include <span>
#include <string>

#include "model/ap_settings.h"
#include "model/ap_state.h"
#include "show/output.h"

struct ApStatus {
  ApState state = ApState::kOff;
  std::string name;  // in the settings, like `enabled`
  bool enabled = false;
  std::string interface;
  std::string nameOnAir;  // empty while it is off the air
  int channel = 0;        // the radio's; 0 for none, and where the driver does not tell
  int megahertz = 0;
  std::optional<int> stations;    // guests included; on the air only
  std::optional<bool> isPending;  // whether the settings differ from those that it runs with

  bool isRunning() const { return state != ApState::kOff && state != ApState::kSettingUp; }
};

// The settings of the adapter's model.
ApStatus ReadApStatus(const ApConf& conf);

std::span<const Field<ApStatus>> ApStatusFields();

// What became of an access point that has been started, for a sentence, such as "is on the air on channel 6".
std::string WhatBecameOf(const ApStatus& status);

#endif  // MERO_TOOLS_AP_STATUS_H
