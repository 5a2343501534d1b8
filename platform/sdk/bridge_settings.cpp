// Bridges as their network-script files describe them.
#include <netinet/ether.h>

#include <cstring>
#include <iterator>

#include "common/text.h"
#include "platform/base/failure.h"
#include "platform/base/interface.h"
#include "platform/sdk/network_script.h"

namespace {

constexpr char kTypeKey[] = "TYPE";
constexpr char kBridgeType[] = "Bridge";
constexpr char kNatKey[] = "NAT";
constexpr char kPrimaryKey[] = "PRIMARY";
constexpr char kProtocolKey[] = "BOOTPROTO";
constexpr char kStaticProtocol[] = "static";
constexpr char kAddressKey[] = "IPADDR";
constexpr char kMaskKey[] = "NETMASK";
constexpr char kAtBootKey[] = "ONBOOT";
constexpr char kHardwareKey[] = "HWADDR";

constexpr const char* kNoYes[] = {"no", "yes"};

bool Holds(const NetworkScript& script, const char* szKey, std::string_view expected) {
  char szValue[16];
  script.Get(szKey, szValue);
  return EqualIgnoringCase(szValue, expected);
}

BOOL IsYes(const NetworkScript& script, const char* szKey) {
  return Holds(script, szKey, "yes") ? TRUE : FALSE;
}

void ReadHardwareAddress(const NetworkScript& script, NETINFO& netInfo) {
  char szAddress[32];
  ether_addr address;
  script.Get(kHardwareKey, szAddress);
  if (::ether_aton_r(szAddress, &address) != nullptr) {
    std::memcpy(netInfo.rgbMac, address.ether_addr_octet, sizeof netInfo.rgbMac);
  }
}

NETINFO ReadAddressing(const NetworkScript& script, const char* szBridge) {
  NETINFO netInfo{};
  netInfo.blManual = Holds(script, kProtocolKey, kStaticProtocol) ? TRUE : FALSE;
  netInfo.blActive = IsYes(script, kAtBootKey);
  CopyText(netInfo.szInterface, szBridge);
  ReadHardwareAddress(script, netInfo);
  script.Get(kAddressKey, netInfo.szIp);
  script.Get(kMaskKey, netInfo.szMask);
  return netInfo;
}

BRIDGE_INFO ReadBridge(const NetworkScript& script, const char* szBridge) {
  BRIDGE_INFO bridgeInfo{};
  bridgeInfo.type = IsYes(script, kNatKey) != FALSE ? TYPE_NAT_MASTER : TYPE_BR_MASTER;
  CopyText(bridgeInfo.szIfName, szBridge);
  script.Get(kPrimaryKey, bridgeInfo.info.szPrimary);
  return bridgeInfo;
}

// Whether the text of a field ends within it, and is one word to a shell without quotes. All fields are checked before
// anything is written, so that no record is written half.
bool IsWord(const char* szField, size_t cbField) {
  const size_t size = ::strnlen(szField, cbField);
  const auto isOrdinary = [](char c) {
    constexpr char kSpecial[] = "\"'\\`$&|;<>()#*?[]{}~!";
    return static_cast<unsigned char>(c) > ' ' && c != '\x7f' && std::strchr(kSpecial, c) == nullptr;
  };
  return size < cbField && All(std::string_view(szField, size), isOrdinary);
}

template <size_t kSize>
bool IsWord(const char (&szField)[kSize]) {
  return IsWord(szField, kSize);
}

// The name of the bridge that the records are about; null when they are about none, or about two.
const char* NameIn(const NETINFO& netInfo, const BRIDGE_INFO& bridgeInfo) {
  if (!IsWord(netInfo.szInterface) || !IsWord(bridgeInfo.szIfName)) return nullptr;
  const char* szName = netInfo.szInterface[0] != '\0' ? netInfo.szInterface : bridgeInfo.szIfName;
  if (!IsInterfaceName(szName)) return nullptr;
  const bool same = bridgeInfo.szIfName[0] == '\0' || std::strcmp(szName, bridgeInfo.szIfName) == 0;
  return same ? szName : nullptr;
}

// Whether the first member can be one of the bridge's. A bridge may have none yet.
bool CanBePrimary(const char* szPrimary, const char* szBridge) {
  return szPrimary[0] == '\0' || (IsInterfaceName(szPrimary) && std::strcmp(szPrimary, szBridge) != 0);
}

// Whether the records can be written; false after a report.
bool Check(const NETINFO& netInfo, const BRIDGE_INFO& bridgeInfo, const char* szBridge) {
  if (szBridge == nullptr) {
    return LOG("'%.16s' and '%.16s' do not name a bridge", netInfo.szInterface, bridgeInfo.szIfName), false;
  }
  if (bridgeInfo.type != TYPE_BR_MASTER && bridgeInfo.type != TYPE_NAT_MASTER) {
    return LOG("%s is of type %d, which is no bridge's", szBridge, bridgeInfo.type), false;
  }
  if (!IsWord(bridgeInfo.info.szPrimary) || !CanBePrimary(bridgeInfo.info.szPrimary, szBridge)) {
    return LOG("'%.16s' is no first member for %s", bridgeInfo.info.szPrimary, szBridge), false;
  }
  if (!IsWord(netInfo.szIp) || !IsWord(netInfo.szMask)) {
    return LOG("'%.20s' and '%.20s' are no address and mask for %s", netInfo.szIp, netInfo.szMask, szBridge), false;
  }
  return true;
}

void SetOrRemove(NetworkScript& script, const char* szKey, const char* szValue) {
  szValue[0] != '\0' ? script.Set(szKey, szValue) : script.Remove(szKey);
}

void SetHardwareAddress(NetworkScript& script, const NETINFO& netInfo) {
  const bool known = !All(netInfo.rgbMac, [](auto b) { return b == 0; });
  char szAddress[sizeof "00:00:00:00:00:00"] = "";
  if (known) MEROWirelessBssidStringGet(netInfo.rgbMac, szAddress, sizeof szAddress);
  SetOrRemove(script, kHardwareKey, szAddress);
}

bool Write(const NETINFO& netInfo, const BRIDGE_INFO& bridgeInfo, const char* szBridge) {
  NetworkScript script(szBridge);
  script.Set("DEVICE", szBridge);
  script.Set(kNatKey, kNoYes[bridgeInfo.type == TYPE_NAT_MASTER]);
  SetOrRemove(script, kPrimaryKey, bridgeInfo.info.szPrimary);
  script.Set(kProtocolKey, netInfo.blManual != FALSE ? kStaticProtocol : "dhcp");
  SetOrRemove(script, kAddressKey, netInfo.szIp);
  SetOrRemove(script, kMaskKey, netInfo.szMask);
  script.Set(kAtBootKey, kNoYes[netInfo.blActive != FALSE]);
  SetHardwareAddress(script, netInfo);
  script.Set(kTypeKey, kBridgeType);  // last, so that a file that was not finished describes no bridge
  return script.written();
}

}  // namespace

