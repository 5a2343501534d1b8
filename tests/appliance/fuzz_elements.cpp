// Any beacon at all gives one row that can be read back. The first three bytes choose capability and band.
#include <cstdio>
#include <cstdlib>

#include "appliance/sbin/elements.h"
#include "appliance/sbin/listing.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::size_t kFrontSize = 3;
  if (size < kFrontSize) return 0;
  iwlist::Network network;
  const unsigned capability = data[0] | static_cast<unsigned>(data[1]) << 8;
  const unsigned megahertz = data[2] % 2 == 0 ? 2437 : 5180;
  network.description = iwlist::Describe({data + kFrontSize, size - kFrontSize}, capability, megahertz);

  const std::string row = Row(network, iwlist::Reader::kProgram);
  unsigned octets[6];
  int signal = 0;
  char protocol[32];
  char security[32];
  const bool oneLine = row.find('\n') == row.size() - 1;
  if (!oneLine || std::sscanf(row.c_str() + 37, " %x:%x:%x:%x:%x:%x %d %31s %31s", &octets[0], &octets[1], &octets[2],
                              &octets[3], &octets[4], &octets[5], &signal, protocol, security) != 9) {
    std::abort();
  }
  return 0;
}
