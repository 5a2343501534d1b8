// How a network is addressed, and the address and gateway that the interface is given.
#ifndef MERO_TOOLS_MODEL_ADDRESSING_H
#define MERO_TOOLS_MODEL_ADDRESSING_H

#include <string>

#include "model/library.h"
#include "work/program.h"

// How a network is to be addressed: "DHCP", or an address with its mask, or "none".
struct Addressing {
  std::string ip = "DHCP";
  std::string mask;
  std::string gateway;
};

// Puts it into a network; fails when it is not sound.
void SetAddressing(KnownNetwork& config, const Addressing& addressing);

// Whether a network can have its address and gateway.
enum class Soundness { kSound, kNoHost, kGatewayOutside, kNoGateway };
Soundness SoundnessOf(const KnownNetwork& config);

// Fails when a network was saved with an address that it cannot have.
void RequireAddressing(const KnownNetwork& config);

// Gives the interface a network's address, as a task.
Task SettingAddress(const Program& program, const KnownNetwork& config);
void ApplyAddress(const Task& task, const KnownNetwork& config);

// Fails when a text is no address that a gateway can have.
void RequireGateway(const std::string& gateway);

// Adds a default gateway, and makes sure that the kernel has taken it.
void ApplyGateway(const std::string& gateway);

// Adds the gateway of a network with a static address; a DHCP server names it along with the address.
void ApplySavedGateway(const KnownNetwork& config);

// Whether the interface's DHCP client was killed, and its lease will not be renewed: one that is ended takes its pid
// file with it.
bool IsLeaseAbandoned();

// Fails when no DHCP server has answered, which the library takes for a success.
void RequireLease();

#endif  // MERO_TOOLS_MODEL_ADDRESSING_H
