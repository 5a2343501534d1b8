// The listing, read back with the formats by which the wireless library reads it.
#include "appliance/sbin/listing.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <iterator>
#include <sstream>
#include <string>
#include <system_error>
#include <thread>

#include "platform.h"

namespace iwlist {
namespace {

// A row, as the library reads it.
struct ReadBack {
  bool good = false;
  int channel = 0;
  std::string name;
  std::array<unsigned, 6> address{};
  int signal = 0;
  char protocol[32] = "";
  char security[32] = "";
};

ReadBack TakeRow(const std::string& row) {
  constexpr std::size_t kNameColumn = 5;
  constexpr std::size_t kNameWidth = 33;
  constexpr std::size_t kRestColumn = 37;
  ReadBack taken;
  if (row.size() < kNameColumn + kNameWidth) return taken;
  taken.name = row.substr(kNameColumn, kNameWidth);
  taken.name.erase(taken.name.find_last_not_of(" \t\n\v\f\r") + 1);
  auto& [a, b, c, d, e, f] = taken.address;
  taken.good = std::sscanf(row.c_str(), " %d", &taken.channel) == 1 &&
               std::sscanf(row.c_str() + kRestColumn, " %x:%x:%x:%x:%x:%x %d %31s %31s", &a, &b, &c, &d, &e, &f,
                           &taken.signal, taken.protocol, taken.security) == 9;
  return taken;
}

std::vector<std::string> RowsOf(const std::string& listing) {
  std::istringstream lines(listing);
  std::vector<std::string> rows;
  for (std::string line; std::getline(lines, line);) rows.push_back(line);
  rows.erase(rows.begin(), rows.begin() + std::min<std::ptrdiff_t>(2, std::ssize(rows)));
  return rows;
}

Network AccessPoint(const std::string& name, std::uint8_t last = 0x0B, int signal = -47) {
  Network network;
  network.bssid = {0x02, 0x00, 0xA0, 0x0C, 0xFF, last};
  network.channel = 6;
  network.signal = signal;
  network.description = {name, WIRELESS_PROTO_11BGN, {WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT_AES}};
  return network;
}

ReadBack TakeRowOf(const Network& network) {
  return TakeRow(Row(network, Reader::kProgram));
}

TEST(ListingRow, GivesBackEveryFieldOfTheNetwork) {
  const ReadBack taken = TakeRowOf(AccessPoint("home"));
  ASSERT_TRUE(taken.good);
  EXPECT_EQ(taken.channel, 6);
  EXPECT_EQ(taken.name, "home");
  EXPECT_EQ(taken.address, (std::array<unsigned, 6>{0x02, 0x00, 0xA0, 0x0C, 0xFF, 0x0B}));
  EXPECT_EQ(taken.signal, -47);
  EXPECT_STREQ(taken.protocol, "11b/g/n");
  EXPECT_STREQ(taken.security, "WPA2PSK/AES");
}

TEST(ListingRow, StaysInItsColumnsWhateverTheNumbers) {
  for (const int channel : {0, 1, 14, 233}) {
    for (const int signal : {0, -1, -100, 7, -2147483647}) {
      Network network = AccessPoint("1 2 3");
      network.channel = channel;
      network.signal = signal;
      const ReadBack taken = TakeRowOf(network);
      ASSERT_TRUE(taken.good) << channel << " " << signal;
      EXPECT_EQ(taken.channel, channel);
      EXPECT_EQ(taken.name, "1 2 3");
      EXPECT_EQ(taken.signal, signal);
    }
  }
}

TEST(ListingRow, KeepsANameOf32BytesApartFromTheAddress) {
  for (const char letter : {'n', 'F', '0', ':'}) {
    const std::string name(32, letter);
    const ReadBack taken = TakeRowOf(AccessPoint(name));
    ASSERT_TRUE(taken.good) << letter;
    EXPECT_EQ(taken.name, name);
    EXPECT_EQ(taken.address[0], 0x02U);
  }
}

TEST(ListingRow, GivesAProgramEveryByteOfANameThatARowCanHold) {
  for (const char* name : {"M\xC3\xBCller", " leading", "in  side", "'; reboot #", "\"%s\\n$(x)`", "tab\there",
                           "\x1B[31mred", "\x01\x7F\x80\xFE\xFF", "\xF0\x9F\x8F\xA0"}) {
    EXPECT_EQ(TakeRowOf(AccessPoint(name)).name, name);
  }
}

TEST(ListingRow, IsOneLineWhateverBytesTheNameHolds) {
  const ReadBack taken = TakeRowOf(AccessPoint(std::string("a\nb\0c\rd\ve\ff", 11)));
  ASSERT_TRUE(taken.good);
  EXPECT_EQ(taken.name, "a?b?c?d?e?f");

  for (int byte = 0; byte < 256; ++byte) {
    const std::string row = Row(AccessPoint(std::string(32, static_cast<char>(byte))), Reader::kProgram);
    EXPECT_EQ(row.find('\n'), row.size() - 1) << byte;
    EXPECT_EQ(row.find('\0'), std::string::npos) << byte;
    EXPECT_TRUE(TakeRow(row).good) << byte;
  }
}

TEST(ListingRow, SteersNoTerminal) {
  const auto shown = [](const std::string& name) { return TakeRow(Row(AccessPoint(name), Reader::kTerminal)).name; };
  EXPECT_EQ(shown("\x1B[31mred\x07\t\x7F."), "?[31mred???.");
  EXPECT_EQ(shown("\xC2\x9B"
                  "2J"),
            "\xC2?2J")
      << "a control character of two bytes";
  EXPECT_EQ(shown("M\xC3\x9Cller \xF0\x9F\x8F\xA0"), "M\xC3\x9Cller \xF0\x9F\x8F\xA0");
}

TEST(ListingRow, HasABlankNameColumnForANetworkThatHidesItsName) {
  const ReadBack taken = TakeRowOf(AccessPoint(""));
  EXPECT_TRUE(taken.good);
  EXPECT_EQ(taken.name, "");
}

TEST(ListingRow, NamesEveryProtocolSoThatTheLibraryKnowsIt) {
  for (int value = WIRELESS_PROTO_UNKNOWN; value <= WIRELESS_PROTO_11BN; ++value) {
    Network network = AccessPoint("home");
    network.description.protocol = static_cast<WIRELESS_PROTOCOL>(value);
    const ReadBack taken = TakeRowOf(network);
    ASSERT_TRUE(taken.good) << value;
    EXPECT_EQ(MEROWirelessProtocolParse(taken.protocol), value);
  }
}

TEST(ListingRow, SaysNoneAndWepWithoutAnAuthentication) {
  Network network = AccessPoint("home");
  network.description.security = {WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE};
  EXPECT_STREQ(TakeRowOf(network).security, "NONE");
  network.description.security = {WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP};
  EXPECT_STREQ(TakeRowOf(network).security, "WEP");
}

TEST(ListingRow, NamesEveryOtherSecuritySoThatTheLibraryKnowsIt) {
  const int kCiphers[] = {WIRELESS_ENCRYPT_UNKNOWN, WIRELESS_ENCRYPT_TKIP, WIRELESS_ENCRYPT_AES,
                          WIRELESS_ENCRYPT_TKIP | WIRELESS_ENCRYPT_AES};
  for (const WIRELESS_AUTH auth : {WIRELESS_AUTH_UNKNOWN, WIRELESS_AUTH_WPAPSK, WIRELESS_AUTH_WPA2PSK,
                                   WIRELESS_AUTH_WPANONE, WIRELESS_AUTH_WPAEAP, WIRELESS_AUTH_WPA2EAP}) {
    for (const int encrypt : kCiphers) {
      Network network = AccessPoint("home");
      network.description.security = {auth, static_cast<WIRELESS_ENCRYPT>(encrypt)};
      const ReadBack taken = TakeRowOf(network);
      char authText[16] = "";
      char encryptText[16] = "";
      ASSERT_EQ(std::sscanf(taken.security, " %15[^/]/%15s", authText, encryptText), 2) << taken.security;
      EXPECT_EQ(MEROWirelessAuthParse(authText), auth) << taken.security;
      EXPECT_EQ(MEROWirelessEncryptParse(encryptText), encrypt) << taken.security;
    }
  }
}

TEST(Listing, IsTwoLinesOfHeadingsWhenNothingIsInRange) {
  const std::string listing = Listing({}, Reader::kProgram);
  EXPECT_EQ(std::count(listing.begin(), listing.end(), '\n'), 2);
  EXPECT_EQ(listing.back(), '\n');
}

TEST(Listing, HasItsHeadingsAboveTheColumns) {
  const std::string headings = Listing({}, Reader::kProgram);
  EXPECT_EQ(headings.find("NAME"), 5U);
  EXPECT_EQ(headings.find("ADDRESS"), Row(AccessPoint("home"), Reader::kProgram).find("02:00:"));
  EXPECT_EQ(headings.find("PROTOCOL"), Row(AccessPoint("home"), Reader::kProgram).find("11b/g/n"));
  EXPECT_EQ(headings.find("SECURITY"), Row(AccessPoint("home"), Reader::kProgram).find("WPA2PSK/AES"));
}

TEST(Listing, BeginsWithTheStrongestSignalAndOrdersEqualOnesByAddress) {
  const std::vector<std::string> rows = RowsOf(Listing(
      {AccessPoint("weak", 1, -90), AccessPoint("d", 4, -60), AccessPoint("c", 3, -60), AccessPoint("strong", 2, -30)},
      Reader::kProgram));
  ASSERT_EQ(rows.size(), 4U);
  EXPECT_EQ(TakeRow(rows[0]).name, "strong");
  EXPECT_EQ(TakeRow(rows[1]).name, "c");
  EXPECT_EQ(TakeRow(rows[2]).name, "d");
  EXPECT_EQ(TakeRow(rows[3]).name, "weak");
}

TEST(Listing, ShowsAnAddressOnceAsItWasLastHeard) {
  Network before = AccessPoint("before", 1, -30);
  before.seenMsAgo = 20000;
  Network now = AccessPoint("now", 1, -80);
  now.seenMsAgo = 100;
  for (const auto& networks : {std::vector{before, now}, std::vector{now, before}}) {
    const std::vector<std::string> rows = RowsOf(Listing(networks, Reader::kProgram));
    ASSERT_EQ(rows.size(), 1U);
    EXPECT_EQ(TakeRow(rows[0]).name, "now");
  }
}

// A network that hides its name is heard twice: by its beacons, and by its answer to whoever asks for it by name.
TEST(Listing, KeepsTheNameOfANetworkThatHidesItInLaterBeacons) {
  Network answer = AccessPoint("secret", 1);
  answer.seenMsAgo = 5000;
  Network beacon = AccessPoint("", 1);
  const std::vector<std::string> rows = RowsOf(Listing({beacon, answer}, Reader::kProgram));
  ASSERT_EQ(rows.size(), 1U);
  EXPECT_EQ(TakeRow(rows[0]).name, "secret");
}

TEST(Listing, ShowsAccessPointsOfOneNameEachByItself) {
  EXPECT_EQ(RowsOf(Listing({AccessPoint("home", 1), AccessPoint("home", 2)}, Reader::kProgram)).size(), 2U);
}

TEST(ListingOfObstacles, NamesThoseThatCannotBeJoinedAndNoOthers) {
  const std::pair<Obstacle, std::string> kTexts[] = {
      {Obstacle::kWpa3, "WPA3"},
      {Obstacle::kOwe, "OWE"},
      {Obstacle::kWpa3Eap192, "WPA3 EAP 192"},
      {Obstacle::kWpa3Eap, "WPA3 EAP"},
      {Obstacle::kFastTransition, "WPA2 FT"},
      {Obstacle::kSha256, "WPA2 SHA256"},
      {Obstacle::kProtectedFrames, "WPA2 PMF"},
      {Obstacle::kCiphers, "WPA2 with other ciphers"},
      {Obstacle::kUnknown, "unknown"},
  };
  for (const auto& [obstacle, text] : kTexts) {
    Network strange = AccessPoint("strange", 0x0C);
    strange.description.obstacle = obstacle;
    EXPECT_EQ(ListingOfObstacles({AccessPoint("home"), strange}), "02:00:A0:0C:FF:0C " + text + "\n");
  }
  EXPECT_EQ(ListingOfObstacles({AccessPoint("home")}), "");
}

TEST(WritingTheListing, DeliversAllOfItThroughAPipeThatIsReadSlowly) {
  int ends[2];
  ASSERT_EQ(pipe(ends), 0);
  const std::string text(1 << 20, 't');
  std::thread writer([&] {
    Write(ends[1], text);
    close(ends[1]);
  });
  std::size_t received = 0;
  char piece[777];
  for (ssize_t size; (size = read(ends[0], piece, sizeof(piece))) > 0;) received += static_cast<std::size_t>(size);
  writer.join();
  close(ends[0]);
  EXPECT_EQ(received, text.size());
}

TEST(WritingTheListing, FailsAloudWhenTheDiskIsFull) {
  const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
  ASSERT_GE(full, 0);
  try {
    Write(full, "listing");
    ADD_FAILURE() << "the lost listing went unnoticed";
  } catch (const std::system_error& failure) {
    EXPECT_EQ(failure.code().value(), ENOSPC);
    EXPECT_STREQ(failure.what(), "cannot write the listing: No space left on device");
  }
  close(full);
}

}  // namespace
}  // namespace iwlist
