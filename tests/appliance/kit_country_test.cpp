// The country whose rules the radio keeps to.
#include "kit_radio.h"

namespace {

using testing::HasSubstr;
using testing::StartsWith;

constexpr char kSettings[] = "/usr/mero/etc/wireless_country.conf";

// A kernel that keeps to the rules that it is asked for.
class KitCountry : public KitRadio {
 protected:
  KitCountry() {
    StandIn("iw", R"sh(
case "$*" in
'reg set '*) [ -e /tmp/deaf ] || echo "$3" >/tmp/rules.country ;;
'reg get') printf 'global\ncountry %s: DFS-ETSI\n\n' "$(/bin/cat /tmp/rules.country)"
	printf 'phy#7 (self-managed)\ncountry FR: DFS-ETSI\n' ;;
esac
)sh");
    WriteText("/tmp/rules.country", "00\n");
  }

  static void Set(const std::string& country) { WriteText(kSettings, "country=\"" + country + "\"\n"); }
  static std::string Kernel() { return ReadText("/tmp/rules.country"); }
  static std::string Configuration() { return ReadText("/run/rc.network/hostapd-wlan0.conf"); }
};

TEST_F(KitCountry, IsTheKernelsBeforeTheAdapterIsNoted) {
  Set("DE");
  EXPECT_EQ(Tells("keep_to_country"), "");
  EXPECT_EQ(Kernel(), "DE\n");
  const std::string add = RunInShell("sed -n '/^add()/,/^}/p' /usr/mero/hotplug/usb.wireless.function").out;
  EXPECT_LT(add.find("keep_to_country"), add.find("note_adapter"));
}

TEST_F(KitCountry, ThatIsNotSetIsLeftToTheKernel) {
  EXPECT_EQ(Tells("keep_to_country"), "");
  EXPECT_EQ(RunInShell("grep -s 'reg set' /tmp/calls").out, "");
}

// An adapter that keeps to the rules of everywhere is of more use than none.
TEST_F(KitCountry, ThatTheKernelDoesNotTakeIsAWarning) {
  Set("DE");
  Break("iw", "reg set");
  EXPECT_THAT(Tells("keep_to_country"), HasSubstr("cannot set the country DE: iw is broken\n"));
  Mend();
  WriteText("/tmp/deaf", "");
  EXPECT_THAT(Tells("keep_to_country"), HasSubstr("the kernel does not keep to the rules of DE\n"));
  Set("FR");
  EXPECT_THAT(Tells("keep_to_country"), HasSubstr("the kernel does not keep to the rules of FR\n")) << "a radio's own";
  RunInShell("rm /tmp/deaf");
  for (const char* szNone : {"de", "D", "DEU", "00", "D\\nE", "../x"}) {
    Set(szNone);
    EXPECT_THAT(Tells("keep_to_country"), HasSubstr(std::string(kSettings) + " has a country that is none\n"))
        << szNone;
  }
}

TEST_F(KitCountry, IsToldToTheAccessPointsStations) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(Configuration(), "interface=wlan0\nssid=home\nwpa=2\nwpa_passphrase=deux croissants\n");
  Set("DE");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(Configuration(),
            "interface=wlan0\nssid=home\nwpa=2\nwpa_passphrase=deux croissants\ncountry_code=DE\nieee80211d=1\n");
  // At 5 GHz the daemon listens for radar, without which most channels may not be used.
  WriteText("/etc/hostapd/hostapd-wlan0-host.conf", "interface=wlan0\nssid=home\nhw_mode=a\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(Configuration(), "interface=wlan0\nssid=home\nhw_mode=a\ncountry_code=DE\nieee80211d=1\nieee80211h=1\n");
  // It is the radio's, and stands with the main network's lines.
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
  WriteText("/usr/mero/etc/wireless_ap.conf", "[RT [5370]\n\tssid=home\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_THAT(Configuration(), testing::EndsWith("ieee80211h=1\nbss=gwlan\nssid=visitors\n"));
}

TEST_F(KitCountry, ThatIsNoneKeepsTheAccessPointOffTheAir) {
  WriteText(kSettings, "country=\"de\"\n");
  const Ran ran = Script("start wlan0 lbr0");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, StartsWith("rc.network: " + std::string(kSettings) + " has a country that is none\n"));
  EXPECT_EQ(Left(), "");
}

}  // namespace
