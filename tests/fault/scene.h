// A machine on which a call does its work: its adapter is a simulated one, and stand-ins that note that they have run
// are in place of the commands.
#ifndef MERO_TESTS_FAULT_SCENE_H
#define MERO_TESTS_FAULT_SCENE_H

#include <functional>
#include <string>
#include <string_view>
#include <vector>

#include "tests/platform/network_interfaces.h"
#include "tests/platform/simulated_radio.h"

inline constexpr int kNetworks = 10;  // in range
inline constexpr std::string_view kConnected = "wpa_state=COMPLETED\n";

// What the listing tool says of them.
std::string Listing();

// For as long as the holder lives. The private machine must be this process's.
class Scene {
 public:
  explicit Scene(const std::function<void(SimulatedDriver&)>& prepare);

  // What the driver was told since.
  const std::vector<std::string>& told() const { return driver_.told; }

 private:
  NetworkInterface interface_;
  ShownInterfaces shown_;
  SimulatedDriver driver_;
};

// A program that notes that it was run, and how, and does its work.
void StandIn(const std::string& path, const std::string& work);

// The commands that were run since the last call: each a line of its path and its arguments.
std::vector<std::string> TakeCommands();

#endif  // MERO_TESTS_FAULT_SCENE_H
