// Waits for what may pass: a network that is not in range yet, an adapter that is used otherwise.
#ifndef MERO_TOOLS_PATIENCE_H
#define MERO_TOOLS_PATIENCE_H

#include <chrono>
#include <functional>
#include <string>

#include "work/program.h"

// Runs `act`, and again, until it does not fail since a network is out of range or the adapter is busy; fails as it
// does once the time is over, or when it fails otherwise. `what` is waited for; an interruption ends that.
void Patiently(const Program& program, const std::string& what, std::chrono::seconds time,
               const std::function<void()>& act);

#endif  // MERO_TOOLS_PATIENCE_H
