// How a network is protected, and what a secret for it may be.
#ifndef MERO_TOOLS_SECURITY_H
#define MERO_TOOLS_SECURITY_H

#include <string>
#include <string_view>

#include "wireless.h"

// "WPA2 AES", "open".
std::string SecurityText(WIRELESS_AUTH auth, WIRELESS_ENCRYPT encrypt);

// Whether two networks are protected in the same way, whatever their ciphers.
bool IsProtectedAlike(const WIRELESS_NETWORK& one, const WIRELESS_NETWORK& other);

bool NeedsSecret(WIRELESS_AUTH auth);
bool NeedsUser(WIRELESS_AUTH auth);

// Whether the library can join a network that is protected so.
bool CanBeJoined(const WIRELESS_NETWORK& network);

// Whether a secret can be one of a network that is protected so. Any character can be in one that was not saved by this
// program.
bool CanBeSecret(WIRELESS_AUTH auth, std::string_view secret);

// Sets the protection that is called `name`, one of kSecurityNames; false when none is.
bool SetSecurity(WIRELESS_NETWORK& network, std::string_view name);
inline constexpr char kSecurityNames[] = "open, wep, wpa, wpa2, wpa-eap, wpa2-eap";

// Fail, with advice, when a secret is not valid.
void RequireWepKey(std::string_view key);
void RequirePassphrase(std::string_view passphrase);
void RequireSecretFor(WIRELESS_AUTH auth, std::string_view secret);

#endif  // MERO_TOOLS_SECURITY_H
