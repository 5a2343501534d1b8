// The kernel's wireless stack, as the program asks it.
#include "kernel_fakes.h"

#include <netlink/genl/genl.h>
#include <sys/mman.h>

#include <cstdlib>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "common/paths.h"
#include "common/text.h"
#include "library_fakes.h"
#include "model/wireless_stack.h"
#include "tests/support/files.h"
#include "tests/support/shell.h"

namespace kernel {

std::vector<Channel> g_channels;
std::map<std::string, std::vector<Channel>> g_channelsIn;

namespace {

struct State {
  Interface main;
  Interface guests;
  char szAppearsWith[64];
  char szAppearing[33];
  Rules rules;
};

State& Shared() {
  static void* const memory = ::mmap(nullptr, sizeof(State), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
  if (memory == MAP_FAILED) std::abort();
  return *static_cast<State*>(memory);
}

std::vector<Result> g_results;

std::string MessageOf(nl80211_commands command, const std::function<void(nl_msg*)>& fill) {
  const std::unique_ptr<nl_msg, decltype(&nlmsg_free)> message(nlmsg_alloc(), nlmsg_free);
  genlmsg_put(message.get(), 0, 0, 28, 0, 0, command, 1);
  fill(message.get());
  const nlmsghdr* header = nlmsg_hdr(message.get());
  return {reinterpret_cast<const char*>(header), header->nlmsg_len};
}

// As the kernel describes a network that was heard.
std::string Description(const Result& result) {
  return MessageOf(NL80211_CMD_NEW_SCAN_RESULTS, [&](nl_msg* message) {
    nlattr* nest = nla_nest_start(message, NL80211_ATTR_BSS);
    nla_put(message, NL80211_BSS_BSSID, static_cast<int>(result.address.size()), result.address.data());
    nla_put_u32(message, NL80211_BSS_SEEN_MS_AGO, result.msAgo);
    if (result.isJoined) nla_put_u32(message, NL80211_BSS_STATUS, NL80211_BSS_STATUS_ASSOCIATED);
    nla_nest_end(message, nest);
  });
}

std::string Description(const Interface& interface) {
  return MessageOf(NL80211_CMD_NEW_INTERFACE, [&](nl_msg* message) {
    nla_put_u32(message, NL80211_ATTR_IFTYPE, interface.type);
    if (interface.megahertz != 0) nla_put_u32(message, NL80211_ATTR_WIPHY_FREQ, interface.megahertz);
    const std::string_view name = interface.szName;
    if (!name.empty()) nla_put(message, NL80211_ATTR_SSID, static_cast<int>(name.size()), name.data());
  });
}

// The first one has been there for an hour, and each one after it for a minute.
std::string Station(int number, bool isLetIn, Driver driver) {
  return MessageOf(NL80211_CMD_NEW_STATION, [&](nl_msg* message) {
    const unsigned char address[] = {2, 0, 0, 0, 0, static_cast<unsigned char>(number)};
    const nl80211_sta_flag_update flags{1U << NL80211_STA_FLAG_AUTHORIZED,
                                        isLetIn ? 1U << NL80211_STA_FLAG_AUTHORIZED : 0};
    nla_put(message, NL80211_ATTR_MAC, sizeof address, address);
    nlattr* nest = nla_nest_start(message, NL80211_ATTR_STA_INFO);
    nla_put_u8(message, NL80211_STA_INFO_SIGNAL, static_cast<std::uint8_t>(-40 - 5 * number));
    if (driver == Driver::kTellsAll) {
      nla_put_u64(message, NL80211_STA_INFO_RX_BYTES64, number == 0 ? 123'456'789 : 900);
      nla_put_u64(message, NL80211_STA_INFO_TX_BYTES64, number == 0 ? 5'000'000'000 : 1'234);
    } else if (driver == Driver::kCountsTo32Bits) {
      nla_put_u32(message, NL80211_STA_INFO_RX_BYTES, 900);
      nla_put_u32(message, NL80211_STA_INFO_TX_BYTES, 4'000'000'000);
    }
    nla_put_u32(message, NL80211_STA_INFO_CONNECTED_TIME, number == 0 ? 3600 : 60);
    nla_put(message, NL80211_STA_INFO_STA_FLAGS, sizeof flags, &flags);
    nla_nest_end(message, nest);
  });
}

std::string AccessPoint(const Interface& interface) {
  return MessageOf(NL80211_CMD_NEW_STATION, [&](nl_msg* message) {
    nla_put(message, NL80211_ATTR_MAC, static_cast<int>(kHome.size()), kHome.data());
    nlattr* station = nla_nest_start(message, NL80211_ATTR_STA_INFO);
    nla_put_u8(message, NL80211_STA_INFO_SIGNAL, static_cast<std::uint8_t>(interface.signal));
    nla_put_u32(message, NL80211_STA_INFO_CONNECTED_TIME, interface.secondsAgo);
    nlattr* rate = nla_nest_start(message, NL80211_STA_INFO_TX_BITRATE);
    nla_put_u32(message, NL80211_RATE_INFO_BITRATE32, interface.rate);
    nla_nest_end(message, rate);
    nla_nest_end(message, station);
  });
}

void PutChannel(nl_msg* message, const Channel& channel) {
  nlattr* description = nla_nest_start(message, 0);
  nla_put_u32(message, NL80211_FREQUENCY_ATTR_FREQ, channel.megahertz);
  if (channel.flag != NL80211_FREQUENCY_ATTR_FREQ) nla_put_flag(message, channel.flag);
  nla_nest_end(message, description);
}

// One message a channel, as the kernel cuts its answer into parts.
std::string PartOfRadio(const Channel& channel) {
  return MessageOf(NL80211_CMD_NEW_WIPHY, [&](nl_msg* message) {
    nlattr* bands = nla_nest_start(message, NL80211_ATTR_WIPHY_BANDS);
    nlattr* band = nla_nest_start(message, channel.megahertz < 5000 ? NL80211_BAND_2GHZ : NL80211_BAND_5GHZ);
    nlattr* channels = nla_nest_start(message, NL80211_BAND_ATTR_FREQS);
    PutChannel(message, channel);
    nla_nest_end(message, channels);
    nla_nest_end(message, band);
    nla_nest_end(message, bands);
  });
}

// The rules of a radio bear its number.
std::string Description(const char* szCountry, bool isRadios) {
  return MessageOf(NL80211_CMD_GET_REG, [&](nl_msg* message) {
    nla_put_string(message, NL80211_ATTR_REG_ALPHA2, szCountry);
    if (!isRadios) return;
    nla_put_u32(message, NL80211_ATTR_WIPHY, 0);
    nla_put_flag(message, NL80211_ATTR_WIPHY_SELF_MANAGED_REG);
  });
}

}  // namespace

void Heard(std::vector<Result> results) {
  g_results = std::move(results);
}

Interface& Main() {
  return Shared().main;
}

Interface& Guests() {
  return Shared().guests;
}

Rules& RulesNow() {
  return Shared().rules;
}

void Reset() {
  Shared() = {};
  RulesNow() = {.szKernel = "00", .szRadio = "", .szTaken = "", .szKnown = "00 DE US"};
  g_channels.clear();
  g_channelsIn.clear();
  BecomeClient();
}

void BecomeClient() {
  Main() = {.isThere = true, .type = NL80211_IFTYPE_STATION, .megahertz = 0, .szName = "", .stations = 0};
}

void BecomeAccessPoint(std::string_view name, unsigned megahertz) {
  Main() = {.isThere = true, .type = NL80211_IFTYPE_AP, .megahertz = megahertz, .szName = "", .stations = 0};
  CopyText(Main().szName, name);
}

void BecomeJoined() {
  BecomeClient();
  Main().megahertz = 2437;
  Main().signal = -52;
  Main().rate = 65;
  Main().secondsAgo = 3600;
}

void AppearWith(const char* szPath, std::string_view name) {
  CopyText(Shared().szAppearsWith, szPath);
  CopyText(Shared().szAppearing, name);
}

void PutInBridge() {
  Shell(
      "mountpoint -q /sys/class/net || { mount -t tmpfs scratch /sys/class/net &&"
      "mkdir /sys/class/net/wlan0 && ln -s ../lbr0 /sys/class/net/wlan0/master; }");
}

void Appear() {
  State& state = Shared();
  if (state.szAppearsWith[0] != '\0' && Exists(state.szAppearsWith)) BecomeAccessPoint(state.szAppearing);
}

}  // namespace kernel

std::vector<std::string> AskWirelessStack(nl80211_commands command, const std::string& interface, bool) {
  kernel::Appear();
  std::vector<std::string> messages;
  if (command == NL80211_CMD_GET_SCAN) {
    for (const kernel::Result& result : kernel::g_results) messages.push_back(kernel::Description(result));
    return messages;
  }
  const kernel::Interface& asked = interface == kGuestInterface ? kernel::Guests() : kernel::Main();
  if (!asked.isThere) return messages;
  if (command == NL80211_CMD_GET_INTERFACE) messages.push_back(kernel::Description(asked));
  if (command == NL80211_CMD_GET_STATION) {
    for (int i = 0; i < asked.stations; ++i) {
      messages.push_back(kernel::Station(i, i < asked.stations - asked.joining, asked.driver));
    }
    if (asked.signal != 0) messages.push_back(kernel::AccessPoint(asked));
  }
  if (command == NL80211_CMD_GET_WIPHY) {
    const auto there = kernel::g_channelsIn.find(kernel::RulesNow().szKernel);
    for (const kernel::Channel& channel : there != kernel::g_channelsIn.end() ? there->second : kernel::g_channels) {
      messages.push_back(kernel::PartOfRadio(channel));
    }
  }
  return messages;
}

std::optional<std::vector<std::string>> AskForStations(const std::string& interface) {
  const kernel::Interface& asked = interface == kGuestInterface ? kernel::Guests() : kernel::Main();
  if (asked.isThere && asked.driver == kernel::Driver::kListsNone) return std::nullopt;
  return AskWirelessStack(NL80211_CMD_GET_STATION, interface, true);
}

std::vector<std::string> AskForRules() {
  const kernel::Rules& rules = kernel::RulesNow();
  std::vector<std::string> messages;
  if (rules.szKernel[0] != '\0') messages.push_back(kernel::Description(rules.szKernel, false));
  if (rules.szRadio[0] != '\0') messages.push_back(kernel::Description(rules.szRadio, true));
  return messages;
}

int RequestRules(std::string_view country) {
  kernel::Rules& rules = kernel::RulesNow();
  library::Record("rules of " + std::string(country));
  if (std::string_view(rules.szKnown).find(country) == std::string_view::npos) return 0;
  CopyText(rules.szKernel, rules.szTaken[0] != '\0' ? rules.szTaken : country);
  return 0;
}
