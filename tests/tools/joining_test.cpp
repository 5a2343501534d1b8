// connect: what it asks for, waits for and saves.
#include <linux/wireless.h>
#include <sys/ioctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdarg>
#include <cstring>
#include <filesystem>

#include "running.h"
#include "tests/support/ring.h"

using library::Network;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

constexpr char kInRange[] = "/tmp/in-range";
constexpr char kCalled[] = "/tmp/called";
constexpr char kCalls[] = "/tmp/calls";
constexpr char kSecret[] = "/tmp/secret";
constexpr char kJoinMarker[] = "/var/tmp/.wireless_connecting";

constexpr int kMany = 20;

bool g_canCall = false;
int g_busyCalls = 0;  // so many are refused, since another program has the adapter scan

class Joining : public ToolTest {
 protected:
  Joining() {
    for (const char* szPath : {kInRange, kCalled, kCalls, kJoinMarker}) std::filesystem::remove(szPath);
    WriteText(kSecret, "open sesame\n");
    library::InRange({Network("cafe")});
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return 0; };
    library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return 0; };
    library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
      return library::Record(std::string(config->network.szEssid) + "|" + config->szKey + "|" + config->szIp), 0;
    };
  }

  // Many networks, of which "Home" was saved before all the others.
  static void KnowMany() {
    std::vector<WIRELESS_NETWORK_CONFIG> known;
    for (int i = 1; i <= kMany; ++i) {
      WIRELESS_NETWORK_CONFIG& config = known.emplace_back(library::Home());
      config.atime = i;
      config.network.bssid[5] = static_cast<unsigned char>(i);
      if (i > 1) std::snprintf(config.network.szEssid, sizeof config.network.szEssid, "away %d", i);
    }
    library::Known(known);
  }

  // The networks are in range once there is a file at this path.
  static void ComeIntoRangeWith(const char* szPath) {
    library::MEROWirelessNetworkScan = [szPath](WIRELESS_SCAN scan, WIRELESS_LIST* head) {
      if (scan == WIRELESS_SCAN_RENEW) library::Record("MEROWirelessNetworkScan");
      FillRing(head, Exists(szPath) ? std::vector{Network("cafe"), Network("Home")} : std::vector<WIRELESS_NETWORK>());
      return 0;
    };
  }
};

// It took two commands, and the network was forgotten when somebody gave the second one alone.
TEST_F(Joining, SavesWhatWorked) {
  const Ran ran = Tool({"connect", "cafe", "--key-file", kSecret});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_THAT(ran.out, testing::EndsWith("without an address, and saved\n"));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessConfSet",
                                            "cafe|open sesame|DHCP", "MEROWirelessIfconfigSet"));
}

TEST_F(Joining, SavesANetworkThatGivesNoAddressYet) {
  library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) {
    return library::Report("wireless_ifcfg_set", "Failed to get IP from DHCP"), 0;
  };
  EXPECT_EQ(Tool({"connect", "cafe", "--key-file", kSecret}).status, 7);
  EXPECT_THAT(library::Calls(), Contains("cafe|open sesame|DHCP"));
}

// Anybody could have had the appliance on a network of his own later, and nobody had been told.
TEST_F(Joining, SaysWhatItMeansToSaveAnOpenNetwork) {
  library::InRange({Network("cafe", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE)});
  const std::string said = "and saved: from now on any open network of this name may be joined by itself\n";
  EXPECT_THAT(Tool({"connect", "cafe"}).out, testing::EndsWith(said));
  EXPECT_THAT(Tool({"connect", "cafe", "--no-save"}).out, Not(HasSubstr("saved")));
}

