// The command line.
#include <algorithm>
#include <sstream>

#include "running.h"

using testing::HasSubstr;
using testing::MatchesRegex;

namespace {

class CommandLine : public ToolTest {};

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
  EXPECT_EQ(Tool({"bogus"}).err, "merowireless: there is no such command: `merowireless --help` tells more\n");
  EXPECT_EQ(Tool({"ap", "bogus"}).err, "merowireless: there is no such command: `merowireless --help` tells more\n");
  EXPECT_EQ(Tool({"ap"}).err, "merowireless: a command is missing: `merowireless --help` tells more\n");
}

TEST_F(CommandLine, ThatIsWrongIsExplainedToMachinesToo) {
  const std::string document = R"({"result":"failed","code":2,"error":"there are more arguments than were expected",)"
                               R"("advice":"`merowireless --help` tells more","reason":"wrong-usage"})"
                               "\n";
  EXPECT_EQ(Tool({"--json", "scan", "--bogus"}).out, document);
  EXPECT_EQ(Tool({"scan", "--bogus", "--json"}).out, document);
  EXPECT_THAT(Tool({"scan", "--json", "--porcelain"}).out, HasSubstr("--json excludes --porcelain"));
}

TEST_F(CommandLine, ThatIsWrongIsNotRepeatedSinceItMayHoldASecret) {
  const std::vector<std::vector<std::string>> wrong = {{"save", "Home", "open-sesame"},
                                                       {"save", "Home", "--key-stdin=open-sesame"},
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

TEST_F(CommandLine, ExplainsItselfOnRequest) {
  const Ran ran = Tool({"--help"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(Tool({"ap", "set", "--help"}).out, HasSubstr("--channel N|auto"));
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

// Columns, where every byte but the continuation of a character is one.
std::size_t WidthOf(std::string_view line) {
  return static_cast<std::size_t>(std::ranges::count_if(line, [](char byte) { return (byte & 0xC0) != 0x80; }));
}

TEST_F(CommandLine, HasHelpThatFitsATerminal) {
  std::vector<std::vector<std::string>> commands = {{}};
  for (const std::string& command : CommandsOf()) commands.push_back({command});
  for (const std::string& command : CommandsOf({"ap"})) commands.push_back({"ap", command});
  EXPECT_THAT(commands, testing::IsSupersetOf<std::vector<std::string>>({{"scan"}, {"ap", "set"}}));
  for (std::vector<std::string>& words : commands) {
    words.emplace_back("--help");
    std::istringstream help(Tool(words).out);
    for (std::string line; std::getline(help, line);) EXPECT_LE(WidthOf(line), 80U) << line;
  }
}

}  // namespace
