// The program while it waits for the library.
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <functional>

#include "running.h"
#include "work/library_log.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

namespace {

constexpr char kMarker[] = "/var/tmp/.wireless_connecting";
constexpr char kDaemonPid[] = "/tmp/daemon.pid";
constexpr char kGo[] = "/tmp/go";

int g_processDescriptors = -1;  // how many there are to be had; below 0 any number

void Touch(const char* szPath) {
  ::close(::open(szPath, O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
}

bool IsRunning(pid_t pid) {
  return ::kill(pid, 0) == 0;
}

void WaitForEver() {
  while (true) ::pause();
}

// As the supplicant: leaves its caller's group and session behind.
void StartDaemon(const std::function<void()>& act = WaitForEver) {
  if (::fork() == 0) {
    ::setsid();
    if (::fork() == 0) {
      WriteText(kDaemonPid, std::to_string(::getpid()));
      act();
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
    library::InRange({home.network});
    std::filesystem::remove(kMarker);
    std::filesystem::remove(kDaemonPid);
  }

  // A join that has come as far as it can without ending.
  static void JoinForever() {
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
      Touch(kMarker);
      StartDaemon();
      WaitForEver();
      return 0;
    };
  }

  static pid_t Daemon() {
    pid_t pid = 0;
    EXPECT_TRUE(Soon([&] { return Exists(kDaemonPid) && std::sscanf(ReadText(kDaemonPid).c_str(), "%d", &pid) == 1; }));
    return pid;
  }
};

TEST_F(Waiting, CanBeEndedWithNothingLeftBehind) {
  JoinForever();
  for (int signal : {SIGINT, SIGQUIT, SIGTERM, SIGHUP}) {
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
  library::InRange({home.network});
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    StartDaemon();
    WaitForEver();
    return 0;
  };
  StartedTool tool({"connect", "Home"});
  const pid_t daemon = Daemon();
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_FALSE(IsRunning(daemon));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

TEST_F(Waiting, ThatIsEndedLeavesAloneWhatWasThereBefore) {
  JoinForever();
  StartedTool tool({"connect", "Home"}, {.before = [] {
                     const pid_t inherited = ::fork();
                     if (inherited == 0) WaitForEver();
                     WriteText(kGo, std::to_string(inherited));
                   }});
  Daemon();
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  const pid_t inherited = std::stoi(ReadText(kGo));
  EXPECT_TRUE(IsRunning(inherited));
  ::kill(inherited, SIGKILL);
}

TEST_F(Waiting, ThatCannotBeginLeavesNothingBehind) {
  JoinForever();
  Lifeline lifeline;
  // The look at the air before takes one.
  const Ran ran = Tool({"connect", "Home"}, {.before = [] { g_processDescriptors = 1; }});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("pidfd_open: Operation not permitted"));
  EXPECT_TRUE(lifeline.IsFree());
  EXPECT_FALSE(std::filesystem::exists(kMarker));
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

TEST_F(Waiting, GoesOnWhenNobodyReadsTheReportsAnyMore) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Report("unit", "first");
    while (!std::filesystem::exists(kGo)) ::usleep(1000);
    library::Report("unit", "second");
    return 0;
  };
  int ends[2];
  ASSERT_EQ(::pipe(ends), 0);
  StartedTool tool({"connect", "Home", "-v"}, {.before = [&] {
                     ::dup2(ends[1], STDERR_FILENO);
                     for (int end : ends) ::close(end);
                   }});
  ::close(ends[1]);
  char bytes[64];
  EXPECT_GT(::read(ends[0], bytes, sizeof bytes), 0);
  ::close(ends[0]);
  Touch(kGo);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(ran.out, testing::StartsWith("connected to"));
}

TEST_F(Waiting, EndsWithTheProgram) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    Touch(kMarker);
    ::alarm(60);  // should nothing else end it
    while (true) library::Report("unit", "still at it");
    return 0;
  };
  Lifeline lifeline;
  StartedTool tool({"connect", "Home"});
  ASSERT_TRUE(Soon([] { return std::filesystem::exists(kMarker); }));
  ::kill(tool.pid(), SIGKILL);
  tool.Wait();
  EXPECT_TRUE(Soon([&] { return lifeline.IsFree(); }));
}

TEST_F(Waiting, ForChangesDoesNotTakeItsSocketForAnOutputThatIsClosed) {
  const Ran ran = Tool({"watch", "--count", "1"}, {.before = [] {
                         for (int fd : {STDIN_FILENO, STDOUT_FILENO}) ::close(fd);
                       }});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the output could not be written"));
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
  static constexpr char kApMarker[] = "/var/tmp/.wireless_ap_connecting";
  library::SavedAp(library::Office());
  // The other one begins after it was looked for, which is the first time that the library is asked.
  library::MEROWirelessTestAPMode = [asked = 0]() mutable {
    if (++asked == 2) Touch(kApMarker);
    return FALSE;
  };
  library::MEROWirelessAPEnable = [] { return StartDaemon(), WaitForEver(), TRUE; };
  StartedTool tool({"ap", "enable"});
  Daemon();
  ::kill(tool.pid(), SIGINT);
  EXPECT_EQ(tool.Wait().status, 130);
  EXPECT_TRUE(std::filesystem::exists(kApMarker));
  std::filesystem::remove(kApMarker);
}

TEST_F(Waiting, EndsWhatDoesNotWantToEnd) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    ::signal(SIGTERM, SIG_IGN);
    Touch(kMarker);
    WaitForEver();
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

