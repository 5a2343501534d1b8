// A join by the library, while the supplicant is listened to.
#ifndef MERO_TOOLS_JOINING_H
#define MERO_TOOLS_JOINING_H

#include "model/library.h"
#include "model/target.h"

// Ends the supplicant of the former network. The library tells it to end and starts the next one at once, which gives
// up while the control socket of the former one is still there.
void EndFormerSupplicant(const Program& program);

// Joins a network, and fails with what the supplicant said of it.
void Join(const Program& program, const KnownNetwork& config);
void Join(const Program& program, const Target& target);

#endif  // MERO_TOOLS_JOINING_H
