// A command that is broken.
#include "tests/fault/commands.h"

#include <filesystem>

#include "tests/support/files.h"

namespace fs = std::filesystem;

namespace {

// Where the command is meanwhile. Commands note by which path they were run: that one is another's.
std::string Aside(const std::string& path) {
  return path + ".aside";
}

// A script, which a shell reads instead of running it, so that it knows itself by its own name.
std::string RunAside(const std::string& path) {
  const bool isScript = ReadText(Aside(path)).starts_with("#!");
  return isScript ? ". " + Aside(path) + "\n" : "exec " + Aside(path) + " \"$@\"\n";
}

// Not for the shell by its common name, which may be the program that is broken.
void Break(const std::string& path, CommandFault fault) {
  switch (fault) {
    case CommandFault::kNone:
    case CommandFault::kIsMissing:
      return;
    case CommandFault::kFails:
      return WriteText(path, "#!/bin/dash\nexit 1\n", 0755);
    case CommandFault::kTakesLong:
      return WriteText(path, "#!/bin/dash\nsleep 0.3\n" + RunAside(path), 0755);
    case CommandFault::kNeverEnds:
      return WriteText(path, "#!/bin/dash\nexec sleep 1000\n", 0755);
  }
}

}  // namespace

BrokenCommand::BrokenCommand(const Fault& fault) {
  if (fault.commandFault == CommandFault::kNone) return;
  path_ = fault.command;
  fs::rename(path_, Aside(path_));
  Break(path_, fault.commandFault);
}

BrokenCommand::~BrokenCommand() {
  if (path_.empty()) return;
  fs::rename(Aside(path_), path_);
}
