// The kernel's wireless stack, asked about an interface.
#ifndef MERO_TOOLS_WIRELESS_STACK_H
#define MERO_TOOLS_WIRELESS_STACK_H

#include <linux/nl80211.h>

#include <optional>
#include <string>
#include <string_view>
#include <vector>

// The netlink messages of its answer, each whole; none when there is no such interface, or no wireless one. `all` asks
// for everything of a kind, such as all stations. Fails when the kernel does not answer.
std::vector<std::string> AskWirelessStack(nl80211_commands command, const std::string& interface, bool all);

// The stations of an access point's interface, as above; nothing when its driver cannot list them.
std::optional<std::vector<std::string>> AskForStations(const std::string& interface);

// The rules that radios keep to, as netlink messages: the kernel's own, then those of each radio that has others. None
// where no radio has ever been. Fails when the kernel does not answer.
std::vector<std::string> AskForRules();

// Asks for the rules of a country, or of the world, for all radios that have none of their own. The kernel follows a
// moment later, or not at all. Gives an errno, or 0; ENODEV where no radio has ever been.
int RequestRules(std::string_view country);

#endif  // MERO_TOOLS_WIRELESS_STACK_H
