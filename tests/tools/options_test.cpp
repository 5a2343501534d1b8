// The command line.
#include <algorithm>
#include <cstdlib>
#include <new>
#include <sstream>

#include "app/options.h"
#include "base/text.h"
#include "running.h"

using testing::Contains;
using testing::HasSubstr;
using testing::MatchesRegex;

namespace {

std::size_t allocations = 0;

}  // namespace

// ---- Memory, counted: each way to get some that these ways to give it back belong to ----

void* operator new(std::size_t size) {
  ++allocations;
  if (void* memory = std::malloc(size)) return memory;
  throw std::bad_alloc();
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
  ++allocations;
  return std::malloc(size);
}

void operator delete(void* memory) noexcept {
  std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept {
  std::free(memory);
}

namespace {

class CommandLine : public ToolTest {
 protected:
  // The words of each; the first has none.
  static std::vector<std::vector<std::string>> EveryCommand() {
    std::vector<std::vector<std::string>> commands = {{}};
    for (const std::string& command : CommandsOf()) commands.push_back({command});
    for (const std::string& command : CommandsOf({"ap"})) commands.push_back({"ap", command});
    EXPECT_THAT(commands, testing::IsSupersetOf<std::vector<std::string>>({{"scan"}, {"ap", "set"}}));
    return commands;
  }
};

TEST_F(CommandLine, ThatIsWrongIsExplainedInOneLine) {
  const std::vector<std::vector<std::string>> wrong = {
      {},
      {"bogus"},
      {"scan", "--bogus"},
      {"save"},
      {"ap"},
      {"ap", "bogus"},
      {"mode", "both"},
      {"watch", "--count", "0"},
      {"watch", "--count", "+1"},
      {"watch", "--count", " 1"},
      {"watch", "--count", "0x2"},
      {"radio", "sideways"},
  };
  for (const auto& arguments : wrong) {
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, 2) << testing::PrintToString(arguments);
    EXPECT_EQ(ran.out, "");
    EXPECT_THAT(ran.err, MatchesRegex("merowireless: [^\n]+\n")) << testing::PrintToString(arguments);
  }
}

TEST_F(CommandLine, ThatNamesNoCommandIsToldSo) {
  EXPECT_EQ(Tool({"bogus"}).err, "merowireless: there is no such command: `merowireless --help` lists them\n");
  EXPECT_EQ(Tool({"ap", "bogus"}).err, "merowireless: there is no such command: `merowireless ap --help` lists them\n");
  EXPECT_EQ(Tool({"ap"}).err, "merowireless: a command is missing: `merowireless ap --help` lists them\n");
}

TEST_F(CommandLine, ThatHasTooMuchIsToldSo) {
  EXPECT_EQ(Tool({"save", "Home", "--key-stdin=x"}).err,
            "merowireless: an option takes no value and was given one: `merowireless save --help` tells more\n");
}

TEST_F(CommandLine, ThatMisspellsACommandIsToldTheOneThatIsMeant) {
  const std::pair<std::vector<std::string>, std::string> rows[] = {
      {{"scna"}, "scan"},       {{"conect", "Home"}, "connect"}, {{"stauts", "--json"}, "status"},
      {{"disc"}, "disconnect"}, {{"ap", "enabel"}, "enable"},
  };
  for (const auto& [words, meant] : rows) {
    EXPECT_THAT(Tool(words).err, HasSubstr("there is no such command: is " + meant + " meant? ")) << words.front();
  }
}

// All that was said of one was that there were more arguments than expected.
TEST_F(CommandLine, ThatHasAnUnknownOptionIsToldItAndTheOneThatIsMeant) {
  const std::pair<std::vector<std::string>, std::string> rows[] = {
      {{"scan", "--renwe"},
       "there is no option --renwe: is --renew meant? `merowireless scan --help` lists those that "},
      {{"scan", "--bogus"}, "there is no option --bogus: `merowireless scan --help` lists those that there are\n"},
      {{"scan", "--jsn"}, "there is no option --jsn: is --json meant? "},
      {{"--porcelian", "scan"}, "there is no option --porcelian: is --porcelain meant? "},
      {{"--bogus"}, "there is no option --bogus: `merowireless --help` lists"},
      {{"save", "Home", "--key"}, "there is no option --key: is --key-file meant? "},
      {{"ap", "set", "--chanel", "6"},
       "there is no option --chanel: is --channel meant? `merowireless ap set --help` "},
      {{"scan", "-x"}, "there is no option -x: `merowireless scan --help` lists"},
  };
  for (const auto& [words, message] : rows) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, 2);
    EXPECT_THAT(ran.err, HasSubstr("merowireless: " + message)) << testing::PrintToString(words);
  }
}

