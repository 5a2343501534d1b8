// Switches the adapter between access-point mode and client mode.
#include "common/log.h"
#include "common/paths.h"
#include "platform.h"
#include "wireless.h"

namespace {

bool RunHotplugScript(const char* szMode) {
  return PLIBCExec(kHotPlugScriptPath, "change-mode", szMode, nullptr, nullptr) == 0;
}

}  // namespace

BOOL MEROWirelessModeChange(MERO_WIRELESS_MODE mode) {
  switch (mode) {
    case WIRELESS_AP_MODE:
      if (RunHotplugScript("ap")) return TRUE;
      return LOG("Failed to change to wireless AP mode."), FALSE;
    case WIRELESS_CLIENT_MODE:
      if (RunHotplugScript("client")) return TRUE;
      return LOG("Failed to change to wireless client mode."), FALSE;
  }
  return LOG("Wrong Wireless Mode."), FALSE;
}
