// The store of known networks, for tests of what becomes of it when a save goes wrong.
#ifndef MERO_TESTS_FAULT_SAVING_H
#define MERO_TESTS_FAULT_SAVING_H

#include <gmock/gmock.h>

#include <string>
#include <vector>

#include "platform.h"

inline constexpr char kStoreDirectory[] = "/usr/mero/etc";
inline constexpr char kStore[] = "/usr/mero/etc/wireless.conf";

// A network whose address ends in `number`.
WIRELESS_NETWORK_CONFIG NetworkOf(int number, const std::string& key = "secret");

// The name of its section.
std::string SectionOf(int number);

// What the store holds, less the times of the saves; "(none)" when it is missing.
std::string StoredText();

// A store that is as it was; where there was none, an empty one holds as little.
MATCHER_P(IsStillThe, before, "is still the store of before") {
  return arg == before || (before == std::string("(none)") && arg.empty());
}

// A save and the store that it meets.
struct Saving {
  const char* szName;
  std::vector<int> known;           // the networks in the store; without any there is no file
  WIRELESS_NETWORK_CONFIG network;  // the one that is saved
};

// Of a network that is known, of one that is not, and of the first one.
std::vector<Saving> Savings();

// Puts the store into the state that a save meets: the known networks, each with a key of another program's, and
// nothing else in its directory.
void Prepare(const Saving& saving);

#endif  // MERO_TESTS_FAULT_SAVING_H