// The secret was asked for where the name of its file was empty, and else "1 required TEXT missing" was said.
TEST_F(CommandLine, ThatLacksTheValueOfAnOptionIsToldWhichOne) {
  const std::pair<std::vector<std::string>, std::string> rows[] = {
      {{"save", "Home", "--key-file"}, "--key-file is given without its value: write --key-file FILE\n"},
      {{"save", "Home", "--key-file", "--ip", "DHCP"}, "--key-file is given without its value: "},
      {{"save", "Home", "--key-file", ""}, "--key-file is given without its value: "},
      {{"ap", "set", "--guest-net-key-file", ""}, "--guest-net-key-file is given without its value: "},
      {{"watch", "--count"}, "--count is given without its value: write --count N\n"},
      {{"ap", "set", "--encryption"}, "--encryption is given without its value: write --encryption open|wep|wpa|wpa2|"},
  };
  for (const auto& [words, message] : rows) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, 2);
    EXPECT_THAT(ran.err, HasSubstr("merowireless: " + message)) << testing::PrintToString(words);
  }
}

TEST_F(CommandLine, ThatIsWrongIsExplainedToMachinesToo) {
  const std::string document = R"({"result":"failed","code":2,"error":"there are more arguments than were expected",)"
                               R"("advice":"`merowireless scan --help` tells more","reason":"wrong-usage"})"
                               "\n";
  EXPECT_EQ(Tool({"--json", "scan", "bogus"}).out, document);
  EXPECT_EQ(Tool({"scan", "bogus", "--json"}).out, document);
  EXPECT_THAT(Tool({"scan", "--json", "--porcelain"}).out, HasSubstr("--json excludes --porcelain"));
}

TEST_F(CommandLine, ThatIsWrongIsNotRepeatedSinceItMayHoldASecret) {
  const std::vector<std::vector<std::string>> wrong = {{"save", "Home", "open-sesame"},
                                                       {"save", "Home", "--key-stdin=open-sesame"},
                                                       {"save", "Home", "--key=open-sesame"},
                                                       {"save", "Home", "--pass", "open-sesame"},
                                                       {"save", "Home", "-popen-sesame"},
                                                       {"save", "Home", "--", "-open-sesame"},
                                                       {"open-sesame"},
                                                       {"mode", "open-sesame"},
                                                       {"radio", "open-sesame"},
                                                       {"watch", "--count", "open-sesame"},
                                                       {"gateway", "open-sesame"},
                                                       {"ap", "set", "--wmm-enabled", "open-sesame"}};
  for (const auto& arguments : wrong) {
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, 2) << testing::PrintToString(arguments);
    EXPECT_THAT(ran.out + ran.err, testing::Not(HasSubstr("sesame"))) << testing::PrintToString(arguments);
  }
}

// `scan`, `save` and `mode` waited for one, and `ap enable` asked for settings first.
TEST_F(CommandLine, ThatNeedsAnAdapterIsToldAtOnceThatThereIsNone) {
  library::MEROWirelessAdapterNum = [] { return 0; };
  const std::vector<std::vector<std::string>> needy = {
      {"scan"},           {"scan", "--renew"}, {"save", "Home"},        {"connect", "Home"},     {"autoconnect"},
      {"adhoc", "Bench"}, {"address", "DHCP"}, {"gateway", "10.0.0.1"}, {"adhoc", "x", "--wep"}, {"ap", "enable"},
      {"mode", "ap"},     {"mode", "client"}};
  for (const auto& words : needy) {
    const Ran ran = ToolOnTerminal(words);  // which could be asked for a secret
    EXPECT_EQ(ran.status, 3) << testing::PrintToString(words);
    EXPECT_THAT(ran.out, testing::StartsWith("merowireless: no adapter is plugged in: ")) << ran.out;
  }
  EXPECT_THAT(library::Calls(), testing::IsEmpty());
  EXPECT_EQ(Tool({"save", "Hidden", "--bssid", "00:11:22:33:44:55", "--security", "open"}).status, 0);
}

