// The country whose rules the radio keeps to.
#include <filesystem>

#include "common/text.h"
#include "running.h"

using testing::ElementsAre;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

constexpr char kSettings[] = "/usr/mero/etc/wireless_country.conf";

// A key/value file that keeps what is set, and a database of three countries.
class Country : public ToolTest {
 protected:
  Country() {
    library::PLIBCFileSetKeyValue = [](const char* szPath, const char*, const char* szValue, const char*) {
      return Set(szPath, szValue), 1;
    };
    WriteDatabase({"DE", "JP", "US"});
  }

  ~Country() override { Shell("rm -f " + std::string(kSettings)); }

  static void Set(const char* szPath, const std::string& country) {
    WriteText(szPath, "country=\"" + country + "\"\n");
  }

  static void WriteDatabase(const std::vector<std::string>& countries) {
    std::string bytes("RGDB\0\0\0\x14", 8);
    for (const std::string& country : countries) bytes += country + std::string("\0\x7", 2);
    WriteText("/lib/firmware/regulatory.db", bytes + std::string(4, '\0'));
  }

  static std::string Saved() { return TextOrNothing(kSettings); }
  static std::string Kernel() { return kernel::RulesNow().szKernel; }
};

TEST_F(Country, IsShownWithWhatTheKernelKeepsTo) {
  EXPECT_EQ(Tool({"country"}).out,
            "country         none is set\n"
            "kernel's rules  the whole world (00)\n"
            "radio's own     -\n"
            "in force        -\n");
  Set(kSettings, "DE");
  CopyText(kernel::RulesNow().szKernel, "DE");
  EXPECT_THAT(Tool({"country"}).out, EndsWith("in force        yes\n"));
  CopyText(kernel::RulesNow().szKernel, "US");
  EXPECT_THAT(Tool({"country"}).out, EndsWith("in force        no: the kernel keeps to other rules\n"));
  EXPECT_EQ(Tool({"country", "--porcelain"}).out, "DE\tUS\t\tno\n");
}

// The program said that none was set, and the access point did not start for it.
TEST_F(Country, InTheSettingsThatIsNoneIsToldAndCanBeReplaced) {
  Set(kSettings, "de; reboot");
  const Ran shown = Tool({"country"});
  EXPECT_EQ(shown.status, 1);
  EXPECT_THAT(shown.err, HasSubstr(" has a country that is none, and no access point starts with it: `merowireless "));
  EXPECT_EQ(Tool({"country", "DE"}).status, 0);
  EXPECT_THAT(Tool({"country"}).out, HasSubstr("country         DE\n"));
}

// What only looks asks for nothing.
TEST_F(Country, IsNotChangedByBeingShown) {
  Set(kSettings, "DE");
  Tool({"country"});
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Country, IsSetInTheKernelAndKept) {
  EXPECT_EQ(Tool({"country", "de"}).out, "the country is DE\n");
  EXPECT_EQ(Kernel(), "DE");
  EXPECT_EQ(Saved(), "country=\"DE\"\n");
  EXPECT_EQ(
      Tool({"country", "us", "--json"}).out,
      "{\"result\":\"ok\",\"country\":{\"country\":\"US\",\"kernel\":\"US\",\"radio\":null,\"in_force\":true}}\n");
  EXPECT_EQ(Tool({"country", "none"}).out, "no country is set\n");
  EXPECT_EQ(Kernel(), "00");
  EXPECT_EQ(Saved(), "");
  EXPECT_EQ(Tool({"country", "00"}).status, 0);
}

