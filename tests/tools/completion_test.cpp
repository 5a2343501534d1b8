// The completions: a line is typed into an interactive shell and run, and the program in its place tells what it is
// given.
#include <sys/stat.h>

#include <cstdio>
#include <ostream>
#include <utility>

#include "model/ap_settings.h"
#include "running.h"

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

namespace {

constexpr char kProgramPath[] = "/tmp/bin/merowireless";
constexpr char kKnownPath[] = "/tmp/known";
constexpr char kGivenPath[] = "/tmp/given";

constexpr char kProgram[] = R"(#!/bin/sh
[ "$*" = '--porcelain known' ] && exec cat /tmp/known
case $* in *--help) exec cat "/tmp/help/$*" ;; esac
printf '<%s>' "$@" >/tmp/given
)";

constexpr char kPrompt[] = "ready> ";
constexpr char kAll[] = "\x1b*";  // puts everything that is offered into the line
constexpr char kRun[] = "\a";     // runs the line, and ends the shell whatever comes of it

struct Shell {
  const char* szName;
  std::vector<std::string> command;
  std::map<std::string, std::string> environment;
  const char* szSettingsPath;
  const char* szSettings;
};

const Shell kBash{.szName = "bash",
                  .command = {"bash", "--norc", "-i"},
                  .environment = {{"PROMPT_COMMAND", ". /tmp/settings"}, {"INPUTRC", "/dev/null"}},
                  .szSettingsPath = "/tmp/settings",
                  .szSettings = R"sh(
unset PROMPT_COMMAND
. )sh" MERO_COMPLETIONS R"sh(/merowireless.bash
run() { eval "$(history -p "$READLINE_LINE")"; exit; }
bind -x '"\C-g": run'
PS1='ready> '
)sh"};

