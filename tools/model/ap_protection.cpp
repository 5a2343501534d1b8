// How an access point's network is protected.
#include "model/ap_protection.h"

#include "base/choices.h"
#include "common/ap_settings.h"
#include "model/library.h"
#include "model/security.h"

namespace {

constexpr Name kCiphers[] = {{"tkip", TYPE_TKIP}, {"aes", TYPE_CCMP}, {"both", TYPE_TKIP_CCMP}};

// The generations of WPA, as the access-point daemon has them: bits.
constexpr int kMixed = TYPE_WPA | TYPE_WPA2;

struct Protection {
  std::string_view text;
  MERO_AP_ENCRYPT encryption;
  int wpaType;
};

constexpr Protection kProtections[] = {
    {"open", AP_ENCRYPT_OPEN, 0},          {"wep", AP_ENCRYPT_WEP, 0},
    {"wpa", AP_ENCRYPT_WPA_PSK, TYPE_WPA}, {"wpa2", AP_ENCRYPT_WPA_PSK, TYPE_WPA2},
    {"mixed", AP_ENCRYPT_WPA_PSK, kMixed}, {"eap", AP_ENCRYPT_WPA_EAP, TYPE_WPA2},
};

int* CipherOf(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info) {
  if (encryption == AP_ENCRYPT_WPA_PSK) return &info.wpaPskInfo.encryptType;
  if (encryption == AP_ENCRYPT_WPA_EAP) return &info.wpaEapInfo.encryptType;
  return nullptr;
}

// The option that a network without protection lacks.
std::string AddProtection(std::string_view options) {
  return "add --" + std::string(options) + "encryption wpa2";
}

}  // namespace

// The details are a union: those of another encryption mean nothing to this one and are cleared.
void SetProtection(MERO_AP_ENCRYPT& encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
                   std::string_view options) {
  const Protection& protection = RowOf<Protection>(kProtections, text, std::string(options) + "encryption");
  if (encryption != protection.encryption) info = {};
  encryption = protection.encryption;
  ForEachSecret(encryption, FALSE, [&](const char*, const Setting& setting) {
    const bool isNumber = setting.kind == SettingKind::kInteger;
    if (isNumber && NumberIn(&info, setting) == 0) PutNumber(&info, setting, setting.missing);
  });
  if (encryption == AP_ENCRYPT_WPA_PSK) info.wpaPskInfo.wpaType = protection.wpaType;
  if (encryption == AP_ENCRYPT_WPA_EAP) info.wpaEapInfo.wpaType = protection.wpaType;
}

std::string ProtectionText(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info) {
  const bool psk = encryption == AP_ENCRYPT_WPA_PSK;
  for (const Protection& protection : kProtections) {
    if (protection.encryption != encryption || (psk && protection.wpaType != info.wpaPskInfo.wpaType)) continue;
    return std::string(protection.text);
  }
  return "unknown";
}

Value CipherValue(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO info) {
  const int* cipher = CipherOf(encryption, info);
  return cipher != nullptr ? Value(NameOf(kCiphers, *cipher)) : nullptr;
}

void SetCipher(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& text,
               std::string_view options) {
  int* cipher = CipherOf(encryption, info);
  if (cipher == nullptr) throw Wrong("only WPA has a choice of ciphers", AddProtection(options));
  *cipher = ValueOf(kCiphers, text, std::string(options) + "wpa-encrypt-type");
}

const char* SecretOf(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info) {
  switch (encryption) {
    case AP_ENCRYPT_WEP:
      return info.szWepPwd;
    case AP_ENCRYPT_WPA_PSK:
      return info.wpaPskInfo.szPassPhrase;
    case AP_ENCRYPT_WPA_EAP:
      return info.wpaEapInfo.szAuthSharedSecret;
    case AP_ENCRYPT_OPEN:
    case AP_ENCRYPT_MAX:
      break;
  }
  return "";
}

void SetSecretOf(MERO_AP_ENCRYPT encryption, MERO_HOSTAP_ENCRYPT_INFO& info, const std::string& secret,
                 std::string_view options) {
  switch (encryption) {
    case AP_ENCRYPT_WEP:
      RequireWepKey(secret);
      return SetText(info.szWepPwd, secret, "the WEP key");
    case AP_ENCRYPT_WPA_PSK:
      RequirePassphrase(secret);
      return SetText(info.wpaPskInfo.szPassPhrase, secret, "the passphrase");
    case AP_ENCRYPT_WPA_EAP:
      return SetText(info.wpaEapInfo.szAuthSharedSecret, secret, "the RADIUS server's secret");
    case AP_ENCRYPT_OPEN:
    case AP_ENCRYPT_MAX:
      break;
  }
  throw Wrong("an open network has no secret", AddProtection(options));
}

bool LacksSecret(MERO_AP_ENCRYPT encryption, const MERO_HOSTAP_ENCRYPT_INFO& info) {
  return encryption != AP_ENCRYPT_OPEN && *SecretOf(encryption, info) == '\0';
}
