// What the program does while the library takes its time.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>

#include "running.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::HasSubstr;
using testing::Not;

namespace {

constexpr char kMarker[] = "/var/tmp/.wireless_connecting";
constexpr char kDaemonPid[] = "/tmp/daemon.pid";

void Touch(const char* szPath) {
  ::close(::open(szPath, O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
}

bool IsRunning(pid_t pid) {
  return ::kill(pid, 0) == 0;
}

// As the supplicant: leaves its caller's group and session behind.
void StartDaemon() {
  if (::fork() == 0) {
    ::setsid();
    if (::fork() == 0) {
      WriteText(kDaemonPid, std::to_string(::getpid()));
      while (true) ::pause();
    }
    ::_exit(0);
  }
}

class Waiting : public ToolTest {
 protected:
  Waiting() {
    WIRELESS_NETWORK_CONFIG home{};
    home.network = Network("Home");
    std::strcpy(home.szKey, "open sesame");
    library::Known({home});
    std::filesystem::remove(kMarker);
    std::filesystem::remove(kDaemonPid);
  }

  // A join that has come as far as it can without ending.
  static void JoinForever() {
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
      Touch(kMarker);
      StartDaemon();
      while (true) ::pause();
      return 0;
    };
  }

  static pid_t Daemon() {
    pid_t pid = 0;
    EXPECT_TRUE(Soon([&] { return std::sscanf(ReadText(kDaemonPid).c_str(), "%d", &pid) == 1; }));
    return pid;
  }
};

TEST_F(Waiting, CanBeEndedWithNothingLeftBehind) {
  JoinForever();
  for (int signal : {SIGINT, SIGTERM, SIGHUP}) {
    std::filesystem::remove(kDaemonPid);
    StartedTool tool({"connect", "Home"});
    const pid_t daemon = Daemon();
    ::kill(tool.pid(), signal);
    const Ran ran = tool.Wait();
    EXPECT_EQ(ran.status, 130);
    EXPECT_THAT(ran.err, HasSubstr("interrupted"));
    EXPECT_FALSE(std::filesystem::exists(kMarker));
    EXPECT_FALSE(IsRunning(daemon)) << "the supplicant goes on";
    EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
  }
}

TEST_F(Waiting, ForAnAddressEndsTheJoinTooWhenItIsEnded) {
  WIRELESS_NETWORK_CONFIG home{};
  home.network = Network("Home", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
  std::strcpy(home.szIp, "DHCP");
  library::Known({home});
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    StartDaemon();
    while (true) ::pause();
    return 0;
  };
  StartedTool tool({"connect", "Home"});
  const pid_t daemon = Daemon();
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_FALSE(IsRunning(daemon));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

TEST_F(Waiting, ForChangesIsEndedWithoutAComplaint) {
  StartedTool tool({"watch", "--json"});
  ASSERT_TRUE(Soon([&] { return !tool.OutputSoFar().empty(); }));
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.err, "");
}

TEST_F(Waiting, ThatIsEndedKeepsAnothersMarker) {
  Touch(kMarker);
  JoinForever();
  StartedTool tool({"connect", "Home"});
  Daemon();
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_TRUE(std::filesystem::exists(kMarker));
}

TEST_F(Waiting, EndsWhatDoesNotWantToEnd) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    ::signal(SIGTERM, SIG_IGN);
    Touch(kMarker);
    while (true) ::pause();
    return 0;
  };
  StartedTool tool({"connect", "Home"});
  ASSERT_TRUE(Soon([] { return std::filesystem::exists(kMarker); }));
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_FALSE(std::filesystem::exists(kMarker));
}

TEST_F(Waiting, LeavesTheSupplicantOfAJoinThatSucceeded) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    StartDaemon();
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  const pid_t daemon = Daemon();
  EXPECT_TRUE(IsRunning(daemon));
  ::kill(daemon, SIGKILL);
}

TEST_F(Waiting, KeepsWhatCommandsPrintOutOfTheOutput) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    if (std::system("echo successfully initialized; echo complaint >&2") != 0) return -1;
    return 0;
  };
  const Ran quiet = Tool({"connect", "Home", "--json"});
  EXPECT_THAT(quiet.out, AllOf(Not(HasSubstr("initialized")), testing::StartsWith("{")));
  EXPECT_EQ(quiet.err, "");
  EXPECT_EQ(Tool({"connect", "Home", "-v"}).err, "complaint\n");
}

TEST_F(Waiting, ShowsWhatTheLibraryReportsOnRequest) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Report("first\x1b[2J");
    library::Report("second");
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home"}).err, "");
  EXPECT_EQ(Tool({"connect", "Home", "-v"}).err, "library: unit:7 first\\x1b[2J\nlibrary: unit:7 second\n");
}

TEST_F(Waiting, ShowsHowLongItTakesOnATerminal) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return ::usleep(900'000), 0; };
  const Ran ran = ToolOnTerminal({"connect", "Home"});
  EXPECT_THAT(ran.out, AllOf(HasSubstr("\rjoining Home  0.6 s\x1b[K"), HasSubstr("\r\x1b[Kconnected to")));
  EXPECT_EQ(Tool({"connect", "Home"}).err, "");
}

TEST_F(Waiting, ShowsNothingOfWhatIsFast) {
  EXPECT_THAT(ToolOnTerminal({"connect", "Home"}).out, Not(HasSubstr("joining")));
}

TEST_F(Waiting, NoticesACallThatBreaksOff) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return ::raise(SIGKILL), 0; };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the library broke off"));
}

TEST_F(Waiting, IsNotEndedByASignalThatWasToBeIgnored) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    Touch(kMarker);
    return ::usleep(300'000), 0;
  };
  ::signal(SIGHUP, SIG_IGN);
  StartedTool tool({"connect", "Home"});
  ::signal(SIGHUP, SIG_DFL);
  ASSERT_TRUE(Soon([] { return std::filesystem::exists(kMarker); }));
  ::kill(tool.pid(), SIGHUP);
  EXPECT_EQ(tool.Wait().status, 0);
}

}  // namespace
