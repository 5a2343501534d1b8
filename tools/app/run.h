// From a command line to an exit status.
#ifndef MERO_TOOLS_RUN_H
#define MERO_TOOLS_RUN_H

// Runs the program; gives its exit status.
int RunProgram(int argc, const char* const* argv);

#endif  // MERO_TOOLS_RUN_H
