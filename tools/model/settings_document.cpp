// The document that holds the known networks and the access point's settings.
#include "model/settings_document.h"

#include <algorithm>
#include <cstdint>
#include <ctime>
#include <iterator>
#include <map>
#include <nlohmann/json.hpp>
#include <set>
#include <string_view>
#include <variant>

#include "base/clock.h"
#include "base/text.h"
#include "model/addressing.h"
#include "model/name_servers.h"
#include "model/security.h"

namespace {

using Json = nlohmann::ordered_json;

constexpr int kVersion = 1;
constexpr char kSecret[] = "secret";

// ---- Values ----

// A text is a string, or its bytes in hexadecimal where it is no UTF-8; one without a character is none.
Json JsonOf(const std::string& text) {
  if (text.empty()) return nullptr;
  if (IsUtf8(text)) return text;
  return {{"hex", Hex(text)}};
}

Json JsonOf(const Value& value) {
  if (const auto* text = std::get_if<std::string>(&value)) return JsonOf(*text);
  return std::visit([](const auto& held) { return Json(held); }, value);
}

// ---- Places ----

constexpr char kAccessPoint[] = "access_point";

// A key is whatever somebody has written there.
std::string Below(const std::string& place, const std::string& key) {
  constexpr std::size_t kLongest = 40;
  return place + "." + Harmless(key.substr(0, kLongest), false);
}

// Does what concerns a place, which is named when that fails.
template <class Act>
void At(const std::string& place, Act act) {
  try {
    act();
  } catch (const Failure& why) {
    throw WrongAt(place, why);
  }
}

// ---- Values that are read ----

// The bytes of {"hex": "..."}.
std::string BytesIn(const Json& value) {
  const auto hex = value.find("hex");
  if (value.size() != 1 || hex == value.end() || !hex->is_string()) {
    throw Wrong("this object is no text", R"(it is to be {"hex": "..."})");
  }
  std::string bytes = BytesOfHex(hex->get<std::string>());
  if (Hex(bytes) != Lower(hex->get<std::string>()))
    throw Wrong("these are no bytes", "write them as pairs of hex digits");
  return bytes;
}

// Null is a text without a character.
std::string TextIn(const Json& value) {
  constexpr std::size_t kLongest = 1024;
  if (value.is_null()) return "";
  if (!value.is_string() && !value.is_object()) throw Wrong("this is no text", "write it between quotes");
  std::string text = value.is_object() ? BytesIn(value) : value.get<std::string>();
  if (text.size() > kLongest) throw Wrong("the text is too long", "no setting is as long as this");
  return text;
}

bool TruthIn(const Json& value) {
  if (!value.is_boolean()) throw Wrong("this is no truth value", "write true or false");
  return value.get<bool>();
}

std::int64_t NumberIn(const Json& value) {
  const bool fits = !value.is_number_unsigned() || value.get<std::uint64_t>() <= std::uint64_t{INT32_MAX};
  if (!value.is_number_integer() || !fits) throw Wrong("this is no whole number", "write it without quotes or point");
  return value.get<std::int64_t>();
}

Value ValueIn(const Json& value) {
  if (value.is_null()) return nullptr;
  if (value.is_boolean()) return value.get<bool>();
  if (value.is_number()) return NumberIn(value);
  return TextIn(value);
}

// ---- Networks ----

// A network that is being read.
struct Reading {
  DocumentedNetwork& of;
  Addressing addressing;
};

void SetAddress(Reading& in, const std::string& text) {
  const auto address = ParseAddress(text);
  if (!address || !IsStation(*address)) {
    throw Wrong("this is no address of an access point", "write it as 00:11:22:33:44:55");
  }
  std::ranges::copy(*address, in.of.network.network.bssid);
}

void SetAuth(Reading& in, const std::string& text) {
  in.of.network.network.auth = MEROWirelessAuthParse(text.c_str());
  if (in.of.network.network.auth != WIRELESS_AUTH_UNKNOWN) return;
  throw Wrong("networks are not protected like this", "it is such as OPEN or WPA2PSK");
}

void SetEncryption(Reading& in, const std::string& text) {
  in.of.network.network.encrypt = MEROWirelessEncryptParse(text.c_str());
  if (in.of.network.network.encrypt != WIRELESS_ENCRYPT_UNKNOWN) return;
  throw Wrong("networks are not enciphered like this", "it is such as NONE or AES");
}

void SetMode(Reading& in, const std::string& text) {
  for (const WIRELESS_OPMODE mode : {WIRELESS_OPMODE_MANAGED, WIRELESS_OPMODE_ADHOC, WIRELESS_OPMODE_AUTO}) {
    in.of.network.network.opmode = mode;
    if (IsWord(text, MEROWirelessOpmodeStringGet(mode))) return;
  }
  throw Wrong("networks have no such mode", "it is MANAGED, ADHOC or AUTO");
}

void SetPriority(Reading& in, const Json& value) {
  const std::int64_t priority = NumberIn(value);
  if (priority < 0 || priority > kGreatestPriority) {
    throw Wrong("no network has this priority", "it is 0 to " + std::to_string(kGreatestPriority));
  }
  in.of.extras.priority = static_cast<int>(priority);
}

void SetSaved(Reading& in, const std::string& text) {
  if (text.empty()) return;
  const std::time_t saved = TimeOf(text);
  if (saved < 0 || saved > INT32_MAX) throw Wrong("this is no time", "write it as 2026-11-20T11:35:28Z");
  in.of.network.atime = static_cast<std::int32_t>(saved);
}

// A key of a network. Those that are not optional have to be there.
struct Row {
  const char* szKey;
  Json (*write)(const DocumentedNetwork&);
  void (*read)(Reading&, const Json&);
  bool isOptional = true;
};

constexpr Row kRows[] = {
    {"name", [](const DocumentedNetwork& of) { return JsonOf(std::string(of.network.network.szEssid)); },
     [](Reading& in, const Json& value) { SetNetworkName(in.of.network.network.szEssid, TextIn(value)); }, false},
    {"address", [](const DocumentedNetwork& of) { return JsonOf(AddressText(of.network.network.bssid)); },
     [](Reading& in, const Json& value) { SetAddress(in, TextIn(value)); }, false},
    {"auth", [](const DocumentedNetwork& of) { return Json(MEROWirelessAuthStringGet(of.network.network.auth)); },
     [](Reading& in, const Json& value) { SetAuth(in, TextIn(value)); }, false},
    {"encryption",
     [](const DocumentedNetwork& of) { return Json(MEROWirelessEncryptStringGet(of.network.network.encrypt, 0)); },
     [](Reading& in, const Json& value) { SetEncryption(in, TextIn(value)); }, false},
    {"mode", [](const DocumentedNetwork& of) { return Json(MEROWirelessOpmodeStringGet(of.network.network.opmode)); },
     [](Reading& in, const Json& value) { SetMode(in, TextIn(value)); }},
    {"ip", [](const DocumentedNetwork& of) { return JsonOf(std::string(of.network.szIp)); },
     [](Reading& in, const Json& value) { in.addressing.ip = value.is_null() ? "none" : TextIn(value); }},
    {"mask", [](const DocumentedNetwork& of) { return JsonOf(std::string(of.network.szMask)); },
     [](Reading& in, const Json& value) { in.addressing.mask = TextIn(value); }},
    {"gateway", [](const DocumentedNetwork& of) { return JsonOf(std::string(of.network.szGateway)); },
     [](Reading& in, const Json& value) { in.addressing.gateway = TextIn(value); }},
    {"name_servers", [](const DocumentedNetwork& of) { return JsonOf(of.extras.nameServers); },
     [](Reading& in, const Json& value) {
       if (!value.is_null()) in.of.extras.nameServers = CheckedNameServers(TextIn(value));
     }},
    {"priority", [](const DocumentedNetwork& of) { return Json(of.extras.priority); }, SetPriority},
    {"autojoin", [](const DocumentedNetwork& of) { return Json(of.extras.autojoin); },
     [](Reading& in, const Json& value) { in.of.extras.autojoin = TruthIn(value); }},
    {"saved",
     [](const DocumentedNetwork& of) {
       return of.network.atime == 0 ? Json(nullptr) : Json(UtcText(of.network.atime));
     },
     [](Reading& in, const Json& value) { SetSaved(in, TextIn(value)); }},
    {kSecret, [](const DocumentedNetwork& of) { return JsonOf(std::string(of.network.szKey)); },
     [](Reading& in, const Json& value) { SetText(in.of.network.szKey, TextIn(value), "the secret"); }},
};

// A secret that was not saved by this program may have characters that it takes from nobody.
void RequireUsable(const KnownNetwork& network) {
  if (!CanBeJoined(network.network)) throw Wrong("networks that are protected so cannot be joined", "leave it out");
  if (network.szKey[0] == '\0' || CanBeSecret(network.network.auth, network.szKey)) return;
  RequireSecretFor(network.network.auth, network.szKey);
}

DocumentedNetwork NetworkIn(const Json& record, const std::string& place) {
  DocumentedNetwork network{};
  network.network.network.opmode = WIRELESS_OPMODE_MANAGED;
  Reading in{.of = network, .addressing = {}};
  At(place, [&] {
    if (!record.is_object()) throw Wrong("this is no network", "it is to be an object");
    for (const Row& row : kRows) {
      if (!row.isOptional && !record.contains(row.szKey)) throw Wrong("a network lacks a key", row.szKey);
    }
  });
  for (const auto& item : record.items()) {
    const std::string& key = item.key();
    const Json& value = item.value();
    At(Below(place, key), [&] {
      const auto* row = std::ranges::find_if(kRows, [&](const Row& each) { return key == each.szKey; });
      if (row == std::end(kRows)) throw Wrong("networks have no such key", "leave it out");
      row->read(in, value);
    });
  }
  At(Below(place, "ip"), [&] { SetAddressing(network.network, in.addressing); });
  At(place, [&] { RequireUsable(network.network); });
  return network;
}

std::vector<DocumentedNetwork> NetworksIn(const Json& list) {
  constexpr std::size_t kMost = 1000;
  std::vector<DocumentedNetwork> networks;
  std::set<std::string> addresses;
  At("networks", [&] {
    if (!list.is_array()) throw Wrong("this is no list", "write it between brackets");
    if (list.size() > kMost) throw Wrong("there are too many networks", "1000 are the most");
  });
  for (const Json& record : list) {
    const std::string place = PlaceOfNetwork(networks.size());
    const DocumentedNetwork& network = networks.emplace_back(NetworkIn(record, place));
    At(Below(place, "address"), [&] {
      if (addresses.insert(AddressText(network.network.network.bssid)).second) return;
      throw Wrong("another network of the document has this address", "leave one of them out");
    });
  }
  return networks;
}

Json JsonOf(const DocumentedNetwork& section, Secrets secrets) {
  Json record = Json::object();
  for (const Row& row : kRows) {
    const bool isLeftOut = secrets == Secrets::kLeftOut && row.szKey == std::string_view(kSecret);
    if (!isLeftOut) record[row.szKey] = row.write(section);
  }
  return record;
}

// ---- The access point ----

// What has an option, and the secrets. The switch and what follows from others are no part of it.
bool IsDocumented(const ApSetting& setting, Secrets secrets) {
  return setting.hasOption() || (setting.show == Show::kOnRequest && secrets == Secrets::kIncluded);
}

Json JsonOf(const ApConf& conf, Secrets secrets) {
  Json record = Json::object();
  for (const ApSetting& setting : ApSettings()) {
    if (IsDocumented(setting, secrets)) record[std::string(setting.field.key)] = JsonOf(setting.field.value(conf));
  }
  return record;
}

// What is known of a value before it is set: texts stay texts, and where there is nothing anything may come.
void RequireSameType(const Value& there, const Value& value) {
  if (std::holds_alternative<std::nullptr_t>(there) || there.index() == value.index()) return;
  throw Wrong("this setting is of another type", "write it as `merowireless ap show --json` does");
}

void SetOne(ApConf& conf, const ApSetting& setting, const Value& value) {
  const auto* text = std::get_if<std::string>(&value);
  const bool isNothing = std::holds_alternative<std::nullptr_t>(value) || (text != nullptr && text->empty());
  if (setting.setHours != nullptr)
    return isNothing ? setting.set(conf, "off") : setting.setHours(conf, text != nullptr ? *text : "");
  if (isNothing) return;
  RequireSameType(setting.field.value(conf), value);
  if (setting.field.key == kSecret) return SetApSecret(conf, *text);
  if (!setting.hasOption()) return SetGuestSecret(conf, *text);
  if (const auto* truth = std::get_if<bool>(&value)) return setting.set(conf, *truth ? "yes" : "no");
  setting.set(conf, text != nullptr ? *text : std::to_string(std::get<std::int64_t>(value)));
}

DocumentedAp ApIn(const Json& record) {
  std::map<std::string, Value> values;
  At(kAccessPoint, [&] {
    if (!record.is_object()) throw Wrong("these are no settings", "they are to be an object");
  });
  for (const auto& item : record.items()) {
    const std::string& key = item.key();
    const Json& value = item.value();
    At(Below(kAccessPoint, key), [&] {
      const auto isNamed = [&](const ApSetting& each) {
        return key == each.field.key && IsDocumented(each, Secrets::kIncluded);
      };
      if (std::ranges::none_of(ApSettings(), isNamed))
        throw Wrong("access points have no such setting", "leave it out");
      values[key] = ValueIn(value);
    });
  }
  DocumentedAp ordered;
  for (const ApSetting& setting : ApSettings()) {
    const auto found = values.find(std::string(setting.field.key));
    if (found != values.end()) ordered.emplace_back(*found);
  }
  return ordered;
}

// ---- The text ----

// Refuses, while a text is being read, what no document has: depth, and a key twice in one object.
class Guard {
 public:
  bool operator()(int /*depth*/, Json::parse_event_t event, Json& value) {
    constexpr std::size_t kDeepest = 4;  // a text in hexadecimal of a network in a list
    switch (event) {
      case Json::parse_event_t::object_start:
      case Json::parse_event_t::array_start:
        keys_.emplace_back();
        if (keys_.size() > kDeepest) throw Wrong("the document is nested too deeply", "it has four levels at most");
        break;
      case Json::parse_event_t::object_end:
      case Json::parse_event_t::array_end:
        keys_.pop_back();
        break;
      case Json::parse_event_t::key:
        if (!keys_.back().insert(value.get<std::string>()).second) {
          throw Wrong(
              "the document has a key twice in one object" + Below("", value.get<std::string>()).replace(0, 1, ": "),
              "leave one of them out");
        }
        break;
      case Json::parse_event_t::value:
        break;
    }
    return true;
  }

