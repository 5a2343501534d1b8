// connect, autoconnect, disconnect, adhoc, watch, radio and mode.
#include <fcntl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "running.h"
#include "tests/support/local_user.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

WIRELESS_NETWORK_CONFIG Home(const char* szIp = "DHCP") {
  WIRELESS_NETWORK_CONFIG config = library::Home();
  std::strcpy(config.szIp, szIp);
  std::strcpy(config.szMask, "255.255.255.0");
  std::strcpy(config.szGateway, "10.0.0.1");
  return config;
}

constexpr char kApMarker[] = "/var/tmp/.wireless_ap_connecting";
constexpr char kApPid[] = "/var/run/rc.network/hostapd-wlan0.pid";

constexpr char kJoinMarker[] = "/var/tmp/.wireless_connecting";
constexpr char kJoinLock[] = "/var/run/merowireless";
constexpr char kGo[] = "/tmp/go-on";
constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";

class Connection : public ToolTest {
 protected:
  Connection() {
    std::filesystem::remove(kApMarker);
    std::filesystem::remove(kApPid);
    for (const char* szPath : {kSupplicantPid, kJoinMarker, kJoinLock, kGo}) std::filesystem::remove_all(szPath);
    library::Known({Home()});
    library::InRange({Network("Home")});
    library::Connected("Home");
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
      library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" + config->szUser + "|" +
                      std::to_string(config->noneBssid));
      return 0;
    };
    library::MEROWirelessIfconfigSet = [](const char* szInterface, WIRELESS_NETWORK_CONFIG config) {
      library::Record(std::string(szInterface) + "|" + config.szIp + "|" + config.szMask);
      return 0;
    };
  }
};

TEST_F(Connection, ToAKnownNetworkTakesItsSecretAndAddress) {
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "connected to Home without an address\n");
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "Home|open sesame||1",
                                            "MEROWirelessIfconfigSet", "wlan0|DHCP|255.255.255.0"));
}

// A supplicant's client that does this.
void InstallSupplicantClient(const std::string& script) {
  WriteScript("/usr/sbin/wpa_cli", script);
}

TEST_F(Connection, IsMadeOnlyWhenTheFormerSupplicantHasGone) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("echo $* >/tmp/told\n(sleep 0.3; rm /var/run/wpa_supplicant.pid) &\n");
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Record(std::filesystem::exists(kSupplicantPid) ? "too early" : "joined");
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("joined"));
  EXPECT_EQ(ReadText("/tmp/told"), "terminate\n");
}

TEST_F(Connection, IsMadeWhenOnlyTheFileOfASupplicantIsLeft) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("exit 255\n");
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("MEROWirelessNetworkConnect"));
}

TEST_F(Connection, IsNotMadeBesideASupplicantThatDoesNotEnd) {
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("exit 0\n");
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the former connection does not end"));
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkDisconnect", "MEROWirelessNetworkConnect", "Home|open sesame||0"))
      << "it is ended by force, and made again";
}

// Any failure of the client was taken for a supplicant that was gone.
TEST_F(Connection, IsNotMadeBesideASupplicantThatDoesNotListen) {
  const StartedDaemon supplicant("wpa_supplicant", kSupplicantPid);
  InstallSupplicantClient("exit 255\n");
  EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("the former connection does not end"));
}

TEST_F(Connection, CanLeaveTheAddressesAlone) {
  EXPECT_EQ(Tool({"connect", "Home", "--no-address"}).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "Home|open sesame||1"));
}

