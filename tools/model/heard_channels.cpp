// What was heard on each channel, and which of them is the quietest.
#include "model/heard_channels.h"

#include <algorithm>
#include <cstdlib>
#include <map>
#include <tuple>

#include "model/ap_settings.h"
#include "show/signal.h"

namespace {

constexpr int kFirstOf5GHz = 15;  // by its number: 14 is the last one of 2.4 GHz
constexpr int kReach = 5;         // at 2.4 GHz, channels that are so far apart leave each other alone

int ReachAt(const HeardChannel& channel) {
  return channel.is5GHz ? 1 : kReach;
}

void Hear(HeardChannel& channel, const WIRELESS_NETWORK& network) {
  const int distance = std::abs(network.channel - channel.number);
  const int reach = ReachAt(channel);
  if ((network.channel >= kFirstOf5GHz) != channel.is5GHz || distance >= reach) return;
  channel.load += QualityOf(network.signal) * (reach - distance) / reach;
  if (distance != 0) return;
  ++channel.networks;
  const auto isStronger = [&] { return QualityOf(network.signal) > QualityOf(*channel.strongest); };
  if (!channel.strongest || isStronger()) channel.strongest = network.signal;
}

// Channel 14 is for the oldest standard alone, and in one country.
bool IsCandidate(const HeardChannel& channel, bool is5GHz) {
  constexpr int kJapans = 14;
  const bool mayBegin = channel.use == ChannelUse::kAll || channel.use == ChannelUse::kAllAfterRadar;
  return channel.is5GHz == is5GHz && mayBegin && channel.number != kJapans;
}

// What is the least for the quietest.
auto RankOf(const HeardChannel& channel) {
  const bool hasRoom = channel.is5GHz || channel.number % kReach == 1;
  return std::tuple(channel.load, channel.use == ChannelUse::kAllAfterRadar, !hasRoom, channel.number);
}

void MarkQuietest(std::vector<HeardChannel>& channels, bool is5GHz) {
  HeardChannel* quietest = nullptr;
  for (HeardChannel& channel : channels) {
    if (!IsCandidate(channel, is5GHz)) continue;
    if (quietest == nullptr || RankOf(channel) < RankOf(*quietest)) quietest = &channel;
  }
  if (quietest != nullptr) quietest->isQuietest = true;
}

}  // namespace

std::vector<HeardChannel> HeardChannels(const std::vector<WIRELESS_NETWORK>& networks,
                                        const std::vector<Channel>& channels) {
  std::map<int, HeardChannel> byNumber;
  for (const Channel& channel : channels) {
    if (!IsChannelOfBand(channel.number, channel.is5GHz())) continue;
    byNumber[channel.number].use = channel.use;
  }
  for (const WIRELESS_NETWORK& network : networks) {
    if (network.channel <= 0) continue;  // a row that does not tell it
    byNumber.try_emplace(network.channel);
  }
  std::vector<HeardChannel> heard;
  for (auto& [number, channel] : byNumber) {
    channel.number = number;
    channel.is5GHz = number >= kFirstOf5GHz;
    for (const WIRELESS_NETWORK& network : networks) Hear(channel, network);
    heard.push_back(channel);
  }
  for (const bool is5GHz : {false, true}) MarkQuietest(heard, is5GHz);
  return heard;
}

std::optional<int> QuietestOf(std::span<const HeardChannel> channels, bool is5GHz) {
  const auto quietest = std::ranges::find_if(
      channels, [&](const HeardChannel& channel) { return channel.isQuietest && channel.is5GHz == is5GHz; });
  return quietest != channels.end() ? std::optional(quietest->number) : std::nullopt;
}
