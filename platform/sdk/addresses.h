// IPv4 addresses and masks as numbers, and from text.
#ifndef MERO_PLATFORM_ADDRESSES_H
#define MERO_PLATFORM_ADDRESSES_H

#include <cstdint>
#include <optional>

using Ipv4 = uint32_t;  // in host order

// The address of a dotted text of four numbers; none when it is anything else, or null.
std::optional<Ipv4> ParseAddress(const char* szAddress);

// As ParseAddress(), for a mask: ones, then zeros.
std::optional<Ipv4> ParseMask(const char* szMask);

// Whether an address is a host's in a subnet: neither the network's nor the broadcast address.
bool IsHost(Ipv4 address, Ipv4 mask);

#endif  // MERO_PLATFORM_ADDRESSES_H
