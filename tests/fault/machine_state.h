// What an operation leaves on a private machine, and the way back.
#ifndef MERO_TESTS_FAULT_MACHINE_STATE_H
#define MERO_TESTS_FAULT_MACHINE_STATE_H

#include <map>
#include <string>

// What commands note that they have run in. It is no part of the state.
inline constexpr char kCommandRecord[] = "/tmp/commands";

// Each file that the private machine has and the one outside has not, or has otherwise: its path, and its mode and
// content. And "wlan0": whether that interface is up, and its addresses.
using MachineState = std::map<std::string, std::string>;

MachineState StateOfMachine();

// Makes the machine what it was.
void Restore(const MachineState& state);

// A state in which times and processes are all the same.
MachineState Comparable(MachineState state);

// The content of a file of a state; empty for none.
std::string ContentIn(const MachineState& state, const std::string& path);

// Has the private machine keep a program as a file of its own, which may be taken away and brought back. False when
// there is no such program.
bool KeepProgram(const std::string& path);

#endif  // MERO_TESTS_FAULT_MACHINE_STATE_H
