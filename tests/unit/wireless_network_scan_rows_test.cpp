// A scan reads each row of the listing.
#include <cstring>
#include <span>

#include "listing.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;

class ListingRow : public UnitTest {
 protected:
  ListingRow() { Begin(); }

  void Begin() {
    ring_.Clear();
    BeginWithAdapter();
  }

  // Scans where the tool prints these rows behind its headings, or all of `listing`.
  void Read(const std::string& rows) { ReadListing(kHeadings + rows); }
  void ReadListing(const std::string& listing) {
    Begin();
    fake::PipesGive({listing});
    EXPECT_EQ(memory::Run(0, [this] { return MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, ring_.head()); }), 0);
    EXPECT_EQ(memory::Held(), ring_.Records().size()) << "rows that are not listed leave their records";
  }

  // The one network that a row is.
  WIRELESS_NETWORK ReadOne(const std::string& row) {
    Read(row);
    EXPECT_EQ(ring_.Records().size(), 1u) << row;
    return ring_.Records().empty() ? WIRELESS_NETWORK{} : *ring_.Records()[0];
  }

  std::vector<std::string> Names() {
    std::vector<std::string> names;
    for (const WIRELESS_NETWORK* network : ring_.Records()) names.push_back(network->szEssid);
    return names;
  }

  // The reports about rows in the first reading.
  static std::vector<std::string> Complaints() {
    std::vector<std::string> messages = fake::Messages();
    const auto isScans = [](const std::string& message) { return message.find(" Scan 0: ") != std::string::npos; };
    messages.erase(std::ranges::find_if(messages, isScans), messages.end());
    return messages;
  }

  Ring<WIRELESS_NETWORK> ring_;
};

std::string ChannelComplaint(const std::string& row) {
  return "wireless_network_scan:110 Failed to parse channel(" + row + ")";
}

std::string InfoComplaint(const std::string& row) {
  return "wireless_network_scan:127 Failed to parse network info(" + row + ")";
}

TEST_F(ListingRow, BecomesARecordWithNothingElseInIt) {
  WIRELESS_NETWORK network = ReadOne(RowOf("11", "Home Net", " 00:11:22:aa:BB:Cc    -40 11b/g/n   WPA2PSK/AES\n"));
  WIRELESS_NETWORK expected;
  std::memset(&expected, 0, sizeof expected);
  std::strcpy(expected.szEssid, "Home Net");
  std::memcpy(expected.bssid, "\x00\x11\x22\xAA\xBB\xCC", sizeof expected.bssid);
  expected.channel = 11;
  expected.signal = -40;
  expected.protocol = WIRELESS_PROTO_11BGN;
  expected.auth = WIRELESS_AUTH_WPA2PSK;
  expected.encrypt = WIRELESS_ENCRYPT_AES;
  network.list = {};
  EXPECT_EQ(std::memcmp(&network, &expected, sizeof network), 0);
  EXPECT_THAT(Complaints(), IsEmpty());
}

TEST_F(ListingRow, KeepsItsPlaceInTheListing) {
  Read(RowOf("b") + RowOf("c") + RowOf("a") + RowOf("b"));
  EXPECT_THAT(Names(), ElementsAre("b", "c", "a", "b"));
}

TEST_F(ListingRow, IsReadAlsoWithoutANewlineBehindTheLast) {
  Read(RowOf("first") + RowOf("6", "last"));
  EXPECT_THAT(Names(), ElementsAre("first", "last"));
}

TEST_F(ListingRow, HasItsChannelAtItsStart) {
  const struct {
    const char* szChannel;
    int channel;
  } rows[] = {{"1", 1}, {" 6", 6}, {"   6", 6}, {"\t11", 11}, {"165", 165}, {"-1", -1}, {"+7", 7}, {"0", 0}};
  for (const auto& row : rows) EXPECT_EQ(ReadOne(RowOf(row.szChannel, "net")).channel, row.channel) << row.szChannel;
}

