// The listing tool as a program, on a machine without a radio and with an ordinary tool of the test's making.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

namespace {

struct FileCloser {
  void operator()(std::FILE* file) const { std::fclose(file); }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

std::string ContentOf(std::FILE* file) {
  std::rewind(file);
  std::string content;
  for (int letter = std::fgetc(file); letter != EOF; letter = std::fgetc(file)) content += static_cast<char>(letter);
  return content;
}

[[noreturn]] void RunTool(std::vector<std::string> arguments, std::FILE* out, std::FILE* err) {
  std::vector<char*> argv{const_cast<char*>("iwlist")};
  for (std::string& argument : arguments) argv.push_back(argument.data());
  argv.push_back(nullptr);
  dup2(fileno(out), STDOUT_FILENO);
  dup2(fileno(err), STDERR_FILENO);
  execv(IWLIST_PROGRAM, argv.data());
  std::perror(IWLIST_PROGRAM);
  _exit(EXIT_FAILURE);
}

class ListingTool : public testing::Test {
 protected:
  static constexpr char kOrdinaryTool[] = "/sbin/iwlist.distrib";

  // Shows its arguments and ends with a status of its own.
  static constexpr char kShowArguments[] =
      "#!/bin/sh\n"
      "printf '<%s>' \"$@\"\n"
      "echo complaint >&2\n"
      "exit 7\n";

  void SetUp() override { std::filesystem::remove(kOrdinaryTool); }

  static void InstallOrdinaryTool(const char* script, mode_t mode = 0755) {
    ASSERT_TRUE(std::ofstream(kOrdinaryTool) << script << std::flush);
    ASSERT_EQ(chmod(kOrdinaryTool, mode), 0);
  }

  void Run(const std::vector<std::string>& arguments) {
    const File out(std::tmpfile());
    const File err(std::tmpfile());
    ASSERT_TRUE(out && err);
    const pid_t child = fork();
    ASSERT_GE(child, 0);
    if (child == 0) RunTool(arguments, out.get(), err.get());
    int waited = 0;
    ASSERT_EQ(waitpid(child, &waited, 0), child);
    ASSERT_TRUE(WIFEXITED(waited));
    status_ = WEXITSTATUS(waited);
    out_ = ContentOf(out.get());
    err_ = ContentOf(err.get());
  }

  int status_ = -1;
  std::string out_;
  std::string err_;
};

TEST_F(ListingTool, HandsEveryOtherFormToTheOrdinaryToolAsItIs) {
  InstallOrdinaryTool(kShowArguments);
  const std::vector<std::string> kForms[] = {
      {"wlan0", "scanning"},
      {"wlan0", "scan"},
      {"wlan0", "scanning", "last"},
      {"wlan0", "scanning", "essid", "two words"},
      {"wlan0", "scanning", "mero", "more"},
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
    EXPECT_EQ(out_, shown);
    EXPECT_EQ(err_, "complaint\n") << shown;
    EXPECT_EQ(status_, 7) << shown;
  }
}

TEST_F(ListingTool, HandsOverACallWithoutArguments) {
  InstallOrdinaryTool("#!/bin/sh\necho \"$# arguments\"\n");
  Run({});
  EXPECT_EQ(out_, "0 arguments\n");
  EXPECT_EQ(status_, 0);
}

TEST_F(ListingTool, SaysThatTheOrdinaryToolIsMissing) {
  Run({"wlan0", "scanning"});
  EXPECT_EQ(status_, 127);
  EXPECT_EQ(out_, "");
  EXPECT_EQ(err_, "iwlist: cannot run the ordinary tool /sbin/iwlist.distrib: No such file or directory\n");
}

TEST_F(ListingTool, SaysThatTheOrdinaryToolCannotBeRun) {
  InstallOrdinaryTool(kShowArguments, 0644);
  Run({"wlan0", "scanning"});
  EXPECT_EQ(status_, 126);
  EXPECT_EQ(out_, "");
  EXPECT_EQ(err_, "iwlist: cannot run the ordinary tool /sbin/iwlist.distrib: Permission denied\n");
}

TEST_F(ListingTool, AnswersTheMeroFormItselfAndSaysThatThereIsNoSuchInterface) {
  InstallOrdinaryTool(kShowArguments);
  for (const char* verb : {"scanning", "scan"}) {
    for (const char* interface : {"wlan0", "", "a-name-that-no-interface-can-have", "%s%n"}) {
      Run({interface, verb, "mero"});
      EXPECT_EQ(status_, 1) << interface;
      EXPECT_EQ(out_, "") << interface;
      EXPECT_EQ(err_, std::string("iwlist: ") + interface + ": no such interface\n");
    }
  }
}

TEST_F(ListingTool, SaysThatAnInterfaceIsNotWireless) {
  Run({"lo", "scanning", "mero"});
  EXPECT_EQ(status_, 1);
  EXPECT_EQ(out_, "");
  EXPECT_EQ(err_, "iwlist: lo: not a wireless interface\n");
}

}  // namespace
