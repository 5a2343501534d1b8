// How a network is protected, and what a secret for it may be.
#include "model/security.h"

#include <algorithm>
#include <cctype>

#include "base/failure.h"
#include "base/text.h"
#include "platform.h"

namespace {

constexpr int kBothCiphers = WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES;

// A protection. One with a name can be given on the command line.
struct Security {
  WIRELESS_AUTH auth;
  std::string_view text;
  std::string_view name;
  int encrypt;  // the ciphers of a network that is given this name
  bool secret;
  bool user;
};

constexpr Security kSecurities[] = {
    {WIRELESS_AUTH_UNKNOWN, "unknown", "", WIRELESS_ENCRYPT_UNKNOWN, false, false},
    {WIRELESS_AUTH_OPEN, "open", "open", WIRELESS_ENCRYPT_NONE, false, false},
    {WIRELESS_AUTH_SHARED, "WEP", "wep", WIRELESS_ENCRYPT_WEP, true, false},
    {WIRELESS_AUTH_WEPAUTO, "WEP", "", WIRELESS_ENCRYPT_WEP, true, false},
    {WIRELESS_AUTH_WPAPSK, "WPA", "wpa", kBothCiphers, true, false},
    {WIRELESS_AUTH_WPA2PSK, "WPA2", "wpa2", kBothCiphers, true, false},
    {WIRELESS_AUTH_WPANONE, "WPA ad-hoc", "", kBothCiphers, true, false},
    {WIRELESS_AUTH_WPAEAP, "WPA EAP", "wpa-eap", kBothCiphers, true, true},
    {WIRELESS_AUTH_WPA2EAP, "WPA2 EAP", "wpa2-eap", kBothCiphers, true, true},
};

const Security& SecurityOf(WIRELESS_AUTH auth) {
  const auto* found = std::ranges::find(kSecurities, auth, &Security::auth);
  return found != std::end(kSecurities) ? *found : kSecurities[0];
}

bool IsPrintable(char c) {
  return c >= ' ' && c <= '~';
}

bool IsWepKey(std::string_view key) {
  const std::size_t size = key.size();
  if (size == 5 || size == 13) return true;
  return (size == 10 || size == 26) && std::ranges::all_of(key, [](unsigned char c) { return std::isxdigit(c) != 0; });
}

bool HasLengthOfPassphrase(std::string_view secret) {
  return secret.size() >= 8 && secret.size() <= 63;
}

}  // namespace

std::string SecurityText(WIRELESS_AUTH auth, WIRELESS_ENCRYPT encrypt) {
  const Security& security = SecurityOf(auth);
  std::string text(security.text);
  if (security.encrypt != kBothCiphers || (encrypt & kBothCiphers) == 0) return text;
  return text + ((encrypt & kBothCiphers) == kBothCiphers ? " TKIP+AES"
                 : (encrypt & WIRELESS_ENCRYPT_AES) != 0  ? " AES"
                                                          : " TKIP");
}

bool IsProtectedAlike(const WIRELESS_NETWORK& one, const WIRELESS_NETWORK& other) {
  return SecurityOf(one.auth).text == SecurityOf(other.auth).text;
}

bool NeedsSecret(WIRELESS_AUTH auth) {
  return SecurityOf(auth).secret;
}

bool NeedsUser(WIRELESS_AUTH auth) {
  return SecurityOf(auth).user;
}

bool CanBeJoined(const WIRELESS_NETWORK& network) {
  if (network.opmode == WIRELESS_OPMODE_ADHOC) {
    return network.encrypt == WIRELESS_ENCRYPT_NONE || network.encrypt == WIRELESS_ENCRYPT_WEP;
  }
  return network.auth != WIRELESS_AUTH_UNKNOWN && network.auth != WIRELESS_AUTH_WPANONE;
}

bool CanBeSecret(WIRELESS_AUTH auth, std::string_view secret) {
  const Security& security = SecurityOf(auth);
  if (security.encrypt == WIRELESS_ENCRYPT_WEP) return IsWepKey(secret);
  return !security.secret || security.user || HasLengthOfPassphrase(secret);
}

bool SetSecurity(WIRELESS_NETWORK& network, std::string_view name) {
  const auto* found = std::ranges::find_if(kSecurities, [&](const Security& each) { return IsWord(name, each.name); });
  if (name.empty() || found == std::end(kSecurities)) return false;
  network.auth = found->auth;
  network.encrypt = static_cast<WIRELESS_ENCRYPT>(found->encrypt);
  return true;
}

void RequireWepKey(std::string_view key) {
  if (IsWepKey(key)) return;
  throw Failure(Exit::kSecretRefused, "a WEP key cannot have this length",
                "give 5 or 13 characters, or 10 or 26 hexadecimal digits");
}

void RequirePassphrase(std::string_view passphrase) {
  if (HasLengthOfPassphrase(passphrase) && std::ranges::all_of(passphrase, IsPrintable)) return;
  throw Failure(Exit::kSecretRefused, "this can be no passphrase", "give 8 to 63 printable ASCII characters");
}

void RequireSecretFor(WIRELESS_AUTH auth, std::string_view secret) {
  const Security& security = SecurityOf(auth);
  if (security.encrypt == WIRELESS_ENCRYPT_WEP) return RequireWepKey(secret);
  if (security.secret && !security.user) return RequirePassphrase(secret);
}
