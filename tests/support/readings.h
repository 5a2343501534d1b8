// What is read of settings. The tests of the library's readers walk these rows, and so do those of the reader that the
// appliance kit has, so that the two cannot come to differ.
#ifndef MERO_TESTS_READINGS_H
#define MERO_TESTS_READINGS_H

#include <optional>
#include <string>
#include <vector>

struct Reading {
  std::string text;
  std::string key;
  std::optional<std::string> value;  // none where the text does not have the key
};

using Readings = std::vector<Reading>;

// Of key/value files.
const Readings& ValueReadings();

// Whether key/value files switch something on: "yes", or else "no".
const Readings& SwitchReadings();

// Of the section "RT [5370", as the bytes that it holds.
const Readings& SectionReadings();

// Of the same section, as settings of the access point: with their defaults, and as the numbers and switches they are.
const Readings& AccessPointReadings();

// Of the network-script files of bridges, behind the line that makes them one; by the names of mero-settings.
const Readings& BridgeReadings();

// Enough of a text to be shown where a reading fails.
std::string Shortened(const std::string& text);

#endif  // MERO_TESTS_READINGS_H
