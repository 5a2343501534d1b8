// Running programs without a shell.
#ifndef MERO_PLATFORM_PROGRAM_H
#define MERO_PLATFORM_PROGRAM_H

#include "platform/base/result.h"

// The standard input, output and error of a program.
enum class Standard {
  kInherited,
  kNull,  // for a program that stays behind as a daemon and must not hold the caller's
};

// Runs a program with the arguments of `argv`, which begins with its path and ends with null, and waits until it has
// finished. Its exit status, or EINTR when a signal ended it. It inherits no other descriptor.
Result<int> RunProgram(const char* const* argv, Standard standard);

#endif  // MERO_PLATFORM_PROGRAM_H
