// Values in commands for the shell. The shell itself says what it makes of them.
#include "lib/obsolete/shell_words.h"

#include <random>

#include "hostile_texts.h"
#include "tests/support/shell.h"
#include "unit_test.h"

namespace {

// The arguments that a shell passes to a program, for a command with the word and a dot.
std::string PassedOn(const std::string& word) {
  return Shell("printf '<%s>' " + word + " .");
}

class ShellWords : public UnitTest {};

TEST_F(ShellWords, OfOrdinaryCharactersStandAsTheyAre) {
  for (const char* szValue : {"wlan0", "br-lan_2.5:1", "/usr/mero/etc/wireless.conf", "a@b%c+d=e,f", "0123456789",
                              "abcdefghijklmnopqrstuvwxyz", "ABCDEFGHIJKLMNOPQRSTUVWXYZ", "-"}) {
    EXPECT_STREQ(ShellWord(szValue).c_str(), szValue);
  }
}

TEST_F(ShellWords, OfAnyOtherCharacterAreQuoted) {
  const std::string ordinary =
      "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789"
      "_.:/@%+=,-";
  for (int byte = 1; byte < 256; ++byte) {
    const std::string value(1, static_cast<char>(byte));
    const bool asItIs = ShellWord(value).c_str() == value;
    EXPECT_EQ(asItIs, ordinary.find(value) != std::string::npos) << byte;
  }
}

TEST_F(ShellWords, ArePassedOnUnchangedByTheShell) {
  std::string every;
  for (int byte = 1; byte < 256; ++byte) every += static_cast<char>(byte);
  for (const std::string& value : {std::string(), std::string(" "), std::string("'"), std::string("''"),
                                   std::string("it's; $(rm -rf /) `x` \"y\""), std::string("\n"), std::string("\\"),
                                   std::string("*"), std::string("~"), std::string("$HOME"), every}) {
    EXPECT_EQ(PassedOn(ShellWord(value).c_str()), "<" + value + "><.>");
  }
}

TEST_F(ShellWords, ArePassedOnUnchangedWhateverTheBytes) {
  std::mt19937 random(7);
  std::uniform_int_distribution<int> byte(1, 255);
  std::uniform_int_distribution<size_t> size(0, 40);
  for (int i = 0; i < 200; ++i) {
    std::string value(size(random), ' ');
    for (char& c : value) c = static_cast<char>(byte(random));
    EXPECT_EQ(PassedOn(ShellWord(value).c_str()), "<" + value + "><.>");
  }
}

// The longest command has 1024 bytes, its end among them.
TEST_F(ShellWords, AreCutOnlyWhenNoCommandCouldHoldThem) {
  for (const char byte : {'x', ' ', '\'', '$'}) {
    const std::string value(1023, byte);
    EXPECT_EQ(PassedOn(ShellWord(value).c_str()), "<" + value + "><.>");
    for (const size_t size : {1024u, 1025u, 5000u}) {
      EXPECT_GE(std::string_view(ShellWord(std::string(size, byte)).c_str()).size(), 1024u) << size;
    }
  }
}

// ---- Inside double quotes of the command's own ----

std::string InQuotes(const std::string& value) {
  return "\"<" + std::string(ShellQuoted(value).c_str()) + ">\"";
}

TEST_F(ShellWords, InQuotesAreEscapedOnlyWhereTheQuotesEndOrTheShellExpands) {
  const struct {
    const char* szValue;
    const char* szQuoted;
  } rows[] = {
      {"", ""},
      {"802.11n WLAN Stick", "802.11n WLAN Stick"},
      {"it's; <a> & |b| #c (d) [e] {f} *~!?", "it's; <a> & |b| #c (d) [e] {f} *~!?"},
      {"$(x) `y` \"z\"", "\\$(x) \\`y\\` \\\"z\\\""},
      {"a\\", "a\\\\"},
      {"\\$", "\\\\\\$"},
      {"\t\n\xff", "\t\n\xff"},
  };
  for (const auto& row : rows) EXPECT_STREQ(ShellQuoted(row.szValue).c_str(), row.szQuoted);
  for (int byte = 1; byte < 256; ++byte) {
    const std::string value(1, static_cast<char>(byte));
    const bool asItIs = ShellQuoted(value).c_str() == value;
    EXPECT_EQ(asItIs, std::string("\"$`\\").find(value) == std::string::npos) << byte;
  }
}

TEST_F(ShellWords, InQuotesArePassedOnUnchangedByTheShell) {
  ForgetCalls();
  for (const std::string& value : kHostileTexts) {
    EXPECT_EQ(PassedOn(InQuotes(value)), "<<" + value + ">><.>");
  }
  const std::string every = BytesFromTo(1, 255);
  EXPECT_EQ(PassedOn(InQuotes(every)), "<<" + every + ">><.>");
  EXPECT_FALSE(HasIntruder());
}

TEST_F(ShellWords, InQuotesArePassedOnUnchangedWhateverTheBytes) {
  constexpr std::string_view kTelling = "\"\\$`'(){}!x\n ";
  std::mt19937 random(7);
  std::uniform_int_distribution<size_t> size(0, 40);
  for (int i = 0; i < 200; ++i) {
    std::string value(size(random), ' ');
    for (char& c : value) c = kTelling[std::uniform_int_distribution<size_t>(0, kTelling.size() - 1)(random)];
    EXPECT_EQ(PassedOn(InQuotes(value)), "<<" + value + ">><.>");
  }
}

TEST_F(ShellWords, InQuotesAreCutOnlyWhenNoCommandCouldHoldThem) {
  for (const char byte : {'x', ' ', '"', '$'}) {
    const std::string value(1023, byte);
    EXPECT_EQ(PassedOn(InQuotes(value)), "<<" + value + ">><.>");
    for (const size_t size : {1024u, 1025u, 5000u}) {
      EXPECT_GE(std::string_view(ShellQuoted(std::string(size, byte)).c_str()).size(), 1024u) << size;
    }
  }
}

// ---- The commands that they make ----

TEST_F(ShellWords, AreNotNeededForACommandThatStandsAsItIs) {
  EXPECT_STREQ(Command<32>("ps | awk '{print $1}' %s %%").c_str(), "ps | awk '{print $1}' %s %%");
}

TEST_F(ShellWords, MakeACommandUpToItsSizeAndNoLonger) {
  const std::string word(12, 'w');
  const Command<16> fitting("%s %s", "ls", word.c_str());
  EXPECT_EQ(fitting.c_str(), "ls " + word);
  const Command<15> cut("%s %s", "ls", word.c_str());
  EXPECT_EQ(cut.c_str(), "ls " + word.substr(0, 11));

  fake::system.Returns(0);
  EXPECT_EQ(fitting.Run(), 0);
  errno = 0;
  EXPECT_LT(cut.Run(), 0);
  EXPECT_EQ(errno, E2BIG);
  EXPECT_THAT(fake::Effects(), testing::ElementsAre("system(ls " + word + ")"));
}

TEST_F(ShellWords, MakeNoPipeOfACommandThatWasCut) {
  const std::string word(12, 'w');
  const Command<17> cut("echo %s", word.c_str());
  errno = 0;
  EXPECT_EQ(cut.OpenPipe(), nullptr);
  EXPECT_EQ(errno, E2BIG);
  EXPECT_EQ(fake::popen.calls(), 0);

  fake::PipesGive({""});
  const Command<18> fitting("echo %s", word.c_str());
  FILE* pipe = fitting.OpenPipe();
  ASSERT_NE(pipe, nullptr);
  pclose(pipe);
  EXPECT_THAT(fake::Effects(), testing::ElementsAre("popen(echo " + word + ", r)", "pclose(&)"));
}

TEST_F(ShellWords, GiveTheStatusOfTheCommandThatRan) {
  EXPECT_EQ(Command<16>("exit %d", 0).Run(), 0);
  EXPECT_EQ(Command<16>("exit %d", 3).Run(), 3 << 8);
  fake::system.Returns(-1);
  EXPECT_EQ(Command<16>("exit %d", 0).Run(), -1);
}

}  // namespace
