// The supplicant's settings, as the library writes them, read back.
#include "model/supplicant_settings.h"

#include <gtest/gtest.h>

#include "base/text.h"

namespace {

std::string Block(const std::string& lines) {
  return "ctrl_interface=/var/run/wpa_supplicant\nnetwork={\n" + lines + "}\n";
}

TEST(SupplicantSettings, TellHowANetworkIsProtected) {
  const struct {
    const char* szLines;
    WIRELESS_AUTH auth;
    int encrypt;
    const char* szKey;
    const char* szUser;
  } rows[] = {
      {"\tssid=\"Home\"\n\tscan_ssid=1\n\tkey_mgmt=NONE\n", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE, "", ""},
      {"\tssid=\"Home\"\n\tkey_mgmt=NONE\n\twep_key0=\"12345\"\n\twep_tx_keyidx=0\n\tauth_alg=SHARED\n",
       WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP, "12345", ""},
      {"\tssid=\"Home\"\n\tkey_mgmt=NONE\n\twep_key0=0123456789\n", WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP,
       "0123456789", ""},
      {"\tssid=\"Home\"\n\tkey_mgmt=WPA-PSK\n\tpairwise=TKIP\n\tpsk=\"open sesame\"\n", WIRELESS_AUTH_WPA2PSK,
       WIRELESS_ENCRYPT_TKIP, "open sesame", ""},
      {"\tssid=\"Home\"\n\tkey_mgmt=WPA-PSK\n\tpsk=\"a \"quoted\" = \"\n", WIRELESS_AUTH_WPA2PSK,
       WIRELESS_ENCRYPT_UNKNOWN, "a \"quoted\" = ", ""},
      {"\tssid=\"Home\"\n\tkey_mgmt=WPA-EAP\n\teap=TTLS PEAP\n\tidentity=\"tina\"\n\tpassword=\"cake\"\n",
       WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_UNKNOWN, "cake", "tina"},
  };
  for (const auto& row : rows) {
    const auto network = ConfiguredNetwork(Block(row.szLines));
    ASSERT_TRUE(network) << row.szLines;
    EXPECT_STREQ(network->network.szEssid, "Home") << row.szLines;
    EXPECT_EQ(network->network.opmode, WIRELESS_OPMODE_MANAGED) << row.szLines;
    EXPECT_EQ(network->network.auth, row.auth) << row.szLines;
    EXPECT_EQ(network->network.encrypt, row.encrypt) << row.szLines;
    EXPECT_STREQ(network->szKey, row.szKey) << row.szLines;
    EXPECT_STREQ(network->szUser, row.szUser) << row.szLines;
  }
}

TEST(SupplicantSettings, TellBothCiphersApartFromOne) {
  for (const int ciphers : {4, 8, 12}) {
    const auto encrypt = static_cast<WIRELESS_ENCRYPT>(ciphers);
    const std::string pairwise = std::string("\tpairwise=") + MEROWirelessEncryptStringGet(encrypt, 1) + "\n";
    const auto network = ConfiguredNetwork(Block("\tssid=\"Home\"\n\tkey_mgmt=WPA-PSK\n" + pairwise));
    ASSERT_TRUE(network);
    EXPECT_EQ(network->network.encrypt, encrypt);
  }
}

TEST(SupplicantSettings, TellTheAccessPointThatANetworkIsJoinedThrough) {
  const std::string rest = "\tssid=\"Home\"\n\tkey_mgmt=NONE\n";
  const auto one = ConfiguredNetwork(Block(rest + "\tbssid=00:11:22:33:44:55\n"));
  ASSERT_TRUE(one);
  EXPECT_EQ(AddressText(one->network.bssid), "00:11:22:33:44:55");
  EXPECT_EQ(one->noneBssid, 0);
  const auto any = ConfiguredNetwork(Block(rest));
  ASSERT_TRUE(any);
  EXPECT_NE(any->noneBssid, 0);
}

TEST(SupplicantSettings, OfAnotherFormTellNothing) {
  for (const char* szText :
       {"", "network={\n\tkey_mgmt=NONE\n}\n", "network={\n\tssid=\"Home\"\n}\n",
        "network={\n\tssid=\"Home\"\n\tkey_mgmt=SAE\n}\n", "ssid=\"Home\"\nkey_mgmt=NONE\n", "\tssid", "\t=\n"}) {
    EXPECT_FALSE(ConfiguredNetwork(szText)) << szText;
  }
}

}  // namespace
