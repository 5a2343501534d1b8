// The command about channels: channels; and the choice of one.
#ifndef MERO_TOOLS_COMMANDS_CHANNELS_H
#define MERO_TOOLS_COMMANDS_CHANNELS_H

#include <optional>

#include "commands/networks.h"

// What is on the air, channel by channel.
void ShowChannels(const Program& program, Results results);

// The quietest channel of a band. Fails when an access point may use none; nothing where the radio does not tell which
// it knows.
std::optional<int> QuietestChannel(const Program& program, bool is5GHz);

#endif  // MERO_TOOLS_COMMANDS_CHANNELS_H
