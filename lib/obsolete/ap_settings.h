// The keys of the access-point settings, stated once for the unit that reads them and the one that writes them. The
// rows stand in the order in which they are written.
#ifndef MERO_LIB_AP_SETTINGS_H
#define MERO_LIB_AP_SETTINGS_H

#include <cstddef>
#include <cstdio>

#include "wireless.h"

enum class SettingKind {
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
  int missing;                      // what the field is when a section lacks the key
  size_t offset;                    // of the field in the record
  size_t size;                      // of the field, for texts
  const char* szMissing = nullptr;  // what a text is when a section lacks the key
};

inline constexpr char kGuestPrefix[] = "guest_net_";

// The hours of a week, all of them on.
inline constexpr char kAlwaysOn[] =
    "111111111111111111111111111111111111111111111111111111111111111111111111111111111111"
    "111111111111111111111111111111111111111111111111111111111111111111111111111111111111";
static_assert(sizeof kAlwaysOn == sizeof(MERO_WIFI_SCHED_CONF::szWifiSched));

// NOLINTNEXTLINE(bugprone-macro-parentheses): a member is no expression
#define SETTING_FIELD(Record, member) offsetof(Record, member), sizeof(static_cast<Record*>(nullptr)->member)
#define AP_FIELD(member) SETTING_FIELD(MERO_AP_CONF, member)
#define SECRET_FIELD(member) SETTING_FIELD(MERO_HOSTAP_ENCRYPT_INFO, member)

inline constexpr Setting kApSettings[] = {
    {"enable", SettingKind::kSwitch, FALSE, AP_FIELD(blEnable)},
    {"unblock", SettingKind::kSwitch, TRUE, AP_FIELD(blWifiUnblock)},
    {"txpower", SettingKind::kInteger, 10, AP_FIELD(txpower)},
    {"ssid", SettingKind::kText, 0, AP_FIELD(hostapConf.szSSID), ""},
    {"bridge", SettingKind::kText, 0, AP_FIELD(hostapConf.szBridge), ""},
    {"wifi_sched", SettingKind::kText, 0, AP_FIELD(wifiSchedConf.szWifiSched), kAlwaysOn},
    {"wifi_sched_enabled", SettingKind::kInteger, 0, AP_FIELD(wifiSchedConf.wifiSchedEnabled)},
    {"ignore_broadcast_ssid", SettingKind::kInteger, 0, AP_FIELD(hostapConf.hideSSID)},
    {"hw_mode", SettingKind::kInteger, AP_MODE_80211G, AP_FIELD(hostapConf.hwMode)},
    {"channel", SettingKind::kInteger, 0, AP_FIELD(hostapConf.channel)},
    {"max_num_sta", SettingKind::kInteger, 256, AP_FIELD(hostapConf.maxStation)},
    {"ieee80211n", SettingKind::kInteger, 1, AP_FIELD(hostapConf.ieee80211n)},
    {"ieee80211n_wireless_width", SettingKind::kInteger, AP_FREQ_ALL, AP_FIELD(hostapConf.wirelessWidth)},
    {"wmm_enabled", SettingKind::kInteger, 1, AP_FIELD(hostapConf.wmm)},
    {"encryption", SettingKind::kInteger, AP_ENCRYPT_OPEN, AP_FIELD(hostapConf.encryption)},
    {nullptr, SettingKind::kMainSecrets, 0, 0, 0},
    {"guest_net_enable", SettingKind::kInteger, FALSE, AP_FIELD(hostapConf.guestNet.blEnable)},
    {"bssid", SettingKind::kTextOnlyWritten, 0, AP_FIELD(hostapConf.guestNet.szBSSID)},
    {"guest_net_ssid", SettingKind::kText, 0, AP_FIELD(hostapConf.guestNet.szSSID), "HarborstoreGuest"},
    {"guest_net_ignore_broadcast_ssid", SettingKind::kInteger, 0, AP_FIELD(hostapConf.guestNet.hideSSID)},
    {"guest_net_max_num_sta", SettingKind::kInteger, 256, AP_FIELD(hostapConf.guestNet.maxStation)},
    {"ap_isolate", SettingKind::kInteger, TRUE, AP_FIELD(hostapConf.guestNet.blAPIsolate)},
    {"guest_net_encryption", SettingKind::kInteger, AP_ENCRYPT_OPEN, AP_FIELD(hostapConf.guestNet.encryption)},
    {nullptr, SettingKind::kGuestSecrets, 0, 0, 0},
    {"guest_net_lan_block", SettingKind::kInteger, TRUE, AP_FIELD(guestNetAccessRule.blLanBlock)},
    {"guest_net_access_ds", SettingKind::kInteger, FALSE, AP_FIELD(guestNetAccessRule.blAccessDS)},
    {"guest_net_internet_block", SettingKind::kInteger, FALSE, AP_FIELD(guestNetAccessRule.blInternetBlock)},
    {"guest_net_allow_http", SettingKind::kInteger, TRUE, AP_FIELD(guestNetAccessRule.blAllowHttp)},
    {"guest_net_sched", SettingKind::kText, 0, AP_FIELD(guestNetSchedConf.szWifiSched), kAlwaysOn},
    {"guest_net_sched_enable", SettingKind::kInteger, 0, AP_FIELD(guestNetSchedConf.wifiSchedEnabled)},
};

// What an encryption needs, with the fields of the union's member that belongs to it.
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

// Calls `visit(szKey, setting)` for each key that an encryption brings, until one call gives false; whether none did.
template <class Visit>
bool ForEachSecret(MERO_AP_ENCRYPT encryption, BOOL blGuestNet, Visit visit) {
  for (const auto& [needed, setting] : kSecretSettings) {
    if (needed != encryption) continue;
    char szKey[64];
    std::snprintf(szKey, sizeof szKey, "%s%s", blGuestNet != FALSE ? kGuestPrefix : "", setting.szKey);
    if (!visit(szKey, setting)) return false;
  }
  return true;
}

#endif  // MERO_LIB_AP_SETTINGS_H
