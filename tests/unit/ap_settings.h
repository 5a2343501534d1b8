// The access-point settings: their file, its keys, and a record with the section that it is saved as.
#ifndef MERO_TESTS_UNIT_AP_SETTINGS_H
#define MERO_TESTS_UNIT_AP_SETTINGS_H

#include <cstddef>
#include <cstring>
#include <string>
#include <vector>

#include "tests/support/early.h"
#include "wireless.h"

EARLY inline const std::string kSettings = "/usr/mero/etc/wireless_ap.conf";
EARLY inline const std::string kModel = "RT-5370";
EARLY inline const std::string kEveryHour(168, '1');

// ---- The keys, apart from the library's own table of them, so that a slip there shows ----

struct NumberKey {
  const char* szKey;
  size_t offset;
  size_t size;
  int missing;              // what the field is when a section lacks the key
  const char* szWith = "";  // what else has to stand in the section

  bool isOfASectionWithoutLines() const { return *szWith == '\0'; }
  bool isOfGuests() const { return std::string(szKey).starts_with("guest_net_") || std::string(szKey) == "ap_isolate"; }
};

struct TextKey {
  const char* szKey;
  size_t offset;
  size_t size;
  std::string missing = {};
  const char* szWith = "";
};

// NOLINTNEXTLINE(bugprone-macro-parentheses): a member is no expression
#define FIELD(member) offsetof(MERO_AP_CONF, member), sizeof(static_cast<MERO_AP_CONF*>(nullptr)->member)

inline const NumberKey kNumberKeys[] = {
    {"txpower", FIELD(txpower), 10},
    {"wifi_sched_enabled", FIELD(wifiSchedConf.wifiSchedEnabled), 0},
    {"ignore_broadcast_ssid", FIELD(hostapConf.hideSSID), 0},
    {"hw_mode", FIELD(hostapConf.hwMode), 4},
    {"channel", FIELD(hostapConf.channel), 0},
    {"max_num_sta", FIELD(hostapConf.maxStation), 256},
    {"ieee80211n", FIELD(hostapConf.ieee80211n), 1},
    {"ieee80211n_wireless_width", FIELD(hostapConf.wirelessWidth), 3},
    {"wmm_enabled", FIELD(hostapConf.wmm), 1},
    {"encryption", FIELD(hostapConf.encryption), 0},
    {"guest_net_enable", FIELD(hostapConf.guestNet.blEnable), 0},
    {"guest_net_ignore_broadcast_ssid", FIELD(hostapConf.guestNet.hideSSID), 0},
    {"guest_net_max_num_sta", FIELD(hostapConf.guestNet.maxStation), 256},
    {"ap_isolate", FIELD(hostapConf.guestNet.blAPIsolate), 1},
    {"guest_net_encryption", FIELD(hostapConf.guestNet.encryption), 0},
    {"guest_net_lan_block", FIELD(guestNetAccessRule.blLanBlock), 1},
    {"guest_net_access_ds", FIELD(guestNetAccessRule.blAccessDS), 0},
    {"guest_net_internet_block", FIELD(guestNetAccessRule.blInternetBlock), 0},
    {"guest_net_allow_http", FIELD(guestNetAccessRule.blAllowHttp), 1},
    {"guest_net_sched_enable", FIELD(guestNetSchedConf.wifiSchedEnabled), 0},
    {"wpa", FIELD(hostapConf.encryptInfo.wpaPskInfo.wpaType), 2, "\tencryption=2\n"},
    {"wpa_encrypt_type", FIELD(hostapConf.encryptInfo.wpaPskInfo.encryptType), 2, "\tencryption=2\n"},
    {"wpa", FIELD(hostapConf.encryptInfo.wpaEapInfo.wpaType), 2, "\tencryption=3\n"},
    {"wpa_encrypt_type", FIELD(hostapConf.encryptInfo.wpaEapInfo.encryptType), 2, "\tencryption=3\n"},
    {"auth_server_port", FIELD(hostapConf.encryptInfo.wpaEapInfo.authPort), 1812, "\tencryption=3\n"},
    {"guest_net_wpa", FIELD(hostapConf.guestNet.encryptInfo.wpaPskInfo.wpaType), 2, "\tguest_net_encryption=2\n"},
    {"guest_net_wpa_encrypt_type", FIELD(hostapConf.guestNet.encryptInfo.wpaPskInfo.encryptType), 2,
     "\tguest_net_encryption=2\n"},
};

