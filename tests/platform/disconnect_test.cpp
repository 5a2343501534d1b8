// Ending the current connection.
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <filesystem>

#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr char kRecord[] = "/var/tmp/.wireless_current_connection";
constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";
constexpr char kSupplicant[] = "/tmp/platform/wpa_supplicant";
constexpr char kDhcpClient[] = "/tmp/platform/busybox";

// A process that runs until it is ended, as a program of that name.
class StandIn {
 public:
  enum class Manner { kEndsWhenAsked, kIgnoresBeingAsked };

  explicit StandIn(const std::string& program, Manner manner = Manner::kEndsWhenAsked) {
    fs::copy_file("/bin/sleep", program, fs::copy_options::skip_existing);
    int started[2];
    EXPECT_EQ(::pipe2(started, O_CLOEXEC), 0);
    pid_ = ::fork();
    if (pid_ == 0) {
      if (manner == Manner::kIgnoresBeingAsked) std::signal(SIGTERM, SIG_IGN);
      ::execl(program.c_str(), program.c_str(), "1000", nullptr);
      ::_exit(127);
    }
    ::close(started[1]);
    char none;
    EXPECT_EQ(::read(started[0], &none, 1), 0);  // ends when the program has begun
    ::close(started[0]);
  }
  StandIn(const StandIn&) = delete;
  StandIn& operator=(const StandIn&) = delete;
  ~StandIn() {
    if (pid_ > 0) ::kill(pid_, SIGKILL);
    if (pid_ > 0) ::waitpid(pid_, nullptr, 0);
  }

  std::string pid() const { return std::to_string(pid_); }
  bool runs() { return Ended(WNOHANG) == 0; }
  // The signal that has ended it; 0 when none has.
  int endedBy() { return Ended(WNOHANG); }

 private:
  int Ended(int options) {
    if (endedBy_ != 0) return endedBy_;
    int state = 0;
    if (::waitpid(pid_, &state, options) != pid_) return 0;
    pid_ = -1;
    return endedBy_ = WIFSIGNALED(state) ? WTERMSIG(state) : -1;
  }

  pid_t pid_ = -1;
  int endedBy_ = 0;
};

class Disconnecting : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    for (const char* szPath : {kRecord, kSupplicantPid, "/var/run/udhcpc-wlan0.pid"}) PLIBCSysUnlink(szPath);
  }
};

TEST_F(Disconnecting, SucceedsWhenThereIsNothingToEnd) {
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
}

TEST_F(Disconnecting, ForgetsTheConnection) {
  WriteText(kRecord, "home\n10\n5\n8\n00:11:22:AA:BB:CC\n");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_FALSE(fs::exists(kRecord));
}

TEST_F(Disconnecting, EndsTheSupplicant) {
  StandIn supplicant(kSupplicant);
  WriteText(kSupplicantPid, supplicant.pid() + "\n");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(supplicant.endedBy(), SIGTERM);
  EXPECT_FALSE(fs::exists(kSupplicantPid));
}

TEST_F(Disconnecting, EndsTheDhcpClientOfTheInterface) {
  StandIn client(kDhcpClient);
  StandIn other(kDhcpClient);
  WriteText("/var/run/udhcpc-wlan0.pid", client.pid());
  WriteText("/var/run/udhcpc-eth0.pid", other.pid());
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(client.endedBy(), SIGTERM);
  EXPECT_FALSE(fs::exists("/var/run/udhcpc-wlan0.pid"));
  EXPECT_TRUE(other.runs());
  EXPECT_TRUE(fs::exists("/var/run/udhcpc-eth0.pid"));
}

TEST_F(Disconnecting, KillsADaemonThatDoesNotEndInTwoSeconds) {
  StandIn supplicant(kSupplicant, StandIn::Manner::kIgnoresBeingAsked);
  WriteText(kSupplicantPid, supplicant.pid());
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::milliseconds(1900));
  EXPECT_EQ(supplicant.endedBy(), SIGKILL);
  EXPECT_FALSE(fs::exists(kSupplicantPid));
}

// An upgrade of the program must not make its daemon a stranger.
TEST_F(Disconnecting, EndsADaemonWhoseProgramWasReplaced) {
  StandIn supplicant(kSupplicant);
  fs::remove(kSupplicant);
  WriteText(kSupplicantPid, supplicant.pid());
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(supplicant.endedBy(), SIGTERM);
}

// A pid file that was left behind names whatever process has got that pid since.
TEST_F(Disconnecting, EndsNoOtherProgram) {
  for (const char* szName : {"bystander", "my_wpa_supplicant", "wpa_supplicant2", "wpa_supplican", "busybox"}) {
    StandIn bystander(std::string(kDirectory) + "/" + szName);
    WriteText(kSupplicantPid, bystander.pid());
    EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
    EXPECT_TRUE(bystander.runs()) << szName;
    EXPECT_FALSE(fs::exists(kSupplicantPid)) << szName;
  }
}

