// The beacons of strangers, as the listing tool reads them: any bytes give one row that can be read back, and steers no
// terminal; a network that announces WPA is never shown as one without protection or with WEP.
//
// Runs: 60000
// Covers: appliance/sbin/elements.cpp appliance/sbin/listing.cpp
#include "appliance/sbin/elements.h"

#include "tests/fuzz/row.h"

namespace {

constexpr std::uint8_t kVendor = 221;
constexpr std::uint8_t kRsn = 48;
constexpr std::string_view kWpa{"\x00\x50\xf2\x01", 4};

// Whether an element of WPA stands before the first one that is cut short.
bool AnnouncesWpa(std::string_view elements) {
  while (elements.size() >= 2) {
    const auto id = static_cast<std::uint8_t>(elements[0]);
    const auto size = static_cast<std::uint8_t>(elements[1]);
    if (size > elements.size() - 2) return false;
    if (id == kRsn || (id == kVendor && elements.substr(2, size).starts_with(kWpa))) return true;
    elements.remove_prefix(2U + size);
  }
  return false;
}

}  // namespace

// The first three bytes choose capability and band.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  constexpr std::size_t kFrontSize = 3;
  if (size < kFrontSize) return 0;
  const unsigned capability = data[0] | static_cast<unsigned>(data[1]) << 8;
  const unsigned megahertz = data[2] % 2 == 0 ? 2437 : 5180;
  const std::string_view elements(reinterpret_cast<const char*>(data) + kFrontSize, size - kFrontSize);

  iwlist::Network network;
  network.description = iwlist::Describe({data + kFrontSize, size - kFrontSize}, capability, megahertz);
  RequireRow(network);
  const WIRELESS_ENCRYPT encrypt = network.description.security.encrypt;
  const bool looksUnprotected = encrypt == WIRELESS_ENCRYPT_NONE || encrypt == WIRELESS_ENCRYPT_WEP;
  Require(!AnnouncesWpa(elements) || !looksUnprotected, "WPA is never none or WEP", {elements});
  Require(encrypt != WIRELESS_ENCRYPT_NONE || (capability & 0x10) == 0, "a private network is not open", {elements});
  return 0;
}
