// autoconnect --keep, in a world that is told by files and a clock that can be put forward.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <filesystem>

#include "running.h"

using testing::ElementsAre;
using testing::HasSubstr;
using testing::Not;

namespace {

constexpr char kJoined[] = "/tmp/world/joined";               // the adapter is in a network
constexpr char kWithoutLease[] = "/tmp/world/without-lease";  // no DHCP server answers there
constexpr char kClosed[] = "/tmp/world/closed";               // no network can be joined
constexpr char kSlow[] = "/tmp/world/slow";                   // joining one has no end
constexpr char kAbsent[] = "/tmp/world/absent";               // the adapter
constexpr char kSilent[] = "/tmp/world/silent";               // the adapter's driver does not tell its state
constexpr char kCell[] = "/tmp/world/cell";                   // the adapter looks for the others of its cell
constexpr char kUnannounced[] = "/tmp/world/unannounced";     // the adapter has been plugged in just now
constexpr char kRadioOff[] = "/tmp/world/radio-off";
constexpr char kLater[] = "/tmp/world/later";  // so many seconds is the program's clock ahead
constexpr char kLooks[] = "/tmp/world/looks";
constexpr char kDaemonPid[] = "/tmp/world/daemon";
constexpr char kJoinMarker[] = "/var/tmp/.wireless_connecting";
constexpr char kApMarker[] = "/var/tmp/.wireless_ap_connecting";
constexpr char kApInfo[] = "/etc/hostapd/hostapd-wlan0.info";  // by which the hot-plug script goes
constexpr char kClientPid[] = "/var/run/udhcpc-wlan0.pid";
constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";

bool g_hasOwnClock = false;
pid_t g_program = 0;

void Is(const char* szPath) {
  WriteText(szPath, "");
}

void IsNot(const char* szPath) {
  std::filesystem::remove(szPath);
}

// The kernel has news: the program looks.
void Announce() {
  Shell("ip address add 192.0.2.9/32 dev lo && ip address delete 192.0.2.9/32 dev lo");
}

// Each look of the program's is a byte of a file.
void NoteLook() {
  const int looks = ::open(kLooks, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
  if (::write(looks, "x", 1) != 1) std::abort();
  ::close(looks);
}

// Returns once the program has seen how the world is now, and has done what follows from it.
void LetLook() {
  for (int looks = 0; looks < 2; ++looks) {
    const std::size_t before = TextOrNothing(kLooks).size();
    Announce();
    EXPECT_TRUE(Soon([=] { return TextOrNothing(kLooks).size() > before; }));
  }
}

void StartDaemon() {
  if (::fork() != 0) return;
  ::setsid();
  if (::fork() != 0) ::_exit(0);
  WriteText(kDaemonPid, std::to_string(::getpid()));
  while (true) ::pause();
}

class Keep : public ToolTest {
 protected:
  Keep() { MakeWorld(); }

  void MakeWorld() {
    library::Reset();
    later_ = 0;
    std::filesystem::remove_all("/tmp/world");
    std::filesystem::create_directory("/tmp/world");
    std::filesystem::remove_all("/var/run/merowireless");
    for (const char* szPath : {kJoinMarker, kApMarker, kApInfo, kSupplicantPid, kClientPid}) IsNot(szPath);
    library::Known({library::Home()});
    library::Connected("Home");
    library::MEROWirelessConnStatusGet = [] {
      if (::getpid() == g_program) NoteLook();
      if (Exists(kSilent)) return WIRELESS_STATUS_NOT_SUPPORTED;
      if (Exists(kCell)) return WIRELESS_STATUS_DISCONNECTED;
      return Exists(kJoined) ? WIRELESS_STATUS_CONNECTED_MANAGED : WIRELESS_STATUS_DOWN;
    };
    library::MEROWirelessCurInfoGet = [inHome = library::MEROWirelessCurInfoGet](WIRELESS_REQUEST request,
                                                                                 PWIRELESS_INFO info) {
      if (!Exists(kCell) || request != REQUEST_MODE) return inHome(request, info);
      info->opmode = WIRELESS_OPMODE_ADHOC;
      return 0;
    };
    library::MEROWirelessAdapterNum = [] { return Exists(kAbsent) ? 0 : 1; };
    library::MEROWirelessCheckBlock = [] { return Exists(kRadioOff) ? 0 : Exists(kUnannounced) ? -1 : 1; };
    library::InRange({library::Network("Home")});
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return Join(); };
    library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return Address(); };
    library::MEROWirelessNetworkDisconnect = [] { return IsNot(kJoined), 0; };
  }