inline const TextKey kTextKeys[] = {
    {"ssid", FIELD(hostapConf.szSSID)},
    {"bridge", FIELD(hostapConf.szBridge)},
    {"wifi_sched", FIELD(wifiSchedConf.szWifiSched), kEveryHour},
    {"guest_net_ssid", FIELD(hostapConf.guestNet.szSSID), "HarborstoreGuest"},
    {"guest_net_sched", FIELD(guestNetSchedConf.szWifiSched), kEveryHour},
    {"wep_key0", FIELD(hostapConf.encryptInfo.szWepPwd), "", "\tencryption=1\n"},
    {"wpa_passphrase", FIELD(hostapConf.encryptInfo.wpaPskInfo.szPassPhrase), "", "\tencryption=2\n"},
    {"auth_server_addr", FIELD(hostapConf.encryptInfo.wpaEapInfo.szAuthIP), "", "\tencryption=3\n"},
    {"auth_server_shared_secret", FIELD(hostapConf.encryptInfo.wpaEapInfo.szAuthSharedSecret), "", "\tencryption=3\n"},
    {"guest_net_wep_key0", FIELD(hostapConf.guestNet.encryptInfo.szWepPwd), "", "\tguest_net_encryption=1\n"},
    {"guest_net_wpa_passphrase", FIELD(hostapConf.guestNet.encryptInfo.wpaPskInfo.szPassPhrase), "",
     "\tguest_net_encryption=2\n"},
};

// With a RADIUS server, and guests with a passphrase.
inline constexpr const char* kKeysInReadingOrder[] = {"enable",
                                                      "unblock",
                                                      "txpower",
                                                      "ssid",
                                                      "bridge",
                                                      "wifi_sched",
                                                      "wifi_sched_enabled",
                                                      "ignore_broadcast_ssid",
                                                      "hw_mode",
                                                      "channel",
                                                      "ieee80211n",
                                                      "ieee80211n_wireless_width",
                                                      "encryption",
                                                      "max_num_sta",
                                                      "wmm_enabled",
                                                      "wpa",
                                                      "wpa_encrypt_type",
                                                      "auth_server_addr",
                                                      "auth_server_port",
                                                      "auth_server_shared_secret",
                                                      "guest_net_enable",
                                                      "guest_net_ssid",
                                                      "guest_net_ignore_broadcast_ssid",
                                                      "guest_net_max_num_sta",
                                                      "ap_isolate",
                                                      "guest_net_encryption",
                                                      "guest_net_lan_block",
                                                      "guest_net_access_ds",
                                                      "guest_net_internet_block",
                                                      "guest_net_allow_http",
                                                      "guest_net_sched",
                                                      "guest_net_sched_enable",
                                                      "guest_net_wpa_passphrase",
                                                      "guest_net_wpa",
                                                      "guest_net_wpa_encrypt_type"};

inline int NumberIn(const MERO_AP_CONF& conf, const NumberKey& key) {
  int value = 0;
  std::memcpy(&value, reinterpret_cast<const char*>(&conf) + key.offset, sizeof value);
  return value;
}

inline void PutNumber(MERO_AP_CONF& conf, const NumberKey& key, int value) {
  std::memcpy(reinterpret_cast<char*>(&conf) + key.offset, &value, sizeof value);
}

// The text; one that fills its field lacks its end.
inline std::string TextIn(const MERO_AP_CONF& conf, const TextKey& key) {
  const char* field = reinterpret_cast<const char*>(&conf) + key.offset;
  return std::string(field, ::strnlen(field, key.size));
}

