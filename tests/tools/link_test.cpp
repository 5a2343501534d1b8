// What the status tells of the link: the access point, how well it is heard, and what came with the connection.
#include <csignal>

#include "running.h"

namespace {

using testing::EndsWith;
using testing::HasSubstr;

class Link : public ToolTest {
 protected:
  Link() {
    library::g_now = library::kNow;
    ::setenv("TZ", "UTC", 1);
    library::Connected("Home");
    Shell(
        "ip link delete wlan0 2>/dev/null; ip link add wlan0 type veth && ip link set wlan0 up &&"
        "ip address add 192.168.1.20/24 dev wlan0; rm -f /etc/resolv.conf");
  }
};

TEST_F(Link, IsInTheStatusWithAllThatCameWithTheConnection) {
  kernel::BecomeJoined();
  Shell("ip route add default via 192.168.1.1 dev wlan0 metric 3003");
  WriteText("/etc/resolv.conf",
            "nameserver 10.9.9.9\n"
            "# By the DHCP client of wlan0, until it leaves the network:\n"
            "search home.example\n"
            "nameserver 192.168.1.1\n"
            "nameserver 192.168.1.2\n"
            "# (end of what the DHCP client of wlan0 has added)\n"
            "nameserver 10.8.8.8\n");
  EXPECT_THAT(Tool({"status"}).out, EndsWith("radio         on\n"
                                             "access point  0A:0A:0A:0A:0A:0A\n"
                                             "signal        -52 dBm\n"
                                             "channel       6\n"
                                             "rate          6.5 Mbit/s\n"
                                             "gateway       192.168.1.1\n"
                                             "name servers  192.168.1.1 192.168.1.2\n"
                                             "since         2026-11-20 10:35:28\n"));
  EXPECT_THAT(Tool({"status", "--json"}).out,
              HasSubstr(R"("name_hex":null,"access_point":"0A:0A:0A:0A:0A:0A","signal_dbm":-52,"channel":6,)"
                        R"("rate_kbps":6500,"gateway":"192.168.1.1","name_servers":"192.168.1.1 192.168.1.2",)"
                        R"("since":"2026-11-20T10:35:28Z"}})"));
}

TEST_F(Link, OfAConnectionOfWhichNothingIsKnownHasNothing) {
  kernel::Main().isThere = false;
  EXPECT_THAT(Tool({"status", "--json"}).out,
              HasSubstr(R"("name_hex":null,"access_point":null,"signal_dbm":null,"channel":null,"rate_kbps":null,)"
                        R"("gateway":null,"name_servers":null,"since":null}})"));
}

TEST_F(Link, IsNoneWithoutAConnection) {
  kernel::BecomeJoined();
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  Shell("ip route add default via 192.168.1.1 dev wlan0");
  EXPECT_THAT(Tool({"status", "--porcelain"}).out, EndsWith("\ton\t\t\t\t\t\t\t\t\n"));
}

TEST_F(Link, OfACellHasAChannelAndNoOneAccessPoint) {
  kernel::BecomeJoined();
  library::InCell("Bench");
  EXPECT_THAT(Tool({"status", "--json"}).out,
              HasSubstr(R"("access_point":null,"signal_dbm":null,"channel":6,"rate_kbps":null,)"));
}

TEST_F(Link, LeadsThroughTheGatewayThatCountsFirst) {
  Shell(
      "ip route add default via 192.168.1.2 dev wlan0 metric 20 &&"
      "ip route add default via 192.168.1.3 dev wlan0 metric 10 &&"
      "ip route add 10.0.0.0/8 via 192.168.1.4 dev wlan0");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\ngateway       192.168.1.3\n"));
  Shell("ip route add default via 192.168.1.5 dev wlan0");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\ngateway       192.168.1.5\n"));
}

TEST_F(Link, HasNoGatewayOrNameServerOfAnotherInterface) {
  Shell(
      "ip link delete eth7 2>/dev/null; ip link add eth7 type veth && ip link set eth7 up &&"
      "ip address add 10.7.0.2/24 dev eth7 && ip route add default via 10.7.0.1 dev eth7");
  WriteText("/etc/resolv.conf",
            "# By the DHCP client of eth7, until it leaves the network:\nnameserver 10.7.0.1\n"
            "# (end of what the DHCP client of eth7 has added)\n"
            "# By the DHCP client of wlan0, until it leaves the network:\nnameserver 10.6.6.6\n");
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("gateway":null,"name_servers":null,)"));
  Shell("ip link delete eth7");
}

TEST_F(Link, ThatIsHeardWorseIsNoNews) {
  kernel::BecomeJoined();
  StartedTool tool({"watch", "--porcelain"});
  ASSERT_TRUE(Soon([&] { return !tool.OutputSoFar().empty(); }));
  kernel::Main().signal = -80;
  Shell("ip address add 192.168.1.21/24 dev wlan0 && sleep 0.5 && ip address flush dev wlan0");
  ASSERT_TRUE(Soon([&] { return tool.OutputSoFar().find('\n') + 1 < tool.OutputSoFar().size(); }));
  ::kill(tool.pid(), SIGINT);
  const std::string out = tool.Wait().out;
  EXPECT_THAT(out, testing::MatchesRegex("[^\n]*\t192.168.1.20\t[^\n]*\t-52\t[^\n]*\n[^\n]*\t-80\t[^\n]*\n"));
}

}  // namespace
