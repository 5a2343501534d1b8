// The text by which a phone joins a network: WIFI:T:WPA;S:NAME;P:SECRET;H:true;;
#include "model/join_code.h"

#include <algorithm>
#include <cctype>
#include <optional>

#include "model/ap_protection.h"

namespace {

enum class Protection { kOpen, kWep, kWpa };

struct Words {
  const char* szWord;  // for the code's record
  const char* szType;  // in its text
};

Words WordsOf(Protection protection) {
  switch (protection) {
    case Protection::kOpen:
      return {"open", "nopass"};
    case Protection::kWep:
      return {"wep", "WEP"};
    case Protection::kWpa:
      return {"wpa", "WPA"};
  }
  return {};
}

bool IsHexadecimal(std::string_view text) {
  return !text.empty() && std::ranges::all_of(text, [](unsigned char c) { return std::isxdigit(c) != 0; });
}

std::string Escaped(std::string_view text) {
  std::string escaped;
  for (const char c : text) {
    if (std::string_view(R"(\;,:")").find(c) != std::string_view::npos) escaped += '\\';
    escaped += c;
  }
  return escaped;
}

// A text of hexadecimal digits alone would be taken for the bytes that they stand for, so it has quotes.
std::string TextField(std::string_view text) {
  return IsHexadecimal(text) ? std::string(1, '"').append(text).append(1, '"') : Escaped(text);
}

// A WEP key and a key of WPA may be given as their bytes.
bool AreBytes(Protection protection, std::string_view secret) {
  const std::size_t size = secret.size();
  const bool fits = protection == Protection::kWep ? size == 10 || size == 26 : size == 64;
  return fits && IsHexadecimal(secret);
}

JoinCode Code(std::string_view name, Protection protection, std::string_view secret, bool isHidden) {
  const Words words = WordsOf(protection);
  std::string text = std::string("WIFI:T:") + words.szType + ";S:" + TextField(name) + ";";
  if (protection != Protection::kOpen) {
    text += "P:" + (AreBytes(protection, secret) ? std::string(secret) : TextField(secret)) + ";";
  }
  if (isHidden) text += "H:true;";
  return {.name = std::string(name), .szProtection = words.szWord, .isHidden = isHidden, .text = text + ";"};
}

std::optional<Protection> ProtectionOf(const Network& network) {
  switch (network.auth) {
    case WIRELESS_AUTH_OPEN:
      return network.encrypt == WIRELESS_ENCRYPT_WEP ? Protection::kWep : Protection::kOpen;
    case WIRELESS_AUTH_SHARED:
    case WIRELESS_AUTH_WEPAUTO:
      return Protection::kWep;
    case WIRELESS_AUTH_WPAPSK:
    case WIRELESS_AUTH_WPA2PSK:
      return Protection::kWpa;
    default:
      return std::nullopt;
  }
}

std::optional<Protection> ProtectionOf(MERO_AP_ENCRYPT encryption) {
  switch (encryption) {
    case AP_ENCRYPT_OPEN:
      return Protection::kOpen;
    case AP_ENCRYPT_WEP:
      return Protection::kWep;
    case AP_ENCRYPT_WPA_PSK:
      return Protection::kWpa;
    default:
      return std::nullopt;
  }
}

bool IsEap(const Network& network) {
  return network.auth == WIRELESS_AUTH_WPAEAP || network.auth == WIRELESS_AUTH_WPA2EAP;
}

Failure AsksWhoYouAre(const std::string& shown) {
  return {Exit::kUnsupported, shown + " asks who you are, and cannot be shared by a code",
          "everybody joins it with a name and a secret of their own"};
}

Failure CannotBeShared(const std::string& shown) {
  return {Exit::kUnsupported, shown + " cannot be shared by a code", "phones join it by hand, if at all"};
}

void RequireSecret(Protection protection, std::string_view secret, const std::string& shown) {
  if (protection == Protection::kOpen || !secret.empty()) return;
  throw Failure(Exit::kFailed, "the secret of " + shown + " is not known", "`merowireless save` saves it");
}

}  // namespace

JoinCode CodeOf(const KnownNetwork& network, bool isHidden, const std::string& shown) {
  if (IsEap(network.network)) throw AsksWhoYouAre(shown);
  const auto protection = ProtectionOf(network.network);
  if (!protection || network.network.opmode == WIRELESS_OPMODE_ADHOC) throw CannotBeShared(shown);
  RequireSecret(*protection, network.szKey, shown);
  return Code(network.network.szEssid, *protection, network.szKey, isHidden);
}

JoinCode CodeOfAp(const ApConf& conf, const std::string& shown) {
  const MERO_HOSTAP_CONF& main = conf.hostapConf;
  if (main.encryption == AP_ENCRYPT_WPA_EAP) throw AsksWhoYouAre(shown);
  const auto protection = ProtectionOf(main.encryption);
  if (!protection) throw CannotBeShared(shown);
  return Code(main.szSSID, *protection, SecretOf(main.encryption, main.encryptInfo), main.hideSSID != 0);
}

JoinCode CodeOfGuests(const ApConf& conf, const std::string& shown) {
  const MERO_HOSTAP_GUEST_NET& guests = conf.hostapConf.guestNet;
  const auto protection = ProtectionOf(guests.encryption);
  if (!protection) throw CannotBeShared(shown);
  return Code(guests.szSSID, *protection, SecretOf(guests.encryption, guests.encryptInfo), guests.hideSSID != 0);
}