// A text that fits, with nothing but zeros behind it.
inline void PutText(MERO_AP_CONF& conf, const TextKey& key, const std::string& text) {
  char* field = reinterpret_cast<char*>(&conf) + key.offset;
  std::memset(field, 0, key.size);
  std::memcpy(field, text.data(), text.size());
}

// What differs in two records: keys, and fields that have none or share theirs. Behind its end a text may differ.
inline std::vector<std::string> Differences(const MERO_AP_CONF& a, const MERO_AP_CONF& b) {
  std::vector<std::string> differences;
  const auto compare = [&](const char* szName, size_t offset, size_t size) {
    const bool same =
        std::memcmp(reinterpret_cast<const char*>(&a) + offset, reinterpret_cast<const char*>(&b) + offset, size) == 0;
    if (!same) differences.push_back(szName);
  };
  compare("enable", FIELD(blEnable));
  compare("unblock", FIELD(blWifiUnblock));
  compare("the section's name", FIELD(szSecName));
  compare("bssid", FIELD(hostapConf.guestNet.szBSSID));
  compare("what the encryption needs", FIELD(hostapConf.encryptInfo));
  compare("what the guest network's encryption needs", FIELD(hostapConf.guestNet.encryptInfo));
  for (const NumberKey& key : kNumberKeys) compare(key.szKey, key.offset, key.size);
  for (const TextKey& key : kTextKeys) {
    if (TextIn(a, key) != TextIn(b, key)) differences.push_back(key.szKey);
  }
  return differences;
}

#undef FIELD

// ---- A record in which no two numbers are the same, nor any of them what a missing key stands for ----

EARLY inline const std::string kOfficeHours = std::string(84, '0') + std::string(84, '1');
EARLY inline const std::string kVisitingHours = std::string(100, '0') + std::string(68, '1');

inline MERO_AP_CONF OfficeSettings(MERO_AP_ENCRYPT encryption, MERO_AP_ENCRYPT guestEncryption) {
  MERO_AP_CONF conf{};
  conf.blEnable = TRUE;
  conf.txpower = 17;
  std::strcpy(conf.szSecName, kModel.c_str());
  conf.blWifiUnblock = FALSE;
  std::strcpy(conf.wifiSchedConf.szWifiSched, kOfficeHours.c_str());
  conf.wifiSchedConf.wifiSchedEnabled = 18;
  std::strcpy(conf.guestNetSchedConf.szWifiSched, kVisitingHours.c_str());
  conf.guestNetSchedConf.wifiSchedEnabled = 33;
  conf.guestNetAccessRule = {static_cast<BOOL>(29), static_cast<BOOL>(30), static_cast<BOOL>(31),
                             static_cast<BOOL>(32)};

  MERO_HOSTAP_CONF& main = conf.hostapConf;
  std::strcpy(main.szSSID, "Office Net");
  std::strcpy(main.szBridge, "lbr7");
  main.hideSSID = 5;
  main.hwMode = 12;
  main.ieee80211n = 19;
  main.wirelessWidth = 21;
  main.channel = 11;
  main.maxStation = 40;
  main.wmm = 22;
  main.encryption = encryption;
  switch (encryption) {
    case AP_ENCRYPT_WEP:
      std::strcpy(main.encryptInfo.szWepPwd, "abcde");
      break;
    case AP_ENCRYPT_WPA_PSK:
      main.encryptInfo.wpaPskInfo = {23, "correct horse", 24};
      break;
    case AP_ENCRYPT_WPA_EAP:
      main.encryptInfo.wpaEapInfo = {23, 24, "10.0.0.5", 1645, "radius secret"};
      break;
    default:
      break;
  }

  MERO_HOSTAP_GUEST_NET& guest = main.guestNet;
  guest.blEnable = static_cast<BOOL>(27);
  std::strcpy(guest.szSSID, "Visitors");
  std::strcpy(guest.szBSSID, "02:11:22:33:44:55");
  guest.hideSSID = 6;
  guest.maxStation = 8;
  guest.blAPIsolate = static_cast<BOOL>(28);
  guest.encryption = guestEncryption;
  if (guestEncryption == AP_ENCRYPT_WEP) std::strcpy(guest.encryptInfo.szWepPwd, "vwxyz");
  if (guestEncryption == AP_ENCRYPT_WPA_PSK) guest.encryptInfo.wpaPskInfo = {25, "battery staple", 26};
  return conf;
}

