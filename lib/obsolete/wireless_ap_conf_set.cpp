// Saves the access-point settings.
#include <sys/stat.h>

#include <cstdio>
#include <optional>

#include "common/ap_settings.h"
#include "common/log.h"
#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "shell_words.h"
#include "wireless.h"

namespace {

constexpr char kEnableKey[] = "enable";

char* ConvertIntegerToString(const int value, char* szValue, const size_t cbSize) {
  std::snprintf(szValue, cbSize, "%d", value);
  return szValue;
}

// Whether a command that reads the settings might come to no end: it would wait for a pipe's other end.
bool MayHaveNoEnd() {
  struct stat info;
  return ::stat(kApSettingsPath, &info) == 0 && !S_ISREG(info.st_mode) && !S_ISDIR(info.st_mode);
}

// Whether the file holds the section's header. The search ignores case, takes the name as a part of a regular
// expression, and finds it anywhere in a line, as it always has. Gives 1 or 0; -1 after a report.
int IsSectionExist(const char* szSecName) {
  if (szSecName == nullptr) return LOG("Wrong Parameter."), -1;
  const Command<1024> command("grep -i \"\\[%s\\]\" %s", ShellQuoted(szSecName).c_str(), kApSettingsPath);
  if (MayHaveNoEnd()) return LOG("Failed to execute command"), -1;
  const Pipe found(command);
  if (!found) return LOG("Failed to execute command"), -1;
  char szLine[1024] = {};
  (void)std::fgets(szLine, sizeof szLine, found.get());  // nothing found leaves the line empty
  return szLine[0] != '\0' ? 1 : 0;
}

const char* TextOfSwitch(int value) {
  return value != FALSE ? "yes" : "no";
}

// Puts the setting of a key, from its field of a record, into the hash. The result is not needed: when memory runs out
// for a pair, the hash remembers it, and writing the hash fails.
void Put(PPLIBSZHASH* ppshHash, const char* szKey, const Setting& setting, const void* record) {
  char szInteger[1024];
  switch (setting.kind) {
    case SettingKind::kSwitch:
      return (void)PLIBCSzHashSetValue(ppshHash, szKey, TextOfSwitch(NumberIn(record, setting)));
    case SettingKind::kInteger:
      return (void)PLIBCSzHashSetValue(ppshHash, szKey,
                                       ConvertIntegerToString(NumberIn(record, setting), szInteger, sizeof szInteger));
    case SettingKind::kText:
    case SettingKind::kTextOnlyWritten:
      return (void)PLIBCSzHashSetValue(ppshHash, szKey, static_cast<const char*>(record) + setting.offset);
    case SettingKind::kMainSecrets:
    case SettingKind::kGuestSecrets:
      return;
  }
}

BOOL setEncryptionConf(PPLIBSZHASH* ppshHash, const MERO_AP_ENCRYPT encryption,
                       const PMERO_HOSTAP_ENCRYPT_INFO pEncryptInfo, BOOL blGuestNet) {
  if (encryption < AP_ENCRYPT_OPEN || encryption >= AP_ENCRYPT_MAX) return LOG("Wrong encryption"), FALSE;
  if (blGuestNet != FALSE && encryption == AP_ENCRYPT_WPA_EAP) {
    return LOG("Guest Network does not have EAP encryption"), FALSE;
  }
  ForEachSecret(encryption, blGuestNet,
                [&](const char* szKey, const Setting& setting) { Put(ppshHash, szKey, setting, pEncryptInfo); });
  return TRUE;
}

void PutSwitches(PPLIBSZHASH* ppshHash, PMERO_AP_CONF pConf) {
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.kind == SettingKind::kSwitch) Put(ppshHash, setting.szKey, setting, pConf);
  }
}

// Puts all settings of an access point that is switched on; false when one of its encryptions is refused.
bool PutTheRest(PPLIBSZHASH* ppshHash, PMERO_AP_CONF pConf) {
  MERO_HOSTAP_CONF& main = pConf->hostapConf;
  MERO_HOSTAP_GUEST_NET& guest = main.guestNet;
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.kind == SettingKind::kSwitch) continue;
    BOOL blDone = TRUE;
    if (setting.kind == SettingKind::kMainSecrets) {
      blDone = setEncryptionConf(ppshHash, main.encryption, &main.encryptInfo, FALSE);
    } else if (setting.kind == SettingKind::kGuestSecrets) {
      blDone = setEncryptionConf(ppshHash, guest.encryption, &guest.encryptInfo, TRUE);
    } else {
      Put(ppshHash, setting.szKey, setting, pConf);
    }
    if (blDone == FALSE) return false;
  }
  return true;
}

// Whether the section exists, and is to be replaced. Creates the file when it is missing. No value after a failure.
std::optional<bool> FindSection(const char* szSecName) {
  if (PLIBCFileExist(kApSettingsPath) != 0) {
    const int exists = IsSectionExist(szSecName);
    return exists >= 0 ? std::optional<bool>(exists > 0) : std::nullopt;
  }
  if (PLIBCFileTouch(kApSettingsPath) < 0) return LOG("Failed to touch %s", kApSettingsPath), std::nullopt;
  return false;
}

// All other settings stay, so that nothing is lost when the access point is switched off.
BOOL SaveDisabled(const char* szSecName) {
  if (PLIBCFileSetSectionValue(kApSettingsPath, szSecName, kEnableKey, TextOfSwitch(FALSE), kSectionLineFormat) >= 0) {
    return TRUE;
  }
  return LOG("Failed to set key[%s] of sec[%s] in file[%s].", kEnableKey, szSecName, kApSettingsPath), FALSE;
}

BOOL SaveSection(const char* szSecName, PPLIBSZHASH pshHash, bool exists) {
  if (exists) {
    if (PLIBCFileSetSection(kApSettingsPath, szSecName, nullptr, pshHash, kSectionLineFormat) > 0) return TRUE;
    return LOG("Failed to set section: %s from %s, errno=0x%X", szSecName, kApSettingsPath,
               static_cast<unsigned>(PLIBCErrGet())),
           FALSE;
  }
  if (PLIBCFileAddSection(kApSettingsPath, szSecName, pshHash, kSectionLineFormat) > 0) return TRUE;
  return LOG("Failed to add section: %s from %s, errno=0x%X", szSecName, kApSettingsPath,
             static_cast<unsigned>(PLIBCErrGet())),
         FALSE;
}

}  // namespace

BOOL MEROWirelessSetAPConfig(const PMERO_AP_CONF pConf) {
  if (pConf == nullptr) return LOG("Bad parameters"), FALSE;
  Hash hash;
  if (!hash) return LOG("Failed to alloc memory"), FALSE;

  const std::optional<bool> exists = FindSection(pConf->szSecName);
  if (!exists) return FALSE;
  PutSwitches(hash.address(), pConf);
  if (pConf->blEnable == FALSE) return SaveDisabled(pConf->szSecName);
  if (!PutTheRest(hash.address(), pConf)) return FALSE;
  return SaveSection(pConf->szSecName, hash.get(), *exists);
}
