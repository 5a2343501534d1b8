// The forms of the output.
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <map>
#include <nlohmann/json.hpp>
#include <sstream>

#include "app/run.h"
#include "base/failure.h"
#include "base/text.h"
#include "running.h"

using library::Network;
using testing::HasSubstr;
using testing::Not;

namespace {

class Output : public ToolTest {
 protected:
  Output() {
    WIRELESS_NETWORK cafe = Network("Café du coin");
    WIRELESS_NETWORK open = Network("guests", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
    open.signal = 9;
    open.channel = 11;
    library::InRange({cafe, open});
  }
};

TEST_F(Output, OfAScanIsATableWithAlignedColumnsAndSignalBars) {
  const Ran ran = Tool({"scan"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out,
            "NAME            SIGNAL  CH  SECURITY  STANDARD  ACCESS POINT       KNOWN\n"
            "Café du coin  ▂▄▆▁  74   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0A  -\n"
            "guests        ▂▁▁▁   9  11  open      11b/g/n   0A:0A:0A:0A:0A:0A  -\n");
  EXPECT_EQ(ran.err, "");
}

TEST_F(Output, OfAScanIsOneDocumentInJson) {
  EXPECT_EQ(
      Tool({"scan", "--json"}).out,
      R"({"result":"ok","networks":[)"
      R"({"name":"Café du coin","signal":74,"channel":6,"auth":"WPA2PSK","encryption":"AES",)"
      R"("standard":"11b/g/n","address":"0A:0A:0A:0A:0A:0A","name_hex":null,"joined":false,"known":false,"unsupported":null},)"
      R"({"name":"guests","signal":9,"channel":11,"auth":"OPEN","encryption":"NONE",)"
      R"("standard":"11b/g/n","address":"0A:0A:0A:0A:0A:0A","name_hex":null,"joined":false,"known":false,"unsupported":null}]})"
      "\n");
}

TEST_F(Output, OfAScanIsARecordALineForScripts) {
  EXPECT_EQ(Tool({"--porcelain", "scan"}).out,
            "Café du coin\t74\t6\tWPA2PSK\tAES\t11b/g/n\t0A:0A:0A:0A:0A:0A\t\tno\tno\t\n"
            "guests\t9\t11\tOPEN\tNONE\t11b/g/n\t0A:0A:0A:0A:0A:0A\t\tno\tno\t\n");
}

TEST_F(Output, KeepsNamesFromBreakingALineForScripts) {
  library::InRange({Network("a\tb\nc\\d\x1b[2J\r\x7f\xc3\xa9")});
  EXPECT_THAT(Tool({"scan", "--porcelain"}).out,
              testing::StartsWith("a\\tb\\nc\\\\d\\0033[2J\\0015\\0177\xc3\xa9\t74\t"));
}

TEST_F(Output, ShowsPeopleControlCharactersOfNamesWithoutTheirEffect) {
  library::InRange({Network("\x1b[2Jgone\r\u202Exyz\xff")});
  EXPECT_THAT(Tool({"scan"}).out, HasSubstr("\n\\x1b[2Jgone\\x0d\\xe2\\x80\\xaexyz\\xff  "));
}

// Everything that a terminal may act on: all bytes by themselves, the controls of both kinds as characters, and what
// hides or reorders others.
std::vector<std::string> EveryHostileName() {
  std::vector<std::string> names;
  for (int byte = 1; byte <= 0xFF; ++byte) names.push_back({'a', static_cast<char>(byte), 'z'});
  for (int byte = 0x80; byte <= 0x9F; ++byte) names.push_back({'a', '\xC2', static_cast<char>(byte), 'z'});
  for (const char* szName : {"a\u00ADz", "a\u061Cz", "a\u200Bz", "a\u202Ez", "a\u2028z", "a\u2066z", "a\uFEFFz",
                             "a\uE000z", "a\U000E0001z", "a\U0010FFFFz"}) {
    names.emplace_back(szName);
  }
  return names;
}

std::vector<WIRELESS_NETWORK> Named(const std::vector<std::string>& names) {
  std::vector<WIRELESS_NETWORK> networks;
  for (const std::string& name : names) networks.push_back(Network(name.c_str()));
  return networks;
}

// DEL, the controls from U+0080 to U+009F, the bytes that they have beyond UTF-8, and marks of direction passed through
// the forms for machines.
TEST_F(Output, CommandsNoTerminalInAnyForm) {
  const std::vector<std::string> names = EveryHostileName();
  library::InRange(Named(names));
  for (const char* szForm : {"--verbose", "--json", "--porcelain"}) {
    std::string out = Tool({"scan", szForm}).out;
    EXPECT_GE(out.size(), names.size() * std::strlen("a?z"));
    std::erase_if(out, [](char byte) { return byte == '\n' || byte == '\t'; });
    Rewritten(out, true, [](const Character& character) {
      EXPECT_TRUE(character.shown) << Hex(character.bytes);
      return std::string();
    });
  }
}

TEST_F(Output, WritesOutInJsonWhatIsNotShown) {
  library::InRange(
      {Network("\x1b[2J\x7f\xc2\x9b"
               "1m\xe2\x80\xae\xf3\xa0\x80\x81\x9b\xc3\xa9")});
  EXPECT_THAT(Tool({"scan", "--json"}).out,
              HasSubstr("\"name\":\"\\u001b[2J\\u007f\\u009b1m\\u202e\\udb40\\udc01\xef\xbf\xbd\xc3\xa9\","));
}

TEST_F(Output, GivesEveryNameAsItIsInJson) {
  const std::vector<std::string> names = EveryHostileName();
  library::InRange(Named(names));
  const auto networks = nlohmann::json::parse(Tool({"scan", "--json"}).out)["networks"];
  ASSERT_EQ(networks.size(), names.size());
  for (std::size_t i = 0; i < names.size(); ++i) {
    if (IsUtf8(names[i])) {
      EXPECT_EQ(networks[i]["name"], names[i]);
      EXPECT_EQ(networks[i]["name_hex"], nullptr);
    } else {
      EXPECT_EQ(networks[i]["name_hex"], Hex(names[i]));
    }
  }
}

TEST_F(Output, WritesOutForScriptsWhatIsNotShown) {
  library::InRange(
      {Network("\x1b[2J\x7f\xc2\x9b"
               "1m\xe2\x80\xae\xf3\xa0\x80\x81\x9b\xc3\xa9")});
  EXPECT_THAT(
      Tool({"scan", "--porcelain"}).out,
      testing::StartsWith("\\0033[2J\\0177\\0302\\02331m\\0342\\0200\\0256\\0363\\0240\\0200\\0201\\0233\xc3\xa9\t"));
}

TEST_F(Output, GivesScriptsEveryNameAsItIsThroughPrintf) {
  std::string names;
  for (const std::string& name : EveryHostileName()) names += name + ".";
  library::InRange(Named(EveryHostileName()));
  WriteText("/tmp/lines", Tool({"scan", "--porcelain"}).out);
  EXPECT_EQ(Shell("cut -f 1 /tmp/lines | while IFS= read -r name; do printf '%b.' \"$name\"; done"), names);
}

// In it the second byte of this letter is a control.
TEST_F(Output, OfAllFormsIsAsciiOnATerminalThatIsNot) {
  library::InRange({Network("\u00DB")});
  const Surroundings surroundings{.environment = {{"LC_ALL", "C"}, {"NO_COLOR", "1"}}};
  EXPECT_THAT(ToolOnTerminal({"scan"}, 80, surroundings).out, HasSubstr("\n\\xc3\\x9b "));
  EXPECT_THAT(ToolOnTerminal({"scan", "--json"}, 80, surroundings).out, HasSubstr(R"("name":"\u00db")"));
  EXPECT_THAT(ToolOnTerminal({"scan", "--porcelain"}, 80, surroundings).out, testing::StartsWith("\\0303\\0233\t"));
}

TEST_F(Output, ForMachinesDoesNotDependOnTheLocale) {
  for (const char* szForm : {"--json", "--porcelain"}) {
    EXPECT_EQ(Tool({"scan", szForm}, {.environment = {{"LC_ALL", "C"}}}).out, Tool({"scan", szForm}).out);
  }
}

TEST_F(Output, GivesAllBytesOfANameThatIsNoTextInJson) {
  library::InRange({Network("caf\xe9")});
  EXPECT_THAT(Tool({"scan", "--json"}).out, HasSubstr(R"("name_hex":"636166e9")"));
}

TEST_F(Output, KeepsToAsciiWhereTheLocaleDoes) {
  const std::string out = Tool({"scan"}, {.environment = {{"LC_ALL", "C"}}}).out;
  EXPECT_THAT(out, HasSubstr("Caf\\xc3\\xa9 du coin  ###.  74"));
}

TEST_F(Output, AlignsNamesOfWideCharacters) {
  library::InRange({Network("東京"), Network("abcd")});
  EXPECT_EQ(Tool({"scan"}).out,
            "NAME    SIGNAL  CH  SECURITY  STANDARD  ACCESS POINT       KNOWN\n"
            "東京  ▂▄▆▁  74   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0A  -\n"
            "abcd  ▂▄▆▁  74   6  WPA2 AES  11b/g/n   0A:0A:0A:0A:0A:0A  -\n");
}

TEST_F(Output, HasColourOnATerminal) {
  EXPECT_THAT(ToolOnTerminal({"scan"}).out, HasSubstr("\x1b[32m▂▄▆▁  74\x1b[0m"));
}

TEST_F(Output, HasNoColourElsewhereNorWhereItIsNotWanted) {
  EXPECT_THAT(Tool({"scan"}).out, Not(HasSubstr("\x1b")));
  EXPECT_THAT(ToolOnTerminal({"scan"}, 80, {.environment = {{"NO_COLOR", "1"}}}).out, Not(HasSubstr("\x1b")));
  EXPECT_THAT(ToolOnTerminal({"scan"}, 80, {.environment = {{"TERM", "dumb"}}}).out, Not(HasSubstr("\x1b")));
}

TEST_F(Output, FitsItsTablesToTheTerminal) {
  library::InRange({Network("a name that is thirty-two long!!", WIRELESS_AUTH_WPA2PSK,
                            static_cast<WIRELESS_ENCRYPT>(WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES))});
  const std::string out = ToolOnTerminal({"scan"}, 80, {.environment = {{"NO_COLOR", "1"}}}).out;
  EXPECT_THAT(out, HasSubstr("\na name that is…  ▂▄▆▁  74   6  WPA2 TKIP+AES  11b/g/n   0A:0A:0A:0A:0A:0A  -\r\n"));
}

TEST_F(Output, ThatCannotBeWrittenIsAFailure) {
  testing::internal::CaptureStderr();
  const int status = RunInChild([] {
    if (std::freopen("/dev/full", "w", stdout) == nullptr) return 99;
    const char* argv[] = {"merowireless", "status"};
    return RunProgram(2, argv);
  });
  EXPECT_EQ(status, 1);
  EXPECT_THAT(testing::internal::GetCapturedStderr(),
              HasSubstr("merowireless: the output could not be written: look at where it goes\n"));
}

TEST_F(Output, OfTheStatusNamesWhatThereIs) {
  library::Connected("Home");
  EXPECT_EQ(Tool({"status"}).out,
            "status        connected\n"
            "network       Home\n"
            "security      WPA2\n"
            "standard      11b/g/n\n"
            "interface     wlan0\n"
            "address       -\n"
            "netmask       -\n"
            "radio         on\n"
            "access point  -\n"
            "signal        -\n"
            "channel       -\n"
            "rate          -\n"
            "gateway       -\n"
            "name servers  -\n"
            "since         -\n");
  EXPECT_EQ(Tool({"status", "--json"}).out,
            R"({"result":"ok","status":{"state":"connected","name":"Home","auth":"WPA2PSK","standard":"11b/g/n",)"
            R"("mode":"MANAGED","interface":"wlan0","ip":null,"mask":null,"radio":"on","name_hex":null,)"
            R"("access_point":null,"signal_dbm":null,"channel":null,"rate_kbps":null,"gateway":null,)"
            R"("name_servers":null,"since":null}})"
            "\n");
  EXPECT_EQ(Tool({"status", "--porcelain"}).out,
            "connected\tHome\tWPA2PSK\t11b/g/n\tMANAGED\twlan0\t\t\ton\t\t\t\t\t\t\t\t\n");
}

TEST_F(Output, OfTheStatusLeavesOutAStandardThatNoScanHasTold) {
  library::Connected("Home");
  library::MEROWirelessCurInfoGet = [](WIRELESS_REQUEST, PWIRELESS_INFO) { return 0; };
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("\nstandard      -\n"));
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("standard":"unknown")"));
}

// It was "UNKNOWN" once the supplicant had changed to another access point of the network: the library notes the
// protection of the one that it joined.
TEST_F(Output, OfTheStatusTellsTheProtectionWhicheverAccessPointItIs) {
  library::Connected("Home");
  library::MEROWirelessCurInfoGet = [](WIRELESS_REQUEST request, PWIRELESS_INFO info) {
    if (request == REQUEST_ESSID) std::strcpy(info->szEssid, "Home");
    if (request == REQUEST_AUTH) info->auth = WIRELESS_AUTH_UNKNOWN;
    return 0;
  };
  const auto isTold = [](const char* szAuth) {
    return HasSubstr(std::string(R"("name":"Home","auth":")") + szAuth + '"');
  };
  EXPECT_THAT(Tool({"status", "--json"}).out, isTold("UNKNOWN"));
  const std::string settings =
      "network={\n\tssid=\"Home\"\n\tkey_mgmt=WPA-PSK\n\tpairwise=CCMP\n\tpsk=\"open sesame\"\n}\n";
  WriteText("/usr/mero/etc/wpa_supplicant.conf", settings);
  EXPECT_THAT(Tool({"status", "--json"}).out, isTold("WPA2PSK"));
  WIRELESS_NETWORK_CONFIG newest = library::Home();
  newest.network.auth = WIRELESS_AUTH_OPEN;
  newest.szKey[0] = '\0';
  WIRELESS_NETWORK_CONFIG old = library::Home();
  old.network.auth = WIRELESS_AUTH_WPAPSK;
  library::Known({newest, old});
  EXPECT_THAT(Tool({"status", "--json"}).out, isTold("WPAPSK"));
  WriteText("/usr/mero/etc/wpa_supplicant.conf", "network={\n\tssid=\"Office\"\n\tkey_mgmt=NONE\n}\n");
  EXPECT_THAT(Tool({"status", "--json"}).out, isTold("UNKNOWN"));
}

TEST_F(Output, OfTheStatusTellsAnAccessPoint) {
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_UNKNOWN; };
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("status        unknown\n"));
  kernel::BecomeAccessPoint("Office");
  EXPECT_THAT(Tool({"status"}).out, HasSubstr("status        an access point (see `merowireless ap status`)\n"));
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("state":"access-point","name":null)"));
  EXPECT_EQ(Tool({"status", "--porcelain"}).out, "access-point\t\t\t\t\twlan0\t\t\ton\t\t\t\t\t\t\t\t\n");
}

TEST_F(Output, OfAFailureIsASentenceAndInJsonADocumentToo) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  const Ran ran = Tool({"connect", "Home", "--json"});
  EXPECT_EQ(ran.status, 3);
  EXPECT_EQ(ran.err, "merowireless: no adapter is plugged in: plug in a wireless USB adapter and try again\n");
  EXPECT_EQ(ran.out, R"({"result":"failed","code":3,"error":"no adapter is plugged in",)"
                     R"("advice":"plug in a wireless USB adapter and try again","reason":"no-adapter"})"
                     "\n");
  EXPECT_EQ(Tool({"connect", "Home", "--porcelain"}).out, "");
}

