// The listing of the networks in range: two lines of headings, then one row a network, in columns of bytes:
//
//   column  0  channel
//   column  5  name, up to 32 bytes, then at least one blank; all blank for a network that hides its name
//   column 38  address, signal in dBm, protocol, security, separated by blanks
//
// Protocol is a text of MEROWirelessProtocolStringGet(). Security is "NONE", "WEP", or the texts of
// MEROWirelessAuthStringGet() and MEROWirelessEncryptStringGet() with "/" between, such as "WPA2PSK/TKIPAES".
#ifndef MERO_APPLIANCE_LISTING_H
#define MERO_APPLIANCE_LISTING_H

#include <string>
#include <string_view>
#include <vector>

#include "appliance/sbin/network.h"

namespace iwlist {

// The reader of the listing. A program gets every byte of a name that a row can hold; on a terminal no name moves the
// cursor or sets a colour. Bytes that are left out are shown as "?".
enum class Reader { kProgram, kTerminal };

std::string Row(const Network& network, Reader reader);

// The whole listing. Of the descriptions of one address that were heard, it shows the latest, preferring one with a
// name. Networks with a strong signal come first, so that the first row of a name is its best access point.
std::string Listing(std::vector<Network> networks, Reader reader);

// The access points that cannot be joined, whatever the secret: a line for each, its address and how it is protected.
std::string ListingOfObstacles(std::vector<Network> networks);

// Writes all of `text`; throws std::system_error when it cannot.
void Write(int fd, std::string_view text);

}  // namespace iwlist

#endif  // MERO_APPLIANCE_LISTING_H
