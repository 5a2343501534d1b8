// The access point's settings, as they are shown and set.
#ifndef MERO_TOOLS_AP_SETTINGS_H
#define MERO_TOOLS_AP_SETTINGS_H

#include <optional>
#include <span>
#include <string>
#include <string_view>

#include "show/output.h"
#include "wireless.h"

using ApConf = MERO_AP_CONF;

enum class Show { kAlways, kOnRequest };  // secrets are shown on request

// One setting, by its key in the settings file: how it is shown and, where it has an option, how it is set.
struct ApSetting {
  Field<ApConf> field;
  const char* szValue = nullptr;  // what its option takes: words, and in capitals what stands for others
  const char* szHelp = nullptr;
  void (*set)(ApConf&, const std::string& text) = nullptr;  // fails with advice
  Show show = Show::kAlways;
  void (*setHours)(ApConf&, const std::string& hours) = nullptr;  // of a schedule, whose option takes a file or off

  bool hasOption() const { return set != nullptr; }
};

// Reads the settings of the adapter's model; false, with the defaults, when none were saved.
bool ReadSavedAp(ApConf& conf);

// The same, where defaults will do.
ApConf ReadApSettings();

// The option that sets a key, without its dashes: the key, with hyphens.
std::string OptionOf(std::string_view key);

// In the order in which they are shown and set.
std::span<const ApSetting> ApSettings();

std::vector<Field<ApConf>> ApFields(bool showSecrets);

// Set the secret of the main or of the guest network.
void SetApSecret(ApConf& conf, const std::string& secret);
void SetGuestSecret(ApConf& conf, const std::string& secret);

// Whether the main network is one of the 5 GHz band, and not of that at 2.4 GHz.
bool Is5GHz(const ApConf& conf);

// Whether an access point can be given this channel of a band.
bool IsChannelOfBand(int channel, bool is5GHz);

// Whether the main network's protection needs a secret and has none.
bool LacksSecret(const ApConf& conf);

// Fails when the settings together make no access point.
void RequireComplete(const ApConf& conf);

#endif  // MERO_TOOLS_AP_SETTINGS_H
