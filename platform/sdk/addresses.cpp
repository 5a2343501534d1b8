// IPv4 addresses as text.
#include "platform/sdk/addresses.h"

#include <arpa/inet.h>

#include <bit>

#include "platform.h"

std::optional<Ipv4> ParseAddress(const char* szAddress) {
  in_addr address;
  if (szAddress == nullptr || ::inet_pton(AF_INET, szAddress, &address) != 1) return std::nullopt;
  return ntohl(address.s_addr);
}

std::optional<Ipv4> ParseMask(const char* szMask) {
  const std::optional<Ipv4> mask = ParseAddress(szMask);
  const bool contiguous = mask && std::countl_one(*mask) + std::countr_zero(*mask) == 32;
  return contiguous ? mask : std::nullopt;
}

bool IsHost(Ipv4 address, Ipv4 mask) {
  if (~mask <= 1) return true;  // neither is there in a subnet of one or two addresses
  const Ipv4 host = address & ~mask;
  return host != 0 && host != ~mask;
}

int MERONetIsSameSubnet(const char* szAddress, const char* szReference, const char* szMask) {
  const std::optional<Ipv4> address = ParseAddress(szAddress);
  const std::optional<Ipv4> reference = ParseAddress(szReference);
  const std::optional<Ipv4> mask = ParseMask(szMask);
  if (!address || !reference || !mask) return 0;
  return (*address & *mask) == (*reference & *mask) && IsHost(*address, *mask) ? 1 : 0;
}

const char* MERONetNtoa(struct in_addr address) {
  static char s_szAddress[INET_ADDRSTRLEN];
  return ::inet_ntop(AF_INET, &address, s_szAddress, sizeof s_szAddress);
}
