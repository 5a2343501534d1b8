// The program as it is installed, with the real library and its files.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <pty.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <iterator>
#include <set>
#include <sstream>
#include <string>

#include "tests/support/files.h"
#include "tests/support/shell.h"

using testing::AllOf;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::Not;
using testing::StartsWith;

namespace {

// Runs a command line of the program.
Ran Tool(const std::string& arguments) {
  return RunInShell("LC_ALL=C.UTF-8 TZ=UTC " MERO_TOOL " " + arguments);
}

// A shell with job control on a terminal.
class ShellOnTerminal {
 public:
  ShellOnTerminal() {
    if (::forkpty(&terminal_, nullptr, nullptr, nullptr) > 0) return;
    ::setenv("LC_ALL", "C.UTF-8", 1);
    ::setenv("PS1", "ready> ", 1);
    ::execl("/bin/bash", "bash", "--norc", "--noprofile", "-i", nullptr);
    ::_exit(EXIT_FAILURE);
  }
  ShellOnTerminal(const ShellOnTerminal&) = delete;
  ShellOnTerminal& operator=(const ShellOnTerminal&) = delete;
  ~ShellOnTerminal() { ::close(terminal_); }

  void Type(const std::string& text) const {
    ASSERT_EQ(::write(terminal_, text.data(), text.size()), static_cast<ssize_t>(text.size()));
  }

  // Whether a text is shown, after other things or at once. The next question begins behind that text.
  bool Shows(const std::string& text) {
    constexpr int kPatience = 20'000;
    char bytes[4096];
    while (shown_.find(text, seen_) == shown_.npos) {
      pollfd readable{terminal_, POLLIN, 0};
      if (::poll(&readable, 1, kPatience) <= 0) return false;
      const ssize_t size = ::read(terminal_, bytes, sizeof bytes);
      if (size <= 0) return false;
      shown_.append(bytes, static_cast<std::size_t>(size));
    }
    seen_ = shown_.find(text, seen_) + text.size();
    return true;
  }

  const std::string& shown() const { return shown_; }

