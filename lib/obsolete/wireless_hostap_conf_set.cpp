// Writes the files that the access-point daemon and the network start script read, after ending a daemon that runs.
#include <csignal>
#include <cstdio>
#include <cstring>

#include "common/log.h"
#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "shell_words.h"
#include "wep_key.h"
#include "wireless.h"

namespace {

constexpr char kPskPath[] = "/etc/hostapd.psk";

// A configuration that is written line by line. A value with a line feed is refused, since it would add a line of its
// own, and names and secrets may come from anybody.
class Conf {
 public:
  Conf(const InterfacePath& path, NewFile::Readers readers) : path_(path), file_(path.c_str(), readers) {}

  explicit operator bool() const { return static_cast<bool>(file_); }

  void Text(const char* szKey, const char* szValue) { Line("%s=%s\n", szKey, szValue); }
  void Quoted(const char* szKey, const char* szValue) { Line("%s=\"%s\"\n", szKey, szValue); }
  void Number(const char* szKey, int value) { std::fprintf(file_.get(), "%s=%d\n", szKey, value); }
  void TwoTexts(const char* szKey, const char* szFirst, const char* szSecond) {
    std::fprintf(file_.get(), "%s=%s%s\n", szKey, szFirst, szSecond);
  }

  // Whether all lines were taken and have reached the file.
  [[nodiscard]] bool Close() {
    const bool written = file_.Close();
    if (!written || refused_) LOG("Failed to write file [%s]", path_.c_str());
    return written && !refused_;
  }

 private:
  void Line(const char* szFormat, const char* szKey, const char* szValue) {
    if (std::strchr(szValue, '\n') != nullptr) {
      LOG("The value of %s holds a line feed", szKey);
      refused_ = true;
      return;
    }
    std::fprintf(file_.get(), szFormat, szKey, szValue);
  }

  const InterfacePath& path_;
  NewFile file_;
  bool refused_ = false;
};

void WriteStationLimit(Conf& conf, int maxStation) {
  if (maxStation > 0) conf.Number("max_num_sta", maxStation);
}

// The ciphers of a type; no lines when the type is unknown.
void WpaEncryptionTypeSet(Conf& file, MERO_AP_WPA_ENCRYPT_TYPE type) {
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
void WriteWep(Conf& file, const char* szKey) {
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

void WriteWpaPsk(Conf& file, const MERO_HOSTAP_WPA_PSK_INFO& info) {
  file.Number("auth_algs", 1);
  file.Number("wpa", info.wpaType);
  file.Text("wpa_key_mgmt", "WPA-PSK");
  file.Text("wpa_passphrase", info.szPassPhrase);
  WpaEncryptionTypeSet(file, static_cast<MERO_AP_WPA_ENCRYPT_TYPE>(info.encryptType));
}

void WriteWpaEap(Conf& file, const MERO_HOSTAP_WPA_EAP_INFO& info) {
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

void WriteHead(Conf& file, const char* szIfName, const MERO_HOSTAP_CONF& conf) {
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
const char* GetHT40String(const int hwMode, const int channel) {
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
int WriteHighThroughput(Conf& file, const MERO_HOSTAP_CONF& conf) {
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
bool MayRequireHighThroughput(const MERO_HOSTAP_CONF& conf) {
  return conf.encryption != AP_ENCRYPT_WEP && conf.encryptInfo.wpaPskInfo.encryptType != TYPE_TKIP;
}

// Writes no line when several modes are left, or none.
void WriteMode(Conf& file, int mode, const MERO_HOSTAP_CONF& conf) {
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

void WriteRadio(Conf& file, const MERO_HOSTAP_CONF& conf) {
  const int mode = WriteHighThroughput(file, conf);
  file.Number("wmm_enabled", conf.wmm > 0 ? 1 : 0);
  WriteMode(file, mode, conf);
}

void WriteSecurity(Conf& file, const MERO_HOSTAP_CONF& conf) {
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

// ---- The guest network ----

bool WriteGuestInfo(const InterfacePath& path, bool enabled) {
  Conf info(path, NewFile::kForAll);
  if (!info) return LOG("Failed to open file [%s]", path.c_str()), false;
  info.Text("enable", enabled ? "yes" : "no");
  return info.Close();
}

void WriteGuest(Conf& file, const MERO_HOSTAP_GUEST_NET& guest) {
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

BOOL SetGuestNetAPConf(const char* szIfName, PMERO_HOSTAP_GUEST_NET pConf) {
  if (szIfName == nullptr) return LOG("Bad parameter."), FALSE;
  const InterfacePath confPath(kHostapdGuestFormat, szIfName);
  const InterfacePath infoPath(kHostapdGuestInfoFormat, szIfName);
  if (!WriteGuestInfo(infoPath, pConf->blEnable != FALSE)) return FALSE;

  Conf file(confPath, NewFile::kSecret);
  if (!file) return LOG("Failed to open file [%s]", confPath.c_str()), FALSE;
  WriteGuest(file, *pConf);
  return file.Close() ? TRUE : FALSE;
}

// ---- The steps ----

// Asks the first daemon in the list to end, and does not wait. kill() would take a pid below 1 for many processes.
void StopDaemon(const Pipe& processes) {
  int pid = 0;
  if (!processes || std::fscanf(processes.get(), " %d", &pid) != 1 || pid <= 0) return;
  if (::kill(pid, SIGTERM) < 0) LOG("Failed to kill hostapd");
}

void TakeDown(const char* szIfName) {
  if (PLIBNetIfDown(szIfName) == 0) LOG("Failed to deactivate network interface [%s].", szIfName);
}

bool MakeDirectory() {
  if (PLIBCExec("/bin/mkdir", "-p", kHostapdDirectory, nullptr, nullptr) == 0) return true;
  return LOG("Failed to mkdir %s", kHostapdDirectory), false;
}

// Only models with a built-in card have a guest network.
bool WriteGuestFiles(const char* szIfName, PMERO_HOSTAP_CONF pConf) {
  if (PLIBCFileCheckKeyValue(kModelPath, "support_pci_wifi", "yes", 0) == 0) return true;
  if (SetGuestNetAPConf(szIfName, &pConf->guestNet) != FALSE) return true;
  return LOG("Failed to set hostapd.conf for Guest Network"), false;
}

}  // namespace

BOOL MEROWirelessSetHostAPConf(const char* szIfName, PMERO_HOSTAP_CONF pConf) {
  if (szIfName == nullptr) return LOG("Bad parameter."), FALSE;
  const Pipe processes(Command<1024>("ps | grep hostapd | grep %s | awk {'print $1'}", ShellWord(szIfName).c_str()));
  StopDaemon(processes);
  TakeDown(szIfName);

  const InterfacePath path(kHostapdHostFormat, szIfName);
  (void)PLIBCSysUnlink(path.c_str());  // a failure does no harm: the file is written from its beginning
  if (!MakeDirectory()) return FALSE;
  Conf file(path, NewFile::kSecret);
  if (!file) return FALSE;
  WriteHead(file, szIfName, *pConf);
  WriteRadio(file, *pConf);
  WriteSecurity(file, *pConf);

  const bool guest = WriteGuestFiles(szIfName, pConf);
  return file.Close() && guest ? TRUE : FALSE;
}
