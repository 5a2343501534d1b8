// The settings of an appliance, and what the kit reads of them.
#ifndef MERO_TESTS_SETTINGS_H
#define MERO_TESTS_SETTINGS_H

#include <gmock/gmock.h>

#include <string>

#include "kit.h"

inline constexpr char kFile[] = "/tmp/file";
inline constexpr char kApSettings[] = "/usr/mero/etc/wireless_ap.conf";
inline constexpr char kBridgeScript[] = "/etc/sysconfig/network-scripts/ifcfg-br0";

// The adapter's section of the access-point settings.
inline const std::string kSection = "[RT [5370]\n";

inline Ran RunReader(const std::string& words) {
  return RunInShell("/usr/mero/sbin/mero-settings " + words);
}

class Settings : public Kit {};

#endif  // MERO_TESTS_SETTINGS_H
