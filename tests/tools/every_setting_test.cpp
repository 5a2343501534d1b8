// Each setting of the library's table stands, with its default, wherever settings do.
#include <algorithm>
#include <iterator>
#include <map>
#include <set>
#include <sstream>

#include "common/ap_settings.h"
#include "common/paths.h"
#include "model/ap_settings.h"
#include "running.h"
#include "tests/unit/ap_settings.h"

namespace {

// ---- The table ----

std::string DefaultOf(const Setting& setting) {
  switch (setting.kind) {
    case SettingKind::kSwitch:
      return setting.missing != FALSE ? "yes" : "no";
    case SettingKind::kInteger:
      return std::to_string(setting.missing);
    case SettingKind::kText:
      return *setting.szMissing == '\0'                    ? "empty"
             : setting.szMissing == std::string(kAlwaysOn) ? "all 1"
                                                           : setting.szMissing;
    default:
      return "";
  }
}

// The default of each key, as the manual has it; none of those of guests that are a main network's with a prefix.
std::map<std::string, std::string> Defaults() {
  std::map<std::string, std::string> defaults;
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.szKey != nullptr) defaults[setting.szKey] = DefaultOf(setting);
  }
  for (const auto& [encryption, setting] : kSecretSettings) defaults[setting.szKey] = DefaultOf(setting);
  return defaults;
}

// ---- Where settings stand ----

// Keys without an option: the switches, which have commands; those that another key's option sets along with it;
// secrets, which come from files; and what is written for others.
const std::set<std::string> kNoOptions = {"enable",
                                          "unblock",
                                          "ieee80211n",
                                          "wpa",
                                          "wifi_sched_enabled",
                                          "guest_net_sched_enable",
                                          "wep_key0",
                                          "wpa_passphrase",
                                          "auth_server_shared_secret",
                                          "bssid"};

// What the program has that is no key: a part of hw_mode, and what stands for whichever secret there is.
const std::set<std::string> kNoKeys = {"band", "has_secret", "guest_net_has_secret", "secret", "guest_net_secret"};

std::set<std::string> Options() {
  std::set<std::string> options;
  for (const ApSetting& setting : ApSettings()) {
    if (setting.hasOption()) options.insert(std::string(setting.field.key));
  }
  return options;
}

std::string Document(const std::string& path) {
  return ReadText(std::string(MERO_SOURCE) + "/" + path);
}

std::vector<std::string> Split(const std::string& text, const std::string& between) {
  std::vector<std::string> parts;
  for (size_t begin = 0; begin <= text.size();) {
    const size_t end = std::min(text.find(between, begin), text.size());
    parts.push_back(text.substr(begin, end - begin));
    begin = end + between.size();
  }
  return parts;
}

// The keys that the page lists, each with what stands in brackets in its place.
std::map<std::string, std::string> DefaultsInTheManual() {
  std::map<std::string, std::string> defaults;
  for (const std::string& item : Split(Document("docs/man/mero-wireless_ap.conf.5"), "\n.It Li ")) {
    const size_t line = item.find('\n');
    const size_t open = item.find('[');
    std::vector<std::string> values;
    if (open < item.size()) values = Split(item.substr(open + 1, item.find(']', open) - open - 1), ", ");
    const std::vector<std::string> keys = Split(item.substr(0, line), " , ");
    for (size_t i = 0; i < keys.size(); ++i) defaults[keys[i]] = i < values.size() ? values[i] : "";
  }
  return defaults;
}

std::set<std::string> KeysOfTheUnitTests() {
  std::set<std::string> keys{"enable", "unblock", "bssid"};
  for (const NumberKey& key : kNumberKeys) keys.insert(key.szKey);
  for (const TextKey& key : kTextKeys) keys.insert(key.szKey);
  return keys;
}

bool Has(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

// ---- The promises ----

class EverySetting : public ToolTest {};

TEST_F(EverySetting, StandsWhereverSettingsDo) {
  const std::set<std::string> options = Options();
  const std::set<std::string> unit = KeysOfTheUnitTests();
  const std::map<std::string, std::string> manual = DefaultsInTheManual();
  const std::string program = Document("docs/man/merowireless.1");
  const std::string screens = ReadText(MERO_SCREENS);
  const std::string lines = OfficeLines(AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_PSK) +
                            OfficeLines(AP_ENCRYPT_WPA_EAP, AP_ENCRYPT_WEP) +
                            OfficeLines(AP_ENCRYPT_WEP, AP_ENCRYPT_OPEN);
  std::ostringstream missing;  // a line for each place
  for (const auto& [key, standard] : Defaults()) {
    const auto described = manual.find(key);
    if (described == manual.end() || described->second != standard) {
      missing << "docs/man/mero-wireless_ap.conf.5: .It Li " << key << " with [" << standard << "]\n";
    }
    if (!unit.contains(key) || !Has(lines, "\t" + key + "=")) missing << "tests/unit/ap_settings.h: " << key << "\n";
    if (kNoOptions.contains(key)) continue;
    if (!options.contains(key)) missing << "the program's ap_settings.cpp: " << key << "\n";
    if (!Has(program, "Fl -" + OptionOf(key) + " ")) missing << "docs/man/merowireless.1: --" << OptionOf(key) << "\n";
    if (!Has(screens, "\"" + key + "\":")) missing << "tests/tools/screens.txt: " << key << "\n";
  }
  EXPECT_EQ(missing.str(), "") << "these places lack a setting, or its default";
}

TEST_F(EverySetting, HasTheNameInTheProgramThatItHasInTheFile) {
  std::set<std::string> keys = kNoKeys;
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.szKey != nullptr) keys.insert(setting.szKey);
  }
  for (const auto& [encryption, setting] : kSecretSettings) {
    keys.insert(setting.szKey);
    keys.insert(kGuestPrefix + std::string(setting.szKey));
  }
  for (const ApSetting& setting : ApSettings()) {
    EXPECT_TRUE(keys.contains(std::string(setting.field.key))) << setting.field.key;
    EXPECT_TRUE(setting.field.title.empty() || setting.field.title == setting.field.key) << setting.field.title;
  }
}

TEST_F(EverySetting, TakesTheWordsThatItsHelpHas) {
  for (const ApSetting& setting : ApSettings()) {
    if (!setting.hasOption()) continue;
    for (const std::string& word : Split(setting.szValue, "|")) {
      if (std::ranges::any_of(word, [](char c) { return c >= 'A' && c <= 'Z'; })) continue;
      try {
        ApConf conf = library::Office();
        setting.set(conf, word);
      } catch (const Failure& failure) {
        EXPECT_THAT(failure.what(), testing::Not(testing::HasSubstr("cannot be this"))) << setting.field.key << word;
      }
    }
  }
}

TEST_F(EverySetting, ThatNothingWasSavedForIsWhatTheManualSays) {
  const std::string manual = Document("docs/man/mero-wireless_ap.conf.5");
  for (const char* szDefault : {kUnsavedSsid, kNatBridge}) {
    EXPECT_TRUE(Has(manual, "\n.Li " + std::string(szDefault) + " ,\n")) << szDefault;
  }
}

}  // namespace
