// The stations of the access point, by the kernel, and what they have leased.
#ifndef MERO_TOOLS_STATIONS_H
#define MERO_TOOLS_STATIONS_H

#include <cstdint>
#include <ctime>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "base/text.h"
#include "show/output.h"

struct Station {
  Address address{};
  std::string interface;
  bool isLetIn = true;                   // else it has still to pass the network's protection
  std::optional<int> signal;             // in dBm
  std::optional<std::int64_t> received;  // bytes that have come from it
  std::optional<std::int64_t> sent;
  std::time_t since = 0;           // it is there; 0 where the driver does not tell
  std::uint64_t associatedAt = 0;  // the same, exactly: tells one stay from the next
  std::string ip;                  // of its lease, like its name
  std::string name;

  bool isGuest() const;
};

// Those of the main network, then the guests; nothing when the driver cannot list them.
std::optional<std::vector<Station>> Stations();

// How many are let in; nothing when the driver cannot list them.
std::optional<int> CountStations();

std::span<const Field<Station>> StationFields();

#endif  // MERO_TOOLS_STATIONS_H
