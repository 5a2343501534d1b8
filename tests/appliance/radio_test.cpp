// The listing tool reads the messages of a radio's driver.
#include "appliance/sbin/radio.h"

#include <gtest/gtest.h>
#include <linux/nl80211.h>
#include <netlink/genl/genl.h>

#include <functional>
#include <memory>
#include <string>

#include "tests/appliance/elements_text.h"

namespace iwlist {
namespace {

constexpr std::uint8_t kAddress[] = {0x02, 0x00, 0x00, 0x00, 0x01, 0x00};

// The network of a message whose description of one is filled in by `fill`.
std::optional<Network> Read(const std::function<void(nl_msg*)>& fill) {
  const std::unique_ptr<nl_msg, decltype(&nlmsg_free)> message(nlmsg_alloc(), nlmsg_free);
  genlmsg_put(message.get(), 0, 0, 28, 0, NLM_F_MULTI, NL80211_CMD_NEW_SCAN_RESULTS, 1);
  nla_put_u32(message.get(), NL80211_ATTR_GENERATION, 3);
  nlattr* bss = nla_nest_start(message.get(), NL80211_ATTR_BSS);
  fill(message.get());
  nla_nest_end(message.get(), bss);
  return NetworkOfMessage(nlmsg_hdr(message.get()));
}

void PutNetwork(nl_msg* message) {
  nla_put(message, NL80211_BSS_BSSID, sizeof(kAddress), kAddress);
  nla_put_u32(message, NL80211_BSS_FREQUENCY, 2437);
  nla_put_u16(message, NL80211_BSS_CAPABILITY, 0x0011);
}

void PutElements(nl_msg* message, nl80211_bss attribute, std::string_view hex) {
  const std::vector<std::uint8_t> bytes = Elements(hex);
  nla_put(message, attribute, static_cast<int>(bytes.size()), bytes.data());
}

TEST(DriverMessage, GivesTheNetwork) {
  const auto network = Read([](nl_msg* message) {
    PutNetwork(message);
    nla_put_s32(message, NL80211_BSS_SIGNAL_MBM, -4750);
    nla_put_u32(message, NL80211_BSS_SEEN_MS_AGO, 1234);
    PutElements(message, NL80211_BSS_INFORMATION_ELEMENTS, "00 04 686F6D65  01 01 82");
  });
  ASSERT_TRUE(network);
  EXPECT_TRUE(std::ranges::equal(network->bssid, kAddress));
  EXPECT_EQ(network->channel, 6);
  EXPECT_EQ(network->signal, -47);
  EXPECT_EQ(network->seenMsAgo, 1234U);
  EXPECT_EQ(network->description.name, "home");
  EXPECT_EQ(network->description.protocol, WIRELESS_PROTO_LEGACY_11B);
  EXPECT_EQ(network->description.security.encrypt, WIRELESS_ENCRYPT_WEP);
}

TEST(DriverMessage, GivesTheNameFromAnAnswerRatherThanFromABeaconThatHidesIt) {
  const auto network = Read([](nl_msg* message) {
    PutNetwork(message);
    PutElements(message, NL80211_BSS_BEACON_IES, "00 06 000000000000");
    PutElements(message, NL80211_BSS_INFORMATION_ELEMENTS, "00 06 736563726574");
  });
  ASSERT_TRUE(network);
  EXPECT_EQ(network->description.name, "secret");
}

TEST(DriverMessage, GivesTheNameFromTheBeaconWhenThatIsAllThatWasHeard) {
  const auto network = Read([](nl_msg* message) {
    PutNetwork(message);
    PutElements(message, NL80211_BSS_BEACON_IES, "00 04 686F6D65");
  });
  ASSERT_TRUE(network);
  EXPECT_EQ(network->description.name, "home");
}

TEST(DriverMessage, GivesASignalInDecibelsWhateverTheDriverMeasuresIn) {
  const auto signal = [](const std::function<void(nl_msg*)>& put) {
    return Read([&](nl_msg* message) {
             PutNetwork(message);
             put(message);
           })
        ->signal;
  };
  EXPECT_EQ(signal([](nl_msg* message) { nla_put_s32(message, NL80211_BSS_SIGNAL_MBM, -10000); }), -100);
  EXPECT_EQ(signal([](nl_msg* message) { nla_put_u8(message, NL80211_BSS_SIGNAL_UNSPEC, 100); }), -50);
  EXPECT_EQ(signal([](nl_msg* message) { nla_put_u8(message, NL80211_BSS_SIGNAL_UNSPEC, 0); }), -100);
  EXPECT_EQ(signal([](nl_msg*) {}), -100) << "none at all";
}

TEST(DriverMessage, IsANetworkEvenWithoutElements) {
  const auto network = Read(PutNetwork);
  ASSERT_TRUE(network);
  EXPECT_EQ(network->description.name, "");
  EXPECT_EQ(network->description.protocol, WIRELESS_PROTO_UNKNOWN);
}

TEST(DriverMessage, IsPassedOverWhenItDescribesNoNetwork) {
  EXPECT_FALSE(Read([](nl_msg*) {})) << "nothing";
  EXPECT_FALSE(Read([](nl_msg* message) { nla_put_u32(message, NL80211_BSS_FREQUENCY, 2437); })) << "no address";
  EXPECT_FALSE(Read([](nl_msg* message) { nla_put(message, NL80211_BSS_BSSID, 6, kAddress); })) << "no frequency";
  EXPECT_FALSE(Read([](nl_msg* message) {
    nla_put(message, NL80211_BSS_BSSID, 5, kAddress);
    nla_put_u32(message, NL80211_BSS_FREQUENCY, 2437);
  })) << "an address that is cut short";

  const std::unique_ptr<nl_msg, decltype(&nlmsg_free)> empty(nlmsg_alloc(), nlmsg_free);
  genlmsg_put(empty.get(), 0, 0, 28, 0, NLM_F_MULTI, NL80211_CMD_NEW_SCAN_RESULTS, 1);
  EXPECT_FALSE(NetworkOfMessage(nlmsg_hdr(empty.get()))) << "no description";
}

}  // namespace
}  // namespace iwlist
