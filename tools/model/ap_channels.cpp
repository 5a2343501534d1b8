// The channels that an access point may use here and now.
#include "model/ap_channels.h"

#include <algorithm>

#include "model/air.h"
#include "model/country.h"
#include "model/library.h"

namespace {

std::string ListOf(const std::vector<Channel>& channels, bool is5GHz) {
  std::string list;
  for (const Channel& channel : channels) {
    if (channel.is5GHz() != is5GHz || !IsChannelOfBand(channel.number, is5GHz)) continue;
    list += (list.empty() ? "" : ", ") + std::to_string(channel.number) +
            (channel.use == ChannelUse::kAllAfterRadar ? " (radar)" : "");
  }
  return list.empty() ? "none" : list;
}

}  // namespace

ChannelCheck CheckChannel(const ApConf& conf) {
  const int number = conf.hostapConf.channel;
  if (number == 0) return ChannelCheck::kPassed;
  std::vector<Channel> channels = ChannelsOf(MEROWirelessAPInterfaceGet());
  if (channels.empty()) return ChannelCheck::kNobodyCanTell;
  std::erase_if(channels, [](const Channel& channel) { return !channel.isForAccessPoints(); });
  const bool isAllowed = std::ranges::any_of(
      channels, [&](const Channel& channel) { return channel.number == number && channel.is5GHz() == Is5GHz(conf); });
  if (isAllowed) return ChannelCheck::kPassed;
  throw Wrong("this radio may not use channel " + std::to_string(number) + WhereRulesHold(),
              HintAtCountry() + "it may use " + ListOf(channels, false) + " in the 2.4 GHz band, and " +
                  ListOf(channels, true) + " in the 5 GHz band");
}
