// Saves a network among the known ones.
#include <cstdio>
#include <ctime>

#include "common/clock.h"
#include "common/known_networks_file.h"
#include "common/log.h"
#include "common/paths.h"
#include "common/text.h"
#include "holders.h"
#include "platform.h"
#include "wireless.h"

namespace {

// Reads the network's saved section, if any, into the hash, or creates the file. Greater than 0 when the section
// exists, 0 when it does not, negative after a report.
int ReadSaved(const char* szSection, Hash& hash) {
  if (PLIBCFileExist(kKnownNetworksPath) == 0) {
    if (PLIBCFileTouch(kKnownNetworksPath) >= 0) return 0;
    return LOG_LINE(47, "Failed to touch %s", kKnownNetworksPath), -1;
  }
  const int exists = PLIBCFileGetSection(kKnownNetworksPath, szSection, hash.address());
  if (exists < 0) {
    // The message has always named the path first and the section second, and is searched for in that form.
    LOG_LINE(42, "Failed to get section: %s from %s, errno=0x%X", kKnownNetworksPath, szSection,
             static_cast<unsigned>(PLIBCErrGet()));
  }
  return exists;
}

// Puts the network into the hash, in the order of the file. The results are not needed: when memory runs out for a
// pair, the hash remembers it, and writing the hash fails.
void Fill(Hash& hash, const WIRELESS_NETWORK_CONFIG& config, const char* szBssid) {
  char szTime[1024] = {};
  std::snprintf(szTime, sizeof szTime, "%lld", static_cast<long long>(SaturatedTime(std::time(nullptr))));

  const WIRELESS_NETWORK& network = config.network;
  const struct {
    const char* szKey;
    const char* szValue;
  } pairs[] = {
      {kKeySecret, config.szKey},
      {kKeyAddress, config.szIp},
      {kKeyMask, config.szMask},
      {kKeyGateway, config.szGateway},
      {kKeyEssid, network.szEssid},
      {kKeyBssid, szBssid},
      {kKeyMode, MEROWirelessOpmodeStringGet(network.opmode)},
      {kKeyAccessTime, szTime},
      {kKeyAuth, MEROWirelessAuthStringGet(network.auth)},
      {kKeyEncrypt, MEROWirelessEncryptStringGet(network.encrypt, 0)},
  };
  for (const auto& pair : pairs) (void)PLIBCSzHashSetValue(hash.address(), pair.szKey, pair.szValue);
}

int Add(const char* szSection, const Hash& hash) {
  if (PLIBCFileAddSection(kKnownNetworksPath, szSection, hash.get(), kSectionLineFormat) > 0) return 0;
  return LOG_LINE(72, "Failed to add section: %s from %s, errno=0x%X", szSection, kKnownNetworksPath,
                  static_cast<unsigned>(PLIBCErrGet())),
         -1;
}

int Replace(const char* szSection, const Hash& hash) {
  if (PLIBCFileSetSection(kKnownNetworksPath, szSection, nullptr, hash.get(), kSectionLineFormat) > 0) return 0;
  return LOG_LINE(67, "Failed to set section: %s from %s, errno=0x%X", szSection, kKnownNetworksPath,
                  static_cast<unsigned>(PLIBCErrGet())),
         -1;
}

}  // namespace

int MEROWirelessConfSet(const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (pNetCfg == nullptr) return LOG_LINE(30, "Bad parameters"), -1;
  Hash hash;
  if (!hash) return LOG_LINE(33, "Failed to alloc memory"), -1;

  char szBssid[1024] = {};
  char szSection[128] = {};
  CopyText(szSection, MEROWirelessBssidStringGet(pNetCfg->network.bssid, szBssid, sizeof szBssid));
  const int exists = ReadSaved(szSection, hash);
  if (exists < 0) return -1;

  Fill(hash, *pNetCfg, szBssid);
  return exists > 0 ? Replace(szSection, hash) : Add(szSection, hash);
}
