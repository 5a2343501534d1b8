// Daemons that keep their pid in a file.
#include "base/pid_file.h"

#include <filesystem>
#include <fstream>

bool IsDaemonThere(const std::string& pidPath, std::string_view program) {
  int pid = 0;
  if (!(std::ifstream(pidPath) >> pid)) return false;
  std::error_code error;
  std::string name = std::filesystem::read_symlink("/proc/" + std::to_string(pid) + "/exe", error).filename();
  // The program's file may have been replaced since, by an upgrade say.
  constexpr std::string_view kReplaced = " (deleted)";
  if (name.ends_with(kReplaced)) name.resize(name.size() - kReplaced.size());
  return name == program;
}
