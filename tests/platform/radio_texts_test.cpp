// The texts of the radio's enumerations, and back.
#include <climits>

#include "tests/platform/platform_test.h"

namespace {

class Texts : public PlatformTest {
 protected:
  static std::string Upper(std::string text) {
    for (char& c : text) c = static_cast<char>(c >= 'a' && c <= 'z' ? c - 'a' + 'A' : c);
    return text;
  }
  static std::string Lower(std::string text) {
    for (char& c : text) c = static_cast<char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
    return text;
  }
};

constexpr const char* kJunk[] = {"",         " ",        "junk", "WPA", "OPEN ",   " OPEN",
                                 "WPA2PSKX", "TKIP AES", "11",   "0",   "\xFF\xFE"};

TEST_F(Texts, OfAuthenticationsReadBackInAnyCase) {
  const struct {
    WIRELESS_AUTH value;
    const char* szText;
  } rows[] = {
      {WIRELESS_AUTH_UNKNOWN, "UNKNOWN"}, {WIRELESS_AUTH_OPEN, "OPEN"},     {WIRELESS_AUTH_SHARED, "SHARED"},
      {WIRELESS_AUTH_WEPAUTO, "WEPAUTO"}, {WIRELESS_AUTH_WPAPSK, "WPAPSK"}, {WIRELESS_AUTH_WPA2PSK, "WPA2PSK"},
      {WIRELESS_AUTH_WPANONE, "WPANONE"}, {WIRELESS_AUTH_WPAEAP, "WPAEAP"}, {WIRELESS_AUTH_WPA2EAP, "WPA2EAP"},
  };
  for (const auto& row : rows) {
    EXPECT_STREQ(MEROWirelessAuthStringGet(row.value), row.szText);
    EXPECT_EQ(MEROWirelessAuthParse(row.szText), row.value);
    EXPECT_EQ(MEROWirelessAuthParse(Lower(row.szText).c_str()), row.value);
  }
  for (const int value : {-1, 9, INT_MIN, INT_MAX}) {
    EXPECT_STREQ(MEROWirelessAuthStringGet(static_cast<WIRELESS_AUTH>(value)), "UNKNOWN");
  }
  for (const char* szJunk : kJunk) EXPECT_EQ(MEROWirelessAuthParse(szJunk), WIRELESS_AUTH_UNKNOWN) << szJunk;
  EXPECT_EQ(MEROWirelessAuthParse(nullptr), WIRELESS_AUTH_UNKNOWN);
}

// A value with a bit beside those of the two ciphers got an empty list, and the supplicant refused the whole file.
TEST_F(Texts, OfCiphersForTheSupplicantAreThoseOfTkipAndAesWhateverElseThereIs) {
  const char* const kNames[] = {"", "TKIP", "CCMP", "TKIP CCMP"};
  for (const int others : {0, 1, 2, 3, 16, 0x7FFFFFF0, INT_MIN}) {
    for (int ciphers = 0; ciphers < 4; ++ciphers) {
      const int value = (others & ~12) | ciphers << 2;
      EXPECT_STREQ(MEROWirelessEncryptStringGet(static_cast<WIRELESS_ENCRYPT>(value), 1), kNames[ciphers]) << value;
    }
  }
}

TEST_F(Texts, OfEncryptionsReadBackInAnyCase) {
  const struct {
    int value;
    const char* szText;
    const char* szCiphers;  // the supplicant's
  } rows[] = {
      {WIRELESS_ENCRYPT_UNKNOWN, "UNKNOWN", ""}, {WIRELESS_ENCRYPT_NONE, "NONE", ""},
      {WIRELESS_ENCRYPT_WEP, "WEP", ""},         {WIRELESS_ENCRYPT_TKIP, "TKIP", "TKIP"},
      {WIRELESS_ENCRYPT_AES, "AES", "CCMP"},     {WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES, "TKIPAES", "TKIP CCMP"},
  };
  for (const auto& row : rows) {
    const auto value = static_cast<WIRELESS_ENCRYPT>(row.value);
    EXPECT_STREQ(MEROWirelessEncryptStringGet(value, 0), row.szText);
    EXPECT_STREQ(MEROWirelessEncryptStringGet(value, 1), row.szCiphers);
    EXPECT_EQ(MEROWirelessEncryptParse(row.szText), value);
    EXPECT_EQ(MEROWirelessEncryptParse(Lower(row.szText).c_str()), value);
  }
  for (const int value : {-1, 3, 5, 9, 13, 15, 16, INT_MIN, INT_MAX}) {
    EXPECT_STREQ(MEROWirelessEncryptStringGet(static_cast<WIRELESS_ENCRYPT>(value), 0), "UNKNOWN") << value;
  }
  for (const char* szJunk : kJunk) EXPECT_EQ(MEROWirelessEncryptParse(szJunk), WIRELESS_ENCRYPT_UNKNOWN) << szJunk;
  EXPECT_EQ(MEROWirelessEncryptParse(nullptr), WIRELESS_ENCRYPT_UNKNOWN);
}

TEST_F(Texts, OfStandardsReadBackInAnyCase) {
  const struct {
    WIRELESS_PROTOCOL value;
    const char* szText;
  } rows[] = {
      {WIRELESS_PROTO_UNKNOWN, "unknown"},      {WIRELESS_PROTO_LEGACY_11BG, "11b/g"},
      {WIRELESS_PROTO_LEGACY_11B, "11b"},       {WIRELESS_PROTO_LEGACY_11A, "11a"},
      {WIRELESS_PROTO_LEGACY_11ABG, "11a/b/g"}, {WIRELESS_PROTO_LEGACY_11G, "11g"},
      {WIRELESS_PROTO_11ABGN, "11a/b/g/n"},     {WIRELESS_PROTO_11N, "11n"},
      {WIRELESS_PROTO_11GN, "11g/n"},           {WIRELESS_PROTO_11AN, "11a/n"},
      {WIRELESS_PROTO_11BGN, "11b/g/n"},        {WIRELESS_PROTO_11AGN, "11a/g/n"},
      {WIRELESS_PROTO_11BN, "11b/n"},
  };
  for (const auto& row : rows) {
    EXPECT_STREQ(MEROWirelessProtocolStringGet(row.value), row.szText);
    EXPECT_EQ(MEROWirelessProtocolParse(row.szText), row.value);
    EXPECT_EQ(MEROWirelessProtocolParse(Upper(row.szText).c_str()), row.value);
  }
  for (const int value : {-1, 13, INT_MIN, INT_MAX}) {
    EXPECT_STREQ(MEROWirelessProtocolStringGet(static_cast<WIRELESS_PROTOCOL>(value)), "unknown");
  }
  for (const char* szJunk : kJunk) EXPECT_EQ(MEROWirelessProtocolParse(szJunk), WIRELESS_PROTO_UNKNOWN) << szJunk;
  EXPECT_EQ(MEROWirelessProtocolParse(nullptr), WIRELESS_PROTO_UNKNOWN);
}

TEST_F(Texts, OfOperatingModesAreThoseOfTheFileOfKnownNetworks) {
  const struct {
    WIRELESS_OPMODE value;
    const char* szText;
  } rows[] = {
      {WIRELESS_OPMODE_AUTO, "AUTO"},         {WIRELESS_OPMODE_ADHOC, "ADHOC"},
      {WIRELESS_OPMODE_MANAGED, "MANAGED"},   {WIRELESS_OPMODE_MASTER, "MASTER"},
      {WIRELESS_OPMODE_REPEATER, "REPEATER"}, {WIRELESS_OPMODE_SECONDEARY, "SECONDARY"},
      {WIRELESS_OPMODE_MONITOR, "MONITOR"},   {WIRELESS_OPMODE_UNKNOWN, "UNKNOWN"},
  };
  for (const auto& row : rows) EXPECT_STREQ(MEROWirelessOpmodeStringGet(row.value), row.szText);
  for (const int value : {-1, +WIRELESS_OPMODE_MAX, INT_MIN, INT_MAX}) {
    EXPECT_STREQ(MEROWirelessOpmodeStringGet(static_cast<WIRELESS_OPMODE>(value)), "UNKNOWN");
  }
}

TEST_F(Texts, OfHardwareAddressesAreCutToTheCallersBuffer) {
  const unsigned char address[] = {0x00, 0x1a, 0xff, 0xAB, 0x09, 0x90};
  const struct {
    size_t size;
    std::string buffer;
  } rows[] = {
      {18, std::string("00:1A:FF:AB:09:90\0x", 19)}, {1024, std::string("00:1A:FF:AB:09:90\0x", 19)},
      {17, std::string("00:1A:FF:AB:09:9\0xx", 19)}, {1, std::string("\0xxxxxxxxxxxxxxxxxx", 19)},
      {0, std::string("xxxxxxxxxxxxxxxxxxx")},
  };
  for (const auto& row : rows) {
    std::string buffer(1024, 'x');
    EXPECT_EQ(MEROWirelessBssidStringGet(address, buffer.data(), row.size), buffer.data());
    EXPECT_EQ(buffer.substr(0, 19), row.buffer) << row.size;
  }
}

TEST_F(Texts, OfHardwareAddressesNeedAnAddressAndABuffer) {
  const unsigned char address[6] = {};
  char szText[18];
  EXPECT_EQ(MEROWirelessBssidStringGet(nullptr, szText, sizeof szText), nullptr);
  ExpectNullRefused();
  EXPECT_EQ(MEROWirelessBssidStringGet(address, nullptr, sizeof szText), nullptr);
  ExpectNullRefused();
}

}  // namespace
