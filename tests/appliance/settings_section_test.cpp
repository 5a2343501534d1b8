// The section that an adapter has in the settings, by its name or its numbers.
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "common/text.h"
#include "readings.h"
#include "settings.h"
#include "wireless.h"

namespace {

using namespace std::string_literals;
using testing::HasSubstr;

// An adapter whose name had 32 bytes, or ended in a blank, could never be an access point.
TEST_F(Settings, OfEveryAdapterAreReadAsTheyWereSaved) {
  const struct {
    std::string product;
    std::string name;
  } rows[] = {
      {"802.11 n WLAN\n", "802.11 n WLAN"},
      {"802.11 n WLAN", "802.11 n WLAN"},
      {std::string(31, 'a') + "\n", std::string(31, 'a')},
      {std::string(32, 'b') + "\n", std::string(31, 'b')},
      {std::string(4096, 'c'), std::string(31, 'c')},
      {std::string(65536, ' ') + "d", "148f:5370"},
      {std::string(30, 'e') + " fg\n", std::string(30, 'e')},
      {"WLAN adapter  \n", "WLAN adapter"},
      {" \t WLAN\tadapter\v\f\r\n", "WLANadapter"},
      {"RT [5370]\n", "RT 5370"},
      {"[]\n", "148f:5370"},
      {"\"USB2.0\" 'WLAN'\n", "USB2.0 'WLAN'"},
      {"'WLAN'\n", "'WLAN'"},
      {"\"\"\n", "148f:5370"},
      {"#x\n", "#x"},
      {";x\n", ";x"},
      {"=\n", "="},
      {"a=b\n", "a=b"},
      {"a.*\\[^$]b\\\n", "a.*\\^$b\\"},
      {"$(touch /tmp/run)`touch /tmp/run`\n", "$(touch /tmp/run)`touch /tmp/ru"},
      {"%s%n --\n", "%s%n --"},
      {"-e\n", "-e"},
      {"*\n", "*"},
      {"first\nsecond\n", "firstsecond"},
      {"a\0\x01\x1B\x7F"
       "b\n"s,
       "ab"},
      {"Caf\xC3\xA9\n", "Caf\xC3\xA9"},
      {std::string(30, 'h') + "\xC3\xA9\n", std::string(30, 'h')},
      {std::string(28, 'i') + "\xF0\x9F\x93\xB6\n", std::string(28, 'i')},
      {std::string(27, 'j') + "\xF0\x9F\x93\xB6\n", std::string(27, 'j') + "\xF0\x9F\x93\xB6"},
      {"k\xFF\xFE\n", "k\xFF\xFE"},
      {std::string(40, '\x80') + "\n", std::string(28, '\x80')},
      {"  \t \n", "148f:5370"},
      {"\n", "148f:5370"},
      {"", "148f:5370"},
  };
  WriteText("/tmp/usb/idVendor", "148f\n");
  WriteText("/tmp/usb/idProduct", "5370\n");
  Install("readlink", "[ \"$2\" = /sys/class/net/wlan7/device ] && echo /tmp/usb/device\n");
  fs::create_directories("/tmp/usb/device");
  int power = 0;
  for (const auto& row : rows) {
    WriteText("/tmp/usb/product", row.product);
    ASSERT_EQ(Tells("note_adapter wlan7"), "") << Shortened(row.product);

    char szName[1024];
    ASSERT_EQ(MEROWirelessApConfigSecNameGet(szName, sizeof szName), TRUE) << Shortened(row.product);
    EXPECT_EQ(szName, row.name) << Shortened(row.product);
    MERO_AP_CONF conf{}, read{};
    CopyText(conf.szSecName, szName);
    conf.blEnable = TRUE;
    conf.txpower = ++power;
    ASSERT_EQ(MEROWirelessSetAPConfig(&conf), TRUE) << row.name;
    ASSERT_EQ(MEROWirelessGetAPConfig(szName, &read), 1) << row.name;
    EXPECT_STREQ(read.szSecName, szName);
    EXPECT_EQ(read.txpower, power) << row.name;
    EXPECT_EQ(Tells("read_setting txpower; printf '%s' \"$answer\""), std::to_string(power)) << row.name;

    WriteText(kFile, row.name);
    EXPECT_EQ(RunReader("section-name </tmp/file").out, row.name + "\n") << "it has one name only";
  }
  EXPECT_FALSE(fs::exists("/tmp/run"));
}

TEST_F(Settings, OfAnAdapterWithoutANameAndNumbersAreNotMadeUp) {
  Install("readlink", "echo /tmp/none/device\n");
  const Ran ran = RunInParts("note_adapter wlan7");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("the adapter wlan7 has neither a name nor numbers"));
  EXPECT_THAT(RunInShell("cat /tmp/wireless.info").out, HasSubstr("RT [5370"));
}

// The adapter's section was made of what a command had not said, and guests got the rules of no settings.
TEST_F(Settings, OfAnAdapterThatCannotBeLookedAtAreNotMadeUp) {
  Install("readlink", "exit 1\n");
  const Ran ran = RunInParts("note_adapter wlan7");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("cannot tell which adapter wlan7 is"));
  EXPECT_THAT(RunInShell("cat /tmp/wireless.info").out, HasSubstr("RT [5370"));
}

}  // namespace
