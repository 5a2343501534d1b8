// What the program keeps of a known network beside what the library reads: in keys of its own, which the library keeps
// when it saves the network again.
#ifndef MERO_TOOLS_NETWORK_EXTRAS_H
#define MERO_TOOLS_NETWORK_EXTRAS_H

#include <string>

#include "model/library.h"

inline constexpr char kKeyNameServers[] = "DNS";
inline constexpr char kKeyPriority[] = "PRIORITY";
inline constexpr char kKeyAutojoin[] = "AUTOJOIN";

inline constexpr int kGreatestPriority = 1000;

struct Extras {
  std::string nameServers;  // with blanks between them; empty for those of the DHCP server
  int priority = 0;         // the network with the greatest is tried first
  bool autojoin = true;     // whether it is joined by itself
};

// Of the network's section or, where its access point has none, of the one that was saved last under its name. A value
// that makes no sense is as if it were not there.
Extras ExtrasOf(const KnownNetwork& network);

// Gives the interface the name servers that were saved for a network, once it has its address there.
void ApplyNameServers(const KnownNetwork& network);

// Whether the store has a section of the network's address. One that was written by hand may be named otherwise.
bool HasSection(const KnownNetwork& network);

// Gives a section that was just added what another one of the same network has.
void CopyExtras(const KnownNetwork& from, const KnownNetwork& to);

#endif  // MERO_TOOLS_NETWORK_EXTRAS_H
