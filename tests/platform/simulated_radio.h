// A machine's adapters and the driver of one, without a radio.
#ifndef MERO_TESTS_PLATFORM_SIMULATED_RADIO_H
#define MERO_TESTS_PLATFORM_SIMULATED_RADIO_H

#include <array>
#include <string>
#include <vector>

// What the kernel shows of its interfaces, for as long as the holder lives.
class ShownInterfaces {
 public:
  struct Interface {
    std::string name;
    std::string mark;  // what lies in its directory: "phy80211" and "wireless" make it an adapter
  };

  explicit ShownInterfaces(const std::vector<Interface>& interfaces);
  ShownInterfaces(const ShownInterfaces&) = delete;
  ShownInterfaces& operator=(const ShownInterfaces&) = delete;
  ~ShownInterfaces();
};

// The driver of an adapter, for as long as the holder lives: what it answers, and what it was told.
class SimulatedDriver {
 public:
  explicit SimulatedDriver(std::string interface);
  SimulatedDriver(const SimulatedDriver&) = delete;
  SimulatedDriver& operator=(const SimulatedDriver&) = delete;
  ~SimulatedDriver();

  int refusal = 0;      // the errno that every request meets; 0 for none
  int scanRefusal = 0;  // the errno that a request to scan meets
  bool hasResults = false;
  unsigned mode = 2;
  std::array<unsigned char, 6> accessPoint = {};
  std::string name;
  bool hasName = true;
  std::vector<std::string> told;  // "mode N", "leave", "scan", "up", "down", in order

  // A request of the kernel's wireless extensions; as ioctl(), less the descriptor.
  int Answer(unsigned long request, void* argument);

 private:
  std::string interface_;
};

#endif  // MERO_TESTS_PLATFORM_SIMULATED_RADIO_H
