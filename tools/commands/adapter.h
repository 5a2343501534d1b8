// The commands about the adapter as a whole: radio, mode.
#ifndef MERO_TOOLS_ADAPTER_H
#define MERO_TOOLS_ADAPTER_H

#include <string>

#include "work/program.h"

void ShowRadio(const Program& program);

// "on" or "off".
void SwitchRadio(const Program& program, const std::string& state);

// "ap" or "client".
void ChangeMode(const Program& program, const std::string& mode);

#endif  // MERO_TOOLS_ADAPTER_H
