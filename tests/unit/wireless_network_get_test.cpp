#include <climits>
#include <cstring>

#include "listing.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kScansAfresh[] = "system(/sbin/iwlist wlan0 scanning > /dev/null 2>&1)";
constexpr auto kFirst = static_cast<WIRELESS_FILTER>(2);

// Three networks, two of them of one name.
const std::string kListing = kHeadings + RowOf("1", "Cafe", " 00:11:22:33:44:00 -40 11n WEP\n") +
                             RowOf("6", "Home", " 00:00:00:33:44:55 -50 11b WPAPSK/TKIP\n") +
                             RowOf("11", "Cafe", " 00:11:22:33:44:01 -60 11a NONE\n");

class NetworkInRange : public UnitTest {
 protected:
  NetworkInRange() { Begin(); }

  static void Begin() {
    BeginWithAdapter();
    fake::system.Returns(0);
    fake::PipesGive({kListing});
  }

  // Looks one up into a record whose every byte is set.
  int Find(const char* szValue, WIRELESS_FILTER filter) {
    std::memset(&network_, 0xff, sizeof network_);
    const int result = memory::Run(0, [&] { return MEROWirelessNetworkGet(szValue, filter, &network_); });
    EXPECT_EQ(memory::Held(), 0u);
    return result;
  }

  bool IsUntouched() const {
    WIRELESS_NETWORK untouched;
    std::memset(&untouched, 0xff, sizeof untouched);
    return std::memcmp(&network_, &untouched, sizeof network_) == 0;
  }

  WIRELESS_NETWORK network_;
};

TEST_F(NetworkInRange, IsNotLookedUpWithoutAValueOrARecord) {
  EXPECT_EQ(MEROWirelessNetworkGet(nullptr, WIRELESS_FILTER_ESSID, &network_), -1);
  EXPECT_EQ(MEROWirelessNetworkGet("Home", WIRELESS_FILTER_ESSID, nullptr), -1);
  EXPECT_EQ(MEROWirelessNetworkGet(nullptr, kFirst, nullptr), -1);
  const std::string report = fake::Report("wireless_network_get:30 Bad parameters");
  EXPECT_THAT(fake::Effects(), ElementsAre(report, report, report));
}

TEST_F(NetworkInRange, IsFoundByNameWithEverythingThatTheScanSawOfIt) {
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), 1);
  EXPECT_STREQ(network_.szEssid, "Home");
  EXPECT_EQ(std::memcmp(network_.bssid, "\x00\x00\x00\x33\x44\x55", 6), 0);
  EXPECT_EQ(network_.channel, 6);
  EXPECT_EQ(network_.signal, -50);
  EXPECT_EQ(network_.opmode, WIRELESS_OPMODE_AUTO);
  EXPECT_EQ(network_.protocol, WIRELESS_PROTO_LEGACY_11B);
  EXPECT_EQ(network_.auth, WIRELESS_AUTH_WPAPSK);
  EXPECT_EQ(network_.encrypt, WIRELESS_ENCRYPT_TKIP);
  EXPECT_NE(network_.list.q_forw, nullptr);
  EXPECT_NE(network_.list.q_back, nullptr);
}

TEST_F(NetworkInRange, IsTheFirstOfItsName) {
  EXPECT_EQ(Find("Cafe", WIRELESS_FILTER_ESSID), 1);
  EXPECT_EQ(network_.channel, 1);
}

TEST_F(NetworkInRange, IsFoundByItsExactNameOnly) {
  for (const char* szName : {"home", "HOME", "Hom", "Home ", " Home", "Home2", "", "Haus"}) {
    EXPECT_EQ(Find(szName, WIRELESS_FILTER_ESSID), 0) << szName;
    EXPECT_TRUE(IsUntouched()) << szName;
  }
}

TEST_F(NetworkInRange, IsFoundByItsAddress) {
  const struct {
    const char* rgbBssid;
    int channel;
  } rows[] = {{"\x00\x11\x22\x33\x44\x00", 1}, {"\x00\x00\x00\x33\x44\x55", 6}, {"\x00\x11\x22\x33\x44\x01", 11}};
  for (const auto& row : rows) {
    EXPECT_EQ(Find(row.rgbBssid, WIRELESS_FILTER_BSSID), 1);
    EXPECT_EQ(network_.channel, row.channel);
  }
}

TEST_F(NetworkInRange, IsFoundByAllSixBytesOfItsAddressOnly) {
  for (const char* rgbBssid : {"\x00\x11\x22\x33\x44\x02", "\x01\x11\x22\x33\x44\x00", "\x00\x11\x22\x30\x44\x00",
                               "\x00\x00\x00\x00\x00\x00", "00:11:22:33:44:00", "Home\0\0"}) {
    EXPECT_EQ(Find(rgbBssid, WIRELESS_FILTER_BSSID), 0);
    EXPECT_TRUE(IsUntouched());
  }
}

