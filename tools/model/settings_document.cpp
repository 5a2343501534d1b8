// The document that holds the known networks and the access point's settings.
#include "model/settings_document.h"

#include <nlohmann/json.hpp>
#include <string_view>
#include <variant>

#include "base/clock.h"
#include "base/text.h"
#include "model/network_extras.h"

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

// ---- Networks ----

// A section of the store.
struct Section {
  KnownNetwork network;
  Extras extras;
};

struct Row {
  const char* szKey;
  Json (*write)(const Section&);
};

constexpr Row kRows[] = {
    {"name", [](const Section& of) { return JsonOf(std::string(of.network.network.szEssid)); }},
    {"address", [](const Section& of) { return JsonOf(AddressText(of.network.network.bssid)); }},
    {"auth", [](const Section& of) { return Json(MEROWirelessAuthStringGet(of.network.network.auth)); }},
    {"encryption", [](const Section& of) { return Json(MEROWirelessEncryptStringGet(of.network.network.encrypt, 0)); }},
    {"mode", [](const Section& of) { return Json(MEROWirelessOpmodeStringGet(of.network.network.opmode)); }},
    {"ip", [](const Section& of) { return JsonOf(std::string(of.network.szIp)); }},
    {"mask", [](const Section& of) { return JsonOf(std::string(of.network.szMask)); }},
    {"gateway", [](const Section& of) { return JsonOf(std::string(of.network.szGateway)); }},
    {"name_servers", [](const Section& of) { return JsonOf(of.extras.nameServers); }},
    {"priority", [](const Section& of) { return Json(of.extras.priority); }},
    {"autojoin", [](const Section& of) { return Json(of.extras.autojoin); }},
    {"saved",
     [](const Section& of) { return of.network.atime == 0 ? Json(nullptr) : Json(UtcText(of.network.atime)); }},
    {kSecret, [](const Section& of) { return JsonOf(std::string(of.network.szKey)); }},
};

Json JsonOf(const Section& section, Secrets secrets) {
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

}  // namespace

std::string DocumentOf(const std::vector<KnownNetwork>& networks, const std::optional<ApConf>& ap, Secrets secrets) {
  Json document = {{"version", kVersion}, {"networks", Json::array()}, {"access_point", nullptr}};
  for (const KnownNetwork& network : networks) {
    document["networks"].push_back(JsonOf({.network = network, .extras = ExtrasOf(network)}, secrets));
  }
  if (ap) document["access_point"] = JsonOf(*ap, secrets);
  return document.dump(1) + "\n";
}
