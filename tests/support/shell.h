// Scripts, what they come upon, and what they say.
#ifndef MERO_TESTS_SHELL_H
#define MERO_TESTS_SHELL_H

#include <string>

struct Ran {
  int status;
  std::string output;  // of both kinds
};

Ran RunInShell(const std::string& command);

// Makes the directories above the file too.
void Write(const std::string& path, const std::string& text);

// A program that stands before the machine's own of that name, where PATH begins with /tmp/bin.
void Install(const std::string& name, const std::string& script);

#endif  // MERO_TESTS_SHELL_H
