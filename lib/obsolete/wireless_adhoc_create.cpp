// Starts or joins an ad-hoc cell. No supplicant takes part: the driver is told directly.
#include <net/if.h>

#include "common/log.h"
#include "common/text.h"
#include "common/wep_key.h"
#include "platform.h"
#include "shell_words.h"
#include "wireless.h"

namespace {

using ConfigCommand = Command<128>;

bool IsSupported(const char* szIfName, const WIRELESS_NETWORK& network) {
  if (network.opmode != WIRELESS_OPMODE_ADHOC) return LOG("Interface %s is not Adhoc mode.", szIfName), false;
  if (network.encrypt == WIRELESS_ENCRYPT_NONE || network.encrypt == WIRELESS_ENCRYPT_WEP) return true;
  return LOG("Adhoc mode does not support encryption [%s].", MEROWirelessEncryptStringGet(network.encrypt, 0)), false;
}

// Changes the mode. Most drivers do so only while the interface is down, so it is taken down first.
bool SetMode(const char* szIfName, WIRELESS_OPMODE opmode) {
  if (PLIBNetIfDown(szIfName) == 0) {
    return LOG("Failed to deactivate network interface [%s].", szIfName), false;
  }
  if (MEROWirelessOpmodeSet(opmode) < 0) return LOG("Failed to set Ad-Hoc mode of %s.", szIfName), false;
  return true;
}

// Only a command that cannot be started is a failure: its exit status is ignored.
bool Run(const ConfigCommand& command) {
  if (command.Run() >= 0) return true;
  return LOG("Failed to execute '%s'", command.c_str()), false;
}

bool SetEssid(const char* szIfName, std::string_view essid) {
  return Run(ConfigCommand("/sbin/iwconfig %s essid %s > /dev/null 2>&1", ShellWord(szIfName).c_str(),
                           ShellWord(essid).c_str()));
}

bool SetKey(const char* szIfName, const WIRELESS_NETWORK_CONFIG& config) {
  const ShellWord ifName(szIfName);
  // Its output is not redirected, unlike that of the others.
  if (config.network.encrypt == WIRELESS_ENCRYPT_NONE) {
    return Run(ConfigCommand("/sbin/iwconfig %s key off", ifName.c_str()));
  }

  const ShellWord key(TextIn(config.szKey));
  switch (FormOfWepKey(TextIn(config.szKey))) {
    case WepKeyForm::kText:
      return Run(ConfigCommand("/sbin/iwconfig %s key open s:%s > /dev/null 2>&1", ifName.c_str(), key.c_str()));
    case WepKeyForm::kDigits:
      return Run(ConfigCommand("/sbin/iwconfig %s key open %s > /dev/null 2>&1", ifName.c_str(), key.c_str()));
    case WepKeyForm::kWrong:
      break;
  }
  return LOG("The key is not standard WEP format."), false;
}

bool BringUp(const char* szIfName) {
  if (PLIBNetIfUp(szIfName) != 0) return true;
  return LOG("Failed to activate network interface %s", szIfName), false;
}

}  // namespace

int MEROWirelessAdhocCreate(const WIRELESS_NETWORK_CONFIG* pNetCfg) {
  if (pNetCfg == nullptr) return LOG("Bad parameters"), -1;
  if (MEROWirelessAdapterNum() <= 0) return LOG("There is no wireless USB adapter plugged"), -1;

  char szIfName[IFNAMSIZ] = {};
  CopyText(szIfName, MEROWirelessInterfaceGet());
  const WIRELESS_NETWORK& network = pNetCfg->network;
  const bool created = IsSupported(szIfName, network) && SetMode(szIfName, network.opmode) &&
                       SetEssid(szIfName, TextIn(network.szEssid)) && SetKey(szIfName, *pNetCfg) && BringUp(szIfName);
  return created ? 0 : -1;
}
