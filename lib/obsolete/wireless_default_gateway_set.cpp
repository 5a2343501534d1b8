// Adds a default route through the wireless interface.
#include "common/log.h"
#include "platform.h"
#include "shell_words.h"
#include "wireless.h"

int MEROWirelessDefaultGatewaySet(const char* szGateway) {
  constexpr int kMetric = 0;
  const char* szIfName = MEROWirelessInterfaceGet();
  if (szGateway == nullptr || szGateway[0] == '\0') return LOG("Bad parameters"), -1;

  const Command<1024> command("/sbin/route add default gw %s metric %d dev %s > /dev/null 2>&1",
                              ShellWord(szGateway).c_str(), kMetric, ShellWord(szIfName).c_str());
  if (command.Run() < 0) return LOG("Failed to execute '%s'", command.c_str()), -1;
  return 0;
}
