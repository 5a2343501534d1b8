// The country whose rules the radio is to keep to, and whose it keeps to.
#ifndef MERO_TOOLS_COUNTRY_H
#define MERO_TOOLS_COUNTRY_H

#include <optional>
#include <string>
#include <string_view>

// What stands in place of a country's two letters: the rules that can be kept everywhere, those of several countries at
// a time, and those of a driver.
inline constexpr std::string_view kWorld = "00";
inline constexpr std::string_view kSeveral = "98";
inline constexpr std::string_view kDrivers = "99";

// The one of the settings; empty where none is set.
std::string SavedCountry();

// Fails when somebody else has put something there that is no country.
void RequireSavedCountry();

// Notes a country, or with an empty one that there is none. Fails when that cannot be written.
void SaveCountry(const std::string& country);

// Whose rules radios keep to, by the kernel.
struct Rules {
  std::string kernel;                // empty where no radio has ever been
  std::optional<std::string> radio;  // those of the adapter's radio, where it has its own in place of the kernel's

  bool areThere() const { return !kernel.empty(); }
  const std::string& inForce() const { return radio ? *radio : kernel; }
};

Rules ReadRules();

// Whether the kernel's database has rules for a country; nothing when it cannot be read.
std::optional<bool> HasRules(std::string_view country);

// Asks the kernel to keep to the rules of a country, or of the world, and waits until it does; false when it does not.
// What the radio's driver, or the network that it is in, asks for holds too: those are the rules of several then.
bool FollowRules(std::string_view country);

// For a sentence: " in DE", " without a country" where none is set, or " here and now" for other rules.
std::string WhereRulesHold();

// Where no country is set, how to set one; else nothing.
std::string HintAtCountry();

#endif  // MERO_TOOLS_COUNTRY_H
