// A scan reads a row's protocol and security tokens.
#include "listing.h"
#include "unit_test.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ListingToken : public UnitTest {
 protected:
  // The network of a row with these tokens, followed by another one.
  WIRELESS_NETWORK Read(const std::string& protocol, const std::string& security) {
    ring_.Clear();
    BeginWithAdapter();
    const std::string row = RowOf("6", "net", " 00:11:22:33:44:55 -40 " + protocol + " " + security + "\n");
    fake::PipesGive({kHeadings + row + RowOf("6", "after", " 0:1:2:3:4:5 -41 11n NONE")});
    EXPECT_EQ(MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, ring_.head()), 0);

    const std::vector<WIRELESS_NETWORK*> networks = ring_.Records();
    EXPECT_EQ(networks.size(), 2u) << row;
    if (networks.size() != 2) return {};
    EXPECT_STREQ(networks[0]->szEssid, "net");
    EXPECT_EQ(networks[0]->signal, -40);
    EXPECT_STREQ(networks[1]->szEssid, "after");
    EXPECT_EQ(networks[1]->auth, WIRELESS_AUTH_OPEN);
    return *networks[0];
  }

  // The first call of a function, or the first report, in the first reading of the row.
  static std::string First(std::string_view function) {
    const std::vector<std::string> effects = fake::EffectsOf({function});
    return effects.empty() ? "" : effects.front();
  }

  static std::string NotUnderstood(const std::string& token) {
    return fake::Report("wireless_network_scan:62 Failed to parse security field '" + token + "'");
  }

  Ring<WIRELESS_NETWORK> ring_;
};

TEST_F(ListingToken, NamesTheRadioStandard) {
  for (int proto = WIRELESS_PROTO_LEGACY_11BG; proto <= WIRELESS_PROTO_11BN; ++proto) {
    const char* szText = MEROWirelessProtocolStringGet(static_cast<WIRELESS_PROTOCOL>(proto));
    EXPECT_EQ(Read(szText, "WEP").protocol, proto) << szText;
  }
  EXPECT_EQ(Read("802.11be", "WEP").protocol, WIRELESS_PROTO_UNKNOWN);
}

TEST_F(ListingToken, OfTheProtocolIsPassedOnUpTo31Bytes) {
  for (const size_t size : {1u, 15u, 16u, 17u, 31u, 32u, 33u, 300u}) {
    const std::string token(size, 'p');
    EXPECT_EQ(Read(token, "WEP").protocol, WIRELESS_PROTO_UNKNOWN);
    EXPECT_EQ(First("MEROWirelessProtocolParse"), "MEROWirelessProtocolParse(" + token.substr(0, 31) + ")");
  }
}

TEST_F(ListingToken, OfTheProtocolLeavesWhatIsBehind31BytesToTheSecurity) {
  const WIRELESS_NETWORK network = Read(std::string(31, 'p') + "wep", "NONE");
  EXPECT_EQ(network.auth, WIRELESS_AUTH_SHARED);
  EXPECT_EQ(network.encrypt, WIRELESS_ENCRYPT_WEP);
}

TEST_F(ListingToken, OfNoEncryptionMeansOpenInAnyCase) {
  for (const char* szToken : {"NONE", "none", "None", "nOnE"}) {
    const WIRELESS_NETWORK network = Read("11n", szToken);
    EXPECT_EQ(network.auth, WIRELESS_AUTH_OPEN) << szToken;
    EXPECT_EQ(network.encrypt, WIRELESS_ENCRYPT_NONE) << szToken;
    EXPECT_EQ(fake::MEROWirelessAuthParse.calls() + fake::MEROWirelessEncryptParse.calls(), 0) << szToken;
  }
}

TEST_F(ListingToken, OfWepMeansSharedKeyInAnyCase) {
  for (const char* szToken : {"WEP", "wep", "Wep", "wEP"}) {
    const WIRELESS_NETWORK network = Read("11n", szToken);
    EXPECT_EQ(network.auth, WIRELESS_AUTH_SHARED) << szToken;
    EXPECT_EQ(network.encrypt, WIRELESS_ENCRYPT_WEP) << szToken;
    EXPECT_EQ(fake::MEROWirelessAuthParse.calls() + fake::MEROWirelessEncryptParse.calls(), 0) << szToken;
  }
}

TEST_F(ListingToken, OfEveryAuthenticationAndEncryptionIsUnderstood) {
  for (int auth = WIRELESS_AUTH_OPEN; auth <= WIRELESS_AUTH_WPA2EAP; ++auth) {
    for (const int encrypt : {1, 2, 4, 8, 12}) {
      const std::string token = std::string(MEROWirelessAuthStringGet(static_cast<WIRELESS_AUTH>(auth))) + "/" +
                                MEROWirelessEncryptStringGet(static_cast<WIRELESS_ENCRYPT>(encrypt), 0);
      const WIRELESS_NETWORK network = Read("11n", token);
      EXPECT_EQ(network.auth, auth) << token;
      EXPECT_EQ(network.encrypt, encrypt) << token;
      EXPECT_EQ(First("syslog"), fake::Report("wireless_network_scan:169 Scan 0: result is un-stable."));
    }
  }
}

