// The texts of the radio's enumerations, and back.
#include "platform/core/radio_texts.h"

#include <cstdio>
#include <iterator>

#include "common/protocol_texts.h"
#include "common/text.h"
#include "common/value_texts.h"
#include "platform/base/failure.h"

namespace {

constexpr WIRELESS_LITERAL_MAPPING kAuthTexts[] = {
    {"UNKNOWN", {WIRELESS_AUTH_UNKNOWN}}, {"OPEN", {WIRELESS_AUTH_OPEN}},     {"SHARED", {WIRELESS_AUTH_SHARED}},
    {"WEPAUTO", {WIRELESS_AUTH_WEPAUTO}}, {"WPAPSK", {WIRELESS_AUTH_WPAPSK}}, {"WPA2PSK", {WIRELESS_AUTH_WPA2PSK}},
    {"WPANONE", {WIRELESS_AUTH_WPANONE}}, {"WPAEAP", {WIRELESS_AUTH_WPAEAP}}, {"WPA2EAP", {WIRELESS_AUTH_WPA2EAP}},
};
static_assert(std::size(kAuthTexts) == WIRELESS_AUTH_WPA2EAP + 1, "name every authentication");

constexpr WIRELESS_LITERAL_MAPPING kEncryptTexts[] = {
    {"UNKNOWN", {WIRELESS_ENCRYPT_UNKNOWN}}, {"NONE", {WIRELESS_ENCRYPT_NONE}},
    {"WEP", {WIRELESS_ENCRYPT_WEP}},         {"TKIP", {WIRELESS_ENCRYPT_TKIP}},
    {"AES", {WIRELESS_ENCRYPT_AES}},         {"TKIPAES", {WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES}},
};

// What the supplicant calls the ciphers of WPA. The first row is for a value with neither of them.
constexpr WIRELESS_LITERAL_MAPPING kSupplicantCiphers[] = {
    {"", {WIRELESS_ENCRYPT_UNKNOWN}},
    {"TKIP", {WIRELESS_ENCRYPT_TKIP}},
    {"CCMP", {WIRELESS_ENCRYPT_AES}},
    {"TKIP CCMP", {WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES}},
};

constexpr WIRELESS_LITERAL_MAPPING kOpmodeTexts[] = {
    {"UNKNOWN", {WIRELESS_OPMODE_UNKNOWN}},      {"AUTO", {WIRELESS_OPMODE_AUTO}},
    {"ADHOC", {WIRELESS_OPMODE_ADHOC}},          {"MANAGED", {WIRELESS_OPMODE_MANAGED}},
    {"MASTER", {WIRELESS_OPMODE_MASTER}},        {"REPEATER", {WIRELESS_OPMODE_REPEATER}},
    {"SECONDARY", {WIRELESS_OPMODE_SECONDEARY}}, {"MONITOR", {WIRELESS_OPMODE_MONITOR}},
};
static_assert(std::size(kOpmodeTexts) == WIRELESS_OPMODE_MAX, "name every operating mode");

// The value of a hexadecimal digit; negative for any other character.
constexpr int HexDigit(char c) {
  const bool digit = c >= '0' && c <= '9';
  const char lower = ToLower(c);
  const bool letter = lower >= 'a' && lower <= 'f';
  if (!(digit | letter)) return -1;  // a bitwise or, since no processor could predict a branch between the two
  return (c & 0xF) + 9 * letter;
}

}  // namespace

WIRELESS_OPMODE ParseOpmode(const char* szOpmode) {
  return static_cast<WIRELESS_OPMODE>(ValueOf(kOpmodeTexts, szOpmode));
}

std::optional<Bssid> ParseBssid(std::string_view text) {
  constexpr size_t kStep = 3;  // two digits and a colon
  Bssid bssid;
  if (text.size() != std::size(bssid.octets) * kStep - 1) return std::nullopt;
  for (size_t at = 0; at < text.size(); at += kStep) {
    const int high = HexDigit(text[at]);
    const int low = HexDigit(text[at + 1]);
    if (high < 0 || low < 0) return std::nullopt;
    if (at + 2 < text.size() && text[at + 2] != ':') return std::nullopt;
    bssid.octets[at / kStep] = static_cast<unsigned char>(high << 4 | low);
  }
  return bssid;
}

const char* MEROWirelessAuthStringGet(WIRELESS_AUTH auth) {
  return TextOf(kAuthTexts, auth);
}

const char* MEROWirelessEncryptStringGet(WIRELESS_ENCRYPT encrypt, int form) {
  constexpr int kCiphersOfWpa = WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES;
  return form == 1 ? TextOf(kSupplicantCiphers, encrypt & kCiphersOfWpa) : TextOf(kEncryptTexts, encrypt);
}

const char* MEROWirelessOpmodeStringGet(WIRELESS_OPMODE opmode) {
  return TextOf(kOpmodeTexts, opmode);
}

char* MEROWirelessBssidStringGet(const unsigned char* rgbBssid, char* szBssid, size_t cbBssid) {
  if (rgbBssid == nullptr || szBssid == nullptr) return REFUSE_NULL(), nullptr;
  std::snprintf(szBssid, cbBssid, "%02X:%02X:%02X:%02X:%02X:%02X", rgbBssid[0], rgbBssid[1], rgbBssid[2], rgbBssid[3],
                rgbBssid[4], rgbBssid[5]);
  return szBssid;
}

WIRELESS_AUTH MEROWirelessAuthParse(const char* szAuth) {
  return static_cast<WIRELESS_AUTH>(ValueOf(kAuthTexts, szAuth));
}

WIRELESS_ENCRYPT MEROWirelessEncryptParse(const char* szEncrypt) {
  return static_cast<WIRELESS_ENCRYPT>(ValueOf(kEncryptTexts, szEncrypt));
}

WIRELESS_PROTOCOL MEROWirelessProtocolParse(const char* szProtocol) {
  return static_cast<WIRELESS_PROTOCOL>(ValueOf(kProtocolTexts, szProtocol));
}
