// The kernel's wireless stack, asked about an interface.
#ifndef MERO_TOOLS_WIRELESS_STACK_H
#define MERO_TOOLS_WIRELESS_STACK_H

#include <linux/nl80211.h>

#include <string>
#include <vector>

// The netlink messages of its answer, each whole; none when there is no such interface, or no wireless one. `all` asks
// for everything of a kind, such as all stations. Fails when the kernel does not answer.
std::vector<std::string> AskWirelessStack(nl80211_commands command, const std::string& interface, bool all);

#endif  // MERO_TOOLS_WIRELESS_STACK_H
