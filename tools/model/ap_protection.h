// How an access point's network is protected: the main one, or that for guests.
#ifndef MERO_TOOLS_AP_PROTECTION_H
#define MERO_TOOLS_AP_PROTECTION_H

#include <string>
#include <string_view>

#include "show/output.h"
#include "wireless.h"

// What the options of a network's protection begin with.
inline constexpr std::string_view kMainOptions;
inline constexpr std::string_view kGuestOptions = "guest-net-";

// Sets the protection that is called `text`: open, wep, wpa, wpa2, mixed or eap. The secret stays when it is of the
// same kind.
void SetProtection(MERO_AP_ENCRYPT& encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
                   std::string_view options);
std::string ProtectionText(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

// tkip, aes or both; nothing where there is no choice.
void SetCipher(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
               std::string_view options);
Value CipherValue(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO info);

// The secret: a WEP key, a passphrase, or the one shared with the RADIUS server. Setting one fails when it is not
// valid.
void SetSecretOf(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& secret,
                 std::string_view options);
const char* SecretOf(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

// Whether the protection needs a secret and has none.
bool LacksSecret(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

#endif  // MERO_TOOLS_AP_PROTECTION_H
