// A network in range, as the radio's driver heard it.
#ifndef MERO_APPLIANCE_NETWORK_H
#define MERO_APPLIANCE_NETWORK_H

#include <array>
#include <cstdint>
#include <span>
#include <string>

#include "wireless.h"

namespace iwlist {

using Bytes = std::span<const std::uint8_t>;

struct Security {
  WIRELESS_AUTH auth = WIRELESS_AUTH_UNKNOWN;
  WIRELESS_ENCRYPT encrypt = WIRELESS_ENCRYPT_UNKNOWN;
};

// What keeps this appliance out of a network, whatever its secret.
enum class Obstacle : std::uint8_t {
  kNone,
  kWpa3,
  kOwe,
  kWpa3Eap192,
  kWpa3Eap,
  kFastTransition,   // WPA2 whose keys are those of fast transition alone
  kSha256,           // WPA2 whose keys are made with SHA-256 alone
  kProtectedFrames,  // WPA2 whose management frames have to be protected
  kCiphers,          // others than TKIP and AES
  kUnknown
};

// The part of a network that its own elements tell.
struct Description {
  std::string name;  // the bytes as sent; empty when it is kept out of the beacons
  WIRELESS_PROTOCOL protocol = WIRELESS_PROTO_UNKNOWN;
  Security security;
  Obstacle obstacle = Obstacle::kNone;
};

struct Network {
  std::array<std::uint8_t, 6> bssid{};
  int channel = 0;  // 0 where the band has no channel numbers
  int signal = 0;   // dBm
  std::uint32_t seenMsAgo = 0;
  Description description;
};

}  // namespace iwlist

#endif  // MERO_APPLIANCE_NETWORK_H
