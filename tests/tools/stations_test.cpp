// The commands about the stations of the access point.
#include <filesystem>

#include "common/paths.h"
#include "hostapd_fake.h"
#include "running.h"

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

constexpr char kLeases[] = "/var/run/rc.network/dnsmasq-lbr0.leases";
constexpr char kServer[] = "/etc/dhcpd/dhcpd-lbr0-lbr0.conf";

class Stations : public ToolTest {
 protected:
  Stations() {
    library::SavedAp(library::Office());
    library::g_now = library::kNow;
    kernel::BecomeAccessPoint("Office");
    kernel::Main().stations = 2;
    kernel::PutInBridge();
    std::filesystem::remove(kLeases);
    std::filesystem::remove(kServer);
  }

  // The first one, for scripts.
  static std::string First() {
    const std::string lines = Tool({"ap", "stations", "--porcelain"}).out;
    return lines.substr(0, lines.find('\n'));
  }
};

TEST_F(Stations, AreListedWithWhatTheKernelKnows) {
  EXPECT_EQ(Tool({"ap", "stations", "--porcelain"}).out,
            "\t02:00:00:00:00:00\t\t-40\t123456789\t5000000000\t2026-11-20T10:35:28Z\tno\tjoined\n"
            "\t02:00:00:00:00:01\t\t-45\t900\t1234\t2026-11-20T11:34:28Z\tno\tjoined\n");
  EXPECT_EQ(Tool({"ap", "stations"}).out,
            "NAME  ADDRESS            IP  SIGNAL  FROM    TO  FOR    GUEST\n"
            "-     02:00:00:00:00:00  -      -40  123M  5.0G  1 h    -\n"
            "-     02:00:00:00:00:01  -      -45   900  1.2k  1 min  -\n");
}

TEST_F(Stations, AreMarkedThatAreGuestsOrNotLetInYet) {
  kernel::Guests() = kernel::Main();
  kernel::Guests().joining = 1;
  const std::string out = Tool({"ap", "stations"}).out;
  EXPECT_THAT(out, HasSubstr("5.0G  1 h      yes\n"));
  EXPECT_THAT(out, HasSubstr("1.2k  joining  yes\n"));
  EXPECT_THAT(Tool({"ap", "stations", "--json"}).out, HasSubstr(R"("guest":true,"state":"joining"}]})"));
}

TEST_F(Stations, HaveTheNamesAndAddressesOfTheirLeases) {
  WriteText(kLeases,
            "1795174000 02:00:00:00:00:00 10.1.14.22 ended *\n"
            "duid 00:01:00:01:2b\n"
            "1795260928 02:00:00:00:00:00 10.1.14.23 tablet 01:02:00:00:00:00:00\n"
            "0 02:00:00:00:00:01 10.1.14.24 * *\n");
  EXPECT_THAT(First(), StartsWith("tablet\t02:00:00:00:00:00\t10.1.14.23\t"));
  EXPECT_THAT(Tool({"ap", "stations", "--json"}).out,
              HasSubstr(R"({"name":null,"address":"02:00:00:00:00:01","ip":"10.1.14.24",)"));
  WriteText(kServer, "interface=lbr0\ndhcp-leasefile=/tmp/others.leases\n");
  WriteText("/tmp/others.leases", "0 02:00:00:00:00:00 10.1.14.25 phone *\n");
  EXPECT_THAT(First(), StartsWith("phone\t02:00:00:00:00:00\t10.1.14.25\t"));
}

TEST_F(Stations, CommandNoTerminalByTheNamesThatTheyGiveThemselves) {
  WriteText(kLeases, "0 02:00:00:00:00:00 10.1.14.23 \x1b[2Jx\xff *\n");
  for (const char* form : {"-v", "--json", "--porcelain"}) {
    const std::string out = Tool({"ap", "stations", form}).out;
    EXPECT_EQ(out.find('\x1b'), out.npos) << form;
  }
  EXPECT_THAT(First(), StartsWith(R"(\0033[2Jx\0377	)"));
  EXPECT_THAT(Tool({"ap", "stations"}).out, HasSubstr(R"(\x1b[2Jx\xff)"));
}

