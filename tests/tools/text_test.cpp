// Bytes from the air as text.
#include "base/text.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <clocale>

namespace {

TEST(Text, IsHarmlessWhateverItsBytes) {
  const std::pair<std::string_view, std::string_view> texts[] = {
      {"plain", "plain"},
      {"", ""},
      {"Café 東京 🚀", "Café 東京 🚀"},
      {"\x1b[31m", "\\x1b[31m"},
      {"\x7f\x01", "\\x7f\\x01"},
      {"\xc2\x9b", "\\xc2\\x9b"},           // a control sequence in one character
      {"\xe2\x80\xae", "\\xe2\\x80\\xae"},  // right to left from here on
      {"\xef\xbb\xbf", "\\xef\\xbb\\xbf"},  // nothing to be seen
      {"\xc0\xaf", "\\xc0\\xaf"},           // longer than it need be
      {"\xed\xa0\x80", "\\xed\\xa0\\x80"},  // half a pair
      {"\xf4\x90\x80\x80", "\\xf4\\x90\\x80\\x80"},
      {"\xe6\x9d", "\\xe6\\x9d"},  // cut short
      {"a\\x1b", "a\\\\x1b"},
  };
  for (const auto& [bytes, shown] : texts) EXPECT_EQ(Harmless(bytes, true), shown);
  EXPECT_EQ(Harmless("é", false), "\\xc3\\xa9");
}

TEST(Text, HasTheWidthThatATerminalGivesIt) {
  ASSERT_NE(std::setlocale(LC_CTYPE, "C.UTF-8"), nullptr);
  EXPECT_EQ(WidthOf("Café", true), 4u);
  EXPECT_EQ(WidthOf("東京", true), 4u);
  EXPECT_EQ(WidthOf("e\xcc\x81", true), 1u);
  EXPECT_EQ(CutToWidth("東京都", 5, true), "東京…");
  EXPECT_EQ(CutToWidth("東京都", 4, true), "東…");
  EXPECT_EQ(CutToWidth("name", 4, true), "name");
  EXPECT_EQ(CutToWidth("names", 4, false), "nam~");
  EXPECT_EQ(CutToWidth("names", 0, true), "");
}

TEST(Text, IsBrokenAtBlanksAlone) {
  EXPECT_EQ(Wrapped("one two three", 0, 2, true), "one two three");
  EXPECT_EQ(Wrapped("one two three", 13, 2, true), "one two three");
  EXPECT_EQ(Wrapped("one two three", 12, 2, true), "one two\n  three");
  EXPECT_EQ(Wrapped("  one two three", 7, 0, true), "  one\ntwo\nthree");
  EXPECT_EQ(Wrapped("unbreakable or not", 6, 1, true), "unbreakable\n or\n not");
  EXPECT_EQ(Wrapped("in  one   line", 14, 0, true), "in  one   line");
  EXPECT_EQ(Wrapped("Café Ümit", 9, 0, true), "Café Ümit");
  EXPECT_EQ(Wrapped("", 9, 3, true), "");
}

TEST(Text, IsAWordInAnyCase) {
  EXPECT_TRUE(IsWord("wPa2-eap", "WPA2-EAP"));
  EXPECT_FALSE(IsWord("wpa2", "wpa2-eap"));
  EXPECT_FALSE(IsWord("", "wpa2"));
}

TEST(Text, IsAnAddressOnlyWhole) {
  EXPECT_EQ(ParseAddress("00:1a:2B:3c:4D:ff"), (Address{0x00, 0x1A, 0x2B, 0x3C, 0x4D, 0xFF}));
  for (const char* wrong : {"", "00:1a:2b:3c:4d", "00:1a:2b:3c:4d:5", "00:1a:2b:3c:4d:5e:6f", "00-1a-2b-3c-4d-5e",
                            "00:1a:2b:3c:4d:5g", "00:1a:2b:3c:4d: 5", "0:01a:2b:3c:4d:5e"}) {
    EXPECT_EQ(ParseAddress(wrong), std::nullopt) << wrong;
  }
}

TEST(Text, IsANetmaskOfOnesThenZeros) {
  for (const char* mask : {"255.255.255.0", "255.255.255.255", "128.0.0.0", "255.255.254.0"}) {
    EXPECT_TRUE(IsNetmask(mask)) << mask;
  }
  for (const char* wrong : {"", "0.0.0.0", "255.0.255.0", "0.255.255.255", "255.255.255", "24"}) {
    EXPECT_FALSE(IsNetmask(wrong)) << wrong;
  }
}

}  // namespace
