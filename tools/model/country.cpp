// The country whose rules the radio is to keep to, and whose it keeps to.
#include "model/country.h"

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <fstream>
#include <iterator>

#include "base/await.h"
#include "common/paths.h"
#include "model/attributes.h"
#include "model/library.h"
#include "model/settings_change.h"
#include "model/wireless_stack.h"

namespace {

constexpr char kKey[] = "country";
constexpr char kFormat[] = "%s=\"%s\"\n";

// The kernel reads its database from there.
constexpr const char* kDatabases[] = {"/lib/firmware/updates/regulatory.db", "/lib/firmware/regulatory.db"};

std::optional<int> RadioOf(const std::string& interface) {
  int radio = 0;
  if (std::ifstream("/sys/class/net/" + interface + "/phy80211/index") >> radio) return radio;
  return std::nullopt;
}

void Take(std::string& message, std::optional<int> radio, Rules& rules) {
  const nlattr* letters = AttributeOf(message, NL80211_ATTR_REG_ALPHA2);
  if (letters == nullptr || nla_len(letters) < static_cast<int>(kWorld.size())) return;
  const std::string country(static_cast<const char*>(nla_data(letters)), kWorld.size());
  const auto owner = ValueIn<std::uint32_t>(AttributeOf(message, NL80211_ATTR_WIPHY));
  const bool isOwn = AttributeOf(message, NL80211_ATTR_WIPHY_SELF_MANAGED_REG) != nullptr;
  if (!owner) {
    rules.kernel = country;
  } else if (isOwn && static_cast<int>(*owner) == radio) {
    rules.radio = country;
  }
}

// The database begins with a word of its own and a version, four bytes each. A row of each country follows: its
// letters, and two bytes that tell where its rules are. A row of zeros ends them.
std::optional<bool> HasRow(std::istream& database, std::string_view country) {
  char head[8];
  if (!database.read(head, sizeof head) || !std::string_view(head, sizeof head).starts_with("RGDB"))
    return std::nullopt;
  for (char row[4]; database.read(row, sizeof row);) {
    if (row[0] == '\0') return false;
    if (std::string_view(row, 2) == country) return true;
  }
  return std::nullopt;
}

bool IsLetters(std::string_view country) {
  return country.size() == kWorld.size() && std::ranges::all_of(country, [](char c) { return c >= 'A' && c <= 'Z'; });
}

// As it stands there, whatever that is.
std::string TextInSettings() {
  char szText[8];
  return PLIBCFileGetKeyValue(kCountryPath, kKey, szText, sizeof szText, 0) > 0 ? szText : "";
}

}  // namespace

std::string SavedCountry() {
  const std::string country = TextInSettings();
  return IsLetters(country) ? country : "";
}

void RequireSavedCountry() {
  const std::string country = TextInSettings();
  if (country.empty() || IsLetters(country)) return;
  throw Failed(std::string(kCountryPath) + " has a country that is none, and no access point starts with it",
               "`merowireless country CC` sets one");
}

void SaveCountry(const std::string& country) {
  const bool saved = country.empty() ? RemoveSettings(kCountryPath)
                                     : PLIBCFileSetKeyValue(kCountryPath, kKey, country.c_str(), kFormat) > 0;
  if (!saved) throw Failed("the country could not be saved", "is there room on the disk? -v shows more");
}

Rules ReadRules() {
  Rules rules;
  const auto radio = RadioOf(MEROWirelessAPInterfaceGet());
  for (std::string& message : AskForRules()) Take(message, radio, rules);
  return rules;
}

std::optional<bool> HasRules(std::string_view country) {
  for (const char* szPath : kDatabases) {
    if (std::ifstream database(szPath, std::ios::binary); database) return HasRow(database, country);
  }
  return std::nullopt;
}

// A kernel that asks a program for rules waits for it for three seconds, and goes back to those of the world then.
bool FollowRules(std::string_view country) {
  constexpr std::chrono::seconds kLongest{4};
  constexpr std::chrono::milliseconds kPause{20};
  if (RequestRules(country) != 0) return false;
  return Await(kLongest, kPause, [&] {
    const std::string kernel = ReadRules().kernel;
    return kernel == country || kernel == kSeveral;
  });
}

std::string WhereRulesHold() {
  const std::string inForce = ReadRules().inForce();
  if (IsLetters(inForce)) return " in " + inForce;
  return inForce == kWorld && SavedCountry().empty() ? " without a country" : " here and now";
}

std::string HintAtCountry() {
  return SavedCountry().empty() ? "`merowireless country CC` tells the country; " : "";
}
