// Commands of the shell, programs that they come upon, and what they say.
#ifndef MERO_TESTS_SUPPORT_SHELL_H
#define MERO_TESTS_SUPPORT_SHELL_H

#include <string>

#include "tests/support/processes.h"

// Runs a command; `out` has both of its outputs. Its PATH has the directories of system programs too.
Ran RunInShell(const std::string& command);

// Runs a command that must succeed, and gives what it says.
std::string Shell(const std::string& command);

// A program that stands before the machine's own of that name, where PATH begins with /tmp/bin.
void Install(const std::string& name, const std::string& script);

#endif  // MERO_TESTS_SUPPORT_SHELL_H
