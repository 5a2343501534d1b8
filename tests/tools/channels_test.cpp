// What is on the air, channel by channel, and the quietest one.
#include "common/text.h"
#include "model/heard_channels.h"
#include "running.h"

using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

WIRELESS_NETWORK At(int channel, int signal) {
  WIRELESS_NETWORK network = library::Network("any");
  network.channel = channel;
  network.signal = signal;
  return network;
}

constexpr Channel kOf2GHz[] = {
    {1, 2412, ChannelUse::kAll},  {2, 2417, ChannelUse::kAll},  {6, 2437, ChannelUse::kAll},
    {7, 2442, ChannelUse::kAll},  {11, 2462, ChannelUse::kAll}, {12, 2467, ChannelUse::kListening},
    {13, 2472, ChannelUse::kAll}, {14, 2484, ChannelUse::kAll},
};

// The quietest channel of 2.4 GHz, and its load.
std::pair<int, int> QuietestAmong(const std::vector<WIRELESS_NETWORK>& networks) {
  for (const HeardChannel& channel : HeardChannels(networks, {std::begin(kOf2GHz), std::end(kOf2GHz)})) {
    if (channel.isQuietest) return {channel.number, channel.load};
  }
  return {};
}

TEST(HeardChannel, IsDisturbedByTheFourToEachSideTheMoreTheNearer) {
  const auto heard = HeardChannels({At(6, 100)}, {std::begin(kOf2GHz), std::end(kOf2GHz)});
  std::vector<int> loads;
  for (const HeardChannel& channel : heard) loads.push_back(channel.load);
  EXPECT_THAT(loads, ElementsAre(0, 20, 100, 80, 0, 0, 0, 0));
}

TEST(HeardChannel, ThatIsTheQuietestHasTheLeastLoad) {
  using Answer = std::pair<int, int>;
  EXPECT_EQ(QuietestAmong({}), Answer(1, 0)) << "the first";
  EXPECT_EQ(QuietestAmong({At(1, 50)}), Answer(6, 0)) << "of those that leave each other room";
  EXPECT_EQ(QuietestAmong({At(1, 50), At(6, 50)}), Answer(11, 0));
  EXPECT_EQ(QuietestAmong({At(1, 90), At(6, 90), At(11, 20)}), Answer(13, 12)) << "the weak one, from two away";
  EXPECT_EQ(QuietestAmong({At(1, 30), At(6, 90), At(11, 90)}), Answer(1, 30)) << "not 12, where none may begin";
  EXPECT_EQ(QuietestAmong({At(3, -95), At(9, -50), At(13, -50)}), Answer(1, 6)) << "dBm";
}

TEST(HeardChannel, AtFiveGigahertzStandsAloneAndIsRatherOneWithoutRadar) {
  const std::vector<Channel> channels{{36, 5180, ChannelUse::kAll},
                                      {40, 5200, ChannelUse::kAllAfterRadar},
                                      {44, 5220, ChannelUse::kAll},
                                      {48, 5240, ChannelUse::kNone}};
  EXPECT_EQ(QuietestOf(HeardChannels({At(36, 60)}, channels), true), 44);
  EXPECT_EQ(QuietestOf(HeardChannels({At(36, 60), At(44, 50)}, channels), true), 40);
  EXPECT_EQ(QuietestOf(HeardChannels({At(36, 60)}, channels), false), std::nullopt);
}

class Channels : public ToolTest {
 protected:
  Channels() {
    library::SavedAp(library::Office());
    kernel::Heard({{.address = kernel::kHome, .msAgo = 10}});
    kernel::g_channels = {{2412},
                          {2437},
                          {2462},
                          {2472, NL80211_FREQUENCY_ATTR_NO_IR},
                          {5180},
                          {5260, NL80211_FREQUENCY_ATTR_RADAR},
                          {5500, NL80211_FREQUENCY_ATTR_DISABLED},
                          {5865}};
    library::InRange({At(1, 40), At(1, 74), At(6, 90)});
  }
};

TEST_F(Channels, AreShownWithWhatIsOnThem) {
  EXPECT_EQ(Tool({"channels"}).out,
            "BAND      CH  NETWORKS  STRONGEST  LOAD  FOR ACCESS POINTS  QUIETEST\n"
            "2.4 GHz    1         2  ▂▄▆▁  74    114  yes                -\n"
            "2.4 GHz    6         1  ▂▄▆█  90     90  yes                -\n"
            "2.4 GHz   11         0  -             0  yes                quietest\n"
            "2.4 GHz   13         0  -             0  listening only     -\n"
            "5 GHz     36         0  -             0  yes                quietest\n"
            "5 GHz     52         0  -             0  yes, after radar   -\n"
            "5 GHz    100         0  -             0  no                 -\n");
  EXPECT_THAT(Tool({"channels", "--porcelain"}).out, StartsWith("2.4\t1\t2\t74\t114\tall\tno\n2.4\t6\t"));
  EXPECT_THAT(Tool({"channels", "--json"}).out,
              EndsWith(R"({"band":"5","channel":100,"networks":0,"strongest":null,"load":0,"use":"none",)"
                       R"("quietest":false}]})"
                       "\n"));
}

