// The supplicant's settings, which hold the network that the library joined last, with its secret.
#include "model/supplicant_settings.h"

#include <algorithm>
#include <map>

#include "base/text.h"
#include "common/text.h"

namespace {

using Values = std::map<std::string_view, std::string_view>;

// A line of the network's block is "\tKEY=VALUE".
Values ValuesIn(std::string_view text) {
  Values values;
  while (!text.empty()) {
    const std::string_view line = text.substr(0, text.find('\n'));
    text.remove_prefix(std::min(line.size() + 1, text.size()));
    const std::size_t equals = line.find('=');
    if (line.starts_with('\t') && equals != line.npos) values[line.substr(1, equals - 1)] = line.substr(equals + 1);
  }
  return values;
}

std::string_view ValueOf(const Values& values, std::string_view key) {
  const auto found = values.find(key);
  return found != values.end() ? found->second : std::string_view();
}

// Texts stand between quotes, and nothing in them is escaped; a WEP key in digits has no quotes.
std::string_view TextOf(const Values& values, std::string_view key) {
  const std::string_view value = ValueOf(values, key);
  const bool quoted = value.size() >= 2 && value.starts_with('"') && value.ends_with('"');
  return quoted ? value.substr(1, value.size() - 2) : value;
}

WIRELESS_ENCRYPT Ciphers(std::string_view pairwise) {
  constexpr auto kBoth = static_cast<WIRELESS_ENCRYPT>(WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES);
  for (const WIRELESS_ENCRYPT ciphers : {WIRELESS_ENCRYPT_TKIP, WIRELESS_ENCRYPT_AES, kBoth}) {
    if (pairwise == MEROWirelessEncryptStringGet(ciphers, 1)) return ciphers;
  }
  return WIRELESS_ENCRYPT_UNKNOWN;
}

bool SetProtection(KnownNetwork& config, const Values& values) {
  const std::string_view management = ValueOf(values, "key_mgmt");
  const bool wep = values.contains("wep_key0");
  config.network.encrypt = Ciphers(ValueOf(values, "pairwise"));
  if (management == "NONE") {
    config.network.auth = wep ? WIRELESS_AUTH_SHARED : WIRELESS_AUTH_OPEN;
    config.network.encrypt = wep ? WIRELESS_ENCRYPT_WEP : WIRELESS_ENCRYPT_NONE;
    CopyText(config.szKey, TextOf(values, "wep_key0"));
  } else if (management == "WPA-PSK") {
    config.network.auth = WIRELESS_AUTH_WPA2PSK;
    CopyText(config.szKey, TextOf(values, "psk"));
  } else if (management == "WPA-EAP") {
    config.network.auth = WIRELESS_AUTH_WPA2EAP;
    CopyText(config.szUser, TextOf(values, "identity"));
    CopyText(config.szKey, TextOf(values, "password"));
  } else {
    return false;
  }
  return true;
}

}  // namespace

std::optional<KnownNetwork> ConfiguredNetwork(std::string_view text) {
  const Values values = ValuesIn(text);
  KnownNetwork config{};
  if (!values.contains("ssid") || !SetProtection(config, values)) return std::nullopt;
  CopyText(config.network.szEssid, TextOf(values, "ssid"));
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  const auto address = ParseAddress(ValueOf(values, "bssid"));
  if (address) std::ranges::copy(*address, config.network.bssid);
  config.noneBssid = address ? 0 : 1;
  return config;
}