TEST_F(Joining, SavesNothingWhereThatIsNotWanted) {
  const Ran ran = Tool({"connect", "cafe", "--key-file", kSecret, "--no-save"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_THAT(ran.out, Not(HasSubstr("saved")));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet"));
}

TEST_F(Joining, SavesNothingThatDidNotWork) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  EXPECT_EQ(Tool({"connect", "cafe", "--key-file", kSecret}).status, 9);
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessConfSet")));
}

TEST_F(Joining, BringsAKnownNetworkUpToDateWhenAnotherSecretWorked) {
  library::Known({library::Home()});
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessConfSet"))) << "there is nothing new";
  EXPECT_EQ(Tool({"connect", "Home", "--key-stdin"}, {.input = "another secret"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("Home|another secret|DHCP"));
}

TEST_F(Joining, KeepsTheConnectionWhenItCannotBeSaved) {
  library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  const Ran ran = Tool({"connect", "cafe", "--key-file", kSecret});
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.out, "");
  EXPECT_THAT(ran.err, HasSubstr("merowireless: cafe is joined, but could not be saved: "));
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkConnect", "MEROWirelessConfSet", "MEROWirelessIfconfigSet"));
}

TEST_F(Joining, AsksForTheSecret) {
  const Ran ran = ToolOnTerminal({"connect", "cafe"}, 80, {}, {.prompt = "secret of cafe: ", .text = "open sesame\n"});
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_THAT(ran.out, Not(HasSubstr("sesame")));
  EXPECT_THAT(library::Calls(), Contains("cafe|open sesame|DHCP"));
}

TEST_F(Joining, AsksForTheUserAndShowsWhatIsTyped) {
  library::InRange({Network("cafe", WIRELESS_AUTH_WPA2EAP)});
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    return library::Record(config->szUser), 0;
  };
  const Ran ran =
      ToolOnTerminal({"connect", "cafe", "--key-file", kSecret}, 80, {}, {.prompt = "user of cafe: ", .text = "ann\n"});
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_THAT(ran.out, HasSubstr("user of cafe: ann"));
  EXPECT_THAT(library::Calls(), Contains("ann"));
}

// A command that is asking kept all others from joining.
TEST_F(Joining, KeepsNobodyElseFromItWhileItAsks) {
  library::Known({library::Home()});
  int ends[2];
  ASSERT_EQ(::pipe(ends), 0);
  StartedTool asking({"connect", "cafe", "--key-stdin"}, {.before = [&] { ::dup2(ends[0], STDIN_FILENO); }});
  ASSERT_EQ(::write(ends[1], "open ", 5), 5);
  ASSERT_TRUE(Soon([&] {
    int left = -1;
    return ::ioctl(ends[0], FIONREAD, &left) == 0 && left == 0;
  }));
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  ::kill(asking.pid(), SIGINT);
  EXPECT_EQ(asking.Wait().status, 130);
}

TEST_F(Joining, WithoutATerminalFailsBeforeAnythingIsTouched) {
  const Ran ran = Tool({"connect", "cafe"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("cafe needs a secret, and there is no terminal to ask on"));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

// ---- Waiting ----

TEST_F(Joining, WaitsUntilTheNetworkIsInRange) {
  library::Known({library::Home()});
  ComeIntoRangeWith(kInRange);
  for (const char* szName : {"cafe", "Home"}) {
    std::filesystem::remove(kInRange);
    StartedTool tool({"connect", szName, "--key-file", kSecret, "--wait", "60"});
    const std::ptrdiff_t scans = std::ranges::count(library::Calls(), "MEROWirelessNetworkScan");
    ASSERT_TRUE(Soon([=] { return std::ranges::count(library::Calls(), "MEROWirelessNetworkScan") > scans; }));
    WriteText(kInRange, "");
    const Ran ran = tool.Wait();
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_EQ(ran.err, "");
  }
}

TEST_F(Joining, WaitsUntilNobodyElseJoins) {
  WriteText(kJoinMarker, "");
  StartedTool tool({"connect", "cafe", "--key-file", kSecret, "--wait", "60"});
  ::usleep(300'000);
  EXPECT_THAT(library::Calls(), IsEmpty());
  std::filesystem::remove(kJoinMarker);
  EXPECT_EQ(tool.Wait().status, 0);
}

TEST_F(Joining, WaitsNoLongerThanItIsTold) {
  ComeIntoRangeWith(kInRange);
  const auto began = std::chrono::steady_clock::now();
  EXPECT_EQ(Tool({"connect", "cafe"}).status, 4);
  EXPECT_LT(std::chrono::steady_clock::now() - began, std::chrono::seconds(1)) << "without --wait";
  const Ran ran = Tool({"connect", "cafe", "--wait", "1"});
  EXPECT_EQ(ran.status, 4);
  EXPECT_THAT(ran.err, HasSubstr("no network named cafe is in range"));
  EXPECT_GE(std::chrono::steady_clock::now() - began, std::chrono::seconds(1));
  EXPECT_EQ(Tool({"connect", "cafe", "--wait", "0"}).status, 2);
}

TEST_F(Joining, DoesNotWaitWhereWaitingDoesNotHelp) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  EXPECT_EQ(Tool({"connect", "cafe", "--key-file", kSecret, "--wait", "60"}).status, 9);
}

TEST_F(Joining, CanBeEndedWhileItWaits) {
  ComeIntoRangeWith(kInRange);
  StartedTool tool({"connect", "cafe", "--wait", "60"});
  ASSERT_TRUE(Soon([] { return !library::Calls().empty(); }));
  ::usleep(300'000);
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkScan")) << "nothing was touched";
}

TEST_F(Joining, ShowsThatItWaits) {
  ComeIntoRangeWith(kInRange);
  EXPECT_THAT(ToolOnTerminal({"connect", "cafe", "--wait", "2"}).out, HasSubstr("waiting for cafe  "));
}

// ---- Networks that hide ----

// They had to be saved first, with their address and their protection.
TEST_F(Joining, FindsANetworkThatHidesByItsNameAlone) {
  g_canCall = true;
  ComeIntoRangeWith(kCalled);
  const Ran ran = Tool({"connect", "cafe", "--key-file", kSecret});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_THAT(library::Calls(), Contains("cafe|open sesame|DHCP"));
  EXPECT_EQ(ReadText(kCalled), "cafe");
  std::filesystem::remove(kCalled);
  EXPECT_EQ(Tool({"save", "cafe", "--key-file", kSecret}).status, 0);
}

// Each network that was not there was called for some seconds, and everybody in range learned its name.
TEST_F(Joining, ByItselfScansOnceForAllThatAreKnownAndCallsNone) {
  g_canCall = true;
  KnowMany();
  library::MEROWirelessNetworkScan = [](WIRELESS_SCAN scan, WIRELESS_LIST* head) {
    if (scan == WIRELESS_SCAN_RENEW) library::Record("MEROWirelessNetworkScan"), WriteText(kInRange, "");
    FillRing(head, Exists(kInRange) ? std::vector{Network("Home")} : std::vector<WIRELESS_NETWORK>());
    return 0;
  };
  const Ran ran = Tool({"autoconnect"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_THAT(library::Calls(),
              ElementsAre("MEROWirelessNetworkScan", "MEROWirelessNetworkConnect", "MEROWirelessIfconfigSet"));
  EXPECT_EQ(TextOrNothing(kCalls), "");
}

// Each was joined in vain for fifteen seconds then, while the one that came into range had to wait.
TEST_F(Joining, ByItselfCallsThoseThatMayHideOnceAndLast) {
  g_canCall = true;
  KnowMany();
  ComeIntoRangeWith(kInRange);
  EXPECT_EQ(Tool({"autoconnect"}).status, 4);
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessNetworkScan", "MEROWirelessNetworkDisconnect"));
  std::string all;
  for (int i = kMany; i > 1; --i) all += "away " + std::to_string(i) + "\n";
  EXPECT_EQ(TextOrNothing(kCalls), all + "Home\n");

  ComeIntoRangeWith(kCalled);  // by now it is as if the call of another one has shown it
  std::filesystem::remove(kCalled);
  EXPECT_EQ(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(library::Calls(), Contains("MEROWirelessNetworkConnect"));
}

// The call was given up at once, and the network called out of range. The supplicant scans whenever it has just lost
// one.
TEST_F(Joining, FindsANetworkThatHidesWhileAnotherProgramScans) {
  g_canCall = true;
  g_busyCalls = 3;
  ComeIntoRangeWith(kCalled);
  EXPECT_EQ(Tool({"connect", "cafe", "--key-file", kSecret}).status, 0);
}

TEST_F(Joining, CallsNoAddress) {
  g_canCall = true;
  ComeIntoRangeWith(kInRange);
  EXPECT_EQ(Tool({"connect", "02:00:00:00:01:00"}).status, 4);
  EXPECT_FALSE(Exists(kCalled));
}

}  // namespace

// The program comes upon this one before libc's. A network that is called has the name of the call as a file, and the
// names of all calls are lines of another.
extern "C" int ioctl(int fd, unsigned long request, ...) noexcept {
  va_list arguments;
  va_start(arguments, request);
  void* argument = va_arg(arguments, void*);
  va_end(arguments);
  if (g_canCall && request == SIOCGIWSCAN) return 0;
  if (!g_canCall || request != SIOCSIWSCAN) return static_cast<int>(::syscall(SYS_ioctl, fd, request, argument));
  if (g_busyCalls-- > 0) return errno = EBUSY, -1;
  const auto* call = static_cast<const iw_scan_req*>(static_cast<const iwreq*>(argument)->u.data.pointer);
  const std::string name(reinterpret_cast<const char*>(call->essid), call->essid_len);
  WriteText(kCalled, name);
  WriteText(kCalls, TextOrNothing(kCalls) + name + "\n");
  return 0;
}