// Each of these words had to be in small letters, and DHCP in capitals.
TEST_F(CommandLine, HasItsWordsInCapitalsOrInSmallLetters) {
  WriteText("/tmp/secret", "open sesame\n");
  library::SavedAp(library::Office());
  library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(std::string(config->szIp) + "|" + std::to_string(config->network.auth));
    return 0;
  };
  kernel::BecomeAccessPoint("Office");
  library::MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
    library::Record(std::to_string(mode));
    return kernel::BecomeClient(), TRUE;
  };
  const std::pair<std::vector<std::string>, std::string> rows[] = {
      {{"save", "Hidden", "--bssid", "00:11:22:33:44:55", "--security", "WPA2", "--key-file", "/tmp/secret", "--ip",
        "dhcp"},
       "DHCP|5"},
      {{"save", "Hidden", "--bssid", "00:11:22:33:44:55", "--security", "Open", "--ip", "None"}, "|1"},
      {{"mode", "Client"}, "1"},
      {{"radio", "ON"}, "PLIBCFileSetSectionValue"},
      {{"radio", "Off"}, "PLIBCFileSetSectionValue"},
      {{"address", "dhcp"}, "MEROWirelessIfconfigSet"},
  };
  for (const auto& [words, done] : rows) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, 0) << ran.err;
    EXPECT_THAT(library::Calls(), Contains(done)) << testing::PrintToString(words);
  }
  const Ran ran = Tool({"ap", "set", "--encryption", "WPA2", "--wpa-encrypt-type", "Both", "--channel", "AUTO",
                        "--wmm-enabled", "No", "--hw-mode", "GN", "--wifi-sched", "OFF", "--json"});
  EXPECT_THAT(ran.out, HasSubstr(R"("encryption":"wpa2","wpa_encrypt_type":"both")")) << ran.err;
  EXPECT_THAT(ran.out, HasSubstr(R"("channel":0,)"));
  EXPECT_THAT(ran.out, HasSubstr(R"("wmm_enabled":false)"));
}

TEST_F(CommandLine, ExplainsItselfOnRequest) {
  const Ran ran = Tool({"--help"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(Tool({"ap", "set", "--help"}).out, HasSubstr("--channel N|auto"));
}

std::size_t AllocationsFor(const std::vector<const char*>& arguments) {
  const std::size_t before = allocations;
  ParseOptions(static_cast<int>(arguments.size()), arguments.data());
  return allocations - before;
}

// Each command took the time that it takes to describe the options of all.
TEST_F(CommandLine, CostsNothingForTheOptionsOfCommandsThatItDoesNotName) {
  const std::size_t few = AllocationsFor({"merowireless", "status"});
  const std::size_t many = AllocationsFor({"merowireless", "ap", "set", "--channel", "6"});
  EXPECT_GT(few, 0U);
  EXPECT_GT(many, 3 * few / 2);
}

TEST_F(CommandLine, TellsTheVersion) {
  const Ran ran = Tool({"--version"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "merowireless " MERO_PROJECT_VERSION "\n");
}

// Who read the help of a command learned of them nowhere.
TEST_F(CommandLine, HasTheOptionsOfEveryCommandInItsHelp) {
  for (std::vector<std::string> words : EveryCommand()) {
    words.emplace_back("--help");
    const std::string help = Tool(words).out;
    for (const char* szOption : {"\n  --json ", "\n  --porcelain ", "\n  -v,--verbose "}) {
      EXPECT_THAT(help, HasSubstr(szOption)) << testing::PrintToString(words);
    }
  }
}

// The help did not have 7.
TEST_F(CommandLine, HasTheExitStatusesOfTheManualInItsHelp) {
  const std::string manual = ReadText(MERO_SOURCE "/docs/man/merowireless.1");
  std::istringstream section(manual.substr(manual.find(".Sh EXIT STATUS")));
  std::vector<std::string> statuses;
  for (std::string line; std::getline(section, line) && line != ".El";) {
    if (line.starts_with(".It ")) statuses.push_back(line.substr(4));
  }
  EXPECT_EQ(statuses.size(), 12U);
  std::string help = Tool({"--help"}).out;
  help.erase(0, help.find("Exit status:"));
  std::istringstream listed(help.substr(0, help.find('.')));
  std::vector<std::string> told;
  for (std::string word; listed >> word;) {
    if (word.find_first_not_of("0123456789") == word.npos) told.push_back(word);
  }
  EXPECT_EQ(told, statuses);
}

TEST_F(CommandLine, HasHelpInWhichALineThatGoesOnIsSeenToDoSo) {
  const std::string help = Tool({"save", "--help"}, {.environment = {{"COLUMNS", "40"}}}).out;
  EXPECT_THAT(
      help, HasSubstr("\n  --security\n      open|wep|wpa|wpa2|wpa-eap|wpa2-eap\n      how a network that hides is\n"));
}

TEST_F(CommandLine, HasHelpThatFitsATerminal) {
  for (std::vector<std::string> words : EveryCommand()) {
    words.emplace_back("--help");
    for (const std::size_t columns : {std::size_t{40}, std::size_t{80}, std::size_t{132}}) {
      std::istringstream help(Tool(words, {.environment = {{"COLUMNS", std::to_string(columns)}}}).out);
      for (std::string line; std::getline(help, line);) EXPECT_LE(WidthOf(line, false), columns) << line;
    }
    const std::string wide = Tool(words).out;
    for (const char* szColumns : {"0", "80", "-1", "wide"}) {
      EXPECT_EQ(Tool(words, {.environment = {{"COLUMNS", szColumns}}}).out, wide) << szColumns;
    }
  }
}

}  // namespace
