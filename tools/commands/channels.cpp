// The command about channels: channels; and the choice of one.
#include "commands/channels.h"

#include <algorithm>
#include <iterator>

#include "model/country.h"
#include "model/heard_channels.h"
#include "model/library.h"
#include "show/signal.h"

namespace {

// What an access point may do on a channel.
struct UseText {
  ChannelUse use;
  Tone tone;
  const char* szKey;
  const char* szText;
};

constexpr UseText kUseTexts[] = {
    {ChannelUse::kAll, Tone::kGood, "all", "yes"},
    {ChannelUse::kAllAfterRadar, Tone::kGood, "after-radar", "yes, after radar"},
    {ChannelUse::kListening, Tone::kFair, "listening", "listening only"},
    {ChannelUse::kNone, Tone::kBad, "none", "no"},
};

Value UseOf(const HeardChannel& of) {
  const auto* text = std::ranges::find(kUseTexts, of.use, &UseText::use);
  return text != std::end(kUseTexts) ? Value(text->szKey) : nullptr;
}

Shown ShowUse(const HeardChannel& of, bool) {
  const auto* text = std::ranges::find(kUseTexts, of.use, &UseText::use);
  return text != std::end(kUseTexts) ? Shown{text->szText, text->tone} : Shown{"-", Tone::kFaint};
}

constexpr Field<HeardChannel> kFields[] = {
    {"band", "BAND", [](const HeardChannel& of) { return Value(of.is5GHz ? "5" : "2.4"); }, Layout::kLeft,
     [](const HeardChannel& of, bool) { return Shown{of.is5GHz ? "5 GHz" : "2.4 GHz"}; }},
    {"channel", "CH", [](const HeardChannel& of) { return Value(std::int64_t{of.number}); }, Layout::kRight},
    {"networks", "NETWORKS", [](const HeardChannel& of) { return Value(std::int64_t{of.networks}); }, Layout::kRight},
    {"strongest", "STRONGEST",
     [](const HeardChannel& of) { return of.strongest ? Value(std::int64_t{*of.strongest}) : nullptr; }, Layout::kLeft,
     [](const HeardChannel& of, bool utf8) {
       return of.strongest ? ShowSignal(*of.strongest, utf8) : Shown{"-", Tone::kFaint};
     }},
    {"load", "LOAD", [](const HeardChannel& of) { return Value(std::int64_t{of.load}); }, Layout::kRight},
    {"use", "FOR ACCESS POINTS", UseOf, Layout::kLeft, ShowUse},
    {"quietest", "QUIETEST", [](const HeardChannel& of) { return Value(of.isQuietest); }, Layout::kLeft,
     [](const HeardChannel& of, bool) {
       return of.isQuietest ? Shown{"quietest", Tone::kGood} : Shown{"-", Tone::kFaint};
     }},
};

std::vector<HeardChannel> Listen(const Program& program, Results results) {
  const auto networks = NetworksInRange(program, results);
  return HeardChannels(networks, ChannelsOf(MEROWirelessInterfaceGet()));
}

}  // namespace

void ShowChannels(const Program& program, Results results) {
  RequireAdapter();
  program.output.List<HeardChannel>("channels", kFields, Listen(program, results),
                                    "nothing was heard, and the radio does not tell which channels it knows");
  if (SavedCountry().empty()) {
    Remark("merowireless: no country is set, which may open more channels: `merowireless country CC` sets it");
  }
}

std::optional<int> QuietestChannel(const Program& program, bool is5GHz) {
  RequireAdapter();
  if (ChannelsOf(MEROWirelessInterfaceGet()).empty()) return std::nullopt;
  const auto channels = Listen(program, Results::kUsable);
  if (const auto quietest = QuietestOf(channels, is5GHz)) return quietest;
  const std::string band = is5GHz ? "5" : "2.4";
  throw Wrong("the rules" + WhereRulesHold() + " leave an access point no channel of the " + band + " GHz band",
              HintAtCountry() + "--band " + (is5GHz ? "2.4" : "5") + " is the other one");
}
