// The command about the country: country.
#include "commands/country.h"

#include <algorithm>
#include <cctype>

#include "base/signals.h"
#include "base/text.h"
#include "model/air.h"
#include "model/ap_state.h"
#include "model/ap_status.h"
#include "model/country.h"
#include "model/library.h"

namespace {

// ---- What is shown ----

struct Country {
  std::string saved;
  Rules rules;

  // Nothing where none is set, or where no radio has ever been.
  std::optional<bool> isInForce() const {
    return saved.empty() || !rules.areThere() ? std::nullopt : std::optional(rules.inForce() == saved);
  }
};

Country ReadCountry() {
  return {SavedCountry(), ReadRules()};
}

Value TextOrNothing(const std::string& text) {
  return text.empty() ? nullptr : Value(text);
}

// For a sentence, behind "those of" or the like.
std::string NameOfRules(const std::string& rules) {
  if (rules == kWorld) return "the whole world (00)";
  if (rules == kSeveral) return "several countries (98)";
  if (rules == kDrivers) return "its driver (99)";
  return rules;
}

Shown ShowInForce(const Country& of, bool) {
  const std::optional<bool> isInForce = of.isInForce();
  if (!isInForce) return {"-", Tone::kFaint};
  if (*isInForce) return {"yes", Tone::kGood};
  return {of.rules.radio ? "no: the radio has rules of its own" : "no: the kernel keeps to other rules", Tone::kBad};
}

constexpr Field<Country> kFields[] = {
    {"country", "country", [](const Country& of) { return TextOrNothing(of.saved); }, Layout::kLeft,
     [](const Country& of, bool) { return of.saved.empty() ? Shown{"none is set", Tone::kFair} : Shown{of.saved}; }},
    {"kernel", "kernel's rules", [](const Country& of) { return TextOrNothing(of.rules.kernel); }, Layout::kLeft,
     [](const Country& of, bool) {
       return of.rules.areThere() ? Shown{NameOfRules(of.rules.kernel)} : Shown{"-", Tone::kFaint};
     }},
    {"radio", "radio's own", [](const Country& of) { return of.rules.radio ? Value(*of.rules.radio) : nullptr; },
     Layout::kLeft,
     [](const Country& of, bool) {
       return of.rules.radio ? Shown{NameOfRules(*of.rules.radio)} : Shown{"-", Tone::kFaint};
     }},
    {"in_force", "in force", [](const Country& of) { return of.isInForce() ? Value(*of.isInForce()) : nullptr; },
     Layout::kLeft, ShowInForce},
};

// ---- What is set ----

// Two capital letters, or nothing for none.
std::string CountryIn(const std::string& text) {
  if (IsWord(text, "none") || text == kWorld) return "";
  std::string country = text;
  for (char& c : country) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  if (country.size() == 2 && std::ranges::all_of(country, [](char c) { return c >= 'A' && c <= 'Z'; })) return country;
  throw Wrong("this is no country", "give its two letters, such as DE, GB or US, or none");
}

Failure NoRules(const std::string& country) {
  return Wrong("the kernel knows no rules for " + country,
               "give a country's two letters as in ISO 3166, such as DE, GB or US");
}

// Of a country that the kernel was asked for.
Failure NotFollowed(const std::string& country) {
  if (country.empty()) return NoRules("the world");
  if (HasRules(country)) return NoRules(country);
  return {Exit::kFailed, "the kernel has no rules for " + country + ", and its database of rules cannot be read",
          "install the package wireless-regdb, and start the appliance anew"};
}

bool MayGoOn(const Air& air, const std::vector<Channel>& channels) {
  return std::ranges::any_of(channels, [&](const Channel& channel) {
    return channel.megahertz == air.megahertz &&
           (air.isAccessPoint ? channel.isForAccessPoints() : channel.use != ChannelUse::kNone);
  });
}

// The kernel would end what uses a channel that may not be used any more, a minute later.
void RequireChannelInUse() {
  const std::string interface = MEROWirelessAPInterfaceGet();
  const auto air = AirOf(interface);
  if (!air || air->megahertz == 0) return;
  const auto channels = ChannelsOf(interface);
  if (channels.empty() || MayGoOn(*air, channels)) return;
  throw Failure(Exit::kBusy,
                "channel " + std::to_string(air->channel) + " may not be used" + WhereRulesHold() + ", and is in use",
                air->isAccessPoint ? "give the access point another one with `merowireless ap set --channel`, or "
                                     "take it down with `merowireless ap disable`"
                                   : "`merowireless disconnect` ends the connection first");
}

// Rules that were put together of several cannot be asked for, but the country that was set can.
void GoBackTo(const Country& former) {
  const bool isMade = former.rules.kernel == kSeveral || former.rules.kernel == kDrivers;
  const std::string before = isMade ? former.saved : former.rules.kernel;
  if (ReadRules().kernel == former.rules.kernel || FollowRules(before.empty() ? kWorld : before)) return;
  throw Failed("the rules that the radio kept to could not be brought back");
}

bool Follow(const Task& task, const std::string& country) {
  return Run<bool>(task, [&] { return FollowRules(country.empty() ? kWorld : country); });
}

std::string WhatBecame(const Country& now) {
  if (now.saved.empty()) return "no country is set";
  std::string sentence = "the country is " + now.saved;
  if (!now.rules.areThere()) return sentence + ", and holds once an adapter is plugged in";
  if (now.isInForce() == false) {
    return sentence +
           (now.rules.radio ? ", and the adapter's radio keeps to rules of its own, those of "
                            : ", and the kernel keeps to the rules of ") +
           NameOfRules(now.rules.inForce());
  }
  if (!IsAccessPoints() || ReadApStatus(ReadApSettings()).isPending != true) return sentence;
  return sentence + "; `merowireless ap enable` has the access point tell of it";
}

}  // namespace

void ShowCountry(const Program& program) {
  RequireSavedCountry();
  program.output.One<Country>("country", kFields, ReadCountry());
}

void SetCountry(const Program& program, const std::string& text) {
  const std::string country = CountryIn(text);
  if (!country.empty() && HasRules(country) == false) throw NoRules(country);
  const Country former = ReadCountry();
  const Signals signals;  // none comes between two steps: the next one that takes time ends with it
  Task task = program.Doing("setting the country");
  task.undo = [&] { GoBackTo(former); };
  try {
    if (former.rules.areThere() && !Follow(task, country)) throw NotFollowed(country);
    RequireChannelInUse();
    SaveCountry(country);
  } catch (const Failure&) {
    if (former.rules.areThere()) Undo(task);
    throw;
  }
  const Country now = ReadCountry();
  program.output.Done<Country>(WhatBecame(now), "country", kFields, now);
}