TEST_F(Stations, AreNoneWithoutAnAccessPoint) {
  kernel::BecomeClient();
  constexpr char kMessage[] = "there is no access point, and so no station";
  EXPECT_THAT(Tool({"ap", "stations"}).err, StartsWith("merowireless: " + std::string(kMessage) + ": "));
  EXPECT_THAT(Tool({"ap", "kick", "02:00:00:00:00:01"}).err, StartsWith("merowireless: " + std::string(kMessage)));
  kernel::BecomeAccessPoint("Office");
  EXPECT_EQ(Tool({"ap", "stations"}).out, "no station is on the access point\n");
}

// Their traffic was said to be 0 then.
TEST_F(Stations, HaveTheTrafficThatADriverOfAnyKindCounts) {
  kernel::Main().stations = 1;
  kernel::Main().driver = kernel::Driver::kCountsTo32Bits;
  EXPECT_THAT(First(), HasSubstr("\t-40\t900\t4000000000\t"));
  kernel::Main().driver = kernel::Driver::kDoesNotCount;
  EXPECT_THAT(Tool({"ap", "stations"}).out, HasSubstr("  -40     -   -  1 h"));
  EXPECT_THAT(Tool({"ap", "stations", "--json"}).out, HasSubstr(R"("signal":-40,"rx_bytes":null,"tx_bytes":null,)"));
}

// It was said that there were none.
TEST_F(Stations, AreNotDeniedWhereTheDriverCannotListThem) {
  kernel::Main().driver = kernel::Driver::kListsNone;
  const Ran ran = Tool({"ap", "stations"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, StartsWith("merowireless: the adapter's driver cannot list the stations: "));
  EXPECT_THAT(Tool({"ap", "status"}).out, HasSubstr("stations      -\n"));
  EXPECT_THAT(Tool({"ap", "status", "--json"}).out, HasSubstr(R"("stations":null,)"));
}

// ---- Sending one away ----

TEST_F(Stations, AreSentAway) {
  const Hostapd hostapd;
  const Ran ran = Tool({"ap", "kick", "02:00:00:00:00:01"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "02:00:00:00:00:01 has left the access point; it may come back by itself\n");
  EXPECT_EQ(kernel::Main().stations, 1);
  EXPECT_THAT(library::Calls(), ElementsAre("DEAUTHENTICATE 02:00:00:00:00:01"));
}

TEST_F(Stations, AreCalledByTheirNamesWhenTheyAreSentAway) {
  const Hostapd hostapd;
  WriteText(kLeases, "0 02:00:00:00:00:01 10.1.14.24 pho\x1bne *\n");
  EXPECT_THAT(Tool({"ap", "kick", "02:00:00:00:00:01"}).out, StartsWith(R"(pho\x1bne (02:00:00:00:00:01) has left)"));
}

TEST_F(Stations, ThatAreNotThereAreNotSentAway) {
  const Hostapd hostapd;
  Ran ran = Tool({"ap", "kick", "02:00:00:00:00:07"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.err,
            "merowireless: no station of this address is on the access point: `merowireless ap stations` lists those "
            "that are\n");
  ran = Tool({"ap", "kick", "tablet"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_EQ(ran.err, "merowireless: this is no station's address: write it as `merowireless ap stations` shows it\n");
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Stations, ThatStayAreNotSaidToHaveLeft) {
  {
    const Hostapd hostapd(Hostapd::Manner::kIgnores);
    EXPECT_THAT(Tool({"ap", "kick", "02:00:00:00:00:01"}).err,
                HasSubstr("merowireless: the station was told to leave, and is on the access point still: "));
  }
  {
    const Hostapd hostapd(Hostapd::Manner::kRefuses);
    EXPECT_THAT(Tool({"ap", "kick", "02:00:00:00:00:01"}).err,
                HasSubstr("merowireless: the access-point daemon does not send the station away: "));
  }
  const Ran ran = Tool({"ap", "kick", "02:00:00:00:00:01"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the access-point daemon does not answer on /var/run/hostapd/wlan0: "));
}

}  // namespace
