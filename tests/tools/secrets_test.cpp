// Where secrets come from, and where they do not go.
#include <sys/ioctl.h>
#include <unistd.h>

#include <csignal>
#include <cstring>

#include "running.h"

using library::Network;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

class Secrets : public ToolTest {
 protected:
  Secrets() {
    library::InRange({Network("Home")});
    library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
      library::Record(config->szKey);
      return 0;
    };
  }
};

TEST_F(Secrets, AreAskedForOnATerminalAndNotShown) {
  const Ran ran = ToolOnTerminal({"save", "Home"}, 80, {}, {.prompt = "secret of Home: ", .text = "open sesame\n"});
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_THAT(ran.out, Not(HasSubstr("sesame")));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessConfSet", "open sesame"));
}

TEST_F(Secrets, OfTheAccessPointAreAskedForWhenThereIsNone) {
  MERO_AP_CONF conf{};
  std::strcpy(conf.hostapConf.szSSID, "Office");
  std::strcpy(conf.hostapConf.szBridge, "lbr0");
  conf.blEnable = TRUE;
  library::SavedAp(conf);
  library::MEROWirelessSetAPConfig = [](PMERO_AP_CONF saved) {
    return library::Record(saved->hostapConf.encryptInfo.wpaPskInfo.szPassPhrase), TRUE;
  };
  const Ran ran = ToolOnTerminal({"ap", "set", "--encryption", "wpa2"}, 80, {},
                                 {.prompt = "secret of Office: ", .text = "open sesame\n"});
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_THAT(ran.out, Not(HasSubstr("sesame")));
  EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessSetAPConfig", "open sesame"));
}

TEST_F(Secrets, CanBeRefusedByCtrlCAndCtrlBackslashAtThePrompt) {
  for (const char* key : {"\x03", "\x1c"}) {
    const Ran ran = ToolOnTerminal({"save", "Home"}, 80, {}, {.prompt = "secret of Home: ", .text = key});
    EXPECT_EQ(ran.status, 130);
    EXPECT_THAT(library::Calls(), IsEmpty());
  }
}

TEST_F(Secrets, CanBeRefusedWhileTheyComeFromTheStandardInput) {
  int ends[2];
  ASSERT_EQ(::pipe(ends), 0);
  ASSERT_EQ(::write(ends[1], "open", 4), 4);
  StartedTool tool({"save", "Home", "--key-stdin", "--json"}, {.before = [&] { ::dup2(ends[0], STDIN_FILENO); }});
  ASSERT_TRUE(Soon([&] {
    int left = -1;
    return ::ioctl(ends[0], FIONREAD, &left) == 0 && left == 0;
  }));
  ::kill(tool.pid(), SIGINT);
  const Ran ran = tool.Wait();
  EXPECT_EQ(ran.status, 130);
  EXPECT_EQ(ran.out, R"({"result":"failed","code":130,"error":"interrupted, and nothing of the command goes on",)"
                     R"("advice":"run it again","reason":"interrupted"})"
                     "\n");
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(Secrets, MustBeGivenOtherwiseWhereThereIsNoTerminal) {
  const Ran ran = Tool({"save", "Home"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("give it with --key-file or --key-stdin"));
}

TEST_F(Secrets, LoseOneLineEndAndNoMore) {
  for (const char* input : {"open sesame ", "open sesame \n", "open sesame \r\n"}) {
    library::Reset();
    library::InRange({Network("Home")});
    library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
      return library::Record(config->szKey), 0;
    };
    Tool({"save", "Home", "--key-stdin"}, {.input = input});
    EXPECT_THAT(library::Calls(), ElementsAre("MEROWirelessConfSet", "open sesame "));
  }
}

TEST_F(Secrets, AreNoArguments) {
  for (const char* option : {"--key", "--passphrase", "--password", "--secret"}) {
    const Ran ran = Tool({"save", "Home", option, "open sesame"});
    EXPECT_EQ(ran.status, 2) << option;
    EXPECT_THAT(ran.out + ran.err, Not(HasSubstr("sesame"))) << option;
  }
}

TEST_F(Secrets, CannotComeFromTwoPlaces) {
  EXPECT_EQ(Tool({"save", "Home", "--key-stdin", "--key-file", "/tmp/secret"}).status, 2);
}

TEST_F(Secrets, OfAFileThatCannotBeReadAreAFailure) {
  const Ran ran = Tool({"save", "Home", "--key-file", "/no/such/file"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/no/such/file cannot be read: No such file or directory"));
}

TEST_F(Secrets, AreNoFilesFullOfOtherThings) {
  EXPECT_EQ(Tool({"save", "Home", "--key-file", "/dev/zero"}).status, 5);
}

}  // namespace
