// Which networks an automatic connection tries, in which order, and as what.
#include "auto_connection.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;

class AutoConnectOrder : public AutoConnectTest {};

// ---- The networks, one after the other ----

TEST_F(AutoConnectOrder, TriesTheMostRecentlySavedFirstUntilOneIsJoined) {
  Save({{"Oldest", 1, 10}, {"Newest", 2, 40}, {"Newer", 3, 30}, {"Older", 4, 20}});
  Find(InRange("Oldest", 1) + InRange("Newest", 2) + InRange("Newer", 3) + InRange("Older", 4));
  outOfReach_ = {"Newest", "Newer"};
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course(
                           {kLooks, JoinOf("Newest"), kLooks, JoinOf("Newer"), kLooks, JoinOf("Older"), kAddresses})));
  EXPECT_EQ(addressed_, "10.0.0.4/255.0.0.4");
  EXPECT_THAT(ReadText(kSupplicantConfig), testing::HasSubstr("psk=\"secret of Older\""));
}

TEST_F(AutoConnectOrder, TriesEverySavedNetworkOnceAndThenFails) {
  Save({{"A", 1, 30}, {"B", 2, 20}, {"C", 3, 10}});
  Find(InRange("A", 1) + InRange("B", 2) + InRange("C", 3));
  outOfReach_ = {"A", "B", "C"};
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("A"), kLooks, JoinOf("B"), kLooks, JoinOf("C"),
                                                kFailsToConnect, kDisconnects})));
}

TEST_F(AutoConnectOrder, FindsANetworkByItsAddressAndNotByItsName) {
  Save({{"Home", 1, 10, "\tAUTH=UNKNOWN\n\tENCRYPT=UNKNOWN\n"}});
  Find(InRange("Home", 2));
  EXPECT_EQ(Connect(), -1);
  Find(InRange("Home", 2) + InRange("Renamed", 1));
  EXPECT_EQ(Connect(), 0);
  EXPECT_EQ(Last(fake::EffectsOf({"join"})), JoinOf("Renamed"));
}

TEST_F(AutoConnectOrder, JoinsANetworkInRangeAsItIsNowAndNotAsItWasSaved) {
  Save({{"Home", 1, 10, "\tMODE=ADHOC\n\tAUTH=OPEN\n\tENCRYPT=NONE\n"}});
  Find(InRange("Renamed", 1, " -55 11g WPAPSK/TKIPAES"));
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("Renamed"), kAddresses})));
  EXPECT_EQ(ReadText(kSupplicantConfig),
            "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n\tssid=\"Renamed\"\n\tbssid=02:00:00:00:00:01\n"
            "\tscan_ssid=1\n\tkey_mgmt=WPA-PSK\n\tpairwise=TKIP CCMP\n\tpsk=\"secret of Home\"\n}\n");
  EXPECT_EQ(ReadText(kRecord), "Renamed\n5\n4\n12\n02:00:00:00:00:01\n");
  EXPECT_EQ(addressed_, "10.0.0.1/255.0.0.1");
}

TEST_F(AutoConnectOrder, TriesANetworkThatIsNotInRangeAsItWasSaved) {
  Save({{"Hidden", 1, 10, "\tMODE=MANAGED\n\tAUTH=SHARED\n\tENCRYPT=WEP\n\tKEY=abcde\n"}});
  EXPECT_EQ(Connect(), 0);
  EXPECT_EQ(ReadText(kSupplicantConfig),
            "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n\tssid=\"Hidden\"\n\tbssid=02:00:00:00:00:01\n"
            "\tscan_ssid=1\n\tkey_mgmt=NONE\n\twep_key0=\"abcde\"\n\twep_tx_keyidx=0\n\tauth_alg=SHARED\n}\n");
  EXPECT_EQ(ReadText(kRecord), "Hidden\n0\n2\n2\n02:00:00:00:00:01\n");
}

TEST_F(AutoConnectOrder, CreatesASavedCellThatIsNotInRange) {
  Save({{"Cell", 1, 10, "\tMODE=ADHOC\n\tAUTH=OPEN\n\tENCRYPT=NONE\n"}});
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, kLooks, "PLIBNetIfDown(wlan0)", kLooks, kAddresses})));
  EXPECT_THAT(fake::EffectsOf({"system"}),
              testing::Contains("system(/sbin/iwconfig wlan0 essid Cell > /dev/null 2>&1)"));
}

// ---- Looking again ----

TEST_F(AutoConnectOrder, LooksOnceMoreForTheFirstNetworkThatIsNotInRangeAndForNoOther) {
  Save({{"A", 1, 40}, {"B", 2, 30}, {"C", 3, 20}});
  outOfReach_ = {"A", "B", "C"};
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, kLooks, JoinOf("A"), kLooks, JoinOf("B"), kLooks, JoinOf("C"),
                                                kFailsToConnect, kDisconnects})));
}

