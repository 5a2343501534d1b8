// The listing tool reads a beacon, element by element.
#include "appliance/sbin/elements.h"

#include <gtest/gtest.h>

#include <string>

#include "common/channel.h"
#include "tests/appliance/elements_text.h"

namespace iwlist {
namespace {

constexpr unsigned kChannel6 = 2437;
constexpr unsigned kChannel36 = 5180;
constexpr unsigned kOpen = 0x0001;     // capability: an access point
constexpr unsigned kPrivate = 0x0011;  // ... that encrypts
constexpr unsigned kCell = 0x0002;     // capability: an ad-hoc cell
constexpr unsigned kPrivateCell = 0x0012;

Description Read(const std::string& hex, unsigned capability = kOpen, unsigned megahertz = kChannel6) {
  const std::vector<std::uint8_t> bytes = Elements(hex);
  return Describe(bytes, capability, megahertz);
}

// ---- Names

TEST(NetworkName, IsTheBytesThatWereSent) {
  EXPECT_EQ(Read("00 04 686F6D65").name, "home");
  EXPECT_EQ(Read("00 06 4D C3BC 6C 20 20").name, "M\xC3\xBCl  ");
  EXPECT_EQ(Read("00 05 61 0A 00 FF 62").name, std::string("a\n\0\xFF"
                                                           "b",
                                                           5));
}

TEST(NetworkName, MayFillAll32Bytes) {
  const std::string name(32, 'n');
  std::string hex = "00 20";
  for (int i = 0; i < 32; ++i) hex += "6E";
  EXPECT_EQ(Read(hex).name, name);
}

TEST(NetworkName, IsEmptyForANetworkThatHidesIt) {
  for (const char* hidden : {"", "00 00", "00 01 00", "00 04 00000000"}) EXPECT_EQ(Read(hidden).name, "") << hidden;
}

TEST(NetworkName, IsEmptyWhenItIsLongerThanANameCanBe) {
  std::string hex = "00 21";
  for (int i = 0; i < 33; ++i) hex += "6E";
  const Description network = Read(hex + "01 01 82");
  EXPECT_EQ(network.name, "");
  EXPECT_EQ(network.protocol, WIRELESS_PROTO_LEGACY_11B) << "what follows is still read";
}

TEST(NetworkName, IsTheFirstOfSeveral) {
  EXPECT_EQ(Read("00 01 61  00 01 62").name, "a");
}

// ---- Radio standard

const std::string kDsss = "01 04 82848B96";                             // 1, 2, 5.5, 11 Mb/s
const std::string kDsssOfdm = "01 08 82848B960C121824 32 04 3048606C";  // ... and 6 to 54 Mb/s
const std::string kOfdm = "01 08 8C129824B048606C";
const std::string kHt = "2D 1A EF1117FFFF00000000000000000000000000000000000000000000";

TEST(RadioStandard, FollowsFromBandRatesAndHighThroughput) {
  const struct {
    std::string elements;
    unsigned megahertz;
    WIRELESS_PROTOCOL protocol;
  } kCases[] = {
      {kDsss, kChannel6, WIRELESS_PROTO_LEGACY_11B},
      {kDsssOfdm, kChannel6, WIRELESS_PROTO_LEGACY_11BG},
      {kOfdm, kChannel6, WIRELESS_PROTO_LEGACY_11G},
      {kDsss + kHt, kChannel6, WIRELESS_PROTO_11BN},
      {kDsssOfdm + kHt, kChannel6, WIRELESS_PROTO_11BGN},
      {kOfdm + kHt, kChannel6, WIRELESS_PROTO_11GN},
      {kHt, kChannel6, WIRELESS_PROTO_11N},
      {kDsssOfdm + kHt, 2484, WIRELESS_PROTO_11BGN},
      {kOfdm, kChannel36, WIRELESS_PROTO_LEGACY_11A},
      {kOfdm + kHt, kChannel36, WIRELESS_PROTO_11AN},
      {kOfdm, 4920, WIRELESS_PROTO_LEGACY_11A},
      {kHt, kChannel36, WIRELESS_PROTO_11N},
      {kOfdm, 5955, WIRELESS_PROTO_UNKNOWN},
      {"", kChannel6, WIRELESS_PROTO_UNKNOWN},
      {"", kChannel36, WIRELESS_PROTO_UNKNOWN},
  };
  for (const auto& row : kCases) {
    EXPECT_EQ(Read(row.elements, kOpen, row.megahertz).protocol, row.protocol) << row.elements << " " << row.megahertz;
  }
}

TEST(RadioStandard, IsNotMistakenForWhatAClientMustSupportToJoin) {
  EXPECT_EQ(Read("01 05 82848B96 FF").protocol, WIRELESS_PROTO_LEGACY_11B) << "high throughput wanted";
  EXPECT_EQ(Read("01 05 82848B96 FB").protocol, WIRELESS_PROTO_LEGACY_11B) << "hash to element wanted";
}

TEST(RadioStandard, DoesNotCountHighThroughputThatIsCutShort) {
  EXPECT_EQ(Read(kDsssOfdm + "2D 02 EF11").protocol, WIRELESS_PROTO_LEGACY_11BG);
}

// ---- Security

const std::string kRsnPskAes = "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC02 0000";
const std::string kWpaPskTkip = "DD 16 0050F201 0100 0050F202 0100 0050F202 0100 0050F202";

TEST(NetworkSecurity, FollowsFromPrivacyAndTheWpaElements) {
  const struct {
    const char* what;
    std::string elements;
    unsigned capability;
    WIRELESS_AUTH auth;
    int encrypt;
  } kCases[] = {
      {"open", "", kOpen, WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE},
      {"open cell", "", kCell, WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE},
      {"WEP", "", kPrivate, WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP},
      {"WEP cell", "", kPrivateCell, WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP},
      {"WEP, with vendor elements that are not WPA", "DD 06 0050F2020101  DD 04 00904C33  DD 00", kPrivate,
       WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP},
      {"WPA2", kRsnPskAes, kPrivate, WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES},
      {"WPA2 cell", kRsnPskAes, kPrivateCell, WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES},
      {"WPA2 without the privacy bit", kRsnPskAes, kOpen, WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES},
      {"WPA", kWpaPskTkip, kPrivate, WIRELESS_AUTH_WPAPSK, WIRELESS_ENCRYPT_TKIP},
      {"WPA with AES", "DD 16 0050F201 0100 0050F204 0100 0050F204 0100 0050F202", kPrivate, WIRELESS_AUTH_WPAPSK,
       WIRELESS_ENCRYPT_AES},
      {"WPA and WPA2", kRsnPskAes + kWpaPskTkip, kPrivate, WIRELESS_AUTH_WPA2PSK,
       WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES},
      {"WPA and WPA2, the other way round", kWpaPskTkip + kRsnPskAes, kPrivate, WIRELESS_AUTH_WPA2PSK,
       WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES},
      {"WPA2 with both ciphers", "30 18 0100 000FAC02 0200 000FAC04 000FAC02 0100 000FAC02 0000", kPrivate,
       WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES},
      {"WPA2 with the group's cipher for all", "30 14 0100 000FAC02 0100 000FAC00 0100 000FAC02 0000", kPrivate,
       WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_TKIP},
      {"WPA2 with a cipher without a name", "30 14 0100 000FAC09 0100 000FAC09 0100 000FAC02 0000", kPrivate,
       WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_UNKNOWN},
      {"WPA2 EAP", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC01 0000", kPrivate, WIRELESS_AUTH_WPA2EAP,
       WIRELESS_ENCRYPT_AES},
      {"WPA EAP", "DD 16 0050F201 0100 0050F202 0100 0050F202 0100 0050F201", kPrivate, WIRELESS_AUTH_WPAEAP,
       WIRELESS_ENCRYPT_TKIP},
      {"WPA2 with EAP or a key", "30 18 0100 000FAC04 0100 000FAC04 0200 000FAC01 000FAC02 0000", kPrivate,
       WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES},
      {"WPA in a cell", "DD 16 0050F201 0100 0050F202 0100 0050F200 0100 0050F200", kPrivateCell, WIRELESS_AUTH_WPANONE,
       WIRELESS_ENCRYPT_TKIP},
      {"WPA3", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC08 C000", kPrivate, WIRELESS_AUTH_UNKNOWN,
       WIRELESS_ENCRYPT_AES},
      {"WPA2 and WPA3", "30 18 0100 000FAC04 0100 000FAC04 0200 000FAC02 000FAC08 8000", kPrivate,
       WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES},
      {"WPA3 beside WPA", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC08 C000" + kWpaPskTkip, kPrivate,
       WIRELESS_AUTH_WPAPSK, WIRELESS_ENCRYPT_TKIP},
      {"WPA2 beside WPA of a maker's own key type",
       kRsnPskAes + "DD 16 0050F201 0100 0050F202 0100 0050F202 0100 00409602", kPrivate, WIRELESS_AUTH_WPA2PSK,
       WIRELESS_ENCRYPT_AES},
      {"opportunistic encryption", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC12 C000", kPrivate,
       WIRELESS_AUTH_UNKNOWN, WIRELESS_ENCRYPT_AES},
      {"fast transition only", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC04 0000", kPrivate, WIRELESS_AUTH_UNKNOWN,
       WIRELESS_ENCRYPT_AES},
      {"a maker's own key type", "30 14 0100 000FAC04 0100 000FAC04 0100 00409602 0000", kPrivate,
       WIRELESS_AUTH_UNKNOWN, WIRELESS_ENCRYPT_AES},
  };
  for (const auto& row : kCases) {
    const Security security = Read(row.elements, row.capability).security;
    EXPECT_EQ(security.auth, row.auth) << row.what;
    EXPECT_EQ(security.encrypt, row.encrypt) << row.what;
  }
}

TEST(NetworkSecurity, TakesTheStandardsDefaultsForWhatASenderLeavesOut) {
  const struct {
    const char* elements;
    WIRELESS_AUTH auth;
    int encrypt;
  } kCases[] = {
      {"30 02 0100", WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_AES},
      {"30 06 0100 000FAC04", WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_AES},
      {"30 0C 0100 000FAC04 0100 000FAC02", WIRELESS_AUTH_WPA2EAP, WIRELESS_ENCRYPT_TKIP},
      {"30 12 0100 000FAC04 0100 000FAC02 0100 000FAC02", WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_TKIP},
      {"DD 06 0050F201 0100", WIRELESS_AUTH_WPAEAP, WIRELESS_ENCRYPT_TKIP},
  };
  for (const auto& row : kCases) {
    const Security security = Read(row.elements, kPrivate).security;
    EXPECT_EQ(security.auth, row.auth) << row.elements;
    EXPECT_EQ(security.encrypt, row.encrypt) << row.elements;
  }
}

TEST(NetworkSecurity, IsUnknownAndNeverWepOrNoneWhenItsElementCannotBeRead) {
  for (const char* bad : {
           "30 00",                                            // empty
           "30 01 01",                                         // half a version
           "30 02 0200",                                       // a version that is not known
           "30 04 0100 000F",                                  // half a cipher
           "30 07 0100 000FAC04 01",                           // half a count
           "30 08 0100 000FAC04 0100",                         // a count of what is not there
           "30 0C 0100 000FAC04 0200 000FAC04",                // one cipher of two
           "30 0C 0100 000FAC04 FFFF 000FAC04",                // one cipher of 65,535
           "30 12 0100 000FAC04 0100 000FAC04 0200 000FAC02",  // one key type of two
           "DD 04 0050F201",                                   // WPA without a version
           "DD 0C 0050F201 0100 0050F202 0100",                // WPA with a count of what is not there
           "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC",    // an element longer than the frame
           "30",                                               // an element without a length
           "DD 16 0050F201 0100",                              // a WPA element longer than the frame
       }) {
    const Security security = Read(bad, kPrivate).security;
    EXPECT_EQ(security.auth, WIRELESS_AUTH_UNKNOWN) << bad;
    EXPECT_EQ(security.encrypt, WIRELESS_ENCRYPT_UNKNOWN) << bad;
  }
}

TEST(NetworkObstacle, IsWhatKeepsTheClientOutWhateverItsSecret) {
  const struct {
    const char* what;
    std::string elements;
    Obstacle obstacle;
  } kCases[] = {
      {"open or WEP", "", Obstacle::kNone},
      {"WPA2", kRsnPskAes, Obstacle::kNone},
      {"WPA", kWpaPskTkip, Obstacle::kNone},
      {"WPA2 EAP", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC01 0000", Obstacle::kNone},
      {"WPA2 without capabilities", "30 12 0100 000FAC04 0100 000FAC02 0100 000FAC02", Obstacle::kNone},
      {"WPA3", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC08 C000", Obstacle::kWpa3},
      {"WPA3 with the key type of newer devices", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC18 C000",
       Obstacle::kWpa3},
      {"WPA2 and WPA3", "30 18 0100 000FAC04 0100 000FAC04 0200 000FAC02 000FAC08 8000", Obstacle::kNone},
      {"WPA2 and WPA3 that insists on protected frames",
       "30 18 0100 000FAC04 0100 000FAC04 0200 000FAC02 000FAC08 C000", Obstacle::kWpa3},
      {"WPA3 beside WPA", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC08 C000" + kWpaPskTkip, Obstacle::kNone},
      {"opportunistic encryption", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC12 C000", Obstacle::kOwe},
      {"WPA3 EAP of 192 bits", "30 14 0100 000FAC09 0100 000FAC09 0100 000FAC0C C000", Obstacle::kWpa3Eap192},
      {"WPA3 EAP", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC05 C000", Obstacle::kWpa3Eap},
      {"fast transition only", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC04 0000", Obstacle::kFastTransition},
      {"WPA2 with SHA-256 only", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC06 0000", Obstacle::kSha256},
      {"WPA2 that insists on protected frames", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC02 C000",
       Obstacle::kProtectedFrames},
      {"WPA2 that may protect frames", "30 14 0100 000FAC04 0100 000FAC04 0100 000FAC02 8000", Obstacle::kNone},
      {"WPA2 with a cipher without a name", "30 14 0100 000FAC09 0100 000FAC09 0100 000FAC02 0000", Obstacle::kCiphers},
      {"a maker's own key type", "30 14 0100 000FAC04 0100 000FAC04 0100 00409602 0000", Obstacle::kUnknown},
      {"an element that is cut short", "30 12 0100 000FAC04 0100 000FAC04 0200 000FAC02", Obstacle::kUnknown},
  };
  for (const auto& row : kCases) EXPECT_EQ(Read(row.elements, kPrivate).obstacle, row.obstacle) << row.what;
}

// ---- Malformed frames

TEST(MalformedFrame, KeepsWhatStandsBeforeTheFault) {
  for (const char* rest : {"2D", "2D 1A", "2D FF 00", "03", "03 05 06"}) {
    const Description network = Read("00 04 686F6D65" + kDsssOfdm + kRsnPskAes + rest, kPrivate);
    EXPECT_EQ(network.name, "home") << rest;
    EXPECT_EQ(network.protocol, WIRELESS_PROTO_LEGACY_11BG) << rest;
    EXPECT_EQ(network.security.auth, WIRELESS_AUTH_WPA2PSK) << rest;
  }
}

// The bytes lie in a block of exactly their size, so that a sanitizer sees any read beyond.
TEST(MalformedFrame, IsNeverReadBeyondItsEnd) {
  const std::vector<std::uint8_t> whole = Elements("00 04 686F6D65" + kDsssOfdm + kRsnPskAes + kWpaPskTkip + kHt);
  for (std::size_t size = 0; size <= whole.size(); ++size) {
    for (const unsigned lie : {0U, 1U, 0x7FU, 0xFFU}) {
      for (std::size_t at = 0; at < size; ++at) {
        std::vector<std::uint8_t> bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(size));
        bytes.shrink_to_fit();
        bytes[at] = static_cast<std::uint8_t>(lie);
        EXPECT_LE(Describe(bytes, kPrivate, kChannel6).name.size(), 32U) << size << " " << at << " " << lie;
      }
    }
  }
}

// ---- Channels

TEST(Channel, FollowsFromTheFrequency) {
  const struct {
    unsigned megahertz;
    int channel;
  } kCases[] = {
      {2412, 1},   {2437, 6},   {2472, 13}, {2484, 14}, {4920, 184},      {5180, 36}, {5500, 100},
      {5825, 165}, {5885, 177}, {5935, 2},  {5955, 1},  {7115, 233},      {58320, 1}, {64800, 4},
      {0, 0},      {900, 0},    {2407, 0},  {5000, 0},  {4294967295U, 0},
  };
  for (const auto& row : kCases) EXPECT_EQ(ChannelOf(row.megahertz), row.channel) << row.megahertz;
}

}  // namespace
}  // namespace iwlist