int MERONetGetBridgeConfig(const char* szBridge, PNETINFO pNetInfo, PBRIDGE_INFO pBridgeInfo) {
  if (szBridge == nullptr || pNetInfo == nullptr || pBridgeInfo == nullptr) return REFUSE_NULL(), -1;
  if (!IsInterfaceName(szBridge)) return PLIBCErrSet(ERR_NO_DEVICE), -1;
  const NetworkScript script(szBridge);
  if (!Holds(script, kTypeKey, kBridgeType)) return PLIBCErrSet(ERR_NO_DEVICE), -1;
  *pNetInfo = ReadAddressing(script, szBridge);
  *pBridgeInfo = ReadBridge(script, szBridge);
  return 0;
}

int MERONetSetBridgeConfig(const NETINFO* pNetInfo, const BRIDGE_INFO* pBridgeInfo) {
  if (pNetInfo == nullptr || pBridgeInfo == nullptr) return REFUSE_NULL(), -1;
  const char* szBridge = NameIn(*pNetInfo, *pBridgeInfo);
  if (!Check(*pNetInfo, *pBridgeInfo, szBridge)) return PLIBCErrSet(ERR_BAD_PARAMETERS), -1;
  return Write(*pNetInfo, *pBridgeInfo, szBridge) ? 0 : -1;
}
