// What the kernel tells of the end of a scan, and whether it was one for all networks in range.
#include "common/scan_end.h"

#include <gtest/gtest.h>

#include <vector>

namespace nl80211 {
namespace {

constexpr unsigned kInterface = 7;
constexpr unsigned kChannels = 3;

struct Scan {
  nl80211_commands command = NL80211_CMD_NEW_SCAN_RESULTS;
  unsigned interface = kInterface;
  std::vector<unsigned> frequencies = {2412, 2437, 2462};
  std::vector<std::string> names = {""};
};

News Told(const Scan& scan) {
  const Message message(nlmsg_alloc());
  genlmsg_put(message.get(), 0, 0, 28, 0, 0, scan.command, 1);
  nla_put_u32(message.get(), NL80211_ATTR_WIPHY, 0);
  nla_put_u32(message.get(), NL80211_ATTR_IFINDEX, scan.interface);
  nlattr* nest = nla_nest_start(message.get(), NL80211_ATTR_SCAN_SSIDS);
  int number = 0;
  for (const std::string& name : scan.names) {
    nla_put(message.get(), number++, static_cast<int>(name.size()), name.data());
  }
  nla_nest_end_keep_empty(message.get(), nest);
  nest = nla_nest_start(message.get(), NL80211_ATTR_SCAN_FREQUENCIES);
  number = 0;
  for (const unsigned frequency : scan.frequencies) nla_put_u32(message.get(), number++, frequency);
  nla_nest_end_keep_empty(message.get(), nest);
  return NewsIn(nlmsg_hdr(message.get()), kInterface, kChannels);
}

TEST(ScanEnd, IsThatOfOneForAllNetworks) {
  EXPECT_EQ(Told({}), News::kAll);
  EXPECT_EQ(Told({.frequencies = {2412, 2437, 2462, 5180}}), News::kAll) << "the channels were more when it began";
  EXPECT_EQ(Told({.names = {"home", ""}}), News::kAll) << "somebody's name was called, and everybody";
  EXPECT_EQ(Told({.names = {}}), News::kAll) << "nobody was called, and all channels were listened to";
}

// Whoever asked for a scan while a supplicant called its network by its name was shown those that happened to be heard.
TEST(ScanEnd, IsThatOfOneForSomeNetworksOnly) {
  EXPECT_EQ(Told({.frequencies = {2412}}), News::kPart);
  EXPECT_EQ(Told({.frequencies = {}}), News::kPart);
  EXPECT_EQ(Told({.names = {"home"}}), News::kPart);
  EXPECT_EQ(Told({.names = {"home", "office"}}), News::kPart);
}

TEST(ScanEnd, IsNotThatOfAnotherInterfaceNorOfOneThatWasBrokenOff) {
  EXPECT_EQ(Told({.interface = kInterface + 1}), News::kOther);
  EXPECT_EQ(Told({.command = NL80211_CMD_TRIGGER_SCAN}), News::kOther);
  EXPECT_EQ(Told({.command = NL80211_CMD_SCAN_ABORTED}), News::kOther);
}

}  // namespace
}  // namespace nl80211
