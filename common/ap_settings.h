// The access point's settings: their keys in the file, their fields in the record, and their defaults. Whoever reads,
// writes, shows or sets them walks these rows. They stand in the order in which they are written; each says at which
// turn it is read. The main network's come first, up to its secrets.
#ifndef MERO_COMMON_AP_SETTINGS_H
#define MERO_COMMON_AP_SETTINGS_H

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <iterator>

#include "wireless.h"

enum class SettingKind : uint8_t {
  kSwitch,           // "yes" or "no"
  kInteger,          // decimal; also every BOOL and enumeration
  kText,             // as it stands
  kTextOnlyWritten,  // text that is stored for others and never read back
  kMainSecrets,      // the keys that the encryption of the main network brings, from kSecretSettings
  kGuestSecrets,     // the same for the guest network, each with kGuestPrefix
};

struct Setting {
  const char* szKey;
  SettingKind kind;
  int16_t missing;                  // the value of the field when a section lacks the key
  uint16_t offset;                  // of the field in the record
  uint16_t size;                    // of the field, for texts
  const char* szMissing = nullptr;  // the text when a section lacks the key
};

inline constexpr char kGuestPrefix[] = "guest_net_";

// The network's name in a record that nothing was saved for; its bridge is kNatBridge. A section that lacks these keys
// has empty texts instead. Everything of the guest network is 0 or empty in such a record.
inline constexpr char kUnsavedSsid[] = "Corvanta";

// The hours of a week, all of them on.
inline constexpr char kAlwaysOn[] =
    "111111111111111111111111111111111111111111111111111111111111111111111111111111111111"
    "111111111111111111111111111111111111111111111111111111111111111111111111111111111111";
static_assert(sizeof kAlwaysOn == sizeof(MERO_WIFI_SCHED_CONF::szWifiSched));

// NOLINTNEXTLINE(bugprone-macro-parentheses): a member is no expression
#define SETTING_FIELD(Record, member) offsetof(Record, member), sizeof(static_cast<Record*>(nullptr)->member)
#define AP_FIELD(member) SETTING_FIELD(MERO_AP_CONF, member)
#define SECRET_FIELD(member) SETTING_FIELD(MERO_HOSTAP_ENCRYPT_INFO, member)

struct SettingRow {
  uint8_t turn;  // its place in the order of reading, from 1; 0 when it is only written
  Setting setting;
};

inline constexpr SettingRow kSettingRows[] = {
    {1, {"enable", SettingKind::kSwitch, FALSE, AP_FIELD(blEnable)}},
    {2, {"unblock", SettingKind::kSwitch, TRUE, AP_FIELD(blWifiUnblock)}},
    {3, {"txpower", SettingKind::kInteger, 10, AP_FIELD(txpower)}},
    {4, {"ssid", SettingKind::kText, 0, AP_FIELD(hostapConf.szSSID), ""}},
    {5, {"bridge", SettingKind::kText, 0, AP_FIELD(hostapConf.szBridge), ""}},
    {6, {"wifi_sched", SettingKind::kText, 0, AP_FIELD(wifiSchedConf.szWifiSched), kAlwaysOn}},
    {7, {"wifi_sched_enabled", SettingKind::kInteger, 0, AP_FIELD(wifiSchedConf.wifiSchedEnabled)}},
    {8, {"ignore_broadcast_ssid", SettingKind::kInteger, 0, AP_FIELD(hostapConf.hideSSID)}},
    {9, {"hw_mode", SettingKind::kInteger, AP_MODE_80211G, AP_FIELD(hostapConf.hwMode)}},
    {10, {"channel", SettingKind::kInteger, 0, AP_FIELD(hostapConf.channel)}},
    {14, {"max_num_sta", SettingKind::kInteger, 256, AP_FIELD(hostapConf.maxStation)}},
    {11, {"ieee80211n", SettingKind::kInteger, 1, AP_FIELD(hostapConf.ieee80211n)}},
    {12, {"ieee80211n_wireless_width", SettingKind::kInteger, AP_FREQ_ALL, AP_FIELD(hostapConf.wirelessWidth)}},
    {15, {"wmm_enabled", SettingKind::kInteger, 1, AP_FIELD(hostapConf.wmm)}},
    {13, {"encryption", SettingKind::kInteger, AP_ENCRYPT_OPEN, AP_FIELD(hostapConf.encryption)}},
    {16, {nullptr, SettingKind::kMainSecrets, 0, 0, 0}},
    {17, {"guest_net_enable", SettingKind::kInteger, FALSE, AP_FIELD(hostapConf.guestNet.blEnable)}},
    {0, {"bssid", SettingKind::kTextOnlyWritten, 0, AP_FIELD(hostapConf.guestNet.szBSSID)}},
    {18, {"guest_net_ssid", SettingKind::kText, 0, AP_FIELD(hostapConf.guestNet.szSSID), "HarborstoreGuest"}},
    {19, {"guest_net_ignore_broadcast_ssid", SettingKind::kInteger, 0, AP_FIELD(hostapConf.guestNet.hideSSID)}},
    {20, {"guest_net_max_num_sta", SettingKind::kInteger, 256, AP_FIELD(hostapConf.guestNet.maxStation)}},
    {21, {"ap_isolate", SettingKind::kInteger, TRUE, AP_FIELD(hostapConf.guestNet.blAPIsolate)}},
    {22, {"guest_net_encryption", SettingKind::kInteger, AP_ENCRYPT_OPEN, AP_FIELD(hostapConf.guestNet.encryption)}},
    {29, {nullptr, SettingKind::kGuestSecrets, 0, 0, 0}},
    {23, {"guest_net_lan_block", SettingKind::kInteger, TRUE, AP_FIELD(guestNetAccessRule.blLanBlock)}},
    {24, {"guest_net_access_ds", SettingKind::kInteger, FALSE, AP_FIELD(guestNetAccessRule.blAccessDS)}},
    {25, {"guest_net_internet_block", SettingKind::kInteger, FALSE, AP_FIELD(guestNetAccessRule.blInternetBlock)}},
    {26, {"guest_net_allow_http", SettingKind::kInteger, TRUE, AP_FIELD(guestNetAccessRule.blAllowHttp)}},
    {27, {"guest_net_sched", SettingKind::kText, 0, AP_FIELD(guestNetSchedConf.szWifiSched), kAlwaysOn}},
    {28, {"guest_net_sched_enable", SettingKind::kInteger, 0, AP_FIELD(guestNetSchedConf.wifiSchedEnabled)}},
};