TEST_F(ListingRow, HasTheNameInItsColumnsWithoutTheWhiteSpaceBehindIt) {
  const std::string longest = "name of exactly thirty-two bytes";
  ASSERT_EQ(longest.size(), 32u);
  const struct {
    std::string column;
    std::string name;
  } rows[] = {
      {"x", "x"},
      {"two words", "two words"},
      {"  leading", "  leading"},
      {"trailing \t\v\f\r ", "trailing"},
      {"in\t\v\f\rside", "in\t\v\f\rside"},
      {longest, longest},
      {std::string(31, ' ') + "x", std::string(31, ' ') + "x"},
      {"x" + std::string(31, '\t'), "x"},
      {"%s%n\\\"'[/]", "%s%n\\\"'[/]"},
      {"\x01\x1b[31m\x7f", "\x01\x1b[31m\x7f"},
      {"\xc3\xa9t\xc3\xa9", "\xc3\xa9t\xc3\xa9"},
      {"blank to some \x85\xa0", "blank to some \x85\xa0"},
      {"00:11:22:33:44:55 1 a WEP", "00:11:22:33:44:55 1 a WEP"},
  };
  for (const auto& row : rows) EXPECT_EQ(ReadOne(RowOf(row.column)).szEssid, row.name);
}

TEST_F(ListingRow, HasAnyByteInItsName) {
  for (int first = 0x80; first <= 0xff; first += 32) {
    std::string name;
    for (int byte = first; byte < first + 32; ++byte) name += static_cast<char>(byte);
    EXPECT_EQ(ReadOne(RowOf(name)).szEssid, name);
  }
}

TEST_F(ListingRow, HasAtMost32BytesInItsName) {
  const std::string name(32, 'n');
  // The 33rd character is the first of the address.
  EXPECT_EQ(ReadOne(RowOf("6", name, "0a:1:2:3:4:5 -40 11n NONE\n")).szEssid, name);
  EXPECT_EQ(ring_.Records()[0]->bssid[0], 0x0a);

  const std::string row = RowOf(name + "n");
  Read(row + RowOf("after"));
  EXPECT_THAT(Names(), ElementsAre("after"));
  EXPECT_THAT(Complaints(), ElementsAre(InfoComplaint(row)));
}

TEST_F(ListingRow, IsLeftOutSilentlyWhenItHidesItsName) {
  Read(RowOf("") + RowOf(std::string(32, ' ')) + RowOf(" \t\v\f\r ") + RowOf("6", "", "no information at all") + "\n" +
       RowOf("after"));
  EXPECT_THAT(Names(), ElementsAre("after"));
  EXPECT_THAT(Complaints(), IsEmpty());
}

TEST_F(ListingRow, HasTheAddressAndTheSignalBehindItsName) {
  const struct {
    const char* szInfo;
    const char* rgbBssid;
    int signal;
  } rows[] = {
      {" 00:11:22:33:44:55 -40 11n WEP", "\x00\x11\x22\x33\x44\x55", -40},
      {"00:11:22:33:44:55 -40 11n WEP", "\x00\x11\x22\x33\x44\x55", -40},
      {"  \t 0:1:2:3:4:5\t7\t11n\tWEP", "\x00\x01\x02\x03\x04\x05", 7},
      {" aA:bB:cC:dD:eE:fF 100 11n WEP", "\xaa\xbb\xcc\xdd\xee\xff", 100},
      {" ff:ff:ff:ff:ff:ff 0 11n WEP", "\xff\xff\xff\xff\xff\xff", 0},
      {" 1fe:2:3:4:5:abcdef99 +5 11n WEP", "\xfe\x02\x03\x04\x05\x99", 5},
      {" 1: 2: 3: 4: 5: 6 -2147483648 11n WEP", "\x01\x02\x03\x04\x05\x06", -2147483647 - 1},
      {" +a:-1:0x1f:0Xe:-0x2: +0xd 1 11n WEP", "\x0a\xff\x1f\x0e\xfe\x0d", 1},
      {" 0x:0X:+0x:-0x: 0x:0x 1 11n WEP", "\x00\x00\x00\x00\x00\x00", 1},
      {" 1:2:3:4:-fffffffffffffffffffff:fffffffffffffffffffff 1 11n WEP", "\x01\x02\x03\x04\xff\xff", 1},
      {" 1:2:3:4:5:6-40\v11n\fWEP", "\x01\x02\x03\x04\x05\x06", -40},
      {" 00:11:22:33:44:55 -40 11n WEP and what else there is", "\x00\x11\x22\x33\x44\x55", -40},
      {" 00:11:22:33:44:55 -40 11n WEP\r", "\x00\x11\x22\x33\x44\x55", -40},
  };
  for (const auto& row : rows) {
    const WIRELESS_NETWORK network = ReadOne(RowOf("6", "net", row.szInfo) + "\n");
    EXPECT_EQ(std::memcmp(network.bssid, row.rgbBssid, sizeof network.bssid), 0) << row.szInfo;
    EXPECT_EQ(network.signal, row.signal) << row.szInfo;
    EXPECT_EQ(network.protocol, WIRELESS_PROTO_11N) << row.szInfo;
    EXPECT_EQ(network.encrypt, WIRELESS_ENCRYPT_WEP) << row.szInfo;
  }
}