TEST_F(Disconnecting, EndsNobodyForAFileThatHoldsNoPid) {
  StandIn supplicant(kSupplicant);
  for (const std::string& content :
       {std::string(), std::string("\n"), std::string("x"), "-" + supplicant.pid(), "+" + supplicant.pid(),
        supplicant.pid() + "x", supplicant.pid() + " 1", "x" + supplicant.pid(), std::string("0"), std::string("-1"),
        std::string("99999999999999999999")}) {
    WriteText(kSupplicantPid, content);
    EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0) << content;
    EXPECT_TRUE(supplicant.runs()) << content;
    EXPECT_FALSE(fs::exists(kSupplicantPid)) << content;
  }
}

TEST_F(Disconnecting, GoesOnAfterAStepThatFails) {
  fs::create_directory(kSupplicantPid);
  StandIn client(kDhcpClient);
  WriteText("/var/run/udhcpc-wlan0.pid", client.pid());
  WriteText(kRecord, "home\n");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), -1);
  ExpectFailure(ERR_BAD_PARAMETERS, "Failed to end the supplicant of wlan0: Invalid argument");
  EXPECT_EQ(client.endedBy(), SIGTERM);
  EXPECT_FALSE(fs::exists(kRecord));
  fs::remove(kSupplicantPid);
}

TEST_F(Disconnecting, ReportsEachStepThatFails) {
  fs::create_directory(kSupplicantPid);
  fs::create_directory("/var/run/udhcpc-wlan0.pid");
  {
    const MemoryFileSystem kept(kRecord, "");  // can be neither removed nor moved aside
    EXPECT_EQ(MEROWirelessNetworkDisconnect(), -1);
  }
  EXPECT_EQ(PLIBCErrGet(), ERR_UNKNOWN);
  EXPECT_THAT(TakeLog(), ElementsAre(Says("Failed to end the supplicant of wlan0: Invalid argument"),
                                     Says("Failed to end the DHCP client of wlan0: Invalid argument"),
                                     Says("Failed to forget the connection of wlan0: Device or resource busy")));
  for (const char* szPath : {kSupplicantPid, "/var/run/udhcpc-wlan0.pid", kRecord}) fs::remove(szPath);
}

class DisconnectingAnAdapter : public Disconnecting {
 protected:
  const NetworkInterface interface_{"wlan3"};
  const ShownInterfaces shown_{{{"wlan3", "phy80211"}, {"eth7", ""}}};
  SimulatedDriver driver_{"wlan3"};
};

TEST_F(DisconnectingAnAdapter, LeavesTheAccessPoint) {
  driver_.mode = WIRELESS_OPMODE_MANAGED;
  driver_.accessPoint = {2, 0, 0, 0, 0, 1};
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_THAT(driver_.told, ElementsAre("leave"));
}

TEST_F(DisconnectingAnAdapter, LeavesNoAccessPointWhenThereIsNone) {
  driver_.mode = WIRELESS_OPMODE_MANAGED;
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_THAT(driver_.told, IsEmpty());
}

TEST_F(DisconnectingAnAdapter, LeavesAnAdHocCellByBecomingAStationWhileDown) {
  ASSERT_EQ(PLIBNetIfUp("wlan3"), 1);
  driver_.told.clear();
  driver_.mode = WIRELESS_OPMODE_ADHOC;
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_THAT(driver_.told, ElementsAre("down", "mode 2", "up"));
}

TEST_F(DisconnectingAnAdapter, LeavesAnAccessPointOfOurOwnAlone) {
  driver_.mode = WIRELESS_OPMODE_MASTER;
  driver_.accessPoint = {2, 0, 0, 0, 0, 1};
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_THAT(driver_.told, IsEmpty());
}

TEST_F(DisconnectingAnAdapter, RemovesEveryAddress) {
  const NetworkInterface other("eth7");
  Shell("ip address add 10.9.9.9/24 dev eth7");
  Shell(
      "ip link set wlan3 up && for a in 10.1.1.2/24 10.1.1.3/24 10.2.2.2/16 192.168.7.7/32; do"
      " ip address add $a dev wlan3; done");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(interface_.addresses(), "");
  EXPECT_EQ(other.addresses(), "10.9.9.9/24 ");
}

TEST_F(DisconnectingAnAdapter, RemovesAnAddressThatHasANameOfItsOwn) {
  Shell("ip address add 10.1.1.2/24 dev wlan3 label wlan3:1");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(interface_.addresses(), "");
}

TEST_F(DisconnectingAnAdapter, GoesOnWhenTheDriverRefuses) {
  driver_.refusal = EIO;
  Shell("ip address add 10.1.1.2/24 dev wlan3");
  WriteText(kRecord, "home\n");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), -1);
  ExpectFailure(ERR_IO, "Failed to leave the network of wlan3: Input/output error");
  EXPECT_EQ(interface_.addresses(), "");
  EXPECT_FALSE(fs::exists(kRecord));
}

}  // namespace