// The rows of a table in a document whose cells are a number and a word in backquotes.
std::map<int, std::string> WordsIn(const std::string& document) {
  std::map<int, std::string> words;
  std::istringstream lines(document);
  for (std::string line; std::getline(lines, line);) {
    int number = 0;
    char szWord[32];
    if (std::sscanf(line.c_str(), "| %d | `%31[^`]` |", &number, szWord) == 2) words[number] = szWord;
  }
  return words;
}

TEST_F(Output, OfAFailureHasTheWordForItsExitStatusThatIsDocumented) {
  std::map<int, std::string> words;
  for (const ExitMeaning& meaning : kExitMeanings) words[static_cast<int>(meaning.exit)] = meaning.word;
  words.erase(0);
  EXPECT_EQ(words, WordsIn(ReadText(MERO_SOURCE "/docs/json.md")));

  library::MEROWirelessCheckBlock = [] { return 0; };
  const std::vector<std::vector<std::string>> failures = {
      {"radio", "sideways"}, {"forget", "Nowhere"}, {"connect", "a"}};
  for (std::vector<std::string> command : failures) {
    command.emplace_back("--json");
    const Ran ran = Tool(command);
    EXPECT_EQ(nlohmann::json::parse(ran.out)["reason"], words[ran.status]) << ran.out;
  }
}

// There were texts without a character, where other fields had null.
TEST_F(Output, IsNullInJsonWhereNothingIsMeant) {
  WIRELESS_NETWORK_CONFIG open{};
  open.network = Network("open", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
  library::Known({open});
  EXPECT_THAT(Tool({"known", "--json", "--show-secrets"}).out,
              HasSubstr(R"("ip":null,"mask":null,"gateway":null,"saved":null,)"));
  const auto settings = nlohmann::json::parse(Tool({"ap", "show", "--json", "--show-secrets"}).out)["access_point"];
  for (const char* szKey : {"ssid", "bridge", "guest_net_ssid", "secret", "guest_net_secret"}) {
    EXPECT_TRUE(settings[szKey].is_null()) << szKey << settings;
  }
}

}  // namespace
