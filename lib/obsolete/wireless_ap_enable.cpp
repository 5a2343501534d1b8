// Turns the adapter into an access point, by the saved settings.
#include <arpa/inet.h>
#include <net/if.h>

#include <cstring>

#include "common/log.h"
#include "common/paths.h"
#include "common/text.h"
#include "holders.h"
#include "platform.h"
#include "wireless.h"

namespace {

constexpr char kWiredInterface[] = "eth0";
constexpr char kAddress[] = "10.1.14.1";
constexpr char kMask[] = "255.255.255.0";
constexpr char kPlainFormat[] = "%s=%s\n";
constexpr char kQuotedFormat[] = "%s=\"%s\"\n";
constexpr int kAutoTime = 30;
constexpr int kLeaseSeconds = 86400;

// Sets a key to "yes", in the quoted form.
bool SwitchOn(const char* szPath, const char* szKey) {
  if (PLIBCFileSetKeyValue(szPath, szKey, "yes", kQuotedFormat) > 0) return true;
  return LOG("Failed to set key[%s] in [%s].", szKey, szPath), false;
}

// ---- The DHCP server of a bridge that translates addresses ----

bool IsInSubnet(const NETINFO& netInfo, const char* szAddress) {
  return MERONetIsSameSubnet(szAddress, netInfo.szIp, netInfo.szMask) != 0;
}

bool HasValidRange(const NETINFO& netInfo) {
  const char* szBridge = netInfo.szInterface;
  MERO_DHCPD_CONF stored{};
  return MERONetGetDhcpServerConf(szBridge, szBridge, &stored) != 0 && IsInSubnet(netInfo, stored.szRangeStart) &&
         IsInSubnet(netInfo, stored.szRangeEnd);
}

// The range from the address after the bridge's own to the end of its subnet. The lower addresses are not given out.
bool ComputeRange(const NETINFO& netInfo, MERO_DHCPD_CONF& conf) {
  in_addr ip;
  in_addr mask;
  if (::inet_aton(netInfo.szIp, &ip) == 0 || ::inet_aton(netInfo.szMask, &mask) == 0) {
    return LOG("Failed to conver to inet_aton format of [%s] or [%s].", netInfo.szIp, netInfo.szMask), false;
  }
  const uint32_t address = ntohl(ip.s_addr);
  const uint32_t bits = ntohl(mask.s_addr);
  const auto put = [&netInfo](char(&szEnd)[20], uint32_t end) {
    CopyText(szEnd, MERONetNtoa({htonl(end)}));
    return IsInSubnet(netInfo, szEnd);
  };
  if (put(conf.szRangeStart, address + 1) && put(conf.szRangeEnd, (address & bits) + ~bits - 1)) return true;
  return LOG("Failed to get the valid range of dhcp server[%s].", netInfo.szInterface), false;
}

bool WriteServer(const NETINFO& netInfo, MERO_DHCPD_CONF& conf) {
  conf.blEnable = TRUE;
  conf.autoTime = kAutoTime;
  conf.leaseTime = kLeaseSeconds;
  CopyText(conf.szInterface, netInfo.szInterface);
  CopyText(conf.szRouter, netInfo.szIp);
  CopyText(conf.szDns, netInfo.szIp);
  CopyText(conf.szSubnet, netInfo.szMask);
  CopyText(conf.szTag, netInfo.szInterface);
  if (MERONetSetDhcpServerConfigFiles(&conf, 1) != 0) return true;
  return LOG("Failed to set dhcpServer conf for [%s].", netInfo.szInterface), false;
}

BOOL SetValidDHCPServerConfig(const NETINFO* pNetInfo) {
  if (pNetInfo == nullptr) return LOG("Wrong Parameter."), FALSE;
  if (HasValidRange(*pNetInfo)) {
    const InterfacePath info(kDhcpInfoFormat, pNetInfo->szInterface, pNetInfo->szInterface);
    return SwitchOn(info.c_str(), "enable") ? TRUE : FALSE;
  }
  MERO_DHCPD_CONF conf{};
  return ComputeRange(*pNetInfo, conf) && WriteServer(*pNetInfo, conf) ? TRUE : FALSE;
}

// ---- The bridge ----

bool CreateBridge(const char* szBridge, const char* szSlave, NETINFO& netInfo, BRIDGE_INFO& bridgeInfo) {
  netInfo.blActive = TRUE;
  CopyText(netInfo.szInterface, szBridge);
  CopyText(bridgeInfo.szIfName, szBridge);
  if (std::strcmp(szBridge, kNatBridge) == 0) {
    bridgeInfo.type = TYPE_NAT_MASTER;
    netInfo.blManual = TRUE;
    CopyText(bridgeInfo.info.szPrimary, szSlave);
    CopyText(netInfo.szIp, kAddress);
    CopyText(netInfo.szMask, kMask);
  } else {
    bridgeInfo.type = TYPE_BR_MASTER;
    netInfo.blManual = FALSE;
    CopyText(bridgeInfo.info.szPrimary, kWiredInterface);
  }
  if (MERONetSetBridgeConfig(&netInfo, &bridgeInfo) >= 0) return true;
  return LOG("Failed to set bridge config."), false;
}

bool StartAtBoot(const char* szBridge) {
  const InterfacePath script(kInterfaceScriptFormat, szBridge);
  if (PLIBCFileCheckKeyValue(script.c_str(), "ONBOOT", "yes", 0) != 0) return true;
  return SwitchOn(script.c_str(), "ONBOOT");
}

BOOL SetBridgeConfigs(const char* szBridge, const char* szSlave) {
  NETINFO netInfo{};
  BRIDGE_INFO bridgeInfo{};
  const bool known = MERONetGetBridgeConfig(szBridge, &netInfo, &bridgeInfo) >= 0;
  const bool ready = known ? StartAtBoot(szBridge) : CreateBridge(szBridge, szSlave, netInfo, bridgeInfo);
  if (!ready) return FALSE;
  return bridgeInfo.type == TYPE_NAT_MASTER ? SetValidDHCPServerConfig(&netInfo) : TRUE;
}

// ---- The settings ----

bool ReadSettings(MERO_AP_CONF& conf) {
  char szSecName[1024] = {};
  if (MEROWirelessApConfigSecNameGet(szSecName, sizeof szSecName) == FALSE) {
    return LOG("Failed to get section name of %s", szSecName), false;
  }
  if (MEROWirelessGetAPConfig(szSecName, &conf) > 0) return true;
  return LOG("Failed to get ap info of secname[%s]", szSecName), false;
}

bool WriteInterfaceScript(const char* szIfName, const char* szBridge) {
  const struct {
    const char* szKey;
    const char* szValue;
  } pairs[] = {
      {"ONBOOT", "yes"},    {"DEVICE", szIfName}, {"BRIDGE", szBridge},
      {"IPADDR", kAddress}, {"NETMASK", kMask},   {"BOOTPROTO", "static"},
  };
  const InterfacePath script(kInterfaceScriptFormat, szIfName);
  for (const auto& pair : pairs) {
    if (PLIBCFileSetKeyValue(script.c_str(), pair.szKey, pair.szValue, kPlainFormat) > 0) continue;
    return LOG("Failed to set %s meroerr=[0x%04X]", script.c_str(), static_cast<unsigned>(PLIBCErrGet())), false;
  }
  return true;
}

BOOL SetWirelessAPConfigs(const char* szIfName, char* szBridge, size_t cbSize) {
  if (szIfName == nullptr || szBridge == nullptr) return LOG("Bad Parameter."), FALSE;

  MERO_AP_CONF apConf{};
  if (!ReadSettings(apConf)) return FALSE;
  if (apConf.blEnable == FALSE) return FALSE;  // an access point that is switched off is reported by the caller alone

  MERO_HOSTAP_CONF& hostapConf = apConf.hostapConf;
  if (MEROWirelessSetHostAPConf(szIfName, &hostapConf) == FALSE) {
    return LOG("Failed to set hostapd conf of interface [%s].", szIfName), FALSE;
  }
  if (!SwitchOn(InterfacePath(kHostapdInfoFormat, szIfName).c_str(), "enable")) return FALSE;
  if (hostapConf.szBridge[0] == '\0') return LOG("Failed to find bridge interface."), FALSE;

  CopyText(szBridge, cbSize, hostapConf.szBridge);
  if (SetBridgeConfigs(szBridge, szIfName) == FALSE) return LOG("Failed to set bridge[%s] config.", szBridge), FALSE;
  return WriteInterfaceScript(szIfName, szBridge) ? TRUE : FALSE;
}

BOOL Construct(const char* szIfName) {
  char szBridge[IFNAMSIZ] = {};
  if (SetWirelessAPConfigs(szIfName, szBridge, sizeof szBridge) == FALSE) return LOG("Failed to enable AP."), FALSE;
  if (PLIBCExec(kNetworkScriptPath, "start", szIfName, szBridge, nullptr) == 0) return TRUE;
  return LOG("Failed to restart /etc/rc.network"), FALSE;
}

}  // namespace

BOOL MEROWirelessAPEnable(void) {
  const Marker marker(kApMarkerPath);
  if (marker.exists()) return LOG("Another ap construction is going"), FALSE;
  marker.Create();
  return Construct(MEROWirelessAPInterfaceGet());
}
