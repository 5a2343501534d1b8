// The country whose rules the radio is to keep to, and whose it keeps to.
#include "model/country.h"

#include <netlink/genl/genl.h>

#include <algorithm>
#include <chrono>
#include <cstring>
#include <fstream>
#include <iterator>
#include <thread>

#include "common/paths.h"
#include "model/library.h"
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
  auto* header = reinterpret_cast<nlmsghdr*>(message.data());
  nla_policy policy[NL80211_ATTR_MAX + 1] = {};
  policy[NL80211_ATTR_REG_ALPHA2].minlen = kWorld.size();
  policy[NL80211_ATTR_WIPHY].type = NLA_U32;
  nlattr* attributes[NL80211_ATTR_MAX + 1];
  if (genlmsg_parse(header, 0, attributes, NL80211_ATTR_MAX, policy) < 0) return;
  if (attributes[NL80211_ATTR_REG_ALPHA2] == nullptr) return;
  const std::string country(static_cast<const char*>(nla_data(attributes[NL80211_ATTR_REG_ALPHA2])), kWorld.size());
  if (attributes[NL80211_ATTR_WIPHY] == nullptr) {
    rules.kernel = country;
  } else if (attributes[NL80211_ATTR_WIPHY_SELF_MANAGED_REG] != nullptr &&
             static_cast<int>(nla_get_u32(attributes[NL80211_ATTR_WIPHY])) == radio) {
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

}  // namespace

std::string SavedCountry() {
  char szCountry[8];
  if (PLIBCFileGetKeyValue(kCountryPath, kKey, szCountry, sizeof szCountry, 0) <= 0) return "";
  return IsLetters(szCountry) ? szCountry : "";
}

void SaveCountry(const std::string& country) {
  const bool saved = country.empty() ? PLIBCSysUnlink(kCountryPath) == 0
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
  using std::chrono::steady_clock;
  constexpr std::chrono::seconds kLongest{4};
  constexpr std::chrono::milliseconds kPause{20};
  if (RequestRules(country) != 0) return false;
  const auto end = steady_clock::now() + kLongest;
  for (std::string kernel = ReadRules().kernel; kernel != country && kernel != kSeveral; kernel = ReadRules().kernel) {
    if (steady_clock::now() >= end) return false;
    std::this_thread::sleep_for(kPause);
  }
  return true;
}

std::string WhereRulesHold() {
  const std::string inForce = ReadRules().inForce();
  if (IsLetters(inForce)) return " in " + inForce;
  return inForce == kWorld && SavedCountry().empty() ? " without a country" : " here and now";
}

std::string HintAtCountry() {
  return SavedCountry().empty() ? "`merowireless country CC` tells the country; " : "";
}
