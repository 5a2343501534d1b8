// The kernel's own switch of a radio, which holds for every program.
#ifndef MERO_TOOLS_KERNEL_SWITCH_H
#define MERO_TOOLS_KERNEL_SWITCH_H

#include <string>

enum class KernelBlock {
  kUnknown,  // no such radio, or it has no switch
  kNone,
  kSet,
  kOfHardware,  // by a switch that hands move
};

KernelBlock KernelBlockOf(const std::string& interface);

// Sets the block of an interface's radio, or lifts it; nothing is done without such a radio. Gives an errno, or 0.
int SetKernelBlock(const std::string& interface, bool set);

#endif  // MERO_TOOLS_KERNEL_SWITCH_H