TEST_F(NetworkInRange, IsTheFirstOfAllForAnyOtherFilter) {
  for (const int filter : {2, 3, -1, INT_MAX, INT_MIN}) {
    EXPECT_EQ(Find("no such name", static_cast<WIRELESS_FILTER>(filter)), 1) << filter;
    EXPECT_EQ(network_.channel, 1) << filter;
  }
}

TEST_F(NetworkInRange, IsLookedForAmongTheLastResultsAndNotScannedForAfreshWhenThereAreAny) {
  EXPECT_EQ(Find("no such name", WIRELESS_FILTER_ESSID), 0);
  EXPECT_EQ(fake::system.calls(), 0);
  EXPECT_EQ(fake::sleep.calls(), 1);
  EXPECT_EQ(fake::popen.calls(), 2);
}

TEST_F(NetworkInRange, IsScannedForAfreshWhenTheLastResultsAreNone) {
  fake::PipesGive({kHeadings, kHeadings, kHeadings, kHeadings, kHeadings, kListing});
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), 1);
  EXPECT_EQ(network_.channel, 6);
  EXPECT_THAT(fake::EffectsOf({"sleep", "system"}), ElementsAre("sleep(1)", "sleep(1)", kScansAfresh));
  EXPECT_EQ(fake::popen.calls(), 7);
}

TEST_F(NetworkInRange, IsNotFoundWhenNothingIsInRange) {
  fake::PipesGive({kHeadings});
  for (const auto filter : {WIRELESS_FILTER_ESSID, WIRELESS_FILTER_BSSID, kFirst}) {
    EXPECT_EQ(Find("\0\0\0\0\0\0", filter), 0);
    EXPECT_TRUE(IsUntouched());
  }
  EXPECT_EQ(fake::system.calls(), 3);
  EXPECT_EQ(fake::popen.calls(), 30);
}

TEST_F(NetworkInRange, IsNotLookedUpWhenTheScanFails) {
  fake::PLIBNetIfUp.Returns(0);
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), -1);
  EXPECT_TRUE(IsUntouched());
  EXPECT_THAT(fake::Messages(), ElementsAre("wireless_network_scan:191 Failed to activate network interface wlan0",
                                            "wireless_network_get:35 Failed to scan wireless networks"));
}

TEST_F(NetworkInRange, IsNotLookedUpWhenTheFreshScanFails) {
  fake::PipesGive({kHeadings});
  fake::system.Returns(-1);
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), -1);
  EXPECT_TRUE(IsUntouched());
  EXPECT_EQ(fake::Messages().back(), "wireless_network_get:40 Failed to scan wireless networks");
  EXPECT_EQ(fake::popen.calls(), 5);
}

TEST_F(NetworkInRange, IsNotLookedUpWithoutAnAdapter) {
  fake::MEROWirelessAdapterNum.Returns(0);
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), -1);
  EXPECT_EQ(fake::MEROWirelessAdapterNum.calls(), 6);
  EXPECT_EQ(fake::sleep.calls(), 5);
  EXPECT_EQ(fake::Messages().back(), "wireless_network_get:35 Failed to scan wireless networks");
}

TEST_F(NetworkInRange, MayComeUpWhileTheAdapterIsPulled) {
  fake::PipesGive({kHeadings});
  fake::MEROWirelessAdapterNum.Returns(1, 0);
  EXPECT_EQ(Find("Home", WIRELESS_FILTER_ESSID), -1);
  EXPECT_EQ(fake::Messages().back(), "wireless_network_get:40 Failed to scan wireless networks");
}

// Where the last of five readings finds no memory, what it read before is left in the list.
TEST_F(NetworkInRange, LeavesNothingAllocatedWheneverMemoryRunsOut) {
  int failures = 0;
  const auto prepare = [] {
    Begin();
    fake::PipesGive({kHeadings, kHeadings, kHeadings, kHeadings, kHeadings, ListingOf(1), ListingOf(2), ListingOf(3),
                     ListingOf(4), kListing});
  };
  const auto find = [this] { return MEROWirelessNetworkGet("Home", WIRELESS_FILTER_ESSID, &network_); };
  prepare();
  memory::FailEach(find, [&](int n, int result) {
    EXPECT_EQ(memory::Held(), 0u) << n;
    if (result < 0) {
      ++failures;
      EXPECT_EQ(fake::Messages().back(), "wireless_network_get:40 Failed to scan wireless networks") << n;
    } else {
      EXPECT_EQ(result, 1) << n;
    }
    prepare();
  });
  EXPECT_EQ(failures, 3);
}

}  // namespace
