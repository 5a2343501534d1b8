// The interface's address and gateway: the commands about them, and what a network has to say of them.
#ifndef MERO_TOOLS_ADDRESSING_H
#define MERO_TOOLS_ADDRESSING_H

#include <string>

#include "model/library.h"
#include "work/program.h"
#include "work/worker.h"

// How a network is to be addressed: "DHCP", or an address with its mask, or "none".
struct Addressing {
  std::string ip = "DHCP";
  std::string mask;
  std::string gateway;
};

// Puts it into a network, when it is sound.
void SetAddressing(KnownNetwork& config, const Addressing& addressing);

// Gives the interface a network's address, as a task.
Task SettingAddress(const Program& program, const KnownNetwork& config);
void ApplyAddress(const Task& task, const KnownNetwork& config);

// Adds the gateway of a network with a static address; a DHCP server names it along with the address.
void ApplySavedGateway(const KnownNetwork& config);

// Fails when the library, which takes that for a success, had no lease.
void RequireLease();

void SetAddress(const Program& program, const Addressing& addressing);
void SetGateway(const Program& program, const std::string& gateway);

#endif  // MERO_TOOLS_ADDRESSING_H
