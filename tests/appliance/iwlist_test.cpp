// The listing tool as a program, on a machine without a radio and with an ordinary tool of the test's making.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "tests/support/files.h"
#include "tests/support/processes.h"
#include "tests/support/shell.h"

namespace {

class ListingTool : public testing::Test {
 protected:
  static constexpr char kOrdinaryTool[] = "/sbin/iwlist.distrib";  // of Debian 12
  static constexpr char kLaterTool[] = "/usr/sbin/iwlist.ordinary";

  // Shows its arguments and ends with a status of its own.
  static constexpr char kShowArguments[] =
      "#!/bin/sh\n"
      "printf '<%s>' \"$@\"\n"
      "echo complaint >&2\n"
      "exit 7\n";

  void SetUp() override {
    for (const char* szTool : {kOrdinaryTool, kLaterTool}) std::filesystem::remove(szTool);
  }

  static void InstallOrdinaryTool(const char* script, mode_t mode = 0755) { WriteText(kOrdinaryTool, script, mode); }

  void Run(const std::vector<std::string>& arguments) {
    std::vector<std::string> command{IWLIST_PROGRAM};
    command.insert(command.end(), arguments.begin(), arguments.end());
    ran_ = StartedChild([&] { return Become(command); }).Wait();
  }

  Ran ran_;
};

TEST_F(ListingTool, HandsEveryOtherFormToTheOrdinaryToolAsItIs) {
  InstallOrdinaryTool(kShowArguments);
  const std::vector<std::string> kForms[] = {
      {"wlan0", "scanning"},
      {"wlan0", "scan"},
      {"wlan0", "scanning", "last"},
      {"wlan0", "scanning", "essid", "two words"},
      {"wlan0", "scanning", "mero", "more"},
      {"wlan0", "scanning", "mero", "unsupported", "more"},
      {"wlan0", "frequency", "mero", "unsupported"},
      {"wlan0", "scanning", "MERO"},
      {"wlan0", "frequency", "mero"},
      {"scanning", "mero"},
      {"--help"},
      {"--version"},
      {"wlan0", ""},
  };
  for (const auto& form : kForms) {
    std::string shown;
    for (const std::string& argument : form) shown += "<" + argument + ">";
    Run(form);
    EXPECT_EQ(ran_.out, shown);
    EXPECT_EQ(ran_.err, "complaint\n") << shown;
    EXPECT_EQ(ran_.status, 7) << shown;
  }
}

TEST_F(ListingTool, HandsOverACallWithoutArguments) {
  InstallOrdinaryTool("#!/bin/sh\necho \"$# arguments\"\n");
  Run({});
  EXPECT_EQ(ran_.out, "0 arguments\n");
  EXPECT_EQ(ran_.status, 0);
}

// An upgrade from Debian 12 to 13 removes the one and brings the other, and none of ours runs meanwhile.
TEST_F(ListingTool, HandsOverToTheOrdinaryToolOfDebian13) {
  WriteText(kLaterTool, kShowArguments, 0755);
  Run({"wlan0", "scanning"});
  EXPECT_EQ(ran_.out, "<wlan0><scanning>");
  EXPECT_EQ(ran_.status, 7);
}

TEST_F(ListingTool, SaysThatTheOrdinaryToolIsMissing) {
  Run({"wlan0", "scanning"});
  EXPECT_EQ(ran_.status, 127);
  EXPECT_EQ(ran_.out, "");
  EXPECT_EQ(ran_.err, "iwlist: the ordinary tool is neither /sbin/iwlist.distrib nor /usr/sbin/iwlist.ordinary\n");
}

TEST_F(ListingTool, SaysThatTheOrdinaryToolCannotBeRun) {
  InstallOrdinaryTool(kShowArguments, 0644);
  Run({"wlan0", "scanning"});
  EXPECT_EQ(ran_.status, 126);
  EXPECT_EQ(ran_.out, "");
  EXPECT_EQ(ran_.err, "iwlist: cannot run the ordinary tool /sbin/iwlist.distrib: Permission denied\n");
}

TEST_F(ListingTool, AnswersTheMeroFormItselfAndSaysThatThereIsNoSuchInterface) {
  InstallOrdinaryTool(kShowArguments);
  for (const char* verb : {"scanning", "scan"}) {
    for (const char* interface : {"wlan0", "", "a-name-that-no-interface-can-have", "%s%n"}) {
      Run({interface, verb, "mero"});
      EXPECT_EQ(ran_.status, 1) << interface;
      EXPECT_EQ(ran_.out, "") << interface;
      EXPECT_EQ(ran_.err, std::string("iwlist: ") + interface + ": no such interface\n");
    }
  }
}

#ifndef MERO_SANITIZE  // whose run time is the shared one
// Loading them took longer than the listing, and a scan has it made up to five times.
TEST_F(ListingTool, LoadsNeitherTheLibraryOfItsLanguageNorTheOneThatRunsIt) {
  const std::string loaded = Shell("LD_TRACE_LOADED_OBJECTS=1 " IWLIST_PROGRAM);
  EXPECT_THAT(loaded, testing::HasSubstr("libc.so.6"));
  EXPECT_THAT(loaded, testing::Not(testing::HasSubstr("libstdc++")));
  EXPECT_THAT(loaded, testing::Not(testing::HasSubstr("libmerowireless-core")));
}
#endif

TEST_F(ListingTool, SaysThatAnInterfaceIsNotWireless) {
  Run({"lo", "scanning", "mero"});
  EXPECT_EQ(ran_.status, 1);
  EXPECT_EQ(ran_.out, "");
  EXPECT_EQ(ran_.err, "iwlist: lo: not a wireless interface\n");
}

}  // namespace