TEST_F(ListingRow, IsReportedAndLeftOutWithoutAChannel) {
  const std::string rows[] = {RowOf("", "net") + "\n", RowOf("x", "net") + "\n",       RowOf("--", "net") + "\n",
                              std::string(32, ' '),    std::string(40, '\xff') + "\n", std::string(40, '%') + "\n"};
  for (const std::string& row : rows) {
    Read(row + (row.ends_with('\n') ? RowOf("after") : ""));
    EXPECT_THAT(Complaints(), ElementsAre(ChannelComplaint(row)));
    EXPECT_EQ(ring_.Records().size(), row.ends_with('\n') ? 1u : 0u);
  }
}

TEST_F(ListingRow, IsReportedAndLeftOutWithoutAllInformation) {
  for (const char* szInfo : {"",
                             " ",
                             " 00",
                             " 00:11:22:33:44",
                             " 00:11:22:33:44:55",
                             " 00:11:22:33:44:55 -40",
                             " 00:11:22:33:44:55 -40 11n",
                             " 00:11:22:33:44:55 -40 11n  ",
                             " 00-11-22-33-44-55 -40 11n WEP",
                             " zz:11:22:33:44:55 -40 11n WEP",
                             " 00:11:22:33:44:55 weak 11n WEP",
                             " 00 :11:22:33:44:55 -40 11n WEP",
                             " :11:22:33:44:55 -40 11n WEP",
                             " 00x:11:22:33:44:55 -40 11n WEP",
                             " 10x:11:22:33:44:55 -40 11n WEP",
                             " 0x0x:11:22:33:44:55 -40 11n WEP",
                             " x:11:22:33:44:55 -40 11n WEP",
                             " - 1:11:22:33:44:55 -40 11n WEP",
                             " 00:11:22:33:44:55: -40 11n WEP",
                             " 00:11:22:33:44:55 - 40 11n WEP",
                             " 00:11:22:33:44:55 -40n-WEP"}) {
    const std::string row = RowOf("6", "net", szInfo) + "\n";
    Read(row + RowOf("after"));
    EXPECT_THAT(Complaints(), ElementsAre(InfoComplaint(row)));
    EXPECT_THAT(Names(), ElementsAre("after"));
  }
}

TEST_F(ListingRow, HasNoInformationWhenItEndsBeforeTheInformationsColumn) {
  for (const size_t size : {32u, 33u, 35u, 36u, 37u, 38u}) {
    const std::string row = ("6    00:11:22:33:44:55 1 a WEP " + std::string(37, 'x')).substr(0, size - 1) + "\n";
    Read(row + RowOf("after"));
    EXPECT_THAT(Complaints(), ElementsAre(InfoComplaint(row))) << size;
    EXPECT_THAT(Names(), ElementsAre("after")) << size;
  }
}

TEST_F(ListingRow, IsPassedOverSilentlyWhenItIsShorterThan32Characters) {
  const std::string row = RowOf("6", "net");
  for (const size_t size : {0u, 1u, 3u, 5u, 6u, 20u, 30u}) {
    Read(row.substr(0, size) + "\n" + RowOf("after"));
    EXPECT_THAT(Complaints(), IsEmpty()) << size;
    EXPECT_THAT(Names(), ElementsAre("after")) << size;
  }
  Read(row.substr(0, 31));
  EXPECT_THAT(Complaints(), IsEmpty());
  Read(row.substr(0, 32));
  EXPECT_THAT(Complaints(), ElementsAre(InfoComplaint(row.substr(0, 32))));
}

