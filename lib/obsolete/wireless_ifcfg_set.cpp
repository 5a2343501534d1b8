// Gives the wireless interface its address.
#include <cstring>

#include "common/log.h"
#include "common/text.h"
#include "platform.h"
#include "wireless.h"

namespace {

constexpr int kDhcpSeconds = 16;

}  // namespace

int MEROWirelessIfconfigSet(const char* szIfName, WIRELESS_NETWORK_CONFIG config) {
  if (szIfName == nullptr) return LOG("Bad parameters"), -1;

  NETINFO netInfo{};
  CopyText(netInfo.szInterface, szIfName);
  if (std::strcmp(config.szIp, "DHCP") == 0) {
    // When no server answers, the record is applied nevertheless, as it is then.
    if (MEROIGetDHCPTestNetInfo(&netInfo, kDhcpSeconds) < 0) LOG("Failed to get IP from DHCP");
  } else {
    netInfo.blManual = TRUE;
    CopyText(netInfo.szIp, config.szIp);
    CopyText(netInfo.szMask, config.szMask);
  }
  if (MERONetSetCard1(&netInfo, 0) < 0) return LOG("Failed to set network interface"), -1;
  return 0;
}