TEST_F(Channels, ThatTheRadioDoesNotKnowAreShownWhenSomethingWasHeardThere) {
  library::InRange({At(161, 40), At(0, 50)});
  EXPECT_THAT(Tool({"channels", "--porcelain"}).out, EndsWith("\n5\t161\t1\t40\t40\t\tno\n"));
  kernel::g_channels.clear();
  library::InRange({});
  EXPECT_EQ(Tool({"channels"}).out, "nothing was heard, and the radio does not tell which channels it knows\n");
}

TEST_F(Channels, AreListenedToAsForAScan) {
  EXPECT_EQ(Tool({"channels", "--renew", "--cached"}).status, 2);
  kernel::Heard({});
  kernel::BecomeAccessPoint("Office");
  EXPECT_EQ(Tool({"channels"}).status, 8);
  EXPECT_EQ(Tool({"channels", "--cached"}).status, 0);
  library::MEROWirelessAdapterNum = [] { return 0; };
  EXPECT_EQ(Tool({"channels", "--cached"}).status, 3);
}

TEST_F(Channels, TellOfAMissingCountryOnce) {
  EXPECT_EQ(Tool({"channels"}).err,
            "merowireless: no country is set, which may open more channels: `merowireless country CC` sets it\n");
  WriteText("/usr/mero/etc/wireless_country.conf", "country=\"DE\"\n");
  EXPECT_EQ(Tool({"channels"}).err, "");
  Shell("rm /usr/mero/etc/wireless_country.conf");
}

// ---- The access point's ----

class QuietestChannel : public Channels {
 protected:
  QuietestChannel() {
    library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF conf) {
      return library::Record(std::to_string(conf->hostapConf.channel)), TRUE;
    };
  }
};

// The daemon was to choose, which it does at each start, and with few radios.
TEST_F(QuietestChannel, IsTheAccessPointsWithAuto) {
  const Ran ran = Tool({"ap", "set", "--channel", "auto"});
  EXPECT_EQ(ran.out, "saved with channel 11, the quietest; `merowireless ap enable` puts the settings on the air\n");
  EXPECT_THAT(library::Calls(), testing::Contains("11"));
  EXPECT_THAT(Tool({"ap", "set", "--channel", "AUTO", "--band", "5"}).out, StartsWith("saved with channel 36, "));
  EXPECT_THAT(Tool({"ap", "set", "--channel", "auto", "--json"}).out, HasSubstr(R"("channel":11,)"));
}

TEST_F(QuietestChannel, IsNotChosenWhereNoneMayBeUsedOrScanningWouldDisturb) {
  kernel::g_channels = {{2412}};
  const Ran ran = Tool({"ap", "set", "--channel", "auto", "--band", "5"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_EQ(ran.err,
            "merowireless: the rules without a country leave an access point no channel of the 5 GHz band: "
            "`merowireless country CC` tells the country; --band 2.4 is the other one\n");
  kernel::Heard({});
  kernel::BecomeAccessPoint("Office");
  EXPECT_EQ(Tool({"ap", "set", "--channel", "auto"}).status, 8);
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(QuietestChannel, IsTheDaemonsToChooseWhereTheRadioTellsNothing) {
  kernel::g_channels.clear();
  EXPECT_THAT(Tool({"ap", "set", "--channel", "auto"}).out,
              StartsWith("saved with the channel left to the daemon, since the radio does not tell which it knows; "));
  EXPECT_THAT(library::Calls(), testing::Contains("0"));
}

TEST_F(QuietestChannel, IsTheDaemonsToChooseWithZero) {
  EXPECT_THAT(Tool({"ap", "set", "--channel", "0"}).out, StartsWith("saved; "));
  EXPECT_THAT(library::Calls(), testing::Contains("0"));
  MERO_AP_CONF conf = library::Office();
  conf.hostapConf.channel = 0;
  library::SavedAp(conf);
  EXPECT_THAT(Tool({"ap", "show"}).out, HasSubstr("  left to the daemon\n"));
}

}  // namespace