TEST_F(Country, ThatIsNoneIsRefusedBeforeAnythingIsTouched) {
  Set(kSettings, "DE");
  CopyText(kernel::RulesNow().szKernel, "DE");
  for (const char* szText : {"", "D", "DEU", "D1", "Germany", "1 ", "\xc3\xa4"}) {
    const Ran ran = Tool({"country", szText});
    EXPECT_EQ(ran.status, 2) << szText;
    EXPECT_THAT(ran.err, HasSubstr("merowireless: this is no country: give its two letters")) << szText;
  }
  const Ran ran = Tool({"country", "UK"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the kernel knows no rules for UK: give a country's two letters"));
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_EQ(Saved(), "country=\"DE\"\n");
}

// The database may say what the kernel does not know, and may not be there.
TEST_F(Country, ThatTheKernelDoesNotFollowIsNotSet) {
  Set(kSettings, "DE");
  CopyText(kernel::RulesNow().szKernel, "DE");
  const Ran ran = Tool({"country", "JP"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the kernel knows no rules for JP: "));
  EXPECT_EQ(Kernel(), "DE");
  EXPECT_EQ(Saved(), "country=\"DE\"\n");
}

TEST_F(Country, IsTheKernelsToJudgeWhereItsDatabaseCannotBeRead) {
  for (const char* szDatabase : {"", "RGDB", "no database\n", "RGDB\1\1\1\1DE\1\7"}) {
    CopyText(kernel::RulesNow().szKernel, "00");
    WriteText("/lib/firmware/regulatory.db", szDatabase);
    EXPECT_EQ(Tool({"country", "US"}).status, 0) << szDatabase;
    EXPECT_EQ(Kernel(), "US") << szDatabase;
  }
}

// It was said to be none, and two letters as in ISO 3166 were advised.
TEST_F(Country, IsNotCalledWrongWhereTheDatabaseIsMissing) {
  std::filesystem::remove("/lib/firmware/regulatory.db");
  const Ran ran = Tool({"country", "JP"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.err,
            "merowireless: the kernel has no rules for JP, and its database of rules cannot be read: install the "
            "package wireless-regdb, and start the appliance anew\n");
  EXPECT_EQ(Kernel(), "00");
  EXPECT_EQ(Saved(), "");
}

TEST_F(Country, ThatWasThereIsBroughtBackWhenAnotherOneCannotBe) {
  Set(kSettings, "DE");
  CopyText(kernel::RulesNow().szKernel, "DE");
  CopyText(kernel::RulesNow().szKnown, "DE JP");
  kernel::g_channelsIn["JP"] = {{2412}};
  kernel::BecomeAccessPoint("Office", 2462);
  EXPECT_EQ(Tool({"country", "JP"}).status, 8);
  EXPECT_THAT(library::Calls(), ElementsAre("rules of JP", "rules of DE"));
  EXPECT_EQ(Kernel(), "DE");
  EXPECT_EQ(Saved(), "country=\"DE\"\n");

  CopyText(kernel::RulesNow().szKnown, "JP");
  const Ran ran = Tool({"country", "JP"});
  EXPECT_THAT(ran.err, HasSubstr("the rules that the radio kept to could not be brought back"));
  EXPECT_EQ(ran.status, 8);
}

// The kernel would take it off the air a minute later.
TEST_F(Country, WhoseRulesWouldEndWhatIsOnTheAirIsRefused) {
  kernel::g_channelsIn["US"] = {{2412}, {2462}, {2467, NL80211_FREQUENCY_ATTR_NO_IR}};
  kernel::BecomeAccessPoint("Office", 2472);
  Ran ran = Tool({"country", "US"});
  EXPECT_EQ(ran.status, 8);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: channel 13 may not be used in US, and is in use: "
                                 "give the access point another one with `merowireless ap set --channel`"));
  EXPECT_EQ(Kernel(), "00");
  EXPECT_EQ(Saved(), "");
  kernel::BecomeAccessPoint("Office", 2467);
  EXPECT_EQ(Tool({"country", "US"}).status, 8) << "where no access point may begin";

  kernel::BecomeClient();
  kernel::Main().megahertz = 2467;
  EXPECT_EQ(Tool({"country", "US"}).status, 0) << "a connection may be where somebody else has begun";
  EXPECT_EQ(Tool({"country", "none"}).status, 0);
  kernel::Main().megahertz = 2472;
  EXPECT_THAT(Tool({"country", "US"}).err, HasSubstr("`merowireless disconnect` ends the connection first\n"));
}

TEST_F(Country, ThatCannotBeSavedIsNotLeftInTheKernel) {
  library::PLIBCFileSetKeyValue = [](const char*, const char*, const char*, const char*) { return -1; };
  const Ran ran = Tool({"country", "US"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the country could not be saved: "));
  EXPECT_EQ(Kernel(), "00");
}

TEST_F(Country, OfAnApplianceThatHasNeverHadARadioWaitsForOne) {
  kernel::RulesNow() = {};
  EXPECT_EQ(Tool({"country", "DE"}).out, "the country is DE, and holds once an adapter is plugged in\n");
  EXPECT_EQ(Saved(), "country=\"DE\"\n");
  EXPECT_EQ(Tool({"country", "--porcelain"}).out, "DE\t\t\t\n");
}

TEST_F(Country, IsToldApartFromRulesThatHoldInItsPlace) {
  Shell("mount -t tmpfs scratch /sys/class/net && mkdir -p /sys/class/net/wlan0/phy80211");
  WriteText("/sys/class/net/wlan0/phy80211/index", "0\n");
  CopyText(kernel::RulesNow().szRadio, "US");
  EXPECT_EQ(Tool({"country", "DE"}).out,
            "the country is DE, and the adapter's radio keeps to rules of its own, those of US\n");
  EXPECT_THAT(Tool({"country"}).out,
              EndsWith("radio's own     US\nin force        no: the radio has rules of its own\n"));
  EXPECT_EQ(Tool({"country", "--porcelain"}).out, "DE\tDE\tUS\tno\n");

  WriteText("/sys/class/net/wlan0/phy80211/index", "1\n");
  EXPECT_EQ(Tool({"country", "--porcelain"}).out, "DE\tDE\t\tyes\n") << "another adapter's";
  Shell("umount /sys/class/net");

  CopyText(kernel::RulesNow().szTaken, "98");
  EXPECT_EQ(Tool({"country", "US"}).out,
            "the country is US, and the kernel keeps to the rules of several countries (98)\n");
}

// ---- The access point ----

TEST_F(Country, IsNamedWhereAChannelMayNotBeUsed) {
  library::SavedAp(library::Office());
  kernel::g_channels = {{2412}};
  EXPECT_THAT(
      Tool({"ap", "set", "--channel", "13"}).err,
      HasSubstr("merowireless: this radio may not use channel 13 without a country: `merowireless country CC`"));
  Set(kSettings, "US");
  CopyText(kernel::RulesNow().szKernel, "US");
  EXPECT_THAT(Tool({"ap", "set", "--channel", "13"}).err,
              HasSubstr("merowireless: this radio may not use channel 13 in US: it may use 1 in the"));
  CopyText(kernel::RulesNow().szKernel, "98");
  EXPECT_THAT(Tool({"ap", "set", "--channel", "13"}).err,
              HasSubstr("merowireless: this radio may not use channel 13 here and now: it may use 1 in the"));
}

}  // namespace
