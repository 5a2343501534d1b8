// Daemons that keep their pid in a file.
#ifndef MERO_PLATFORM_DAEMON_H
#define MERO_PLATFORM_DAEMON_H

#include "platform/base/result.h"

// Ends the daemon whose pid is in a file, if the process of that pid is the program `szProgram`, and removes the file.
// Success also when there is none. Blocks up to 2 s for it to end by itself; then it is killed.
Status EndDaemon(const char* szPidPath, const char* szProgram);

// Whether the process whose pid is in a file is the program.
bool IsDaemonThere(const char* szPidPath, const char* szProgram);

#endif  // MERO_PLATFORM_DAEMON_H
