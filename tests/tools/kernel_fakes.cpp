// What the program comes upon instead of the kernel's wireless stack.
#include "kernel_fakes.h"

#include <netlink/genl/genl.h>

#include <cstdlib>
#include <memory>
#include <string>
#include <utility>

#include "model/wireless_stack.h"

namespace kernel {
namespace {

std::vector<Result> g_results;

// As the kernel describes a network that was heard.
std::string Description(const Result& result) {
  const std::unique_ptr<nl_msg, decltype(&nlmsg_free)> message(nlmsg_alloc(), nlmsg_free);
  genlmsg_put(message.get(), 0, 0, 28, 0, NLM_F_MULTI, NL80211_CMD_NEW_SCAN_RESULTS, 1);
  nlattr* nest = nla_nest_start(message.get(), NL80211_ATTR_BSS);
  nla_put(message.get(), NL80211_BSS_BSSID, static_cast<int>(result.address.size()), result.address.data());
  nla_put_u32(message.get(), NL80211_BSS_SEEN_MS_AGO, result.msAgo);
  if (result.isJoined) nla_put_u32(message.get(), NL80211_BSS_STATUS, NL80211_BSS_STATUS_ASSOCIATED);
  nla_nest_end(message.get(), nest);
  const nlmsghdr* header = nlmsg_hdr(message.get());
  return {reinterpret_cast<const char*>(header), header->nlmsg_len};
}

std::vector<std::string> ScanResults() {
  std::vector<std::string> messages;
  for (const Result& result : g_results) messages.push_back(Description(result));
  return messages;
}

}  // namespace

void Heard(std::vector<Result> results) {
  g_results = std::move(results);
}

}  // namespace kernel

std::vector<std::string> AskWirelessStack(nl80211_commands command, const std::string&, bool) {
  if (command == NL80211_CMD_GET_SCAN) return kernel::ScanResults();
  std::abort();
}