TEST_F(Waiting, RefusesWhatADaemonPrintsAfterIt) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    StartDaemon([] {
      ::alarm(60);  // should nothing else end it
      while (::write(STDERR_FILENO, "chatter\n", 8) > 0) ::usleep(1000);
      WriteText(kGo, std::strerror(errno));
    });
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  EXPECT_TRUE(Soon([] { return TextOrNothing(kGo) == std::strerror(EPERM); })) << TextOrNothing(kGo);
}

TEST_F(Waiting, KeepsWhatCommandsPrintOutOfTheOutput) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    if (std::system("echo successfully initialized; printf 'complaint\\033]0;x\n' >&2") != 0) return -1;
    return 0;
  };
  const Ran quiet = Tool({"connect", "Home", "--json"});
  EXPECT_THAT(quiet.out, AllOf(Not(HasSubstr("initialized")), testing::StartsWith("{")));
  EXPECT_EQ(quiet.err, "");
  EXPECT_EQ(Tool({"connect", "Home", "-v"}).err, "complaint\\x1b]0;x\n");
}

TEST_F(Waiting, ThatIsEndedShowsWhatCommandsPrintedTillThen) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    if (std::system("echo complaint >&2") != 0) return -1;
    Touch(kMarker);
    WaitForEver();
    return 0;
  };
  StartedTool tool({"connect", "Home", "-v"});
  ASSERT_TRUE(Soon([] { return std::filesystem::exists(kMarker); }));
  ::kill(tool.pid(), SIGINT);
  EXPECT_THAT(tool.Wait().err, testing::StartsWith("complaint\nmerowireless: interrupted"));
}

TEST_F(Waiting, ShowsWhatTheLibraryReportsOnRequest) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    library::Report("unit", "first\x1b[2J");
    library::Report("unit", "second");
    return 0;
  };
  EXPECT_EQ(Tool({"connect", "Home"}).err, "");
  EXPECT_EQ(Tool({"connect", "Home", "-v"}).err, "library: unit:7 first\\x1b[2J\nlibrary: unit:7 second\n");
}

TEST_F(Waiting, ShowsHowLongItTakesOnATerminal) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return ::usleep(900'000), 0; };
  const Ran ran = ToolOnTerminal({"connect", "Home"});
  EXPECT_THAT(ran.out, AllOf(ContainsRegex("\rjoining Home  0[.][5-9] s\x1b\\[K"), HasSubstr("\r\x1b[Kconnected to")));
  EXPECT_EQ(Tool({"connect", "Home"}).err, "");
}

TEST_F(Waiting, ShowsNothingThatTheTerminalCouldNotTakeBack) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return ::usleep(900'000), 0; };
  const Ran ran = ToolOnTerminal({"connect", "Home"}, 80, {.environment = {{"TERM", "dumb"}}});
  EXPECT_THAT(ran.out, testing::StartsWith("connected to"));
}

TEST_F(Waiting, ShowsNothingOfWhatIsFast) {
  EXPECT_THAT(ToolOnTerminal({"connect", "Home"}).out, Not(HasSubstr("joining")));
}

TEST_F(Waiting, NoticesACallThatBreaksOff) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    Touch(kMarker);
    StartDaemon();
    Daemon();
    return ::raise(SIGKILL), 0;
  };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("the library broke off"));
  EXPECT_FALSE(std::filesystem::exists(kMarker));
  EXPECT_FALSE(IsRunning(Daemon())) << "the supplicant goes on";
  EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
}

TEST_F(Waiting, ThatCannotBeUndoneSaysSo) {
  JoinForever();
  library::MEROWirelessNetworkDisconnect = [] { return -1; };
  StartedTool tool({"connect", "Home"});
  Daemon();
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the connection could not be ended whole\n"));
}

TEST_F(Waiting, ThatIsInterruptedTwiceIsToldToMachinesAllTheSame) {
  JoinForever();
  library::MEROWirelessNetworkDisconnect = [] { return ::raise(SIGTERM), 0; };
  StartedTool tool({"connect", "Home", "--json"});
  Daemon();
  ::kill(tool.pid(), SIGTERM);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(ran.out, HasSubstr(R"("code":130)"));
}

// Scripts that end a daemon wait until it is no process any more.
TEST_F(Waiting, LeavesNoDaemonThatHasEndedAsAProcess) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    StartDaemon();
    const pid_t daemon = Daemon();
    ::kill(daemon, SIGKILL);
    return Soon([&] { return !IsRunning(daemon); }) ? 0 : -1;
  };
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
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

TEST(LibraryLog, KeepsTheNewestLines) {
  library_log::Keep("the oldest");
  for (int i = 0; i < 10'000; ++i) library_log::Keep("a newer one");
  EXPECT_THAT(library_log::Lines(), AllOf(Not(Contains("the oldest")), Contains("a newer one")));
}

}  // namespace

// The program comes upon this one before libc's, which takes as many arguments whatever the call is: also those that
// are none, of which AddressSanitizer would tell.
extern "C" __attribute__((no_sanitize("address"))) long syscall(long number, ...) noexcept {
  static const auto real = reinterpret_cast<decltype(&::syscall)>(::dlsym(RTLD_NEXT, "syscall"));
  if (number == SYS_pidfd_open && g_processDescriptors == 0) return errno = EPERM, -1;
  if (number == SYS_pidfd_open && g_processDescriptors > 0) --g_processDescriptors;
  long of[6];
  va_list arguments;
  va_start(arguments, number);
  for (long& argument : of) argument = va_arg(arguments, long);
  va_end(arguments);
  return real(number, of[0], of[1], of[2], of[3], of[4], of[5]);
}
