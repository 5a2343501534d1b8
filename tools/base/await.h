// Waits for what becomes so by itself.
#ifndef MERO_TOOLS_AWAIT_H
#define MERO_TOOLS_AWAIT_H

#include <chrono>
#include <functional>

// Looks whether something is so, and again after each pause until it is; false when it is not once the time is over.
// The caller can be interrupted only where it runs this as a task.
bool Await(std::chrono::milliseconds time, std::chrono::milliseconds pause, const std::function<bool()>& isSo);

#endif  // MERO_TOOLS_AWAIT_H
