// What the kernel says of an interface and its radio.
#ifndef MERO_TOOLS_AIR_H
#define MERO_TOOLS_AIR_H

#include <optional>
#include <string>
#include <vector>

struct Air {
  bool isAccessPoint = false;  // of that type, on the air or not
  int channel = 0;             // that it uses; 0 for none
  int megahertz = 0;
  std::string name;  // of the network that it sends as an access point; empty while it is off the air
};

// Nothing without such an interface, or a wireless one.
std::optional<Air> AirOf(const std::string& interface);

// How many stations an access point has.
int StationsOf(const std::string& interface);

#endif  // MERO_TOOLS_AIR_H
