// Scripts, what they come upon, and what they say.
#include "shell.h"

#include <sys/stat.h>
#include <sys/wait.h>

#include <cstdio>
#include <filesystem>
#include <fstream>

Ran RunInShell(const std::string& command) {
  FILE* pipe = ::popen(("{ " + command + "\n} 2>&1").c_str(), "r");
  Ran ran = {-1, ""};
  for (int c; (c = std::fgetc(pipe)) != EOF;) ran.output += static_cast<char>(c);
  const int status = ::pclose(pipe);
  ran.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return ran;
}

void Write(const std::string& path, const std::string& text) {
  std::filesystem::create_directories(std::filesystem::path(path).parent_path());
  std::ofstream(path) << text;
}

void Install(const std::string& name, const std::string& script) {
  const std::string path = "/tmp/bin/" + name;
  Write(path, "#!/bin/sh\n" + script);
  ::chmod(path.c_str(), 0755);
}
