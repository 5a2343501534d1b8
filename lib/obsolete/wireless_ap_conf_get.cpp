// Reads the access-point settings of one adapter model.
#include <cstdlib>
#include <cstring>

#include "common/ap_settings.h"
#include "common/log.h"
#include "common/paths.h"
#include "common/text.h"
#include "holders.h"
#include "platform.h"
#include "wireless.h"

namespace {

int GetIntegerValue(const PPLIBSZHASH pHash, const char* key, int defValue) {
  const char* szValue = PLIBCSzHashGetValue(pHash, key);
  return szValue != nullptr ? static_cast<int>(std::strtol(szValue, nullptr, 10)) : defValue;
}

const char* GetStringValue(const PPLIBSZHASH pHash, const char* key, const char* defValue) {
  const char* szValue = PLIBCSzHashGetValue(pHash, key);
  return szValue != nullptr ? szValue : defValue;
}

int GetSwitchValue(const PPLIBSZHASH pHash, const char* key, int defValue) {
  const char* szValue = PLIBCSzHashGetValue(pHash, key);
  if (szValue == nullptr) return defValue;
  return std::strcmp(szValue, "yes") == 0 ? TRUE : FALSE;
}

// The settings when there is no section. They differ from the defaults of the table, which hold for keys that a section
// lacks: above all, the guest network is all zeros here.
void SetDefaultAPConfig(const char* szSecName, PMERO_AP_CONF pConf) {
  MERO_AP_CONF conf{};
  CopyText(conf.szSecName, szSecName);
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.kind == SettingKind::kMainSecrets) break;
    if (setting.kind != SettingKind::kText) {
      PutNumber(&conf, setting, setting.missing);
    } else {
      CopyText(reinterpret_cast<char*>(&conf) + setting.offset, setting.size, setting.szMissing);
    }
  }
  CopyText(conf.hostapConf.szSSID, kUnsavedSsid);
  CopyText(conf.hostapConf.szBridge, kNatBridge);
  *pConf = conf;  // all at once, since the name may be the record's own
}

// Takes one setting of a key from the section into its field of a record.
void Take(PPLIBSZHASH pshHash, const char* szKey, const Setting& setting, void* record) {
  switch (setting.kind) {
    case SettingKind::kSwitch:
      return PutNumber(record, setting, GetSwitchValue(pshHash, szKey, setting.missing));
    case SettingKind::kInteger:
      return PutNumber(record, setting, GetIntegerValue(pshHash, szKey, setting.missing));
    case SettingKind::kText:
      return CopyText(static_cast<char*>(record) + setting.offset, setting.size,
                      GetStringValue(pshHash, szKey, setting.szMissing));
    case SettingKind::kTextOnlyWritten:
    case SettingKind::kMainSecrets:
    case SettingKind::kGuestSecrets:
      return;
  }
}

// Reads the keys that an encryption needs; an unknown encryption has none.
BOOL getEncryptionConf(PPLIBSZHASH pshHash, MERO_AP_ENCRYPT encryption, PMERO_HOSTAP_ENCRYPT_INFO pEncryptInfo,
                       BOOL blGuestNet) {
  if (blGuestNet != FALSE && encryption == AP_ENCRYPT_WPA_EAP) {
    return LOG("Guest Network does not have EAP encryption"), FALSE;
  }
  ForEachSecret(encryption, blGuestNet,
                [&](const char* szKey, const Setting& setting) { Take(pshHash, szKey, setting, pEncryptInfo); });
  return TRUE;
}

void TakeAll(PPLIBSZHASH pshHash, PMERO_AP_CONF pConf) {
  MERO_HOSTAP_CONF& main = pConf->hostapConf;
  MERO_HOSTAP_GUEST_NET& guest = main.guestNet;
  ForEachRead([&](const Setting& setting) {
    if (setting.kind == SettingKind::kMainSecrets) {
      (void)getEncryptionConf(pshHash, main.encryption, &main.encryptInfo, FALSE);
    } else if (setting.kind == SettingKind::kGuestSecrets) {
      (void)getEncryptionConf(pshHash, guest.encryption, &guest.encryptInfo, TRUE);  // has reported; the rest is good
    } else {
      Take(pshHash, setting.szKey, setting, pConf);
    }
  });
}

}  // namespace

int MEROWirelessGetAPConfig(const char* szSecName, PMERO_AP_CONF pConf) {
  if (szSecName == nullptr || pConf == nullptr) return LOG("Bad parameters"), -1;
  SetDefaultAPConfig(szSecName, pConf);
  if (PLIBCFileExist(kApSettingsPath) == 0) return 0;

  Hash section;
  if (!section) return -1;
  const int result = PLIBCFileGetSection(kApSettingsPath, szSecName, section.address());
  if (result > 0) TakeAll(section.get(), pConf);
  return result;
}
