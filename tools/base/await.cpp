// Waits for what becomes so by itself.
#include "base/await.h"

#include <thread>

bool Await(std::chrono::milliseconds time, std::chrono::milliseconds pause, const std::function<bool()>& isSo) {
  const auto end = std::chrono::steady_clock::now() + time;
  while (!isSo()) {
    if (std::chrono::steady_clock::now() >= end) return false;
    std::this_thread::sleep_for(pause);
  }
  return true;
}
