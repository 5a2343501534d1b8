// The kernel's wireless stack, asked about an interface.
#include "model/wireless_stack.h"

#include <net/if.h>

#include <cerrno>

#include "common/nl80211.h"
#include "model/failed.h"

namespace {

nl80211::Answer Ask(nl80211_commands command, const std::string& interface, bool all) {
  const unsigned index = ::if_nametoindex(interface.c_str());
  if (index == 0) return {.error = ENODEV};
  nl80211::Answer answer = nl80211::Ask({command, all, index});
  if (!answer.saysNotWireless() && (answer.error != 0 || answer.failure < 0)) {
    throw Failed("the kernel does not say what " + interface + " does: " + answer.reason());
  }
  return answer;
}

}  // namespace

std::vector<std::string> AskWirelessStack(nl80211_commands command, const std::string& interface, bool all) {
  nl80211::Answer answer = Ask(command, interface, all);
  if (answer.saysNotWireless()) return {};
  return std::move(answer.messages);
}

std::optional<std::vector<std::string>> AskForStations(const std::string& interface) {
  nl80211::Answer answer = Ask(NL80211_CMD_GET_STATION, interface, true);
  if (answer.error == EOPNOTSUPP) return std::nullopt;
  if (answer.error == ENODEV) answer.messages.clear();
  return std::move(answer.messages);
}

std::vector<std::string> AskForRules() {
  nl80211::Answer answer = nl80211::Ask({.command = NL80211_CMD_GET_REG, .dump = true, .interface = 0});
  if (answer.saysNotWireless()) return {};
  if (answer.error != 0 || answer.failure < 0) {
    throw Failed(std::string("the kernel does not say whose rules radios keep to: ") + answer.reason());
  }
  return std::move(answer.messages);
}

int RequestRules(std::string_view country) {
  const nl80211::Answer answer =
      nl80211::Ask({.command = NL80211_CMD_REQ_SET_REG, .dump = false, .interface = 0, .country = country});
  return answer.failure < 0 ? EIO : answer.error;
}
