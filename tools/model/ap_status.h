// What is so of the access point at this moment, by the kernel.
#ifndef MERO_TOOLS_AP_STATUS_H
#define MERO_TOOLS_AP_STATUS_H

#include <optional>
#include <span>
#include <string>

#include "model/ap_settings.h"
#include "show/output.h"

enum class ApState {
  kOff,
  kOffBySchedule,  // it runs, and has no hour on the air
  kSettingUp,
  kWaitingForRadar,  // listens whether its channel is a radar's, which takes a minute or more
  kOnAir,
};

struct ApStatus {
  ApState state = ApState::kOff;
  std::string name;  // in the settings, like `enabled`
  bool enabled = false;
  std::string interface;
  std::string nameOnAir;  // empty while it is off the air
  int channel = 0;        // the radio's; 0 for none
  int megahertz = 0;
  std::optional<int> stations;    // guests included; on the air only
  std::optional<bool> isPending;  // whether the settings differ from those that it runs with

  bool isRunning() const {
    return state == ApState::kOnAir || state == ApState::kWaitingForRadar || state == ApState::kOffBySchedule;
  }
};

// The settings of the adapter's model.
ApStatus ReadApStatus(const ApConf& conf);

std::span<const Field<ApStatus>> ApStatusFields();

// Whether the interface has the type of an access point, on the air or not.
bool IsAccessPoint(const std::string& interface);

// What became of an access point that has been started, for a sentence, such as "is on the air on channel 6".
std::string WhatBecameOf(const ApStatus& status);

#endif  // MERO_TOOLS_AP_STATUS_H
