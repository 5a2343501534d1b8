// The commands of a connection in a real shell.
#include "hostile_texts.h"
#include "joining.h"

namespace {

using testing::ElementsAre;

constexpr char kSupplicant[] = "/usr/sbin/wpa_supplicant";

// The machine's tools note what they were given, and the supplicant is connected once it has been started.
class JoiningInAShell : public JoiningTest {
 protected:
  JoiningInAShell() {
    InstallNoter(kSupplicant);
    InstallNoter("/usr/sbin/wpa_cli", "[ \"$1\" != status ] || printf 'bssid=x\\nwpa_state=COMPLETED\\nid=0\\n'\n");
    BeginInAShell();
  }

  static void BeginInAShell() {
    Begin();
    fake::system.Does([](const char* szCommand) { return fake::system.Real(szCommand); });
    fake::popen.Does([](const char* szCommand, const char* szMode) { return fake::popen.Real(szCommand, szMode); });
    fake::pclose.Does([](FILE* pipe) { return fake::pclose.Real(pipe); });
    fake::sleep.Does([](unsigned) { return AwaitSupplicant(); });
    ForgetCalls();
  }

  // Some shells start the supplicant and go on, for what looks to others like a redirection to them.
  static unsigned AwaitSupplicant() {
    Soon([] { return !CallsOf(kSupplicant).empty(); }, 10);
    return 0;
  }

  static std::vector<Call> CallsOf(const std::string& program) {
    std::vector<Call> calls = NotedCalls();
    std::erase_if(calls, [&](const Call& call) { return call.front() != program; });
    return calls;
  }
};

TEST_F(JoiningInAShell, RunsTheSupplicantItsToolAndTheCopy) {
  WriteText(kSupplicantPid, "1\n");
  WriteText(kResolver, "nameserver 10.0.0.1\n");
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(NotedCalls(), ElementsAre(Call{"/usr/sbin/wpa_cli", "terminate"},
                                        Call{kSupplicant, "-Dwext", "-iwlan0", "-c/usr/mero/etc/wpa_supplicant.conf",
                                             "-B", "-P/var/run/wpa_supplicant.pid"},
                                        Call{"/usr/sbin/wpa_cli", "status"}));
  EXPECT_EQ(ReadText(kResolverBackup), "nameserver 10.0.0.1\n");
}

TEST_F(JoiningInAShell, PassesAnyInterfaceNameOnUnchanged) {
  for (const std::string& name : kHostileTexts) {
    BeginInAShell();
    fake::MEROWirelessInterfaceGet.Returns(name.c_str());
    EXPECT_EQ(Join(), 0) << name;
    EXPECT_THAT(CallsOf(kSupplicant),
                ElementsAre(Call{kSupplicant, "-Dwext", "-i" + name, "-c/usr/mero/etc/wpa_supplicant.conf", "-B",
                                 "-P/var/run/wpa_supplicant.pid"}))
        << name;
    EXPECT_FALSE(HasIntruder()) << name;
  }
}

TEST_F(JoiningInAShell, RunsNothingThatANameOrASecretHolds) {
  config_.network.auth = WIRELESS_AUTH_WPAEAP;
  for (const std::string& text : kHostileTexts) {
    BeginInAShell();
    WriteText(kResolver, "");
    std::strcpy(config_.network.szEssid, text.c_str());
    std::strcpy(config_.szKey, text.c_str());
    std::strcpy(config_.szUser, text.c_str());
    EXPECT_EQ(Join(), text.find('\n') == std::string::npos ? 0 : -1) << text;
    EXPECT_FALSE(HasIntruder()) << text;
  }
}

// A command has up to 1023 bytes.
TEST_F(JoiningInAShell, StartsTheSupplicantByItsWholeCommandOrNotAtAll) {
  const size_t room = 1023 - (kStartsSupplicant.size() - std::strlen("wlan0"));
  const std::string longest(room, 'w');
  fake::system.Returns(0);
  fake::sleep.Returns(0);
  fake::MEROWirelessInterfaceGet.Returns(longest.c_str());
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::system.calls(), 1);

  const std::string tooLong = longest + "w";
  fake::MEROWirelessInterfaceGet.Returns(tooLong.c_str());
  EXPECT_EQ(Join(), -1);
  EXPECT_EQ(fake::system.calls(), 1);
  std::string command = kStartsSupplicant;
  command.replace(command.find("wlan0"), 5, tooLong);
  EXPECT_THAT(WithoutLines(fake::Messages()),
              ElementsAre("wireless_network_connect:# Failed to execute '" + command.substr(0, 1023) + "'",
                          "wireless_network_connect:# Failed to connect network."));
  EXPECT_FALSE(Exists(kMarker));
}

}  // namespace
