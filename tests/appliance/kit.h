// The appliance kit on a private machine, installed as its package installs it.
#ifndef MERO_TESTS_KIT_H
#define MERO_TESTS_KIT_H

#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "tests/support/files.h"
#include "tests/support/shell.h"

namespace fs = std::filesystem;

// Has the parts do something, as the scripts would.
inline Ran RunInParts(const std::string& command) {
  std::string script = "set -u; PATH=/tmp/bin:$PATH; ";
  for (const char* part : {"report", "files", "daemon", "ip", "bridge", "country", "hostapd", "guest", "dhcp",
                           "firewall", "schedule", "client", "adapter"}) {
    script += ". /usr/mero/lib/network/" + std::string(part) + ".sh; ";
  }
  return RunInShell(script + command);
}

inline std::string Tells(const std::string& command) {
  const Ran ran = RunInParts(command);
  EXPECT_EQ(ran.status, 0) << command << "\n" << ran.out;
  return ran.out;
}

class Kit : public testing::Test {
 protected:
  Kit() {
    const fs::path kit = APPLIANCE_KIT;
    fs::create_directories("/usr/mero/lib");
    fs::copy(kit / "lib", "/usr/mero/lib/network", fs::copy_options::recursive);
    fs::copy(kit / "hotplug", "/usr/mero/hotplug", fs::copy_options::recursive);
    fs::copy(kit / "etc/rc.network", "/etc/rc.network");
    fs::create_directories("/usr/mero/sbin");
    fs::copy(SETTINGS_PROGRAM, "/usr/mero/sbin/mero-settings");
    WriteText("/tmp/wireless.info", "INTERFACE=\"wlan0\"\nPRODUCT=\"RT [5370\"\n");
  }
};

#endif  // MERO_TESTS_KIT_H
