// Joins a network: an ad-hoc cell directly, any other through the supplicant.
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>

#include "common/log.h"
#include "common/paths.h"
#include "common/text.h"
#include "common/wep_key.h"
#include "holders.h"
#include "platform.h"
#include "shell_words.h"
#include "wireless.h"

namespace {

constexpr char kSupplicantPath[] = "/usr/sbin/wpa_supplicant";
constexpr char kSystemSettingsPath[] = "/etc/meroinfo.conf";

constexpr int kMediaServiceRestart = 2;

using LongCommand = Command<1024>;

// ---- The supplicant's configuration ----

BOOL CheckBssid(const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (pNetCfg == nullptr) return LOG("Bad parameters"), FALSE;
  const auto& bssid = pNetCfg->network.bssid;
  const bool known = !All(bssid, [](unsigned char octet) { return octet == 0; });
  return known && pNetCfg->noneBssid == 0 ? TRUE : FALSE;
}

// Writes the line of a value, by a format with "%.*s" in it. A value with a line feed is reported and gives false: it
// would add a line of its own, and values come from strangers.
bool WriteValue(FILE* pfConf, const char* szFormat, std::string_view value) {
  if (value.find('\n') != std::string_view::npos) {
    return LOG("A name or secret with a line feed cannot be configured."), false;
  }
  std::fprintf(pfConf, szFormat, static_cast<int>(value.size()), value.data());
  return true;
}

bool WriteWepKey(FILE* pfConf, std::string_view key) {
  switch (FormOfWepKey(key)) {
    case WepKeyForm::kText:
      return WriteValue(pfConf, "\twep_key0=\"%.*s\"\n", key);
    case WepKeyForm::kDigits:
      return WriteValue(pfConf, "\twep_key0=%.*s\n", key);
    case WepKeyForm::kWrong:
      break;
  }
  return LOG("Wrong WEP Format."), true;  // and the attempt goes on, without the key
}

bool WriteWithoutWpa(FILE* pfConf, const WIRELESS_NETWORK_CONFIG& config) {
  std::fprintf(pfConf, "\tkey_mgmt=NONE\n");
  if (config.network.encrypt == WIRELESS_ENCRYPT_WEP) {
    if (!WriteWepKey(pfConf, TextIn(config.szKey))) return false;
    std::fprintf(pfConf, "\twep_tx_keyidx=0\n");
    std::fprintf(pfConf, "\tauth_alg=SHARED\n");
  }
  std::fprintf(pfConf, "}\n");
  return true;
}

void WritePairwise(FILE* pfConf, WIRELESS_ENCRYPT encrypt) {
  if ((encrypt & (WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES)) == 0) return;
  std::fprintf(pfConf, "\tpairwise=%s\n", MEROWirelessEncryptStringGet(encrypt, 1));
}

bool WriteWpaPsk(FILE* pfConf, const WIRELESS_NETWORK_CONFIG& config) {
  std::fprintf(pfConf, "\tkey_mgmt=WPA-PSK\n");
  WritePairwise(pfConf, config.network.encrypt);
  return WriteValue(pfConf, "\tpsk=\"%.*s\"\n}\n", TextIn(config.szKey));
}

bool WriteWpaEap(FILE* pfConf, const WIRELESS_NETWORK_CONFIG& config) {
  std::fprintf(pfConf, "\tkey_mgmt=WPA-EAP\n");
  std::fprintf(pfConf, "\teap=TTLS PEAP\n");
  WritePairwise(pfConf, config.network.encrypt);
  if (!WriteValue(pfConf, "\tidentity=\"%.*s\"\n", TextIn(config.szUser))) return false;
  if (!WriteValue(pfConf, "\tpassword=\"%.*s\"\n", TextIn(config.szKey))) return false;
  std::fprintf(pfConf, "}\n");
  return true;
}

// Writes the lines of the authentication, and closes the block. False after a report when the authentication is
// unknown, or a value cannot be written.
bool WriteSecurity(FILE* pfConf, const WIRELESS_NETWORK_CONFIG& config) {
  switch (config.network.auth) {
    case WIRELESS_AUTH_OPEN:
    case WIRELESS_AUTH_SHARED:
    case WIRELESS_AUTH_WEPAUTO:
      return WriteWithoutWpa(pfConf, config);
    case WIRELESS_AUTH_WPAPSK:
    case WIRELESS_AUTH_WPA2PSK:
      return WriteWpaPsk(pfConf, config);
    case WIRELESS_AUTH_WPAEAP:
    case WIRELESS_AUTH_WPA2EAP:
      return WriteWpaEap(pfConf, config);
    case WIRELESS_AUTH_UNKNOWN:
    case WIRELESS_AUTH_WPANONE:
      break;
  }
  return LOG("Failed to detect authentication/encryption type"), false;
}

bool WriteNetwork(FILE* pfConf, const WIRELESS_NETWORK_CONFIG& config) {
  char szBssid[1024] = {};
  std::fprintf(pfConf, "ctrl_interface=%s\n", kSupplicantControlDirectory);
  std::fprintf(pfConf, "network={\n");
  if (!WriteValue(pfConf, "\tssid=\"%.*s\"\n", TextIn(config.network.szEssid))) return false;
  if (CheckBssid(&config) == TRUE) {
    std::fprintf(pfConf, "\tbssid=%s\n", MEROWirelessBssidStringGet(config.network.bssid, szBssid, sizeof szBssid));
  }
  std::fprintf(pfConf, "\tscan_ssid=1\n");
  return WriteSecurity(pfConf, config);
}

BOOL SetWpaSupplicantConfig(const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (pNetCfg == nullptr) return LOG("Bad parameters"), FALSE;
  if (PLIBCFileExist(kSupplicantConfigPath) != 0) (void)PLIBCSysUnlink(kSupplicantConfigPath);  // rewritten anyway
  NewFile conf(kSupplicantConfigPath, NewFile::kSecret);
  if (!conf) return LOG("Failed to open file[%s].", kSupplicantConfigPath), FALSE;
  const bool complete = WriteNetwork(conf.get(), *pNetCfg);
  return conf.Close() && complete ? TRUE : FALSE;
}

// ---- The supplicant itself ----

bool Run(const LongCommand& command) {
  if (command.Run() >= 0) return true;
  return LOG("Failed to execute '%s'", command.c_str()), false;
}

bool TerminateSupplicant() {
  return Run(LongCommand("/usr/sbin/wpa_cli terminate > /dev/null 2>&1"));
}

bool StartSupplicant(const char* szIfName) {
  return Run(LongCommand("%s -Dwext -i%s -c%s -B -P%s &> /dev/null", kSupplicantPath, ShellWord(szIfName).c_str(),
                         kSupplicantConfigPath, kSupplicantPidPath));
}

// Asks for the supplicant's state once a second until the connection is complete.
BOOL CheckConnComplete() {
  constexpr int kPolls = 15;
  char szState[1024] = {};
  for (int poll = 0; poll < kPolls; ++poll) {
    ::sleep(1);
    const Pipe status(LongCommand("/usr/sbin/wpa_cli status | grep wpa_state"));
    if (!status) continue;
    if (std::fscanf(status.get(), " wpa_state=%1023s", szState) == 1 && std::strcmp(szState, "COMPLETED") == 0) {
      return TRUE;
    }
  }
  return FALSE;
}

// Puts a new record into its place, and removes a directory that others have put there meanwhile: anyone may, in this
// directory. A file it replaces.
bool PutRecord(const char* szNew) {
  constexpr int kTries = 100;
  for (int i = 0; i < kTries; ++i) {
    if (std::rename(szNew, kConnectionRecordPath) == 0) return true;
    if (errno != EISDIR) return false;
    (void)PLIBCSysUnlink(kConnectionRecordPath);
  }
  return false;
}

// Records the connection for other programs. FALSE when no file can be made for the record; a record that cannot be
// written is only reported, since a connection that is up is worth more than its record.
BOOL RecordConnection(const WIRELESS_NETWORK* pNetwork) {
  if (pNetwork == nullptr) return FALSE;
  (void)PLIBCSysUnlink(kConnectionRecordPath);  // the old record is wrong from now on
  char szNew[sizeof kConnectionRecordPath + sizeof ".XXXXXX"];
  std::snprintf(szNew, sizeof szNew, "%s.XXXXXX", kConnectionRecordPath);
  NewFile record = NewFile::Unforeseen(szNew, NewFile::kForAll);
  if (!record) return FALSE;

  char szBssid[1024] = {};
  const std::string_view essid = TextIn(pNetwork->szEssid);
  std::fprintf(record.get(), "%.*s\n%d\n%d\n%d\n%s\n", static_cast<int>(essid.size()), essid.data(), pNetwork->protocol,
               pNetwork->auth, pNetwork->encrypt, MEROWirelessBssidStringGet(pNetwork->bssid, szBssid, sizeof szBssid));
  const bool written = record.Close();
  if (!written) LOG("Failed to write file [%s]", kConnectionRecordPath);  // none is better than a part
  const bool put = written && PutRecord(szNew);
  if (!put) (void)::unlink(szNew);
  return put || !written ? TRUE : FALSE;
}

// ---- The connection ----

int NetworkConnect(const char* szIfName, const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (szIfName == nullptr || pNetCfg == nullptr) return LOG("Bad parameters"), -1;
  if (pNetCfg->network.opmode == WIRELESS_OPMODE_ADHOC) return MEROWirelessAdhocCreate(pNetCfg);

  if (SetWpaSupplicantConfig(pNetCfg) == FALSE) return LOG("Failed to set [%s]", kSupplicantConfigPath), -1;
  if (PLIBCFileExist(kSupplicantPidPath) != 0 && !TerminateSupplicant()) return -1;
  if (!StartSupplicant(szIfName)) return -1;
  if (CheckConnComplete() == FALSE) {
    LOG("Time out to connect AP, kill wpa_supplicant.");
    (void)TerminateSupplicant();  // has reported; there is nothing else to be done
    return -1;
  }
  if (RecordConnection(&pNetCfg->network) == FALSE) return LOG("Failed to record this connection."), -1;
  return 0;
}

bool MediaServiceUsesWireless() {
  return PLIBCFileCheckKeyValue(kSystemSettingsPath, "runmediaservice", "yes", 0) != 0 &&
         PLIBCFileCheckKeyValue(kSystemSettingsPath, "network_mediaservice", MEROWirelessInterfaceGet(), 0) != 0;
}

void PostProcessing() {
  if (MediaServiceUsesWireless()) (void)MEROMediaService(kMediaServiceRestart);  // has reported
  if (PLIBCFileExist(kResolverPath) != 0) {
    (void)Run(LongCommand("/bin/cp /etc/resolv.conf /etc/resolv.conf.wireless.bak"));  // has reported
  }
}

}  // namespace

int MEROWirelessNetworkConnect(const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  const Marker marker(kJoinMarkerPath);
  if (MEROWirelessAdapterNum() <= 0) return LOG("There is no wireless USB adapter plugged"), -1;
  if (MEROWirelessCheckBlock() != 1) return 0;  // a radio that is switched off is nobody's failure
  if (marker.exists()) return LOG("Another connection construction is going"), -1;

  marker.Create();
  if (NetworkConnect(MEROWirelessInterfaceGet(), pNetCfg) < 0) return LOG("Failed to connect network."), -1;
  PostProcessing();
  return 0;
}
