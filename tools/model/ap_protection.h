// How an access point's network is protected: the main one, or that for guests.
#ifndef MERO_TOOLS_AP_PROTECTION_H
#define MERO_TOOLS_AP_PROTECTION_H

#include <string>

#include "show/output.h"
#include "wireless.h"

// Sets the protection that is called `text`: open, wep, wpa, wpa2, mixed or eap. A secret stays as long as it is one.
void SetProtection(MERO_AP_ENCRYPT& encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
                   const char* szOption);
std::string ProtectionText(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

// tkip, aes or both; nothing where there is no choice.
void SetCipher(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
               const char* szOption);
Value CipherValue(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO info);

// The secret: a key, a passphrase, or what is shared with the RADIUS server. It fails when it cannot be that.
void SetSecretOf(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& secret);
const char* SecretOf(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

// Whether there has to be a secret, and is none.
bool LacksSecret(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info);

#endif  // MERO_TOOLS_AP_PROTECTION_H
