// Daemons that keep their pid in a file.
#ifndef MERO_TOOLS_PID_FILE_H
#define MERO_TOOLS_PID_FILE_H

#include <string>
#include <string_view>

// Whether the process whose pid is in a file runs a program, by the name of the program's file. The pid file may have
// been left by a process that ended long ago, and another process may have its pid now.
bool IsDaemonThere(const std::string& pidPath, std::string_view program);

#endif  // MERO_TOOLS_PID_FILE_H
