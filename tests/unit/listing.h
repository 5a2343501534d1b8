// What the listing tool prints of the networks in range.
#ifndef MERO_TESTS_UNIT_LISTING_H
#define MERO_TESTS_UNIT_LISTING_H

#include <cstdio>
#include <string>
#include <string_view>

#include "fakes.h"
#include "tests/support/early.h"

EARLY inline const std::string kHeadings =
    "CHAN NAME                             ADDRESS           SIGNAL PROTOCOL  SECURITY\n"
    "---- -------------------------------- ----------------- ------ --------- --------\n";

// The information of a row, from column 37 on.
EARLY inline const std::string kInfo = " 00:11:22:AA:BB:CC    -40 11b/g/n   WPA2PSK/AES";

// A row, without its end: the channel from column 0, the name from column 5, and what comes behind the name's column.
inline std::string RowOf(std::string_view channel, std::string_view name, std::string_view info = kInfo) {
  std::string row(channel);
  row.resize(5, ' ');
  row.append(name);
  if (row.size() < 37) row.resize(37, ' ');
  return row.append(info);
}

inline std::string RowOf(std::string_view name) {
  return RowOf("6", name) + "\n";
}

// A listing of so many networks.
inline std::string ListingOf(int count) {
  std::string listing = kHeadings;
  for (int i = 1; i <= count; ++i) listing += RowOf("net " + std::to_string(i));
  return listing;
}

// Forgets everything; from now on there is an adapter, its interface comes up, and sleeps take no time.
inline void BeginWithAdapter() {
  fake::Begin();
  fake::MEROWirelessAdapterNum.Returns(1);
  fake::MEROWirelessInterfaceGet.Returns("wlan0");
  fake::PLIBNetIfUp.Returns(1);
  fake::sleep.Returns(0);
}

#endif  // MERO_TESTS_UNIT_LISTING_H