TEST_F(Connection, ToAnUnknownNetworkScansAndTakesASecret) {
  library::InRange({Network("Office", WIRELESS_AUTH_WPA2EAP)});
  EXPECT_EQ(Tool({"connect", "Office", "--key-stdin", "--user", "ann"}, {.input = "secret"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("Office|secret|ann|1"));
  EXPECT_EQ(Tool({"connect", "Office", "--key-stdin"}, {.input = "secret"}).status, 2);
}

TEST_F(Connection, ToANetworkOutOfRangeIsNotTried) {
  EXPECT_EQ(Tool({"connect", "Elsewhere"}).status, 4);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkScan"));
}

// The library takes such an attempt for a success.
TEST_F(Connection, IsNotTriedWhileTheRadioIsSwitchedOff) {
  for (int answer : {0, -1}) {
    library::MEROWirelessCheckBlock = [answer] { return answer; };
    for (const auto& command : std::vector<std::vector<std::string>>{{"connect", "Home"}, {"autoconnect"}}) {
      const Ran ran = Tool(command);
      EXPECT_EQ(ran.status, 6);
      EXPECT_THAT(ran.err, HasSubstr("`merowireless radio on` switches it on"));
    }
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

const std::vector<std::vector<std::string>> kJoins = {{"connect", "Home"}, {"autoconnect"}, {"adhoc", "cell"}};

void MakeAccessPoint() {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_UNKNOWN; };
  kernel::BecomeAccessPoint("Office");
}

// Everybody was knocked off the access point, which was called "on the air" afterwards.
TEST_F(Connection, IsNotTriedWhileTheAdapterIsAnAccessPoint) {
  MakeAccessPoint();
  for (const auto& command : kJoins) {
    const Ran ran = Tool(command);
    EXPECT_EQ(ran.status, 8);
    EXPECT_THAT(ran.err, AllOf(HasSubstr("the adapter is an access point, and would be none any more"),
                               HasSubstr("`merowireless ap disable`")));
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, IsNotTriedWhileTheAccessPointsDaemonRuns) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  {
    const StartedDaemon hostapd("hostapd", kApPid);
    for (const auto& command : kJoins) EXPECT_EQ(Tool(command).status, 8);
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0) << "the file alone tells of no daemon";
  const StartedDaemon another("another", kApPid);
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0) << "nor does another program's process";
}

TEST_F(Connection, IsNotTriedWhileAnAccessPointIsBeingSetUp) {
  WriteText(kApMarker, "");
  for (const auto& command : kJoins) {
    const Ran ran = Tool(command);
    EXPECT_EQ(ran.status, 8);
    EXPECT_THAT(ran.err,
                AllOf(HasSubstr("the adapter is about to be an access point"), HasSubstr("`merowireless ap disable`")));
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_TRUE(Exists(kApMarker));
}

TEST_F(Connection, IsTriedWhenOnlyAnOldMarkerOfAnAccessPointIsLeft) {
  WriteText(kApMarker, "");
  Shell("touch -d '6 minutes ago' " + std::string(kApMarker));
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
}

// Two attempts ended each other, and nothing was connected.
TEST_F(Connection, IsMadeByOneCommandAtATime) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Record("joining");
    return Soon([] { return Exists(kGo); }) ? 0 : -1;
  };
  StartedTool first({"connect", "Home", "--no-address"});
  ASSERT_TRUE(Soon([] { return library::Calls().size() == 2; }));
  InstallSupplicantClient("touch /tmp/told-in-between\n");
  WriteText(kSupplicantPid, "1\n");
  for (const auto& command : kJoins) {
    const Ran ran = Tool(command);
    EXPECT_EQ(ran.status, 8);
    EXPECT_THAT(ran.err, HasSubstr("another command is at work with the adapter"));
  }
  for (const auto& command : std::vector<std::vector<std::string>>{{"disconnect"},
                                                                   {"ap", "enable"},
                                                                   {"ap", "disable"},
                                                                   {"mode", "ap"},
                                                                   {"mode", "client"},
                                                                   {"radio", "off"},
                                                                   {"radio", "on"},
                                                                   {"address", "DHCP"},
                                                                   {"gateway", "10.0.0.1"}}) {
    EXPECT_EQ(Tool(command).status, 8) << testing::PrintToString(command);
  }
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "joining"));
  EXPECT_FALSE(Exists("/tmp/told-in-between"));
  std::filesystem::remove(kSupplicantPid);
  WriteText(kGo, "");
  EXPECT_EQ(first.Wait().status, 0);
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
}

TEST_F(Connection, IsNotMadeWhileAnotherProgramMakesOne) {
  WriteText(kJoinMarker, "");
  for (const auto& command : kJoins) {
    const Ran ran = Tool(command);
    EXPECT_EQ(ran.status, 8);
    EXPECT_THAT(ran.err, HasSubstr("another program is joining a network"));
  }
  EXPECT_THAT(library::Calls(), IsEmpty());
  EXPECT_TRUE(Exists(kJoinMarker));
}

