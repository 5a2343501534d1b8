// Takes the access point down and gives the interface back to client use.
#include <net/if.h>

#include "common/log.h"
#include "common/paths.h"
#include "holders.h"
#include "platform.h"
#include "wireless.h"

namespace {

constexpr char kLineFormat[] = "%s=%s\n";

bool KeepFromBoot(const char* szPath) {
  if (PLIBCFileSetKeyValue(szPath, "ONBOOT", "no", kLineFormat) >= 0) return true;
  return LOG("Failed to set file[%s].", szPath), false;
}

// Names another member as the bridge's first. This changes the file alone; the kernel's bridge changes at the restart.
void PassPrimaryOn(const char* szPath, PPLIBSZLIST slaves, int leaving) {
  (void)PLIBCSzListRemove(slaves, leaving);
  (void)PLIBCFileSetKeyValue(szPath, "PRIMARY", PLIBCSzListGet(slaves, 0), kLineFormat);  // has reported
}

BOOL RemoveBridgeSlaveInMasterConfig(const char* szBridge, const char* szSlave) {
  List slaves;
  if (!slaves) {
    LOG("Failed to alloc pList");
    return PLIBCErrSet(ERR_OUT_OF_MEMORY), FALSE;
  }
  if (PLIBNetBridgeSlaveEnum(szBridge, slaves.address()) < 0) {
    return LOG("Failed to get number of slave for bridge [%s].", szBridge), FALSE;
  }

  const int leaving = PLIBCSzListFind(slaves.get(), szSlave);
  const InterfacePath script(kInterfaceScriptFormat, szBridge);
  const int count = slaves.get()->nItem;
  if (count < 1) return KeepFromBoot(script.c_str()) ? TRUE : FALSE;
  if (leaving < 0) return TRUE;
  if (count == 1) return KeepFromBoot(script.c_str()) ? TRUE : FALSE;
  PassPrimaryOn(script.c_str(), slaves.get(), leaving);
  return TRUE;
}

// Takes the interface out of its bridge, and gives the name of the bridge; an empty name when it is in none.
void LeaveBridge(const char* szScript, const char* szIfName, char* szBridge, size_t cbSize) {
  if (PLIBCFileGetKeyValue(szScript, "BRIDGE", szBridge, cbSize, 0) <= 0) return;
  (void)RemoveBridgeSlaveInMasterConfig(szBridge, szIfName);  // has reported; the interface leaves all the same
  if (PLIBCFileRemoveKey(szScript, "BRIDGE") < 0) LOG("Failed to remove key %s in [%s].", "BRIDGE", szScript);
}

bool StopDhcpServer(const char* szBridge) {
  MERO_DHCPD_CONF conf{};
  if (MERONetGetDhcpServerConf(szBridge, szBridge, &conf) == 0) return true;
  return MERONetSetDhcpServerConfigFiles(&conf, 0) != 0;
}

BOOL SetWirelessAPConfigs(const char* szIfName, char* szBridge, size_t cbSize) {
  const InterfacePath info(kHostapdInfoFormat, szIfName);
  if (PLIBCFileExist(info.c_str()) != 0) (void)PLIBCSysRemove(info.c_str());  // has reported

  const InterfacePath script(kInterfaceScriptFormat, szIfName);
  if (PLIBCFileExist(script.c_str()) == 0) return LOG("File[%s] does not exist.", script.c_str()), FALSE;
  LeaveBridge(script.c_str(), szIfName, szBridge, cbSize);
  (void)PLIBCFileRemoveKey(script.c_str(), "LOCAL_LAN");  // has reported
  return StopDhcpServer(szBridge) ? TRUE : FALSE;
}

}  // namespace

BOOL MEROWirelessAPDisable(void) {
  char szBridge[IFNAMSIZ] = {};
  if (SetWirelessAPConfigs(MEROWirelessAPInterfaceGet(), szBridge, sizeof szBridge) == FALSE) {
    return LOG("Failed to set AP config files."), FALSE;
  }
  if (PLIBCExec(kNetworkScriptPath, "restart", MEROWirelessAPInterfaceGet(), szBridge, nullptr) == 0) return TRUE;
  return LOG("Failed to restart /etc/rc.network"), FALSE;
}
