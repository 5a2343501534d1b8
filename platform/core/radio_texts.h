// The texts of the radio that only the platform itself reads back: of operating modes and hardware addresses.
#ifndef MERO_PLATFORM_RADIO_TEXTS_H
#define MERO_PLATFORM_RADIO_TEXTS_H

#include <optional>
#include <string_view>

#include "platform.h"

// The operating mode of a text that MEROWirelessOpmodeStringGet() gives, in any case; else unknown.
WIRELESS_OPMODE ParseOpmode(const char* szOpmode);

struct Bssid {
  unsigned char octets[6];

  friend bool operator==(const Bssid&, const Bssid&) = default;
};

// The address of a text such as "00:11:22:AA:BB:CC"; none when it is anything else.
std::optional<Bssid> ParseBssid(std::string_view text);

#endif  // MERO_PLATFORM_RADIO_TEXTS_H