TEST_F(ListingToken, IsSplitAtTheFirstSlashForThePlatformToUnderstand) {
  const struct {
    const char* szToken;
    const char* szAuth;
    const char* szEncrypt;
  } rows[] = {
      {"WPA2PSK/AES", "WPA2PSK", "AES"},
      {"WPA2PSK/TKIP/AES", "WPA2PSK", "TKIP/AES"},
      {"a//", "a", "/"},
      {"NONE/NONE", "NONE", "NONE"},
      {"123456789012345/123456789012345", "123456789012345", "123456789012345"},
      {"WPA/1234567890123456", "WPA", "123456789012345"},
      {"WPA/12345678901234567", "WPA", "123456789012345"},
      {"\x80\xff/\xfe", "\x80\xff", "\xfe"},
  };
  for (const auto& row : rows) {
    Read("11n", row.szToken);
    EXPECT_EQ(First("MEROWirelessAuthParse"), std::string("MEROWirelessAuthParse(") + row.szAuth + ")");
    EXPECT_EQ(First("MEROWirelessEncryptParse"), std::string("MEROWirelessEncryptParse(") + row.szEncrypt + ")");
  }
}

TEST_F(ListingToken, HasTheValuesThatThePlatformUnderstands) {
  ring_.Clear();
  BeginWithAdapter();
  fake::PipesGive({kHeadings + RowOf("net")});
  fake::MEROWirelessProtocolParse.Returns(WIRELESS_PROTO_11AN);
  fake::MEROWirelessAuthParse.Returns(WIRELESS_AUTH_WPANONE);
  fake::MEROWirelessEncryptParse.Returns(WIRELESS_ENCRYPT_TKIP);
  EXPECT_EQ(MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, ring_.head()), 0);
  ASSERT_EQ(ring_.Records().size(), 1u);
  EXPECT_EQ(ring_.Records()[0]->protocol, WIRELESS_PROTO_11AN);
  EXPECT_EQ(ring_.Records()[0]->auth, WIRELESS_AUTH_WPANONE);
  EXPECT_EQ(ring_.Records()[0]->encrypt, WIRELESS_ENCRYPT_TKIP);
}

TEST_F(ListingToken, ThatIsNotUnderstoodIsReportedAndTheNetworkStaysListed) {
  for (const std::string token : {"WPA2PSK", "NONES", "WE", "/AES", "WPAPSK/", "/", "(none)", "\xff", "%s%s%n"}) {
    const WIRELESS_NETWORK network = Read("11n", token);
    EXPECT_EQ(network.auth, WIRELESS_AUTH_UNKNOWN) << token;
    EXPECT_EQ(network.encrypt, WIRELESS_ENCRYPT_UNKNOWN) << token;
    EXPECT_EQ(First("syslog"), NotUnderstood(token));
    EXPECT_EQ(fake::MEROWirelessAuthParse.calls() + fake::MEROWirelessEncryptParse.calls(), 0) << token;
  }
}

TEST_F(ListingToken, OfSecurityIsTakenUpTo31Bytes) {
  for (const size_t size : {30u, 31u, 32u, 33u, 300u}) {
    const std::string token(size, 's');
    const WIRELESS_NETWORK network = Read("11n", token);
    EXPECT_EQ(network.auth, WIRELESS_AUTH_UNKNOWN) << size;
    EXPECT_EQ(First("syslog"), NotUnderstood(token.substr(0, 31)));
  }
}

TEST_F(ListingToken, HasAtMost15BytesBeforeItsSlashAndAsManyBehind) {
  const std::string longest(15, 'a');
  Read("11n", longest + "/" + std::string(15, 'e'));
  EXPECT_EQ(First("MEROWirelessAuthParse"), "MEROWirelessAuthParse(" + longest + ")");
  EXPECT_EQ(First("MEROWirelessEncryptParse"), "MEROWirelessEncryptParse(" + std::string(15, 'e') + ")");
  Read("11n", "a/" + std::string(29, 'e'));
  EXPECT_EQ(First("MEROWirelessEncryptParse"), "MEROWirelessEncryptParse(" + std::string(15, 'e') + ")");
  Read("11n", longest + "a/e");
  EXPECT_EQ(First("syslog"), NotUnderstood(longest + "a/e"));
}

TEST_F(ListingToken, WithALongerAuthenticationThanAnyIsUnknown) {
  for (const size_t size : {16u, 17u, 30u, 31u, 33u}) {
    const WIRELESS_NETWORK network = Read("11n", std::string(size, 'a') + "/AES");
    EXPECT_EQ(network.auth, WIRELESS_AUTH_UNKNOWN) << size;
    EXPECT_LE(First("MEROWirelessAuthParse").size(), std::string_view("MEROWirelessAuthParse()").size() + 15) << size;
  }
}

}  // namespace
