// Commands of the shell.
#include "tests/support/shell.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>

#include "tests/support/files.h"

namespace {

[[noreturn]] void BecomeShell(const std::string& command, int output) {
  ::dup2(output, STDOUT_FILENO);
  ::dup2(output, STDERR_FILENO);
  const char* szPath = std::getenv("PATH");
  ::setenv("PATH", ((szPath != nullptr ? szPath : "/usr/bin:/bin") + std::string(":/usr/sbin:/sbin")).c_str(), 1);
  ::execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
  ::_exit(127);
}

}  // namespace

// Without popen(), which some tests have a function of their own for.
Ran RunInShell(const std::string& command) {
  int ends[2];
  if (::pipe2(ends, O_CLOEXEC) != 0) return {};
  const pid_t pid = ::fork();
  if (pid == 0) BecomeShell(command, ends[1]);
  ::close(ends[1]);
  Ran ran;
  char part[4096];
  for (ssize_t size; (size = ::read(ends[0], part, sizeof part)) > 0;) ran.out.append(part, static_cast<size_t>(size));
  ::close(ends[0]);
  ran.status = StatusOf(pid);
  return ran;
}

std::string Shell(const std::string& command) {
  Ran ran = RunInShell(command);
  EXPECT_EQ(ran.status, 0) << command << "\n" << ran.out;
  return ran.out;
}

void Install(const std::string& name, const std::string& script) {
  WriteScript("/tmp/bin/" + name, script);
}
