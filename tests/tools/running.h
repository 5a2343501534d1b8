// The program under test, run in a process of its own.
#ifndef MERO_TESTS_TOOLS_RUNNING_H
#define MERO_TESTS_TOOLS_RUNNING_H

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/types.h>

#include <functional>
#include <map>
#include <string>
#include <vector>

#include "kernel_fakes.h"
#include "library_fakes.h"
#include "tests/support/files.h"
#include "tests/support/processes.h"
#include "tests/support/shell.h"

struct Surroundings {
  std::string input = {};                               // on the standard input
  std::map<std::string, std::string> environment = {};  // beside LC_ALL=C.UTF-8
  std::function<void()> before = [] {};                 // done in the program's process, before it begins
};

Ran Tool(const std::vector<std::string>& arguments, const Surroundings& surroundings = {});

// The same on a terminal of so many columns, which shows both outputs; `type` is typed once `prompt` was shown.
struct Typing {
  std::string prompt;
  std::string text;
};
Ran ToolOnTerminal(const std::vector<std::string>& arguments, unsigned short columns = 80,
                   const Surroundings& surroundings = {}, const Typing& typing = {});

// The same with another program.
Ran CommandOnTerminal(const std::vector<std::string>& command, const Surroundings& surroundings, const Typing& typing);

// The commands that the help of a command lists, or that of the program.
std::vector<std::string> CommandsOf(std::vector<std::string> command = {});

// A run that is not waited for.
class StartedTool : public StartedChild {
 public:
  explicit StartedTool(const std::vector<std::string>& arguments, const Surroundings& surroundings = {});
};

// A process that runs a program of this name, whose pid is in a file.
class StartedDaemon {
 public:
  StartedDaemon(const std::string& program, const std::string& pidPath);
  StartedDaemon(const StartedDaemon&) = delete;
  StartedDaemon& operator=(const StartedDaemon&) = delete;
  ~StartedDaemon();

 private:
  pid_t pid_;
};

// Held by every process that is started while it lives, until that ends.
class Lifeline {
 public:
  Lifeline();
  Lifeline(const Lifeline&) = delete;
  Lifeline& operator=(const Lifeline&) = delete;
  ~Lifeline();

  // Whether all of them have ended; those that are started after the first question do not count.
  bool IsFree();

 private:
  int ends_[2];
};

class ToolTest : public testing::Test {
 protected:
  ToolTest() {
    library::Reset();
    kernel::Heard({});
  }
};

#endif  // MERO_TESTS_TOOLS_RUNNING_H
