// The store of known networks.
#include "tests/fault/saving.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <regex>

#include "common/text.h"
#include "tests/platform/platform_test.h"

namespace fs = std::filesystem;

WIRELESS_NETWORK_CONFIG NetworkOf(int number, const std::string& key) {
  WIRELESS_NETWORK_CONFIG config = {};
  CopyText(config.szKey, key);
  CopyText(config.szIp, "DHCP");
  CopyText(config.network.szEssid, "network " + std::to_string(number));
  config.network.bssid[4] = static_cast<unsigned char>(number / 256);
  config.network.bssid[5] = static_cast<unsigned char>(number % 256);
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.network.auth = WIRELESS_AUTH_WPA2PSK;
  config.network.encrypt = WIRELESS_ENCRYPT_AES;
  return config;
}

std::string SectionOf(int number) {
  char szSection[18];
  return MEROWirelessBssidStringGet(NetworkOf(number).network.bssid, szSection, sizeof szSection);
}

std::string StoredText() {
  if (!fs::exists(kStore)) return "(none)";
  return std::regex_replace(ReadText(kStore), std::regex("ACCESS_TIME=[0-9]+"), "ACCESS_TIME=");
}

std::vector<Saving> Savings() {
  return {
      {"a known network", {1, 2, 3}, NetworkOf(2, "new secret")},
      {"another network", {1, 2, 3}, NetworkOf(4)},
      {"the first network", {}, NetworkOf(1)},
  };
}

void Prepare(const Saving& saving) {
  for (const auto& entry : fs::directory_iterator(kStoreDirectory)) fs::remove_all(entry);
  for (const int number : saving.known) {
    const WIRELESS_NETWORK_CONFIG config = NetworkOf(number);
    ASSERT_EQ(MEROWirelessConfSet(&config), 0);
    ASSERT_EQ(PLIBCFileSetSectionValue(kStore, SectionOf(number).c_str(), "OTHER", "kept", "\t%s=%s\n"), 0);
  }
}