// The library refuses once after a power cut that came while a network was being joined.
TEST_F(Connection, IsMadeWhenOnlyTheMarkerOfOneIsLeft) {
  for (const std::string change : {"touch -d '3 minutes ago' ", "touch -d tomorrow ", "chown 1 "}) {
    WriteText(kJoinMarker, "");
    Shell(change + kJoinMarker);
    EXPECT_EQ(Tool({"connect", "Home"}).status, 0) << change;
    EXPECT_FALSE(Exists(kJoinMarker)) << change;
  }
}

// A directory that was not empty stayed, and kept the appliance from every network.
TEST_F(Connection, IsMadeWhateverLocalUsersHavePutInItsWay) {
  if (!HasLocalUsers()) GTEST_SKIP() << "this machine has no other users";
  const std::string victim = "/tmp/victim";
  WriteText(victim, "as was");
  ObstructEachWay(
      kJoinMarker, victim, [] { std::filesystem::remove_all(kJoinMarker); },
      [] {
        const Ran ran = Tool({"connect", "Home"});
        EXPECT_EQ(ran.status, 0) << ran.err;
        EXPECT_FALSE(Exists(kJoinMarker));
      });
}

TEST_F(Connection, IsNotMadeWhileTheMarkerOfAnotherCannotBeRemoved) {
  Shell("mkdir " + std::string(kJoinMarker) + " && mount -t tmpfs none " + kJoinMarker);
  const Ran ran = Tool({"connect", "Home"});
  Shell("umount " + std::string(kJoinMarker));
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("an old marker of a join cannot be removed"));
}

TEST_F(Connection, IsNotMadeWhereOthersCannotBeKeptAway) {
  std::filesystem::remove(kJoinLock);
  WriteText(kJoinLock, "");
  EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("other joins cannot be kept away"));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, CanBeMadeAgainWhileProgramsRunThatOneHasStarted) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return std::system("sleep 5 &"); };
  for (int i = 0; i < 2; ++i) EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  EXPECT_EQ(ModeOf(kJoinLock), 0700U) << "anyone else could hold it for ever";
}

TEST_F(Connection, ThatFailsWithoutAReasonSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 9);
  EXPECT_THAT(ran.err, HasSubstr("Home could not be joined in time"));
}

TEST_F(Connection, ThatMeetsAnotherAttemptSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    return library::Report("wireless_network_connect", "Another connection construction is going"), -1;
  };
  EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("is being joined already"));
}

TEST_F(Connection, ThatCannotBeWrittenDownSaysSo) {
  for (const char* szReport :
       {"Failed to set [/usr/mero/etc/wpa_supplicant.conf]", "Failed to record this connection."}) {
    library::MEROWirelessNetworkConnect = [szReport](const WIRELESS_NETWORK_CONFIG*) {
      return library::Report("wireless_network_connect", szReport), -1;
    };
    EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("could not be written down")) << szReport;
  }
}

TEST_F(Connection, ThatLosesItsAdapterSaysSo) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  int asked = 0;
  library::MEROWirelessAdapterNum = [asked]() mutable { return asked++ < 1 ? 1 : 0; };
  EXPECT_EQ(Tool({"connect", "Home"}).status, 3);
}

TEST_F(Connection, ThatExistsIsKeptByAutoconnect) {
  EXPECT_EQ(Tool({"autoconnect"}).out, "connected to Home without an address\n");
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, IsMadeByAutoconnectOrNotAtAll) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  EXPECT_EQ(Tool({"autoconnect"}).status, 4);
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return 0; };
  EXPECT_EQ(Tool({"autoconnect"}).status, 0);
}

TEST_F(Connection, IsNotMadeByAutoconnectWhenNoNetworkIsKnown) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  library::Known({});
  const Ran ran = Tool({"autoconnect"});
  EXPECT_EQ(ran.status, 4);
  EXPECT_THAT(ran.err, HasSubstr("no network is known"));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Connection, IsMadeByAutoconnectOnlyWhenTheFormerSupplicantHasGone) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  WriteText(kSupplicantPid, "1\n");
  InstallSupplicantClient("rm /var/run/wpa_supplicant.pid\n");
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Record(std::filesystem::exists(kSupplicantPid) ? "too early" : "joined");
    return 0;
  };
  EXPECT_EQ(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("joined"));
}

