// Every command in each of the three forms, byte by byte.
#include <sys/stat.h>

#include <algorithm>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <set>
#include <sstream>

#include "common/paths.h"
#include "common/text.h"
#include "hostapd_fake.h"
#include "real_store.h"
#include "running.h"

namespace {

using library::Network;
using testing::HasSubstr;

// ---- Worlds for commands to be run in ----

WIRELESS_NETWORK_CONFIG Home() {
  WIRELESS_NETWORK_CONFIG config = library::Home();
  config.atime = 86400;
  return config;
}

void Connected() {
  WIRELESS_NETWORK square = Network("square", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
  square.bssid[5] = 0x0B;
  square.signal = 70;
  library::InRange({Network("Home"), square});
  library::Known({Home()});
  library::Connected("Home");
  kernel::Heard({{.address = kernel::kHome, .isJoined = true}});
  kernel::BecomeJoined();
}

void WriteStore() {
  WriteText(kKnownNetworksPath,
            "[0A:0A:0A:0A:0A:0A]\n\tKEY=open sesame\n\tIPADDR=DHCP\n\tNETMASK=\n\tGATEWAY=\n\tESSID=Home\n"
            "\tBSSID=0A:0A:0A:0A:0A:0A\n\tMODE=MANAGED\n\tACCESS_TIME=86400\n\tAUTH=WPA2PSK\n\tENCRYPT=AES\n");
}

void WithAStore() {
  UseRealStore();
  WriteStore();
}

void InACell() {
  library::InCell("Bench");
}

void WithAGateway() {
  Shell(
      "ip link show wlan0 >/dev/null 2>&1 || { ip link add wlan0 type veth && ip address add 10.0.0.8/24 dev wlan0 &&"
      "ip link set wlan0 up && ip route add default via 10.0.0.1; }");
}

void OffTheAir() {
  library::SavedAp(library::Office());
}

void OnTheAir() {
  MERO_AP_CONF conf = library::Office();
  conf.blEnable = TRUE;
  library::SavedAp(conf);
  kernel::BecomeAccessPoint("Office");
  kernel::Main().stations = 2;
}

void WithChannels() {
  Connected();
  kernel::Heard({{.address = kernel::kHome, .msAgo = 10}});
  kernel::g_channels = {{2412}, {2437}, {2472, NL80211_FREQUENCY_ATTR_NO_IR}, {5260, NL80211_FREQUENCY_ATTR_RADAR}};
}

void InACountry() {
  OnTheAir();
  CopyText(kernel::RulesNow().szKernel, "DE");
}

void WithStations() {
  OnTheAir();
  kernel::Guests() = kernel::Main();
  kernel::Guests().joining = 1;
}

void WithoutStations() {
  OnTheAir();
  kernel::Main().stations = 0;
}

// ---- What each command says ----

struct Command {
  void (*world)();
  std::vector<std::string> words;
};

const Command kCommands[] = {
    {Connected, {"scan"}},
    {WithChannels, {"channels"}},
    {Connected, {"known"}},
    {Connected, {"save", "square"}},
    {Connected, {"forget", "Home"}},
    {Connected, {"share", "Home"}},
    {Connected, {"connect", "Home"}},
    {Connected, {"autoconnect"}},
    {Connected, {"disconnect"}},
    {Connected, {"status"}},
    {Connected, {"watch", "--count", "1"}},
    {Connected, {"address", "DHCP"}},
    {InACell, {"adhoc", "Bench"}},
    {OnTheAir, {"ap", "show"}},
    {OnTheAir, {"ap", "set", "--channel", "11"}},
    {OnTheAir, {"ap", "enable"}},
    {OffTheAir, {"ap", "disable"}},
    {OnTheAir, {"ap", "status"}},
    {WithStations, {"ap", "stations"}},
    {WithoutStations, {"ap", "stations"}},
    {OnTheAir, {"ap", "kick", "02:00:00:00:00:01"}},
    {OnTheAir, {"mode", "client"}},
    {Connected, {"mode", "ap"}},
    {Connected, {"radio"}},
    {Connected, {"radio", "off"}},
    {InACountry, {"country"}},
    {InACountry, {"country", "DE"}},
    {WithAGateway, {"gateway", "10.0.0.1"}},  // the last one: its interface stays
    {WithAStore, {"edit", "Home", "--priority", "5"}},
    {WithAStore, {"export", "--networks"}},
    {WithAStore, {"import", "/tmp/settings.json"}},
};

std::vector<std::string> With(std::vector<std::string> words, const char* szOption) {
  words.emplace_back(szOption);
  return words;
}

std::string Joined(const std::vector<std::string>& words) {
  std::string joined;
  for (const std::string& word : words) joined += (joined.empty() ? "" : " ") + word;
  return joined;
}

// The screen of a person who gives the command.
std::string Screen(const std::vector<std::string>& words) {
  return "$ merowireless " + Joined(words) + "\n" + Tool(words).out;
}

class Forms : public ToolTest {
 protected:
  Forms() {
    ::setenv("TZ", "UTC", 1);
    Shell("mkdir -p /etc/hostapd /usr/mero/etc");
    WriteStore();
    WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
    WriteText("/etc/hostapd/hostapd-wlan0-host.conf", "ssid=Old Office\n");
    WriteText("/usr/mero/etc/wireless_country.conf", "country=\"DE\"\n");
    WriteText("/tmp/settings.json",
              R"({"version":1,"networks":[{"name":"Home","address":"0A:0A:0A:0A:0A:0A","auth":"WPA2PSK",)"
              R"("encryption":"AES","priority":3}]})");
    kernel::PutInBridge();
    WriteText("/var/run/rc.network/dnsmasq-lbr0.leases", "0 02:00:00:00:00:00 10.1.14.23 tablet *\n");
  }

  Hostapd hostapd_;
};

TEST_F(Forms, OfEveryCommandAreAsTheyAlwaysWere) {
  std::string screens;
  for (const auto& [world, words] : kCommands) {
    for (const auto& given : {words, With(words, "--json"), With(words, "--porcelain")}) {
      library::Reset();
      library::g_now = library::kNow;
      world();
      screens += Screen(given);
    }
  }
  EXPECT_EQ(screens, ReadText(MERO_SCREENS));
}

// The words on a screen of so many columns, where all lines have room.
std::set<std::string> WordsOnScreen(const std::vector<std::string>& words, unsigned short columns) {
  std::istringstream screen(ToolOnTerminal(words, columns, {.environment = {{"NO_COLOR", "1"}, {"TERM", "dumb"}}}).out);
  std::set<std::string> shown;
  for (std::string line; std::getline(screen, line);) {
    if (line.ends_with('\r')) line.pop_back();
    EXPECT_LE(::WidthOf(line, true), columns) << line;
    std::istringstream in(line);
    for (std::string word; in >> word;) shown.insert(word);
  }
  return shown;
}

// Lines were broken in the middle of a word, and tables made no sense.
TEST_F(Forms, FitAScreenOfFortyColumnsWordByWord) {
  ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
  for (const auto& command : kCommands) {
    const auto wordsAt = [&](unsigned short columns) {
      library::Reset();
      library::g_now = library::kNow;
      command.world();
      return WordsOnScreen(command.words, columns);
    };
    EXPECT_EQ(wordsAt(40), wordsAt(300)) << Joined(command.words);
  }
  Shell("ip link delete wlan0");
  for (const std::vector<std::string>& wrong : {std::vector<std::string>{"scan", "--renwe"}, {"forget", "Nowhere"}}) {
    EXPECT_EQ(WordsOnScreen(wrong, 40), WordsOnScreen(wrong, 300)) << Joined(wrong);
  }
}

TEST_F(Forms, OfATableThatHasNoRoomAreALineForEachField) {
  Connected();
  constexpr char kHome[] =
      "NAME          Home\n"
      "SIGNAL        ▂▄▆▁  74\n"
      "CH            6\n"
      "SECURITY      WPA2 AES\n"
      "STANDARD      11b/g/n\n"
      "ACCESS POINT  0A:0A:0A:0A:0A:0A\n"
      "KNOWN         joined\n"
      "\n"
      "NAME          square\n";
  EXPECT_THAT(Tool({"scan"}, {.environment = {{"COLUMNS", "40"}}}).out, testing::StartsWith(kHome));
  EXPECT_THAT(Tool({"scan", "--porcelain"}, {.environment = {{"COLUMNS", "40"}}}).out, testing::StartsWith("Home\t74"));
}

TEST_F(Forms, OfAValueThatHasNoRoomBesideItsTitleAreOnLinesOfTheirOwn) {
  MERO_AP_CONF conf = library::Office();
  CopyText(conf.hostapConf.szSSID, "a name that is thirty-two long!!");
  CopyText(conf.hostapConf.szBridge, "withoutblanks");
  library::SavedAp(conf);
  const std::string out = Tool({"ap", "show"}, {.environment = {{"COLUMNS", "40"}}}).out;
  EXPECT_THAT(out, HasSubstr("\nssid\n    a name that is thirty-two long!!\n"));
  EXPECT_THAT(out, HasSubstr("\nbridge\n    withoutblanks\n"));
  EXPECT_THAT(out, HasSubstr("\nieee80211n_wireless_width        20 and\n                                 40 MHz\n"));
}

// Everything that has been made on this machine.
std::set<std::string> AllFiles() {
  namespace fs = std::filesystem;
  std::set<std::string> files;
  for (const char* szTop : {"/mnt/etc", "/mnt/run", "/mnt/tmp", "/mnt/usr", "/mnt/var"}) {
    for (const auto& entry : fs::recursive_directory_iterator(szTop)) files.insert(entry.path());
  }
  return files;
}

// Only the library creates files, and it sets their modes. Beside them there are the directory that joins lock, and the
// note in it that somebody has disconnected.
TEST_F(Forms, CreateNoFileWhateverTheUmask) {
  const std::string lock = "/mnt/run/merowireless";
  const std::set<std::string> before = AllFiles();
  for (const mode_t mask : {0000u, 0077u}) {
    for (const auto& [world, words] : kCommands) {
      library::Reset();
      world();
      const Ran ran = Tool(words, {.before = [mask] { ::umask(mask); }});
      EXPECT_EQ(ran.status, 0) << Joined(words) << ": " << ran.err;
      std::vector<std::string> created;
      std::ranges::set_difference(AllFiles(), before, std::back_inserter(created));
      std::erase(created, lock + "/left-alone");
      if (std::erase(created, lock) > 0) {
        EXPECT_EQ(std::filesystem::status(lock).permissions(), std::filesystem::perms::owner_all) << Joined(words);
      }
      EXPECT_THAT(created, testing::IsEmpty()) << Joined(words);
    }
    Shell("ip link delete wlan0");  // the last world's
    std::filesystem::remove_all(kJoinLock);
  }
}

TEST_F(Forms, AreLookedAtForEveryCommand) {
  std::vector<std::string> commands = CommandsOf();
  std::erase(commands, "ap");
  for (const std::string& command : CommandsOf({"ap"})) commands.push_back("ap " + command);
  EXPECT_GT(commands.size(), 15U);
  for (const std::string& command : commands) {
    EXPECT_TRUE(std::ranges::any_of(kCommands, [&](const Command& known) {
      return (Joined(known.words) + " ").starts_with(command + " ");
    })) << command;
  }
}

}  // namespace
