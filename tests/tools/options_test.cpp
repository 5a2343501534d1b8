// The command line and its completions.
#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <sstream>

#include "ap_settings.h"
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
      {"scan", "--json", "--porcelain"},
  };
  for (const auto& arguments : wrong) {
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, 2) << testing::PrintToString(arguments);
    EXPECT_EQ(ran.out, "");
    EXPECT_THAT(ran.err, MatchesRegex("merowireless: [^\n]+\n")) << testing::PrintToString(arguments);
  }
}

TEST_F(CommandLine, ThatIsWrongIsNotRepeatedSinceItMayHoldASecret) {
  const std::vector<std::vector<std::string>> wrong = {{"save", "Home", "open-sesame"},
                                                       {"save", "Home", "--key-stdin=open-sesame"},
                                                       {"mode", "open-sesame"},
                                                       {"radio", "open-sesame"},
                                                       {"watch", "--count", "open-sesame"},
                                                       {"gateway", "open-sesame"},
                                                       {"ap", "set", "--hidden", "open-sesame"}};
  for (const auto& arguments : wrong) {
    const Ran ran = Tool(arguments);
    EXPECT_EQ(ran.status, 2) << testing::PrintToString(arguments);
    EXPECT_THAT(ran.out + ran.err, testing::Not(HasSubstr("sesame"))) << testing::PrintToString(arguments);
  }
}

TEST_F(CommandLine, ExplainsItselfOnRequest) {
  const Ran ran = Tool({"--help"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(ran.out, HasSubstr("5 secret refused"));
  EXPECT_THAT(Tool({"ap", "set", "--help"}).out, HasSubstr("--channel VALUE"));
}

const char* const kCommands[] = {"scan",        "known",      "save",   "forget", "connect",
                                 "autoconnect", "disconnect", "status", "watch",  "address",
                                 "gateway",     "adhoc",      "ap",     "mode",   "radio"};

// Columns, where every byte but the continuation of a character is one.
std::size_t WidthOf(std::string_view line) {
  return std::ranges::count_if(line, [](char byte) { return (byte & 0xC0) != 0x80; });
}

TEST_F(CommandLine, HasHelpThatFitsATerminal) {
  std::vector<std::vector<std::string>> commands = {
      {}, {"ap", "show"}, {"ap", "set"}, {"ap", "enable"}, {"ap", "disable"}, {"ap", "status"}};
  for (const char* szCommand : kCommands) commands.push_back({szCommand});
  for (std::vector<std::string>& words : commands) {
    words.emplace_back("--help");
    std::istringstream help(Tool(words).out);
    for (std::string line; std::getline(help, line);) EXPECT_LE(WidthOf(line), 80U) << line;
  }
}

// What bash would offer for the last word of a line.
std::string Offered(const std::string& line) {
  const std::string script =
      "source " MERO_COMPLETIONS "/merowireless.bash; COMP_WORDS=(" + line +
      "); COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _merowireless; printf '%s ' \"${COMPREPLY[@]}\"";
  WriteText("/tmp/complete", script);
  FILE* pipe = ::popen("bash /tmp/complete 2>&1", "r");
  char text[4096] = "";
  const std::size_t size = std::fread(text, 1, sizeof text, pipe);
  ::pclose(pipe);
  return {text, size};
}

TEST_F(CommandLine, IsCompletedByBash) {
  for (const char* szCommand : kCommands) {
    EXPECT_THAT(Offered("merowireless ''"), HasSubstr(std::string(szCommand) + " "));
  }
  EXPECT_EQ(Offered("merowireless sc"), "scan ");
  EXPECT_THAT(Offered("merowireless --json scan --r"), "--renew ");
  EXPECT_EQ(Offered("merowireless mode ''"), "ap client ");
  EXPECT_EQ(Offered("merowireless ap ''"), "show set enable disable status ");
  for (const ApSetting& setting : ApSettings()) {
    if (setting.szOption == nullptr) continue;
    EXPECT_THAT(Offered("merowireless ap set --"), HasSubstr("--" + std::string(setting.szOption) + " "));
  }
  EXPECT_EQ(Offered("merowireless ap set --security w"), "wep wpa wpa2 ");
}

TEST_F(CommandLine, HasEveryCommandAndSettingInTheCompletionOfZsh) {
  const std::string zsh = ReadText(MERO_COMPLETIONS "/_merowireless");
  for (const char* szCommand : kCommands) EXPECT_THAT(zsh, HasSubstr("'" + std::string(szCommand) + ":"));
  for (const ApSetting& setting : ApSettings()) {
    if (setting.szOption == nullptr) continue;
    EXPECT_THAT(zsh, HasSubstr("'--" + std::string(setting.szOption) + "["));
  }
}

TEST_F(CommandLine, HasEveryCommandInItsHelp) {
  const std::string help = Tool({"--help"}).out;
  for (const char* szCommand : kCommands) EXPECT_THAT(help, HasSubstr("\n  " + std::string(szCommand) + " "));
}

}  // namespace