TEST_F(Connection, Ends) {
  EXPECT_EQ(Tool({"disconnect"}).out, "disconnected\n");
  EXPECT_EQ(Tool({"disconnect", "--json"}).out, "{\"result\":\"ok\"}\n");
  library::MEROWirelessNetworkDisconnect = [] { return -1; };
  EXPECT_EQ(Tool({"disconnect"}).status, 1);
}

TEST_F(Connection, ThatEndsUnnotedSaysSo) {
  Shell("mkdir -p " + std::string(kJoinLock) + " && mount -t tmpfs -o ro none " + kJoinLock);
  const Ran ran = Tool({"disconnect"});
  Shell("umount " + std::string(kJoinLock));
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("disconnected, but `autoconnect --keep` does not know that it is to stay so"));
}

// A cell once kept the address, the routes, the name servers and the DHCP client of the network before it.
TEST_F(Connection, OfEqualsIsACellWithNothingOfTheFormerNetwork) {
  library::InCell("cell");
  library::MEROWirelessAdhocCreate = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" +
                    std::to_string(config->network.opmode) + "|" + std::to_string(config->network.encrypt));
    return 0;
  };
  EXPECT_EQ(Tool({"adhoc", "cell"}).status, 0);
  EXPECT_EQ(Tool({"adhoc", "cell", "--wep", "--key-stdin"}, {.input = "12345"}).status, 0);
  EXPECT_EQ(Tool({"adhoc", "cell", "--wep", "--key-stdin"}, {.input = "123456"}).status, 5);
  const char* const szLeave = "MEROWirelessNetworkDisconnect";
  EXPECT_THAT(library::Calls(), ElementsAre(szLeave, "MEROWirelessAdhocCreate", "cell||1|1", szLeave,
                                            "MEROWirelessAdhocCreate", "cell|12345|1|2"));
}