TEST_F(ListingRow, EndsAtANullByteAndTheNextIsRead) {
  for (const size_t at : {0u, 3u, 31u, 32u, 36u, 37u, 38u, 60u}) {
    std::string row = RowOf("net");
    row[at] = '\0';
    Read(row + RowOf("after"));
    EXPECT_THAT(Names(), ElementsAre("after")) << at;
    if (at < 32) {
      EXPECT_THAT(Complaints(), IsEmpty()) << at;
    } else {
      EXPECT_THAT(Complaints(), ElementsAre(InfoComplaint(row.substr(0, at)))) << at;
    }
  }
}

TEST_F(ListingRow, IsTakenInPiecesOf511BytesWhenItIsLonger) {
  const std::string network = RowOf("6", "long") + " ";
  for (const size_t size : {510u, 511u, 512u, 541u, 542u, 600u, 1022u, 1023u}) {
    const std::string row = network + std::string(size - network.size() - 1, 'x') + "\n";
    std::vector<std::string> complaints;
    for (size_t begin = 511; begin < size; begin += 511) {
      const std::string piece = row.substr(begin, 511);
      if (piece.size() >= 32) complaints.push_back(ChannelComplaint(piece));
    }
    Read(row + RowOf("after"));
    EXPECT_THAT(Names(), ElementsAre("long", "after")) << size;
    EXPECT_THAT(Complaints(), ElementsAreArray(complaints)) << size;
  }
}

TEST_F(ListingRow, OfAnyLengthAndContentKeepsTheNetworksAfterIt) {
  for (const char byte : {'x', '9', ' ', '\t', ':', '/', '%', '\x01', '\x80', '\xff', '\0'}) {
    for (size_t size = 0; size <= 600; ++size) {
      Read(std::string(size, byte) + "\n" + RowOf("after"));
      EXPECT_THAT(Names(), ElementsAre("after")) << size << " of " << static_cast<int>(byte);
    }
  }
}

TEST_F(ListingRow, IsNoneOfTheTwoHeadingsWhateverTheySay) {
  ReadListing(RowOf("heading") + RowOf("heading") + RowOf("net"));
  EXPECT_THAT(Names(), ElementsAre("net"));
  for (const char* szListing : {"", "\n", "x", "one heading\n", "two\nheadings\n", "two\nheadings"}) {
    ReadListing(szListing);
    EXPECT_THAT(Names(), IsEmpty()) << szListing;
    EXPECT_THAT(Complaints(), IsEmpty()) << szListing;
  }
}

TEST_F(ListingRow, ComesEarlierWhenAHeadingTakesTwoPieces) {
  const std::string second = "---- -------------------------------- ----\n";
  ReadListing(std::string(600, '=') + "\n" + second + RowOf("net"));
  EXPECT_THAT(Names(), ElementsAre("net"));
  EXPECT_THAT(Complaints(), ElementsAre(ChannelComplaint(second)));
}

TEST_F(ListingRow, IsNotListedWhenItFindsNoMemoryNorAreThoseAfterIt) {
  std::vector<size_t> kept;
  const auto scan = [this] { return MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, ring_.head()); };
  const auto prepare = [this] {
    Begin();
    fake::PipesGive({ListingOf(1), ListingOf(2), ListingOf(3), ListingOf(4), ListingOf(5)});
  };
  prepare();
  memory::FailEach(scan, [&](int n, int result) {
    EXPECT_EQ(fake::pclose.calls(), fake::popen.calls()) << n;
    EXPECT_EQ(memory::Held(), ring_.Records().size()) << n;
    const std::vector<std::string> all = {"net 1", "net 2", "net 3", "net 4", "net 5"};
    EXPECT_TRUE(std::ranges::equal(Names(), std::span(all).first(Names().size()))) << n;
    if (memory::HasFailed()) {
      EXPECT_THAT(fake::Messages(), testing::Contains("wireless_network_scan:97 Failed to alloc memory")) << n;
    }
    if (result != 0) {
      kept.push_back(Names().size());
      EXPECT_EQ(result, -1);
      const std::vector<std::string> messages = fake::Messages();
      EXPECT_THAT(
          std::vector(messages.end() - 3, messages.end()),
          ElementsAre("wireless_network_scan:97 Failed to alloc memory", "wireless_network_scan:162 Scan 4: failed.",
                      "wireless_network_scan:204 Failed to get network scanning result"));
    }
    prepare();
  });
  EXPECT_THAT(kept, ElementsAre(0, 1, 2, 3, 4));
}

}  // namespace
