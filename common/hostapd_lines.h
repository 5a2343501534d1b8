// The lines of the access-point daemon's configuration, from the settings of an access point: the library writes them,
// and the management program tells by them whether what was saved is what the daemon was given.
//
// A File takes them one by one: Text() and Number() take KEY=VALUE, Quoted() takes KEY="VALUE", and TwoTexts() takes a
// value in two parts.
#ifndef MERO_COMMON_HOSTAPD_LINES_H
#define MERO_COMMON_HOSTAPD_LINES_H

#include "common/paths.h"
#include "common/wep_key.h"
#include "wireless.h"

namespace hostapd {

inline constexpr char kPskPath[] = "/etc/hostapd.psk";

template <class File>
void WriteStationLimit(File& conf, int maxStation) {
  if (maxStation > 0) conf.Number("max_num_sta", maxStation);
}

// The ciphers of a type; no lines when the type is unknown.
template <class File>
void WpaEncryptionTypeSet(File& file, MERO_AP_WPA_ENCRYPT_TYPE type) {
  const char* szCiphers = nullptr;
  switch (type) {
    case TYPE_TKIP:
      szCiphers = "TKIP";
      break;
    case TYPE_CCMP:
      szCiphers = "CCMP";
      break;
    case TYPE_TKIP_CCMP:
      szCiphers = "TKIP CCMP";
      break;
  }
  if (szCiphers == nullptr) return;
  file.Text("wpa_pairwise", szCiphers);
  file.Text("rsn_pairwise", szCiphers);
}

// A key of a wrong length is left out: no station can join then.
template <class File>
void WriteWep(File& file, const char* szKey) {
  file.Number("auth_algs", 3);
  file.Number("wep_default_key", 0);
  switch (FormOfWepKey(szKey)) {
    case WepKeyForm::kText:
      return file.Quoted("wep_key0", szKey);
    case WepKeyForm::kDigits:
      return file.Text("wep_key0", szKey);
    case WepKeyForm::kWrong:
      return;
  }
}

template <class File>
void WriteWpaPsk(File& file, const MERO_HOSTAP_WPA_PSK_INFO& info) {
  file.Number("auth_algs", 1);
  file.Number("wpa", info.wpaType);
  file.Text("wpa_key_mgmt", "WPA-PSK");
  file.Text("wpa_passphrase", info.szPassPhrase);
  WpaEncryptionTypeSet(file, static_cast<MERO_AP_WPA_ENCRYPT_TYPE>(info.encryptType));
}

template <class File>
void WriteWpaEap(File& file, const MERO_HOSTAP_WPA_EAP_INFO& info) {
  file.Number("auth_algs", 1);
  file.Number("wpa", info.wpaType);
  file.Text("wpa_key_mgmt", "WPA-EAP");
  WpaEncryptionTypeSet(file, static_cast<MERO_AP_WPA_ENCRYPT_TYPE>(info.encryptType));
  file.Number("ieee8021x", 1);
  file.Text("auth_server_addr", info.szAuthIP);
  file.Number("auth_server_port", info.authPort);
  file.Text("auth_server_shared_secret", info.szAuthSharedSecret);
}

// ---- The main network ----

template <class File>
void WriteHead(File& file, const char* szIfName, const MERO_HOSTAP_CONF& conf) {
  file.Text("interface", szIfName);
  file.Text("driver", "nl80211");
  file.Text("ssid", conf.szSSID);
  file.Number("ignore_broadcast_ssid", conf.hideSSID);
  file.Text("macaddr_acl", "0");
  file.Text("wpa_psk_file", kPskPath);
  file.Number("wps_state", 2);
  file.Number("ap_setup_locked", 1);
  file.Text("ctrl_interface", kHostapdControlDirectory);
  file.Text("config_methods", "label display push_button keypad");
  WriteStationLimit(file, conf.maxStation);
  file.Text("bridge", conf.szBridge);
  file.Number("channel", conf.channel);
}

// The capability that says on which side of its channel a 40 MHz network has the second one. The rule for 5 GHz holds
// for 802.11a alone; a mode that combines it with another uses the rule for 2.4 GHz.
inline const char* GetHT40String(const int hwMode, const int channel) {
  if (hwMode != AP_MODE_80211A) return channel <= 5 ? "[HT40+]" : "[HT40-]";
  switch (channel) {
    case 36:
    case 44:
    case 52:
    case 60:
      return "[HT40+]";
    case 40:
    case 48:
    case 56:
    case 64:
      return "[HT40-]";
    default:
      return "";
  }
}

// Writes the 802.11n lines, when 802.11n is switched on. Gives the modes that the line "hw_mode" has to name still.
template <class File>
int WriteHighThroughput(File& file, const MERO_HOSTAP_CONF& conf) {
  if (conf.ieee80211n <= 0) return conf.hwMode;
  file.Number("ieee80211n", conf.ieee80211n);
  if ((conf.wirelessWidth & AP_FREQ_40_MHZ) != 0) {
    file.TwoTexts("ht_capab", "[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935]",
                  GetHT40String(conf.hwMode, conf.channel));
  } else {
    file.Text("ht_capab", "[SHORT-GI-20][DELAYED-BA]");
  }
  constexpr int kLegacyModes = AP_MODE_80211A | AP_MODE_80211B | AP_MODE_80211G;
  return conf.hwMode == AP_MODE_80211N ? conf.hwMode : conf.hwMode & kLegacyModes;
}

// Whether the network may refuse stations without 802.11n. It may not when its cipher is one that 802.11n forbids. The
// cipher is read from the fields of the pre-shared key, under every encryption.
inline bool MayRequireHighThroughput(const MERO_HOSTAP_CONF& conf) {
  return conf.encryption != AP_ENCRYPT_WEP && conf.encryptInfo.wpaPskInfo.encryptType != TYPE_TKIP;
}

// Writes no line when several modes are left, or none.
template <class File>
void WriteMode(File& file, int mode, const MERO_HOSTAP_CONF& conf) {
  switch (mode) {
    case AP_MODE_80211A:
      return file.Text("hw_mode", "a");
    case AP_MODE_80211B:
      return file.Text("hw_mode", "b");
    case AP_MODE_80211G:
      return file.Text("hw_mode", "g");
    case AP_MODE_80211N:
      if (MayRequireHighThroughput(conf)) file.Number("require_ht", 1);
      return file.Text("hw_mode", "g");
    default:
      return;
  }
}

template <class File>
void WriteRadio(File& file, const MERO_HOSTAP_CONF& conf) {
  const int mode = WriteHighThroughput(file, conf);
  file.Number("wmm_enabled", conf.wmm > 0 ? 1 : 0);
  WriteMode(file, mode, conf);
}

template <class File>
void WriteSecurity(File& file, const MERO_HOSTAP_CONF& conf) {
  const bool eap = conf.encryption == AP_ENCRYPT_WPA_EAP;
  file.Number("eap_server", eap ? 0 : 1);
  switch (conf.encryption) {
    case AP_ENCRYPT_WEP:
      return WriteWep(file, conf.encryptInfo.szWepPwd);
    case AP_ENCRYPT_WPA_PSK:
      return WriteWpaPsk(file, conf.encryptInfo.wpaPskInfo);
    case AP_ENCRYPT_WPA_EAP:
      return WriteWpaEap(file, conf.encryptInfo.wpaEapInfo);
    default:  // open, or an unknown encryption
      return file.Number("auth_algs", 1);
  }
}

// All lines of the main network.
template <class File>
void WriteMain(File& file, const char* szIfName, const MERO_HOSTAP_CONF& conf) {
  WriteHead(file, szIfName, conf);
  WriteRadio(file, conf);
  WriteSecurity(file, conf);
}

// ---- The guest network ----

// All lines of the guest network, which the daemon reads behind those of the main one.
template <class File>
void WriteGuest(File& file, const MERO_HOSTAP_GUEST_NET& guest) {
  file.Text("bss", kGuestInterface);
  file.Text("bssid", guest.szBSSID);
  file.Text("ssid", guest.szSSID);
  file.Text("bridge", kGuestBridge);
  file.Text("ctrl_interface", kHostapdControlDirectory);
  WriteStationLimit(file, guest.maxStation);
  if (guest.blAPIsolate != FALSE) file.Number("ap_isolate", 1);
  file.Number("ignore_broadcast_ssid", guest.hideSSID);

  if (guest.encryption == AP_ENCRYPT_WEP) WriteWep(file, guest.encryptInfo.szWepPwd);
  if (guest.encryption == AP_ENCRYPT_WPA_PSK) WriteWpaPsk(file, guest.encryptInfo.wpaPskInfo);
}

}  // namespace hostapd

#endif  // MERO_COMMON_HOSTAPD_LINES_H
