// What the listing tool prints of a network, whatever the network is.
#ifndef MERO_TESTS_FUZZ_ROW_H
#define MERO_TESTS_FUZZ_ROW_H

#include <algorithm>
#include <cstdio>

#include "appliance/sbin/listing.h"
#include "tests/fuzz/support.h"

// One line that can be read back, and that moves no cursor and sets no colour where a terminal reads it.
inline void RequireRow(const iwlist::Network& network) {
  for (const iwlist::Reader reader : {iwlist::Reader::kProgram, iwlist::Reader::kTerminal}) {
    const std::string row = iwlist::Row(network, reader);
    Require(row.find('\n') == row.size() - 1 && row.find('\0') == row.npos, "a network is one row", {row});
    unsigned octets[6];
    int signal = 0;
    char szProtocol[32];
    char szSecurity[32];
    Require(std::sscanf(row.c_str() + 37, " %x:%x:%x:%x:%x:%x %d %31s %31s", &octets[0], &octets[1], &octets[2],
                        &octets[3], &octets[4], &octets[5], &signal, szProtocol, szSecurity) == 9 &&
                signal == network.signal && std::ranges::equal(octets, network.bssid),
            "a row can be read back", {row});
    if (reader == iwlist::Reader::kProgram) continue;
    char before = '\0';
    for (const char c : row.substr(0, row.size() - 1)) {
      const bool steers = (c >= '\0' && c < ' ') || c == '\x7f' || (before == '\xc2' && c >= '\x80' && c < '\xa0');
      Require(!steers, "a name steers no terminal", {row});
      before = c;
    }
  }
}

#endif  // MERO_TESTS_FUZZ_ROW_H
