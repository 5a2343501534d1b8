// The supplicant's events, and the effect that they have on the program.
#include "work/supplicant.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstring>

#include "running.h"

using library::Network;
using testing::HasSubstr;

namespace {

constexpr char kDirectory[] = "/var/run/wpa_supplicant";
constexpr char kSocket[] = "/var/run/wpa_supplicant/wlan0";

// Plays the supplicant.
class Supplicant {
 public:
  explicit Supplicant(const char* szPath = kSocket) : szPath_(szPath) {
    ::mkdir(kDirectory, 0755);
    ::unlink(szPath);
    fd_ = ::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strcpy(address.sun_path, szPath);
    EXPECT_EQ(::bind(fd_, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
  }
  Supplicant(const Supplicant&) = delete;
  Supplicant& operator=(const Supplicant&) = delete;
  ~Supplicant() {
    ::close(fd_);
    ::unlink(szPath_);
  }

  // Waits for the next request; empty when none comes.
  std::string Request() {
    pollfd waited{fd_, POLLIN, 0};
    if (::poll(&waited, 1, 20'000) <= 0) return "";
    char request[64];
    size_ = sizeof listener_;
    const ssize_t size = ::recvfrom(fd_, request, sizeof request, 0, reinterpret_cast<sockaddr*>(&listener_), &size_);
    return {request, static_cast<std::size_t>(std::max<ssize_t>(size, 0))};
  }

  void Say(std::string_view event) {
    EXPECT_EQ(::sendto(fd_, event.data(), event.size(), 0, reinterpret_cast<sockaddr*>(&listener_), size_),
              static_cast<ssize_t>(event.size()));
  }

 private:
  const char* szPath_;
  int fd_ = -1;
  sockaddr_un listener_{};
  socklen_t size_ = 0;
};

TEST(SupplicantEvents, TellWhyAJoinCameToNothing) {
  const std::pair<const char*, Verdict> events[] = {
      {"<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" auth_failures=1 duration=10 reason=WRONG_KEY",
       Verdict::kSecretRefused},
      {"<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" auth_failures=1 duration=10 reason=AUTH_FAILED",
       Verdict::kSecretRefused},
      {"<3>WPA: 4-Way Handshake failed - pre-shared key may be incorrect", Verdict::kSecretRefused},
      {"<3>CTRL-EVENT-EAP-FAILURE EAP authentication failed", Verdict::kSecretRefused},
      {"<3>CTRL-EVENT-ASSOC-REJECT bssid=02:00:00:00:01:00 status_code=17", Verdict::kRefused},
      {"<3>CTRL-EVENT-AUTH-REJECT 02:00:00:00:01:00 auth_type=0 auth_transaction=2 status_code=1", Verdict::kRefused},
      {"<3>CTRL-EVENT-AUTH-REJECT 02:00:00:00:01:00 auth_type=1 auth_transaction=4 status_code=15",
       Verdict::kSecretRefused},
      {"<3>CTRL-EVENT-NETWORK-NOT-FOUND ", Verdict::kNotFound},
      {"<3>SME: Trying to authenticate with 02:00:00:00:01:00 (SSID='reason=WRONG_KEY' freq=2412 MHz)", Verdict::kNone},
      {"<3>Trying to associate with SSID 'CTRL-EVENT-EAP-FAILURE'", Verdict::kNone},
      {"<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" auth_failures=1 duration=10 reason=CONN_FAILED",
       Verdict::kNone},
      {"<3>CTRL-EVENT-SCAN-RESULTS ", Verdict::kNone},
      {"OK\n", Verdict::kNone},
      {"", Verdict::kNone},
  };
  for (const auto& [szEvent, verdict] : events) EXPECT_EQ(VerdictOf(szEvent), verdict) << szEvent;
}

TEST(SupplicantEvents, AreFinalWhenTheSupplicantPausesForLongerThanAJoinLasts) {
  for (const std::string reason : {"WRONG_KEY", "AUTH_FAILED"}) {
    EXPECT_TRUE(IsFinal("<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" duration=10 reason=" + reason));
  }
  for (const char* szEvent :
       {"<3>WPA: 4-Way Handshake failed - pre-shared key may be incorrect",
        "<3>CTRL-EVENT-EAP-FAILURE EAP authentication failed", "<3>CTRL-EVENT-NETWORK-NOT-FOUND ",
        "<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" auth_failures=1 duration=10 reason=CONN_FAILED",
        "<3>CTRL-EVENT-ASSOC-REJECT bssid=02:00:00:00:01:00 status_code=17", ""}) {
    EXPECT_FALSE(IsFinal(szEvent)) << szEvent;
  }
}

TEST(SupplicantListener, KeepsTheMostTellingEvent) {
  SupplicantListener listener(kSocket);
  listener.Tick();
  EXPECT_EQ(listener.fd(), -1) << "there is no supplicant yet";

  Supplicant supplicant;
  listener.Tick();
  ASSERT_EQ(supplicant.Request(), "ATTACH");
  supplicant.Say("<3>CTRL-EVENT-EAP-FAILURE EAP authentication failed");
  supplicant.Say("<3>CTRL-EVENT-NETWORK-NOT-FOUND ");
  listener.Receive();
  EXPECT_EQ(listener.verdict(), Verdict::kSecretRefused);
}

TEST(SupplicantListener, FindsTheNextSupplicantWhenOneLeaves) {
  SupplicantListener listener(kSocket);
  {
    Supplicant first;
    listener.Tick();
    ASSERT_EQ(first.Request(), "ATTACH");
    first.Say("<3>CTRL-EVENT-TERMINATING ");
    listener.Receive();
  }
  Supplicant second;
  listener.Tick();
  EXPECT_EQ(second.Request(), "ATTACH");
}

TEST(SupplicantListener, FindsTheNextSupplicantWhenOneVanishes) {
  SupplicantListener listener(kSocket);
  {
    Supplicant first;
    listener.Tick();
    ASSERT_EQ(first.Request(), "ATTACH");
  }
  Supplicant second;
  EXPECT_TRUE(Soon([&] { return listener.Tick(), listener.fd() == -1; })) << "it is asked now and then";
  listener.Tick();
  EXPECT_EQ(second.Request(), "ATTACH");
}

// A tenth of a second later the supplicant had begun to scan.
TEST(SupplicantListener, GreetsTheFirstSupplicantAtOnce) {
  int greetings = 0;
  SupplicantListener listener(kSocket, [&] { ++greetings; });
  listener.Tick();
  EXPECT_EQ(greetings, 0);
  EXPECT_LE(listener.interval(), std::chrono::milliseconds(10));
  {
    Supplicant first;
    listener.Tick();
    EXPECT_EQ(greetings, 1);
    EXPECT_GE(listener.interval(), std::chrono::milliseconds(100)) << "there is time now";
    ASSERT_EQ(first.Request(), "ATTACH");
    first.Say("<3>CTRL-EVENT-TERMINATING ");
    listener.Receive();
  }
  Supplicant second;
  listener.Tick();
  EXPECT_EQ(second.Request(), "ATTACH");
  EXPECT_EQ(greetings, 1);
}

TEST(SupplicantListener, BearsAPathThatNoSocketCanHave) {
  SupplicantListener listener(std::string(500, 'x'));
  listener.Tick();
  EXPECT_EQ(listener.fd(), -1);
}

// Joins a network that does not let it in, while the supplicant says `event`.
class RefusedJoin : public ToolTest {
 protected:
  RefusedJoin() {
    WIRELESS_NETWORK_CONFIG home{};
    home.network = Network("Home");
    std::strcpy(home.szKey, "open sesame");
    library::Known({home});
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
      return Soon([] { return ::access("/tmp/said", F_OK) == 0; }), -1;
    };
  }

  Ran Join(std::string_view event, const std::vector<std::string>& command = {"connect", "Home"}) {
    ::unlink("/tmp/said");
    Supplicant supplicant;
    StartedTool tool(command);
    EXPECT_EQ(supplicant.Request(), "ATTACH");
    supplicant.Say(event);
    EXPECT_EQ(supplicant.Request(), "PING") << "the event has been read by then";
    WriteText("/tmp/said", "");
    return tool.Wait();
  }
};

TEST_F(RefusedJoin, TellsAWrongSecretFromANetworkOutOfRange) {
  const Ran wrong = Join("<3>WPA: 4-Way Handshake failed - pre-shared key may be incorrect");
  EXPECT_EQ(wrong.status, 5);
  EXPECT_THAT(wrong.err, HasSubstr("Home does not accept the secret: `merowireless connect --key-stdin`"));

  const Ran absent = Join("<3>CTRL-EVENT-NETWORK-NOT-FOUND ");
  EXPECT_EQ(absent.status, 4);
  EXPECT_THAT(absent.err, HasSubstr("Home is not in range: move closer"));

  const Ran refused = Join("<3>CTRL-EVENT-ASSOC-REJECT bssid=02:00:00:00:01:00 status_code=17");
  EXPECT_EQ(refused.status, 1);
  EXPECT_THAT(refused.err, HasSubstr("Home refuses this appliance"));
}

// It was told when the library had waited for its 15 seconds.
TEST_F(RefusedJoin, EndsAsSoonAsTheSupplicantKnowsThatTheSecretIsWrong) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) {
    WriteText("/var/tmp/.wireless_connecting", "");
    return ::pause();
  };
  for (const char* szReason : {"WRONG_KEY", "AUTH_FAILED"}) {
    Lifeline lifeline;
    Supplicant supplicant;
    StartedTool tool({"connect", "Home"});
    EXPECT_EQ(supplicant.Request(), "ATTACH");
    supplicant.Say("<3>WPA: 4-Way Handshake failed - pre-shared key may be incorrect");
    EXPECT_EQ(supplicant.Request(), "PING") << "a handshake that fails ends nothing";
    supplicant.Say(std::string("<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" reason=") + szReason);
    EXPECT_TRUE(Soon([&] { return lifeline.IsFree(); }));
    if (!lifeline.IsFree()) ::kill(tool.pid(), SIGTERM);
    const Ran ran = tool.Wait();
    EXPECT_EQ(ran.status, 5);
    EXPECT_THAT(ran.err, HasSubstr("Home does not accept the secret"));
    EXPECT_FALSE(Exists("/var/tmp/.wireless_connecting"));
    EXPECT_EQ(library::Calls().back(), "MEROWirelessNetworkDisconnect");
  }
}

// The walk goes on to the next network.
TEST_F(RefusedJoin, ByAutoconnectTellsThemApartToo) {
  const Ran wrong = Join("<3>WPA: 4-Way Handshake failed - pre-shared key may be incorrect", {"autoconnect"});
  EXPECT_EQ(wrong.status, 5);
  EXPECT_THAT(wrong.err, HasSubstr("Home does not accept the secret: `merowireless connect --key-stdin`"));

  const Ran absent = Join("<3>CTRL-EVENT-NETWORK-NOT-FOUND ", {"autoconnect"});
  EXPECT_EQ(absent.status, 4);
  EXPECT_THAT(absent.err, HasSubstr("none of the known networks could be joined"));
}

// The supplicant goes to the strongest again and again, so whoever bore the name could keep the appliance out.
TEST_F(RefusedJoin, ByAStrangerOfTheNameIsTriedThroughTheAccessPointsThatTheNetworkWasSavedWith) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(AddressText(config->network.bssid) + (config->noneBssid != 0 ? " or any" : " alone"));
    return config->noneBssid != 0 ? ::pause() : 0;
  };
  library::InRange({Network("Home")});
  const auto wayOf = [](const std::string& command, const std::string& accessPoint) {
    const std::size_t before = library::Calls().size();
    Supplicant supplicant;
    StartedTool tool(command == "connect" ? std::vector<std::string>{command, "Home"} : std::vector{command});
    EXPECT_EQ(supplicant.Request(), "ATTACH");
    EXPECT_TRUE(Soon([&] { return library::Calls().size() > before + 1; }));
    supplicant.Say("<3>Associated with " + accessPoint);
    supplicant.Say("<3>CTRL-EVENT-SSID-TEMP-DISABLED id=0 ssid=\"Home\" reason=WRONG_KEY");
    const int status = tool.Wait().status;
    const auto calls = library::Calls();
    return std::to_string(status) + " " + *std::find_if(calls.rbegin(), calls.rend(), [](const std::string& call) {
             return call.find(':') != call.npos;
           });
  };
  for (const char* szCommand : {"connect", "autoconnect"}) {
    EXPECT_EQ(wayOf(szCommand, "0a:0a:0a:0a:0a:0b"), "0 0A:0A:0A:0A:0A:0A alone");
    EXPECT_EQ(wayOf(szCommand, "0a:0a:0a:0a:0a:0a"), "5 0A:0A:0A:0A:0A:0A or any") << "its own need not be asked twice";
  }
}

// One that took the appliance for its station, or its question, and said no more could keep it out.
TEST_F(RefusedJoin, ByTheSilenceOfAStrangerIsTriedThroughTheAccessPointsThatTheNetworkWasSavedWith) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(AddressText(config->network.bssid) + (config->noneBssid != 0 ? " or any" : " alone"));
    return config->noneBssid != 0 ? -1 : 0;
  };
  WIRELESS_NETWORK stranger = Network("Home");
  stranger.bssid[5] = 0x0B;
  stranger.signal = Network("Home").signal + 10;
  const auto waysOf = [](const std::vector<WIRELESS_NETWORK>& inRange, int status) {
    library::InRange(inRange);
    const std::size_t before = library::Calls().size();
    EXPECT_EQ(Tool({"autoconnect"}).status, status);
    auto calls = library::Calls();
    calls.erase(calls.begin(), calls.begin() + static_cast<std::ptrdiff_t>(before));
    std::erase_if(calls, [](const std::string& call) { return call.find(':') == call.npos; });
    return calls;
  };
  EXPECT_THAT(waysOf({Network("Home"), stranger}, 0),
              testing::ElementsAre("0A:0A:0A:0A:0A:0B or any", "0A:0A:0A:0A:0A:0A alone"));
  EXPECT_THAT(waysOf({Network("Home")}, 4), testing::ElementsAre("0A:0A:0A:0A:0A:0A or any")) << "it was its own";
}

}  // namespace
