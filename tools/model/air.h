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

// What a radio may do on a channel, by the rules of the place where it is.
enum class ChannelUse {
  kAll,
  kAllAfterRadar,  // it has to be listened to for radar first
  kListening,      // nobody may radiate there first, so that no access point may begin
  kNone,
};

// A channel of 2.4 or 5 GHz.
struct Channel {
  int number;
  int megahertz;
  ChannelUse use;

  bool is5GHz() const { return megahertz >= 5000; }
  bool isForAccessPoints() const { return use == ChannelUse::kAll || use == ChannelUse::kAllAfterRadar; }
};

// Those that the radio knows, in ascending order; nothing without such an interface, or a wireless one.
std::vector<Channel> ChannelsOf(const std::string& interface);

#endif  // MERO_TOOLS_AIR_H