TEST_F(Connection, OfEqualsIsNotBegunInAConnectionThatDoesNotEnd) {
  library::Connected("Home");
  library::MEROWirelessNetworkDisconnect = [] { return -1; };
  const Ran ran = Tool({"adhoc", "cell"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the connection could not be ended whole"));
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessAdhocCreate")));
}

// The library reports no command that the driver refuses.
TEST_F(Connection, OfEqualsThatTheDriverDoesNotMakeIsAFailure) {
  for (const char* szName : {"another cell", "Home"}) {
    szName == std::string("Home") ? library::Connected(szName) : library::InCell(szName);
    const Ran ran = Tool({"adhoc", "cell"});
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.err, HasSubstr("the cell cell could not be started"));
    EXPECT_THAT(library::Calls(), Contains("MEROWirelessNetworkDisconnect")) << "nothing of it is left";
  }
  EXPECT_EQ(Tool({"adhoc", ""}).status, 2);
}

bool EndsSoon(const StartedTool& tool) {
  return Soon([&] {
    siginfo_t ended{};
    return ::waitid(P_PID, static_cast<id_t>(tool.pid()), &ended, WEXITED | WNOHANG | WNOWAIT) == 0 &&
           ended.si_pid != 0;
  });
}

TEST_F(Connection, ThatIsWatchedIsNoLongerWhenItCannotBeShown) {
  const auto writeToFullDisk = [] { ::dup2(::open("/dev/full", O_WRONLY), STDOUT_FILENO); };
  EXPECT_TRUE(EndsSoon(StartedTool({"watch"}, {.before = writeToFullDisk})));
}

TEST_F(Connection, ThatIsWatchedIsNoLongerWhenNobodyReadsOn) {
  int pipe[2];
  int sockets[2];
  ASSERT_EQ(::pipe(pipe), 0);
  ASSERT_EQ(::socketpair(AF_UNIX, SOCK_STREAM, 0, sockets), 0);
  for (const auto& ends : {std::pair(pipe[0], pipe[1]), std::pair(sockets[0], sockets[1])}) {
    const auto writeThere = [ends] {
      ::signal(SIGPIPE, SIG_IGN);
      ::dup2(ends.second, STDOUT_FILENO);
      for (int end : {ends.first, ends.second}) ::close(end);
    };
    const StartedTool tool({"watch"}, {.before = writeThere});
    ::close(ends.second);
    char shown[4096];
    EXPECT_GT(::read(ends.first, shown, sizeof shown), 0) << "and nothing is left, which would be an error of its own";
    ::close(ends.first);
    EXPECT_TRUE(EndsSoon(tool));
  }
}

TEST_F(Connection, IsShownAgainWhenItHasChanged) {
  library::g_now = library::kNow;
  int asked = 0;
  library::MEROWirelessConnStatusGet = [asked]() mutable {
    return asked++ < 2 ? WIRELESS_STATUS_DOWN : WIRELESS_STATUS_DISCONNECTED;
  };
  const Ran ran = Tool({"watch", "--count", "2", "--porcelain"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out,
            "down\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\t2026-11-20T11:35:28Z\n"
            "disconnected\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\t2026-11-20T11:35:28Z\n");
}

// A station that the access point had not let in, as with a wrong secret, was called connected.
TEST_F(Connection, IsCalledOneOnlyOnceTheAccessPointLetsTheStationIn) {
  Shell("ip link add wlan0 type veth peer name air && ip link set air up && ip link set wlan0 mode dormant up");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("joining (the access point has not let it in yet)"));
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("state":"joining","name":"Home")"));
  StartedTool tool({"watch", "--count", "2", "--porcelain"});
  ASSERT_TRUE(Soon([&] { return !tool.OutputSoFar().empty(); }));
  Shell("ip link set wlan0 mode default down && ip link set wlan0 up");
  EXPECT_THAT(tool.Wait().out, testing::MatchesRegex("joining\tHome\t[^\n]*\nconnected\tHome\t[^\n]*\n"));
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("state":"connected","name":"Home")"));
  Shell("ip link delete wlan0");
}

TEST_F(Connection, IsWatchedByTheClockOnTheWall) {
  library::g_now = library::kNow;
  const Surroundings india{.environment = {{"TZ", "XIT-5:30"}}};
  EXPECT_THAT(Tool({"watch", "--count", "1"}, india).out, HasSubstr("\ntime          17:05:28\n"));
  EXPECT_THAT(Tool({"watch", "--count", "1", "--json"}, india).out, HasSubstr(R"("time":"2026-11-20T11:35:28Z"}})"));
  EXPECT_THAT(Tool({"status"}, india).out, Not(HasSubstr("time")));
}

// The steps of a change were shown too: the address with the mask of its class, then none.
TEST_F(Connection, IsWatchedWithoutTheAddressesThatItHasOnTheWayToAnother) {
  library::g_now = library::kNow;
  Shell("ip link add wlan0 type veth && ip link set wlan0 up");
  StartedTool tool({"watch", "--count", "2", "--porcelain"});
  ASSERT_TRUE(Soon([&] { return !tool.OutputSoFar().empty(); }));
  Shell(
      "ip address add 10.0.0.9/8 dev wlan0 && sleep 0.05 && ip address delete 10.0.0.9/8 dev wlan0 && sleep 0.05 &&"
      "ip address add 10.0.0.9/24 dev wlan0");
  EXPECT_EQ(tool.Wait().out,
            "connected\tHome\tWPA2PSK\t11b/g/n\tMANAGED\twlan0\t\t\ton\t\t\t\t\t\t\t\t\t2026-11-20T11:35:28Z\n"
            "connected\tHome\tWPA2PSK\t11b/g/n\tMANAGED\twlan0\t10.0.0.9\t255.255.255.0\ton\t\t\t\t\t\t\t\t\t"
            "2026-11-20T11:35:28Z\n");
  Shell("ip link delete wlan0");
}

// The news of a busy machine never ends.
TEST_F(Connection, IsWatchedThoughTheKernelIsNeverQuiet) {
  Shell("ip link add wlan0 type veth peer name air && ip link set air up && ip link set wlan0 up");
  Shell("ip link add noise type veth");
  const StartedChild noise([] {
    while (true) Shell("ip link set noise up; ip link set noise down");
    return 0;
  });
  EXPECT_EQ(Tool({"watch", "--count", "1", "--porcelain"}).out.substr(0, 10), "connected\t");
}

}  // namespace
