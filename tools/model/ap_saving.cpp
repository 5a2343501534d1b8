// Saves the access point's settings by the library.
#include "model/ap_saving.h"

#include "base/signals.h"
#include "common/paths.h"
#include "model/library.h"

void SetBridgeDefault(ApConf& conf) {
  if (conf.hostapConf.szBridge[0] == '\0') SetText(conf.hostapConf.szBridge, kNatBridge, "the bridge");
}

Failure ApNotSaved() {
  return Failed("the settings could not be saved", "is there room on the disk? -v shows more");
}

void SaveApSwitch(ApConf conf, bool on) {
  conf.blEnable = on ? TRUE : FALSE;
  if (MEROWirelessSetAPConfig(&conf) == FALSE) throw ApNotSaved();
}

void SaveApKeepingSwitch(const ApConf& conf) {
  const Signals signals;
  SaveApSwitch(conf, true);
  if (conf.blEnable == FALSE) SaveApSwitch(conf, false);
}
