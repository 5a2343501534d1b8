#include "appliance/sbin/listing.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <system_error>
#include <tuple>

#include "common/protocol_texts.h"
#include "common/value_texts.h"
#include "platform.h"

namespace iwlist {
namespace {

constexpr std::string_view kHeadings =
    "CHAN NAME                             ADDRESS           SIGNAL PROTOCOL  SECURITY\n"
    "---- -------------------------------- ----------------- ------ --------- ---------------\n";

constexpr std::size_t kAddressTextSize = sizeof("00:11:22:33:44:55");

// NUL and the bytes that a reader of lines may take for the end of one.
bool EndsRow(std::uint8_t byte) {
  return byte == '\0' || (byte >= '\n' && byte <= '\r');
}

// A control character, in ASCII or, as the second byte of two, in UTF-8.
bool SteersTerminal(std::uint8_t before, std::uint8_t byte) {
  return byte < ' ' || byte == 0x7F || (before == 0xC2 && byte >= 0x80 && byte < 0xA0);
}

std::string Printable(std::string name, Reader reader) {
  std::uint8_t before = 0;
  for (char& letter : name) {
    const auto byte = static_cast<std::uint8_t>(letter);
    if (EndsRow(byte) || (reader == Reader::kTerminal && SteersTerminal(before, byte))) letter = '?';
    before = byte;
  }
  return name;
}

std::string Token(const Security& security) {
  if (security.encrypt == WIRELESS_ENCRYPT_NONE) return "NONE";
  if (security.encrypt == WIRELESS_ENCRYPT_WEP) return "WEP";
  return std::string(MEROWirelessAuthStringGet(security.auth)) + '/' +
         MEROWirelessEncryptStringGet(security.encrypt, 0);
}

const char* TextOf(Obstacle obstacle) {
  switch (obstacle) {
    case Obstacle::kNone:
      break;
    case Obstacle::kWpa3:
      return "WPA3";
    case Obstacle::kOwe:
      return "OWE";
    case Obstacle::kWpa3Eap192:
      return "WPA3 EAP 192";
    case Obstacle::kWpa3Eap:
      return "WPA3 EAP";
    case Obstacle::kFastTransition:
      return "WPA2 FT";
    case Obstacle::kSha256:
      return "WPA2 SHA256";
    case Obstacle::kProtectedFrames:
      return "WPA2 PMF";
    case Obstacle::kCiphers:
      return "WPA2 with other ciphers";
    case Obstacle::kUnknown:
      return "unknown";
  }
  return "";
}

// Leaves one description of each address.
void DropDuplicates(std::vector<Network>& networks) {
  std::ranges::sort(networks, {}, [](const Network& network) {
    return std::tuple(network.bssid, network.description.name.empty(), network.seenMsAgo);
  });
  const auto sameAddress = [](const Network& left, const Network& right) { return left.bssid == right.bssid; };
  networks.erase(std::unique(networks.begin(), networks.end(), sameAddress), networks.end());
}

}  // namespace

std::string Row(const Network& network, Reader reader) {
  const Description& description = network.description;
  char address[kAddressTextSize];
  char row[256];
  std::snprintf(row, sizeof(row), "%-4d %-32s %s %6d %-9s %s\n", network.channel,
                Printable(description.name, reader).c_str(),
                MEROWirelessBssidStringGet(network.bssid.data(), address, sizeof(address)), network.signal,
                TextOf(kProtocolTexts, description.protocol), Token(description.security).c_str());
  return row;
}

std::string Listing(std::vector<Network> networks, Reader reader) {
  DropDuplicates(networks);
  std::ranges::stable_sort(networks, std::ranges::greater{}, &Network::signal);

  std::string listing(kHeadings);
  for (const Network& network : networks) listing += Row(network, reader);
  return listing;
}

std::string ListingOfObstacles(std::vector<Network> networks) {
  DropDuplicates(networks);
  std::string listing;
  for (const Network& network : networks) {
    if (network.description.obstacle == Obstacle::kNone) continue;
    char address[kAddressTextSize];
    listing += MEROWirelessBssidStringGet(network.bssid.data(), address, sizeof(address));
    listing += ' ';
    listing += TextOf(network.description.obstacle);
    listing += '\n';
  }
  return listing;
}

void Write(int fd, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = write(fd, text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) throw std::system_error(errno, std::generic_category(), "cannot write the listing");
    text.remove_prefix(static_cast<std::size_t>(written));
  }
}

}  // namespace iwlist