TEST_F(AutoConnectOrder, LooksOnceMoreInEveryCall) {
  Save({{"A", 1, 40}});
  for (int i = 0; i < 2; ++i) {
    fake::PLIBNetIfUp.Reset();
    fake::PLIBNetIfUp.Returns(1);
    EXPECT_EQ(Connect(), 0);
    EXPECT_EQ(fake::PLIBNetIfUp.calls(), 2);
  }
}

TEST_F(AutoConnectOrder, KeepsTheSecondLookForANetworkThatNeedsIt) {
  Save({{"InRange", 1, 40}, {"Unsafe", 2, 30, "\tAUTH=UNKNOWN\n\tENCRYPT=AES\n"}, {"Gone", 3, 20}, {"Too", 4, 10}});
  Find(InRange("InRange", 1));
  outOfReach_ = {"InRange", "Gone", "Too"};
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("InRange"), kLooks, kLooks, kLooks, JoinOf("Gone"),
                                                kLooks, JoinOf("Too"), kFailsToConnect, kDisconnects})));
}

TEST_F(AutoConnectOrder, TakesWhatTheSecondLookFinds) {
  Save({{"Home", 1, 10, "\tMODE=ADHOC\n\tAUTH=OPEN\n\tENCRYPT=NONE\n"}});
  FindFrom(2, InRange("Found", 1));
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, kLooks, JoinOf("Found"), kAddresses})));
  EXPECT_THAT(ReadText(kSupplicantConfig), testing::HasSubstr("key_mgmt=WPA-PSK"));
}

// Of saved networks the protocol is not kept, but a platform may know it.
void ProtocolIsKnownOf(const std::string& section) {
  fake::MEROWirelessConfGet.Does([=](const char* szSection, WIRELESS_NETWORK_CONFIG* pConfig) {
    const int result = fake::MEROWirelessConfGet.Real(szSection, pConfig);
    if (szSection == section) pConfig->network.protocol = WIRELESS_PROTO_11N;
    return result;
  });
}

TEST_F(AutoConnectOrder, DoesNotLookAgainForANetworkOfAKnownProtocol) {
  Save({{"Known", 1, 20}, {"Unknown", 2, 10}});
  ProtocolIsKnownOf(AddressOf(1));
  outOfReach_ = {"Known", "Unknown"};
  EXPECT_EQ(Connect(), -1);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("Known"), kLooks, kLooks, JoinOf("Unknown"),
                                                kFailsToConnect, kDisconnects})));
}

TEST_F(AutoConnectOrder, NeverTriesANetworkOfUnknownSecurityThatIsNotInRange) {
  for (const bool protocolIsKnown : {false, true}) {
    for (const char* szSecurity : {"\tAUTH=UNKNOWN\n\tENCRYPT=AES\n", "\tAUTH=WPA2PSK\n\tENCRYPT=UNKNOWN\n",
                                   "\tAUTH=UNKNOWN\n\tENCRYPT=UNKNOWN\n", "\tENCRYPT=AES\n", "\tAUTH=WPA2PSK\n", "",
                                   "\tAUTH=x\n\tENCRYPT=AES\n"}) {
      Begin();
      Save({{"Doubtful", 1, 20, szSecurity}, {"Other", 2, 10}});
      Find(InRange("Other", 2));
      if (protocolIsKnown) ProtocolIsKnownOf(AddressOf(1));
      EXPECT_EQ(Connect(), 0);
      EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, kLooks, JoinOf("Other"), kAddresses}))) << szSecurity;
    }
  }
}

TEST_F(AutoConnectOrder, JoinsANetworkOfUnknownSecurityThatIsInRange) {
  Save({{"Home", 1, 20, "\tAUTH=UNKNOWN\n\tENCRYPT=UNKNOWN\n"}});
  Find(InRange("Home", 1));
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(Steps(), ElementsAreArray(Course({kLooks, JoinOf("Home"), kAddresses})));
}

TEST_F(AutoConnectOrder, TriesSavedNetworksAlsoWhenLookingFails) {
  Save({{"A", 1, 20}, {"B", 2, 10, "\tAUTH=UNKNOWN\n"}, {"C", 3, 5}});
  fake::PLIBNetIfUp.Returns(0);
  outOfReach_ = {"A"};
  EXPECT_EQ(Connect(), 0);
  EXPECT_THAT(fake::EffectsOf({"PLIBNetIfUp", "join"}),
              ElementsAre(kLooks, kLooks, JoinOf("A"), kLooks, kLooks, JoinOf("C")));
}

}  // namespace