// The lines that an encryption brings, of the main network and of the guest network.
inline std::string OfficeSecrets(MERO_AP_ENCRYPT encryption) {
  switch (encryption) {
    case AP_ENCRYPT_WEP:
      return "\twep_key0=abcde\n";
    case AP_ENCRYPT_WPA_PSK:
      return "\twpa_passphrase=correct horse\n\twpa=23\n\twpa_encrypt_type=24\n";
    case AP_ENCRYPT_WPA_EAP:
      return "\twpa=23\n\twpa_encrypt_type=24\n\tauth_server_addr=10.0.0.5\n\tauth_server_port=1645\n"
             "\tauth_server_shared_secret=radius secret\n";
    default:
      return "";
  }
}

inline std::string VisitorSecrets(MERO_AP_ENCRYPT encryption) {
  switch (encryption) {
    case AP_ENCRYPT_WEP:
      return "\tguest_net_wep_key0=vwxyz\n";
    case AP_ENCRYPT_WPA_PSK:
      return "\tguest_net_wpa_passphrase=battery staple\n\tguest_net_wpa=25\n\tguest_net_wpa_encrypt_type=26\n";
    default:
      return "";
  }
}

// The lines of the section that saving the record leaves.
inline std::string OfficeLines(MERO_AP_ENCRYPT encryption, MERO_AP_ENCRYPT guestEncryption) {
  return "\tenable=yes\n"
         "\tunblock=no\n"
         "\ttxpower=17\n"
         "\tssid=Office Net\n"
         "\tbridge=lbr7\n"
         "\twifi_sched=" +
         kOfficeHours +
         "\n"
         "\twifi_sched_enabled=18\n"
         "\tignore_broadcast_ssid=5\n"
         "\thw_mode=12\n"
         "\tchannel=11\n"
         "\tmax_num_sta=40\n"
         "\tieee80211n=19\n"
         "\tieee80211n_wireless_width=21\n"
         "\twmm_enabled=22\n"
         "\tencryption=" +
         std::to_string(encryption) + "\n" + OfficeSecrets(encryption) +
         "\tguest_net_enable=27\n"
         "\tbssid=02:11:22:33:44:55\n"
         "\tguest_net_ssid=Visitors\n"
         "\tguest_net_ignore_broadcast_ssid=6\n"
         "\tguest_net_max_num_sta=8\n"
         "\tap_isolate=28\n"
         "\tguest_net_encryption=" +
         std::to_string(guestEncryption) + "\n" + VisitorSecrets(guestEncryption) +
         "\tguest_net_lan_block=29\n"
         "\tguest_net_access_ds=30\n"
         "\tguest_net_internet_block=31\n"
         "\tguest_net_allow_http=32\n"
         "\tguest_net_sched=" +
         kVisitingHours +
         "\n"
         "\tguest_net_sched_enable=33\n";
}

inline std::string OfficeSection(MERO_AP_ENCRYPT encryption, MERO_AP_ENCRYPT guestEncryption) {
  return "[" + kModel + "]\n" + OfficeLines(encryption, guestEncryption);
}

// ---- What reads it ----

// A record with something in every byte.
inline MERO_AP_CONF UsedSettings() {
  MERO_AP_CONF conf;
  std::memset(static_cast<void*>(&conf), 0xA5, sizeof conf);
  return conf;
}

#endif  // MERO_TESTS_UNIT_AP_SETTINGS_H