 private:
  int terminal_ = -1;
  std::string shown_;
  std::size_t seen_ = 0;
};

void AnnounceAdapter() {
  WriteText("/tmp/wireless.info", "PRODUCT=\"Example Stick\"\n");
}

TEST(InstalledProgram, SavesANetworkThatItThenKnows) {
  WriteText("/tmp/secret", "open sesame\n");
  EXPECT_EQ(Tool("save 'My Café' --bssid 00:11:22:33:44:55 --security wpa2 --key-file /tmp/secret").out,
            "saved My Café (00:11:22:33:44:55)\n");
  EXPECT_THAT(ReadText("/usr/mero/etc/wireless.conf"),
              AllOf(HasSubstr("[00:11:22:33:44:55]"), HasSubstr("\tKEY=open sesame\n"), HasSubstr("\tIPADDR=DHCP\n")));
  EXPECT_THAT(Tool("known").out, AllOf(HasSubstr("\nMy Café  WPA2 TKIP+AES  DHCP"), Not(HasSubstr("sesame"))));
  EXPECT_THAT(Tool("known --porcelain --show-secrets").out, HasSubstr("\topen sesame\t"));
}

TEST(InstalledProgram, DoesNotShowASecretThatIsTypedAfterItWasStopped) {
  ShellOnTerminal shell;
  ASSERT_TRUE(shell.Shows("ready> "));
  shell.Type(MERO_TOOL " save Home --bssid 00:11:22:33:44:55 --security wpa2\n");
  ASSERT_TRUE(shell.Shows("secret of Home: ")) << shell.shown();
  shell.Type("\x1a");
  ASSERT_TRUE(shell.Shows("Stopped") && shell.Shows("ready> ")) << shell.shown();
  shell.Type("fg\n");
  ASSERT_TRUE(shell.Shows("secret of Home: ")) << shell.shown();
  shell.Type("open sesame\n");
  EXPECT_TRUE(shell.Shows("saved Home")) << shell.shown();
  EXPECT_THAT(shell.shown(), Not(HasSubstr("sesame")));
}

// Has a shared library be a file that is none.
void SpoilLibrary(const std::string& soname) {
  Shell("ldconfig -p | awk '$1 == \"" + soname + "\" { print $NF }' | xargs -n 1 mount --bind /dev/null");
}

// All of them were loaded at every start, and there was no start without them.
TEST(InstalledProgram, NeedsTheLibrariesThatDrawCodesForNothingElse) {
  WriteText("/tmp/secret", "open sesame\n");
  Shell(MERO_TOOL " save Home --bssid 00:11:22:33:44:55 --security wpa2 --key-file /tmp/secret");
  SpoilLibrary("libpng16.so.16");
  EXPECT_THAT(
      Tool("share Home --png /tmp/home.png").out,
      MatchesRegex("merowireless: no picture can be written: /[^\n]*libpng16.so.16: file too short: install that "
                   "library, or take --svg\n"));
  EXPECT_EQ(Tool("share Home --svg /tmp/home.svg").status, 0);
  SpoilLibrary("libqrencode.so.4");
  EXPECT_THAT(Tool("share Home").out,
              MatchesRegex("merowireless: no code can be drawn: /[^\n]*libqrencode.so.4: file too short: install that "
                           "library\n"));
  EXPECT_EQ(Tool("share Home --porcelain --show-secrets").out,
            "Home\t\twpa\tno\t\t\tWIFI:T:WPA;S:Home;P:open sesame;;\n");
}

TEST(InstalledProgram, SwitchesTheRadio) {
  AnnounceAdapter();
  EXPECT_EQ(Tool("radio --porcelain").out, "on\tExample Stick\t\n");
  EXPECT_EQ(Tool("radio off --porcelain").out, "off\tExample Stick\t\n");
  EXPECT_EQ(Tool("radio --porcelain").out, "off\tExample Stick\t\n");
  EXPECT_EQ(Tool("radio on").out, "the radio is on\n");
  EXPECT_EQ(Tool("radio --porcelain").out, "on\tExample Stick\t\n");
}

TEST(InstalledProgram, KeepsTheAccessPointsSettings) {
  AnnounceAdapter();
  EXPECT_EQ(Tool("radio on").status, 0);
  WriteText("/tmp/secret", "open sesame\n");
  EXPECT_EQ(Tool("ap set --ssid Office --encryption wpa2 --key-file /tmp/secret --channel 11").status, 0);
  EXPECT_THAT(
      ReadText("/usr/mero/etc/wireless_ap.conf"),
      AllOf(HasSubstr("[Example Stick]"), HasSubstr("\tenable=no\n"), HasSubstr("\tssid=Office\n"),
            HasSubstr("\tbridge=lbr0\n"), HasSubstr("\twpa_passphrase=open sesame\n"), HasSubstr("\tchannel=11\n")));
  EXPECT_EQ(Tool("ap set --ignore-broadcast-ssid yes").status, 0);
  EXPECT_THAT(Tool("ap show --json --show-secrets").out,
              AllOf(HasSubstr(R"("enable":false,"ssid":"Office","encryption":"wpa2","wpa_encrypt_type":"aes")"),
                    HasSubstr(R"("ignore_broadcast_ssid":true)"), HasSubstr(R"("secret":"open sesame")")));
}

// The files and directories that have been written or made on this machine, each behind its mode, or alone.
std::string Written(const std::string& form) {
  return Shell("cd /mnt && find etc run tmp usr var -printf '" + form + "\\n' | sort -k 2");
}

// The files that the program writes; they are removed afterwards.
std::string WrittenWithUmask(const std::string& mask) {
  std::istringstream before(Written("/%p"));
  const std::set<std::string> kept{std::istream_iterator<std::string>(before), {}};
  const std::string tool = "umask " + mask + "; LC_ALL=C.UTF-8 " MERO_TOOL " ";
  for (const char* szArguments :
       {"save Home --bssid 00:11:22:33:44:55 --security wpa2 --key-file /tmp/secret",
        "ap set --ssid Office --encryption wpa2 --key-file /tmp/secret", "radio off", "disconnect", "forget Home"}) {
    Shell(tool + szArguments);
  }
  const std::string written = Written("%m %p");
  std::istringstream after(Written("/%p"));
  for (std::string path; after >> path;) {
    if (!kept.contains(path)) std::filesystem::remove_all(path);
  }
  return written;
}

TEST(InstalledProgram, WritesTheSameModesWhateverTheUmask) {
  AnnounceAdapter();
  WriteText("/tmp/secret", "open sesame\n");
  const std::string written = WrittenWithUmask("000");
  EXPECT_EQ(WrittenWithUmask("077"), written);
  EXPECT_THAT(written,
              AllOf(HasSubstr("600 usr/mero/etc/wireless.conf\n"), HasSubstr("600 usr/mero/etc/wireless_ap.conf\n")));
}

TEST(InstalledProgram, SaysThatThereIsNoAdapterAndWhatTheLibraryReported) {
  const Ran ran = Tool("scan -v");
  EXPECT_EQ(ran.status, 3);
  EXPECT_EQ(ran.out, "merowireless: no adapter is plugged in: plug in a wireless USB adapter and try again\n");
  AnnounceAdapter();
  EXPECT_THAT(Tool("ap disable -v").out, HasSubstr("library: wireless_ap_disable:"));
  EXPECT_THAT(Tool("status").out, StartsWith("status        no adapter is plugged in\n"));
  EXPECT_EQ(Tool("autoconnect").status, 3);
}

TEST(InstalledProgram, TakesAnEmptyFileOfTheAdapterForNone) {
  WriteText("/tmp/wireless.info", "");
  for (const char* szArguments : {"ap show", "ap status", "ap disable", "radio on"}) {
    const Ran ran = Tool(szArguments);
    EXPECT_EQ(ran.status, 3) << szArguments;
    EXPECT_THAT(ran.out, StartsWith("merowireless: no adapter is plugged in")) << szArguments;
  }
  EXPECT_EQ(Tool("radio --porcelain").out, "on\t\t\n");
}

TEST(InstalledProgram, DisconnectsWhatIsNotConnected) {
  EXPECT_EQ(Tool("disconnect").out, "disconnected\n");
}

}  // namespace