const Shell kZsh{.szName = "zsh",
                 .command = {"zsh", "-d", "-i"},
                 .environment = {{"ZDOTDIR", "/tmp/zsh"}},
                 .szSettingsPath = "/tmp/zsh/.zshrc",
                 .szSettings = R"sh(
# Reading all completions that zsh brings takes a second; these are the parts that others are made of.
fpath=()sh" MERO_COMPLETIONS R"sh( ${(M)fpath:#*/Completion(|/Base|/Unix)})
autoload -U compinit
compinit -u
zle -C all complete-word _generic
bindkey '^[*' all
zstyle ':completion:all::::' completer _all_matches _complete
zstyle ':completion:all:*' insert true
setopt nobanghist
run() { eval $BUFFER; exit }
zle -N run
bindkey '^G' run
PS1='ready> '
)sh"};

void PrintTo(const Shell& shell, std::ostream* out) {
  *out << shell.szName;
}

class Completion : public ToolTest, public testing::WithParamInterface<Shell> {
 protected:
  Completion() {
    for (const char* szPath : {"/tmp/bin", "/tmp/zsh", "/tmp/files", "/tmp/files/sub dir", "/tmp/help"})
      ::mkdir(szPath, 0755);
    WriteText("/tmp/files/a key", "open sesame\n");
    WriteText(kProgramPath, kProgram);
    ::chmod(kProgramPath, 0755);
    WriteText(GetParam().szSettingsPath, GetParam().szSettings);
    KeepHelp({});
    for (const std::string& command : CommandsOf()) KeepHelp({command});
    for (const std::string& command : CommandsOf({"ap"})) KeepHelp({"ap", command});
  }

  // What the program says to --help, for the one in its place to say the same.
  static void KeepHelp(std::vector<std::string> words) {
    std::string path = "/tmp/help/";
    for (const std::string& word : words) path += word + " ";
    words.emplace_back("--help");
    WriteText(path + "--help", Tool(words).out);
  }

  // The arguments that the program is given by a line, each in <>.
  static std::string Given(const std::string& typed) {
    const Shell& shell = GetParam();
    Surroundings surroundings{.environment = shell.environment};
    surroundings.environment["PATH"] = "/tmp/bin:/usr/bin:/bin";
    surroundings.environment["HOME"] = "/tmp";
    ::remove(kGivenPath);
    const Ran ran = CommandOnTerminal(shell.command, surroundings, {kPrompt, "merowireless " + typed + kRun});
    const std::string given = ReadText(kGivenPath);
    return given.empty() ? "nothing, and the terminal shows: " + ran.out : given;
  }

  static void ExpectGiven(const std::vector<std::pair<std::string, std::string>>& rows) {
    for (const auto& [typed, given] : rows) EXPECT_EQ(Given(typed), given) << typed;
  }
};

std::string In(const std::string& word) {
  return "<" + word + ">";
}

TEST_P(Completion, OffersEveryCommand) {
  const std::vector<std::string> commands = CommandsOf();
  ASSERT_THAT(commands, testing::Contains("scan"));
  const std::string offered = Given(kAll);
  for (const std::string& command : commands) EXPECT_THAT(offered, HasSubstr(In(command)));
  EXPECT_EQ(Given(std::string("ap ") + kAll), "<ap><disable><enable><kick><set><show><stations><status>");
}

// Behind the last one zsh has the sign that a value follows.
TEST_P(Completion, OffersEverySettingOfTheAccessPoint) {
  const std::string options = Given(std::string("ap set --") + kAll);
  for (const ApSetting& setting : ApSettings()) {
    if (!setting.hasOption()) continue;
    EXPECT_THAT(options, testing::ContainsRegex("<--" + OptionOf(setting.field.key) + "=?>"));
  }
}

// An x that comes to stand alone shows that a blank has been put after the word.
TEST_P(Completion, KnowsWhatACommandCanBeGiven) {
  ExpectGiven({
      {"sc\tx", "<scan><x>"},
      {"--json scan --r\tx", "<--json><scan><--renew><x>"},
      {"mode c\tx", "<mode><client><x>"},
      {"ap se\tx", "<ap><set><x>"},
      {"ap --json set --wpa\t tk\tx", "<ap><--json><set><--wpa-encrypt-type><tkip><x>"},
  });
}

TEST_P(Completion, KnowsTheValuesOfOptionsAfterABlankAndAfterAnEqualsSign) {
  ExpectGiven({
      {"ap set --encryption mi\tx", "<ap><set><--encryption><mixed><x>"},
      {"ap set --encryption=mi\tx", "<ap><set><--encryption=mixed><x>"},
      {"save --security mi\tx", "<save><--security><mix>"},
      {"save --security=wpa-\tx", "<save><--security=wpa-eap><x>"},
      {"ap set --guest-net-allow-http=n\tx", "<ap><set><--guest-net-allow-http=no><x>"},
  });
}

TEST_P(Completion, GoesOnWithFilesAndDirectories) {
  ExpectGiven({
      {"save --key-file /tmp/files/a\tx", "<save><--key-file></tmp/files/a key><x>"},
      {"save --key-file=/tmp/files/a\tx", "<save><--key-file=/tmp/files/a key><x>"},
      {"save --key-file \"/tmp/files/a\tx", "<save><--key-file></tmp/files/a key><x>"},
      {"ap set --wifi-sched /tmp/files/s\tx", "<ap><set><--wifi-sched></tmp/files/sub dir/x>"},
      {"ap set --wifi-sched=/tmp/files/s\tx", "<ap><set><--wifi-sched=/tmp/files/sub dir/x>"},
      {"export /tmp/files/a\tx", "<export></tmp/files/a key><x>"},
  });
}

class CompletionOfNames : public Completion {
 protected:
  CompletionOfNames() {
    std::vector<WIRELESS_NETWORK_CONFIG> configs;
    for (const char* szName :
         {"Home", "Cafe Deluxe", "co:lon one", "me@home", "pay $me", "Hey!You", "back\\slash", "it's \"it\"", "Guests'",
          "tab\tbed", "-dash", "a=b", "Größe", "back\\0slash", "mark\u202Eed"}) {
      configs.emplace_back().network = library::Network(szName);
    }
    library::Known(configs);
    WriteText(kKnownPath, Tool({"--porcelain", "known"}).out);
  }
};

TEST_P(CompletionOfNames, WritesThemAsOneArgument) {
  ExpectGiven({
      {"connect Ho\tx", "<connect><Home><x>"},
      {"forget Ca\tx", "<forget><Cafe Deluxe><x>"},
      {"forget Cafe\\ D\tx", "<forget><Cafe Deluxe><x>"},
      {"forget pay\tx", "<forget><pay $me><x>"},
      {"forget Hey\tx", "<forget><Hey!You><x>"},
      {"forget back\\\\s\tx", "<forget><back\\slash><x>"},
      {"forget back\\\\0\tx", "<forget><back\\0slash><x>"},
      {"forget it\tx", "<forget><it's \"it\"><x>"},
      {"forget Gr\tx", "<forget><Größe><x>"},
  });
}

TEST_P(CompletionOfNames, GoesOnAfterCharactersAtWhichBashTakesWordsApart) {
  ExpectGiven({
      {"forget co\tx", "<forget><co:lon one><x>"},
      {"forget co:\tx", "<forget><co:lon one><x>"},
      {"forget co:lon\\ o\tx", "<forget><co:lon one><x>"},
      {"forget me@\tx", "<forget><me@home><x>"},
      {"forget me@h\tx", "<forget><me@home><x>"},
      {"forget a=\tx", "<forget><a=b><x>"},
  });
}

TEST_P(CompletionOfNames, GoesOnInOpenedQuotes) {
  ExpectGiven({
      {"forget \"Hey\tx", "<forget><Hey!You><x>"},
      {"forget \"Cafe D\tx", "<forget><Cafe Deluxe><x>"},
      {"forget 'Cafe D\tx", "<forget><Cafe Deluxe><x>"},
      {"forget \"co:\tx", "<forget><co:lon one><x>"},
      {"forget \"pay\tx", "<forget><pay $me><x>"},
      {"forget \"back\\\\s\tx", "<forget><back\\slash><x>"},
      {"forget \"it\tx", "<forget><it's \"it\"><x>"},
      {"forget 'it\tx", "<forget><it's \"it\"><x>"},
      {"forget 'Guests\tx", "<forget><Guests'><x>"},
  });
}

TEST_P(CompletionOfNames, LeavesOutThoseThatWouldBeOptions) {
  EXPECT_THAT(Given(std::string("forget ") + kAll), AllOf(HasSubstr("<Home>"), Not(HasSubstr("dash"))));
  EXPECT_EQ(Given("forget -d\tx"), "<forget><-dx>");
}

TEST_P(CompletionOfNames, OffersNoneInTheWayThatPorcelainWritesIt) {
  EXPECT_THAT(Given(std::string("forget ") + kAll), AllOf(HasSubstr("<Home>"), Not(HasSubstr("tab\\tbed"))));
}

// A mark of direction was put into the line, as if it could be seen.
TEST_P(CompletionOfNames, HidesNothingInTheLine) {
  EXPECT_THAT(Given(std::string("forget ") + kAll), AllOf(HasSubstr("<Home>"), Not(HasSubstr("\u202E"))));
}

std::string NameOf(const testing::TestParamInfo<Shell>& of) {
  return of.param.szName;
}

INSTANTIATE_TEST_SUITE_P(Shells, Completion, testing::Values(kBash, kZsh), NameOf);
INSTANTIATE_TEST_SUITE_P(Shells, CompletionOfNames, testing::Values(kBash, kZsh), NameOf);

}  // namespace
