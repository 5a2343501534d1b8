// IPv4 addresses as text.
#include <arpa/inet.h>

#include <bit>
#include <cstdint>

#include "platform.h"

namespace {

// An address or a mask in host order; false when the text is none. Dotted with four numbers, no shorthand.
bool Parse(const char* szText, uint32_t& value) {
  in_addr address;
  if (szText == nullptr || ::inet_pton(AF_INET, szText, &address) != 1) return false;
  value = ntohl(address.s_addr);
  return true;
}

// Ones, then zeros.
bool IsMask(uint32_t mask) {
  return std::countl_one(mask) + std::countr_zero(mask) == 32;
}

}  // namespace

int MERONetIsSameSubnet(const char* szAddress, const char* szReference, const char* szMask) {
  uint32_t address;
  uint32_t reference;
  uint32_t mask;
  if (!Parse(szAddress, address) || !Parse(szReference, reference) || !Parse(szMask, mask) || !IsMask(mask)) return 0;
  if ((address & mask) != (reference & mask)) return 0;

  const uint32_t host = address & ~mask;
  const bool hasNetworkAddress = ~mask > 1;  // two addresses alone are both hosts, and so is one
  return !hasNetworkAddress || (host != 0 && host != ~mask) ? 1 : 0;
}

const char* MERONetNtoa(struct in_addr address) {
  static char s_szAddress[INET_ADDRSTRLEN];
  return ::inet_ntop(AF_INET, &address, s_szAddress, sizeof s_szAddress);
}