 private:
  std::vector<std::set<std::string>> keys_;
};

// What the parser says of a text may repeat some of it, and so a secret.
Json Parsed(const std::string& text) {
  if (text.size() > kLongestDocument) throw Wrong("the document is too long", "1 MiB is the most");
  try {
    Guard guard;
    return Json::parse(text,
                       [&](int depth, Json::parse_event_t event, Json& value) { return guard(depth, event, value); });
  } catch (const Json::parse_error& error) {
    const auto end = text.begin() + static_cast<std::ptrdiff_t>(std::min(error.byte, text.size()));
    throw Wrong("the document is no JSON at line " + std::to_string(std::count(text.begin(), end, '\n') + 1),
                "`merowireless export` writes one");
  } catch (const Json::exception&) {
    throw Wrong("the document holds a number that is too great", "look at its numbers");
  }
}

}  // namespace

std::string DocumentOf(const std::vector<KnownNetwork>& networks, const std::optional<ApConf>& ap, Secrets secrets) {
  Json document = {{"version", kVersion}, {"networks", Json::array()}, {"access_point", nullptr}};
  for (const KnownNetwork& network : networks) {
    document["networks"].push_back(JsonOf(DocumentedNetwork{.network = network, .extras = ExtrasOf(network)}, secrets));
  }
  if (ap) document["access_point"] = JsonOf(*ap, secrets);
  return document.dump(1) + "\n";
}