// A number or switch in a record, and in what an encryption needs.
inline int NumberIn(const void* record, const Setting& setting) {
  int value = 0;
  std::memcpy(&value, static_cast<const char*>(record) + setting.offset, sizeof value);
  return value;
}

inline void PutNumber(void* record, const Setting& setting, int value) {
  std::memcpy(static_cast<char*>(record) + setting.offset, &value, sizeof value);
}

// The number of rows with this turn.
constexpr auto RowsAtTurn(int turn) {
  return std::count_if(std::begin(kSettingRows), std::end(kSettingRows),
                       [=](const SettingRow& row) { return row.turn == turn; });
}

// The number of turns, when they run from 1 on with one row each; else less.
consteval int CountTurns() {
  int turns = 0;
  while (RowsAtTurn(turns + 1) == 1) ++turns;
  return turns;
}
static_assert(CountTurns() + RowsAtTurn(0) == std::size(kSettingRows), "each turn is one row's");

// Calls `visit(setting)` for each row that is read, turn by turn.
template <class Visit>
void ForEachRead(Visit visit) {
  for (int turn = 1; turn <= CountTurns(); ++turn) {
    for (const SettingRow& row : kSettingRows) {
      if (row.turn == turn) visit(row.setting);
    }
  }
}

// The keys that an encryption needs, with the fields of its member of the union.
struct SecretSetting {
  MERO_AP_ENCRYPT encryption;
  Setting setting;
};

inline constexpr SecretSetting kSecretSettings[] = {
    {AP_ENCRYPT_WEP, {"wep_key0", SettingKind::kText, 0, SECRET_FIELD(szWepPwd), ""}},
    {AP_ENCRYPT_WPA_PSK, {"wpa_passphrase", SettingKind::kText, 0, SECRET_FIELD(wpaPskInfo.szPassPhrase), ""}},
    {AP_ENCRYPT_WPA_PSK, {"wpa", SettingKind::kInteger, TYPE_WPA2, SECRET_FIELD(wpaPskInfo.wpaType)}},
    {AP_ENCRYPT_WPA_PSK, {"wpa_encrypt_type", SettingKind::kInteger, TYPE_CCMP, SECRET_FIELD(wpaPskInfo.encryptType)}},
    {AP_ENCRYPT_WPA_EAP, {"wpa", SettingKind::kInteger, TYPE_WPA2, SECRET_FIELD(wpaEapInfo.wpaType)}},
    {AP_ENCRYPT_WPA_EAP, {"wpa_encrypt_type", SettingKind::kInteger, TYPE_CCMP, SECRET_FIELD(wpaEapInfo.encryptType)}},
    {AP_ENCRYPT_WPA_EAP, {"auth_server_addr", SettingKind::kText, 0, SECRET_FIELD(wpaEapInfo.szAuthIP), ""}},
    {AP_ENCRYPT_WPA_EAP, {"auth_server_port", SettingKind::kInteger, 1812, SECRET_FIELD(wpaEapInfo.authPort)}},
    {AP_ENCRYPT_WPA_EAP,
     {"auth_server_shared_secret", SettingKind::kText, 0, SECRET_FIELD(wpaEapInfo.szAuthSharedSecret), ""}},
};

#undef AP_FIELD
#undef SECRET_FIELD
#undef SETTING_FIELD

// Calls `visit(szKey, setting)` for each key that an encryption brings.
template <class Visit>
void ForEachSecret(MERO_AP_ENCRYPT encryption, BOOL blGuestNet, Visit visit) {
  for (const auto& [needed, setting] : kSecretSettings) {
    if (needed != encryption) continue;
    char szKey[64];
    std::snprintf(szKey, sizeof szKey, "%s%s", blGuestNet != FALSE ? kGuestPrefix : "", setting.szKey);
    visit(szKey, setting);
  }
}

#endif  // MERO_COMMON_AP_SETTINGS_H