  static int Join() {
    while (Exists(kSlow)) ::usleep(10'000);
    if (Exists(kClosed)) return -1;
    Is(kJoined);
    return 0;
  }

  static int Address() {
    if (Exists(kWithoutLease)) library::Report("wireless_ifcfg_set", "Failed to get IP from DHCP");
    return 0;
  }

  // The program, with both of its outputs in one.
  static StartedTool Started(std::vector<std::string> more = {}) {
    more.insert(more.begin(), {"autoconnect", "--keep"});
    return StartedTool(more, {.before = [] {
                         ::dup2(STDOUT_FILENO, STDERR_FILENO);
                         g_hasOwnClock = true;
                         g_program = ::getpid();
                       }});
  }

  void Pass(int seconds) {
    later_ += seconds;
    WriteText(kLater + std::string(".new"), std::to_string(later_));
    std::filesystem::rename(kLater + std::string(".new"), kLater);
    Announce();
  }

  static std::ptrdiff_t Attempts() { return std::ranges::count(library::Calls(), "MEROWirelessNetworkConnect"); }

  static bool Attempted(std::ptrdiff_t times) {
    return Soon([=] { return Attempts() >= times; });
  }

  // Waits until the attempt of this moment has ended, its process is gone, and the program has begun the pause.
  static void AwaitEnd(const StartedTool& tool) {
    const std::string pid = std::to_string(tool.pid());
    EXPECT_TRUE(Soon([&] { return TextOrNothing("/proc/" + pid + "/task/" + pid + "/children").empty(); }));
    LetLook();
  }

  // Long enough for an attempt to begin that should not.
  static void ExpectNoAttemptAfter(std::ptrdiff_t times) {
    ::usleep(250'000);
    EXPECT_EQ(Attempts(), times);
  }

  static bool Says(const StartedTool& tool, const std::string& text) {
    return Soon([&] { return tool.OutputSoFar().find(text) != std::string::npos; });
  }

  static Ran Ended(StartedTool& tool) {
    ::kill(tool.pid(), SIGTERM);
    return tool.Wait();
  }

  int later_ = 0;
};

constexpr char kConnected[] = "connected to Home without an address\n";
constexpr char kLost[] = "the connection to Home is lost, and a known network is joined anew\n";

TEST_F(Keep, JoinsAtOnceAndLeavesTheConnectionWhenItIsEnded) {
  StartedTool tool = Started();
  EXPECT_TRUE(Says(tool, kConnected));
  const Ran ran = Ended(tool);
  EXPECT_EQ(ran.status, 0) << "whoever ends it has not met a failure";
  EXPECT_EQ(ran.out, kConnected);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet"));
}

TEST_F(Keep, LeavesAConnectionAloneThatIsThereAlready) {
  Is(kJoined);
  StartedTool tool = Started();
  EXPECT_TRUE(Says(tool, kConnected));
  ExpectNoAttemptAfter(0);
}

// The address stayed until the server gave it to somebody else.
TEST_F(Keep, AsksForAnAddressAnewWhenTheDhcpClientWasKilled) {
  StartedTool tool = Started();
  ASSERT_TRUE(Says(tool, kConnected));
  const auto addressed = [] { return std::ranges::count(library::Calls(), "MEROWirelessIfconfigSet"); };
  ASSERT_EQ(addressed(), 1);
  {
    const StartedDaemon client("busybox", kClientPid);
    LetLook();
    EXPECT_EQ(addressed(), 1) << "it lives";
  }
  WriteText(kClientPid, "999999");
  Pass(5);
  EXPECT_TRUE(Soon([&] { return addressed() == 2; }));
  EXPECT_TRUE(Says(tool, "the DHCP client was killed, and an address is asked for anew\n"));
  EXPECT_EQ(Attempts(), 1) << "the network is not joined anew";
  Pass(4);
  EXPECT_EQ(addressed(), 2);
  IsNot(kClientPid);
}

// The unit tried once, and an appliance that was switched on before its access point stayed without a connection.
TEST_F(Keep, TriesAgainAtPausesThatGrow) {
  Is(kClosed);
  StartedTool tool = Started();
  std::ptrdiff_t attempts = 1;
  for (int pause : {5, 10, 20, 40, 80, 160, 300, 300}) {
    ASSERT_TRUE(Attempted(attempts)) << pause;
    AwaitEnd(tool);
    Pass(pause - 2);
    ExpectNoAttemptAfter(attempts);
    Pass(2);
    ++attempts;
  }
  ASSERT_TRUE(Attempted(attempts));
  AwaitEnd(tool);
  IsNot(kClosed);
  Pass(300);
  EXPECT_TRUE(Says(tool, kConnected));
  EXPECT_THAT(Ended(tool).out,
              testing::MatchesRegex("merowireless: none of the known networks could be joined: [^\n]*\n" +
                                    std::string(kConnected)))
      << "what comes to the same is told once";
}

TEST_F(Keep, PausesNoLongerThanItIsTold) {
  Is(kClosed);
  const StartedTool tool = Started({"--longest-pause", "7"});
  ASSERT_TRUE(Attempted(1));
  for (std::ptrdiff_t attempts : {2, 3, 4}) {
    AwaitEnd(tool);
    Pass(7);
    EXPECT_TRUE(Attempted(attempts));
  }
}

TEST_F(Keep, LeavesALostConnectionToTheSupplicantForAWhile) {
  StartedTool tool = Started();
  ASSERT_TRUE(Says(tool, kConnected));
  IsNot(kJoined);
  LetLook();
  Pass(28);
  ExpectNoAttemptAfter(1);
  Is(kJoined);  // the supplicant has found it
  Pass(28);
  ExpectNoAttemptAfter(1);
  IsNot(kJoined);
  LetLook();
  Pass(28);
  ExpectNoAttemptAfter(1);
  Pass(2);
  EXPECT_TRUE(Attempted(2));
  EXPECT_TRUE(Says(tool, kConnected + std::string(kLost) + kConnected));
}

TEST_F(Keep, HasThePatienceThatItIsTold) {
  StartedTool tool = Started({"--patience", "90"});
  ASSERT_TRUE(Says(tool, kConnected));
  IsNot(kJoined);
  LetLook();
  Pass(88);
  ExpectNoAttemptAfter(1);
  Pass(2);
  EXPECT_TRUE(Attempted(2));
}

// Started anew, it would end a supplicant that looks for the network.
TEST_F(Keep, LeavesASupplicantThatIsThereToItsWork) {
  Shell("cp $(command -v sleep) /tmp/wpa_supplicant; /tmp/wpa_supplicant 60 >/dev/null 2>&1 & echo $! >" +
        std::string(kSupplicantPid));
  const StartedTool tool = Started();
  ExpectNoAttemptAfter(0);
  Pass(28);
  ExpectNoAttemptAfter(0);
  Shell("kill $(cat " + std::string(kSupplicantPid) + ") && rm " + kSupplicantPid);
  Pass(2);
  EXPECT_TRUE(Attempted(1));
}

// A station that the access point does not let in is one all the same, for as long as that takes.
TEST_F(Keep, TakesAStationThatIsNotLetInForNoConnection) {
  Is(kJoined);
  Shell("ip link add wlan0 type veth peer name air && ip link set air up && ip link set wlan0 mode dormant up");
  StartedTool tool = Started();
  EXPECT_TRUE(Attempted(1));
  EXPECT_EQ(tool.OutputSoFar(), "");
  Shell("ip link set wlan0 mode default down && ip link set wlan0 up");
  EXPECT_TRUE(Says(tool, kConnected));
  Shell("ip link delete wlan0");
}

// The kernel follows a station's state a moment later. Until then it was taken for let in, and one that never was had
// the patience of a lost connection.
TEST_F(Keep, TakesAStationThatTheKernelHasNotFollowedYetForNoConnection) {
  Is(kJoined);
  Shell("ip link add wlan0 type veth peer name air");
  StartedTool tool = Started();
  EXPECT_TRUE(Attempted(1));
  EXPECT_EQ(tool.OutputSoFar(), "");
  Shell("ip link delete wlan0");
  EXPECT_TRUE(Says(tool, kConnected));
}

// It joined again once its patience was over.
TEST_F(Keep, LeavesAnApplianceAloneThatSomebodyHasDisconnected) {
  constexpr char kWaiting[] =
      "waiting since somebody has disconnected; `merowireless connect` or `autoconnect` joins again\n";
  StartedTool tool = Started({"--patience", "0"});
  ASSERT_TRUE(Says(tool, kConnected));
  for (const auto& again : std::vector<std::vector<std::string>>{{"connect", "Home"}, {"autoconnect"}}) {
    const std::ptrdiff_t attempts = Attempts();
    EXPECT_EQ(Tool({"disconnect"}).status, 0);
    EXPECT_TRUE(Says(tool, kWaiting));
    Pass(1000);
    ExpectNoAttemptAfter(attempts);
    StartedTool anew = Started({"--patience", "0"});
    EXPECT_TRUE(Says(anew, kWaiting)) << "also one that is started later";
    Ended(anew);
    EXPECT_EQ(Tool(again).status, 0);
    LetLook();
    const std::ptrdiff_t joins = Attempts();
    IsNot(kJoined);
    LetLook();
    Pass(5);
    EXPECT_TRUE(Attempted(joins + 1)) << "a connection that is lost is joined again";
    ASSERT_TRUE(Soon([] { return Exists(kJoined); }));
    AwaitEnd(tool);
  }
}

TEST_F(Keep, TakesAJoinOfAnotherProgramForAnEndOfThat) {
  EXPECT_EQ(Tool({"disconnect"}).status, 0);
  StartedTool tool = Started();
  ExpectNoAttemptAfter(0);
  WriteText("/var/tmp/.wireless_current_connection", "");
  LetLook();
  Pass(5);
  EXPECT_TRUE(Attempted(1));
  std::filesystem::remove("/var/tmp/.wireless_current_connection");
}

// Whoever has an account could undo what the administrator wanted.
TEST_F(Keep, TakesNoFileOfALocalUserForAJoin) {
  EXPECT_EQ(Tool({"disconnect"}).status, 0);
  WriteText("/var/tmp/.wireless_current_connection", "");
  Shell("chown 65534 /var/tmp/.wireless_current_connection");
  StartedTool tool = Started();
  LetLook();
  ExpectNoAttemptAfter(0);
  std::filesystem::remove("/var/tmp/.wireless_current_connection");
}

// Whoever wanted to do something during an attempt was refused.
TEST_F(Keep, GivesWayToWhateverSomebodyWants) {
  Is(kSlow);
  StartedTool tool = Started();
  ASSERT_TRUE(Attempted(1));
  const Ran ran = Tool({"radio", "off"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
  EXPECT_EQ(Attempts(), 1);
  IsNot(kSlow);
  Pass(5);
  EXPECT_TRUE(Attempted(2)) << "the pause is no longer for it";
}

TEST_F(Keep, LetsAnAddressWaitForTheEndOfAnAttempt) {
  Is(kSlow);
  StartedTool tool = Started();
  ASSERT_TRUE(Attempted(1));
  StartedTool addressing({"address", "DHCP"});
  ::usleep(500'000);
  EXPECT_THAT(library::Calls(), Not(testing::Contains("MEROWirelessIfconfigSet")));
  IsNot(kSlow);
  EXPECT_EQ(addressing.Wait().status, 0);
  EXPECT_TRUE(Says(tool, kConnected)) << "the attempt was not cut off";
}

TEST_F(Keep, NeverDisturbsAnAccessPoint) {
  const struct {
    const char* szName;
    void (*begin)();
    void (*end)();
  } rows[] = {
      {"switched on", [] { WriteText(kApInfo, "enable=\"yes\"\n"); }, [] { IsNot(kApInfo); }},
      {"on the air", [] { kernel::BecomeAccessPoint("Office"); }, [] { kernel::BecomeClient(); }},
      {"being set up", [] { Is(kApMarker); }, [] { IsNot(kApMarker); }},
  };
  for (const auto& [szName, begin, end] : rows) {
    MakeWorld();
    begin();
    StartedTool tool = Started();
    EXPECT_TRUE(Says(tool, "waiting while the adapter is an access point's\n")) << szName;
    Pass(100);
    ExpectNoAttemptAfter(0);
    end();
    Announce();
    ExpectNoAttemptAfter(0);
    Pass(5);
    EXPECT_TRUE(Says(tool, kConnected)) << szName;
  }
}

TEST_F(Keep, GivesWayToAnAccessPointWhileItJoins) {
  Is(kSlow);
  StartedTool tool = Started();
  ASSERT_TRUE(Attempted(1));
  Is(kApMarker);
  EXPECT_TRUE(Says(tool, "waiting while the adapter is an access point's\n"));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessNetworkDisconnect"));
}

TEST_F(Keep, TellsWhyItWaits) {
  const struct {
    const char* szWorld;
    const char* szSentence;
    const char* szPorcelain;
  } rows[] = {
      {kAbsent, "waiting until an adapter is plugged in", "down\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\n"},
      {kRadioOff, "waiting until the radio is switched on", "down\t\t\t\t\twlan0\t\t\toff\t\t\t\t\t\t\t\t\n"},
      {kUnannounced, "waiting until the adapter is announced, so that its radio may be used",
       "down\t\t\t\t\twlan0\t\t\tunknown\t\t\t\t\t\t\t\t\n"},
      {kCell, "waiting while the adapter looks for the others of its ad-hoc cell",
       "disconnected\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\n"},
      {kSilent, "waiting while nobody knows whether the adapter is connected",
       "not-supported\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\n"},
  };
  for (const auto& [szWorld, szSentence, szPorcelain] : rows) {
    MakeWorld();
    Is(szWorld);
    StartedTool tool = Started();
    EXPECT_TRUE(Says(tool, szSentence + std::string("\n")));
    StartedTool machines = Started({"--porcelain"});
    EXPECT_TRUE(Says(machines, szPorcelain)) << machines.OutputSoFar();
    Ended(machines);
    Pass(400);
    ExpectNoAttemptAfter(0);
    IsNot(szWorld);
    Announce();
    ExpectNoAttemptAfter(0);
    Pass(5);
    EXPECT_TRUE(Says(tool, kConnected)) << szSentence;
  }
}

TEST_F(Keep, LetsOthersJoinANetwork) {
  Is(kJoinMarker);
  StartedTool tool = Started();
  for (int pause : {5, 5, 5}) {
    ExpectNoAttemptAfter(0);
    Pass(pause);
  }
  EXPECT_EQ(tool.OutputSoFar(), "");
  IsNot(kJoinMarker);
  Is(kJoined);
  Announce();
  EXPECT_TRUE(Says(tool, kConnected));
  ExpectNoAttemptAfter(0);
}

TEST_F(Keep, IsNotHeldUpByTheMarkerOfACallThatWasCutOff) {
  for (const char* szMarker : {kJoinMarker, kApMarker}) {
    MakeWorld();
    Is(szMarker);
    std::filesystem::last_write_time(szMarker,
                                     std::filesystem::file_time_type::clock::now() - std::chrono::seconds(301));
    StartedTool tool = Started();
    EXPECT_TRUE(Says(tool, kConnected)) << szMarker;
  }
}

// An address that is late came with an exit status that systemd took for a failure.
TEST_F(Keep, StaysInANetworkThatGivesNoAddressYet) {
  Is(kWithoutLease);
  StartedTool tool = Started();
  EXPECT_TRUE(Says(tool, kConnected));
  Pass(400);
  ExpectNoAttemptAfter(1);
  EXPECT_THAT(Ended(tool).out,
              testing::MatchesRegex("merowireless: no DHCP server answered: [^\n]*\n" + std::string(kConnected)));
}

TEST_F(Keep, TakesBackAnAttemptDuringWhichItIsEnded) {
  Is(kSlow);
  StartedTool tool = Started();
  ASSERT_TRUE(Attempted(1));
  EXPECT_EQ(Ended(tool).status, 0);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessNetworkDisconnect"));
}

// They would be zombies, and deaf to the signal that ends a daemon, if they were children of a program that waits.
TEST_F(Keep, HasNothingToDoWithTheDaemonsThatItStarts) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return StartDaemon(), Join(); };
  StartedTool tool = Started();
  EXPECT_TRUE(Says(tool, kConnected));
  ASSERT_TRUE(Soon([] { return !TextOrNothing(kDaemonPid).empty(); }));
  const pid_t daemon = std::stoi(ReadText(kDaemonPid));
  EXPECT_THAT(ReadText("/proc/" + std::to_string(daemon) + "/status"), HasSubstr("SigBlk:\t0000000000000000\n"));
  EXPECT_THAT(ReadText("/proc/" + std::to_string(daemon) + "/status"),
              Not(HasSubstr("PPid:\t" + std::to_string(tool.pid()) + "\n")));
  ::kill(daemon, SIGTERM);
}

// Whoever corrects a secret at the other end of the wire need not wait for the end of a long pause.
TEST_F(Keep, TriesSoonAfterANetworkWasSaved) {
  Is(kClosed);
  const StartedTool tool = Started();
  for (std::ptrdiff_t attempts : {1, 2, 3, 4}) {
    ASSERT_TRUE(Attempted(attempts));
    AwaitEnd(tool);
    if (attempts < 4) Pass(20);
  }
  WriteText("/usr/mero/etc/wireless.conf", "[0A:0A:0A:0A:0A:0A]\n");
  Announce();
  ExpectNoAttemptAfter(4);
  Pass(5);
  EXPECT_TRUE(Attempted(5));
  std::filesystem::remove("/usr/mero/etc/wireless.conf");
}

TEST_F(Keep, TellsMachinesToo) {
  StartedTool tool = Started({"--json"});
  EXPECT_TRUE(Says(tool, R"({"result":"ok","status":{"state":"connected","name":"Home",)"));
  IsNot(kJoined);
  Is(kClosed);
  LetLook();
  Pass(30);
  EXPECT_TRUE(Says(tool, R"({"result":"ok","status":{"state":"down","name":null,)"));
  EXPECT_TRUE(Says(tool, R"({"result":"failed","code":4,"error":"none of the known networks could be joined",)"));
}

TEST_F(Keep, TellsOfAnAttemptThatBreaksOff) {
  library::MEROWirelessAdapterNum = [] {
    if (g_hasOwnClock && ::getpid() != g_program) ::raise(SIGKILL);
    return 1;
  };
  const StartedTool tool = Started();
  EXPECT_TRUE(Says(tool, "merowireless: the attempt broke off: "));
}

TEST_F(Keep, IsToldItsTimesInSeconds) {
  for (const auto& [option, value] : std::vector<std::pair<std::string, std::string>>{
           {"--patience", "-1"}, {"--patience", "86401"}, {"--longest-pause", "0"}, {"--longest-pause", "soon"}}) {
    const Ran ran = Tool({"autoconnect", "--keep", option, value});
    EXPECT_EQ(ran.status, 2) << option << value;
    EXPECT_THAT(ran.err, HasSubstr(option + " cannot be this"));
  }
  EXPECT_EQ(Tool({"autoconnect", "--patience", "5"}).status, 2) << "without --keep there is nothing to wait for";
}

}  // namespace

// The program comes upon this one before libc's.
extern "C" int clock_gettime(clockid_t clock, timespec* time) noexcept {
  const int result = static_cast<int>(::syscall(SYS_clock_gettime, clock, time));
  if (!g_hasOwnClock || clock != CLOCK_MONOTONIC) return result;
  const std::string later = TextOrNothing(kLater);
  return time->tv_sec += std::atoi(later.c_str()), result;
}
