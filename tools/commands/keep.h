// autoconnect --keep: a known network is joined, and joined again whenever the connection was lost.
#ifndef MERO_TOOLS_KEEP_H
#define MERO_TOOLS_KEEP_H

#include <chrono>

#include "work/program.h"

struct Keeping {
  std::chrono::seconds patience{30};       // how long a lost connection is left to the supplicant
  std::chrono::seconds longestPause{300};  // between two attempts
};

// Goes on until a signal ends the program, which leaves a connection as it is. Shows what has changed, and no attempt
// that comes to the same as the one before.
void KeepConnected(const Program& program, const Keeping& keeping);

#endif  // MERO_TOOLS_KEEP_H
