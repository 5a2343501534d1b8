#include <climits>

#include "platform.h"
#include "unit_test.h"

namespace {

struct Text {
  WIRELESS_PROTOCOL proto;
  const char* szText;
};

constexpr Text kTexts[] = {
    {WIRELESS_PROTO_UNKNOWN, "unknown"},      {WIRELESS_PROTO_LEGACY_11BG, "11b/g"},
    {WIRELESS_PROTO_LEGACY_11B, "11b"},       {WIRELESS_PROTO_LEGACY_11A, "11a"},
    {WIRELESS_PROTO_LEGACY_11ABG, "11a/b/g"}, {WIRELESS_PROTO_LEGACY_11G, "11g"},
    {WIRELESS_PROTO_11ABGN, "11a/b/g/n"},     {WIRELESS_PROTO_11N, "11n"},
    {WIRELESS_PROTO_11GN, "11g/n"},           {WIRELESS_PROTO_11AN, "11a/n"},
    {WIRELESS_PROTO_11BGN, "11b/g/n"},        {WIRELESS_PROTO_11AGN, "11a/g/n"},
    {WIRELESS_PROTO_11BN, "11b/n"},
};

class ProtocolText : public UnitTest {};

TEST_F(ProtocolText, NamesEveryRadioStandard) {
  static_assert(std::size(kTexts) == WIRELESS_PROTO_11BN + 1);
  for (const Text& text : kTexts) EXPECT_STREQ(MEROWirelessProtocolStringGet(text.proto), text.szText);
}

TEST_F(ProtocolText, IsUnknownForWhatIsNoStandard) {
  for (const int value : {13, 14, 64, 256, -1, INT_MAX, INT_MIN}) {
    EXPECT_STREQ(MEROWirelessProtocolStringGet(static_cast<WIRELESS_PROTOCOL>(value)), "unknown") << value;
  }
}

TEST_F(ProtocolText, StaysTheSameWhenOthersAreAskedFor) {
  const char* szText = MEROWirelessProtocolStringGet(WIRELESS_PROTO_11N);
  MEROWirelessProtocolStringGet(WIRELESS_PROTO_LEGACY_11B);
  EXPECT_STREQ(szText, "11n");
}

TEST_F(ProtocolText, IsReadBackAsTheStandardItNames) {
  for (const Text& text : kTexts) EXPECT_EQ(MEROWirelessProtocolParse(text.szText), text.proto) << text.szText;
}

TEST_F(ProtocolText, ReportsNothingAndDoesNothingElse) {
  for (int value = -1; value <= 13; ++value) MEROWirelessProtocolStringGet(static_cast<WIRELESS_PROTOCOL>(value));
  EXPECT_THAT(fake::Effects(), testing::IsEmpty());
}

}  // namespace
