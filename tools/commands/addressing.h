// The commands about the interface's address and gateway: address, gateway.
#ifndef MERO_TOOLS_COMMANDS_ADDRESSING_H
#define MERO_TOOLS_COMMANDS_ADDRESSING_H

#include <string>

#include "model/addressing.h"
#include "work/program.h"

void SetAddress(const Program& program, const Addressing& addressing);
void SetGateway(const Program& program, const std::string& gateway);

#endif  // MERO_TOOLS_COMMANDS_ADDRESSING_H
