// The command that shares a network by a code.
#ifndef MERO_TOOLS_SHARE_H
#define MERO_TOOLS_SHARE_H

#include <string>

#include "work/program.h"

struct NetworkToShare {
  std::string name;  // of a known network, the address of its access point, or "ap"; empty for the one in use
  bool guests = false;
  bool isHidden = false;
  std::string png;  // files; without one the code is drawn on the screen
  std::string svg;
  bool showSecrets = false;
};

void Share(const Program& program, const NetworkToShare& wanted);

#endif  // MERO_TOOLS_SHARE_H