SettingsDocument DocumentIn(const std::string& text) {
  const Json root = Parsed(text);
  if (!root.is_object() || !root.contains("version")) {
    throw Wrong("this is no document of settings", "`merowireless export` writes one");
  }
  if (root["version"] != kVersion) throw Wrong("the document is of another version", "this program reads version 1");
  SettingsDocument document;
  for (const auto& [key, value] : root.items()) {
    if (key == "version" || value.is_null()) continue;
    if (key == "networks") {
      document.networks = NetworksIn(value);
    } else if (key == kAccessPoint) {
      document.ap = ApIn(value);
    } else {
      throw WrongAt(Below("", key).substr(1), Wrong("documents have no such key", "leave it out"));
    }
  }
  return document;
}

void SetAp(ApConf& conf, const DocumentedAp& documented) {
  for (const auto& setting : documented) {
    const std::string& key = setting.first;
    const Value& value = setting.second;
    At(Below(kAccessPoint, key), [&] {
      SetOne(conf, *std::ranges::find(ApSettings(), key, [](const ApSetting& each) { return each.field.key; }), value);
    });
  }
  At(kAccessPoint, [&] { RequireComplete(conf); });
}

Failure WrongAt(const std::string& place, const Failure& why) {
  return {why.exit(), "the document is wrong at " + place, std::string(why.what()) + ": " + why.advice()};
}

std::string PlaceOfNetwork(std::size_t index) {
  return "networks[" + std::to_string(index) + "]";
}
