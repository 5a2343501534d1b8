// The command that shares a network by a code, and the code's text and pictures.
#include <algorithm>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <sstream>

#include "base/text.h"
#include "common/text.h"
#include "model/join_code.h"
#include "running.h"

using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

namespace {

// ---- The text ----

KnownNetwork Known(std::string_view name, std::string_view secret, WIRELESS_AUTH auth = WIRELESS_AUTH_WPA2PSK,
                   WIRELESS_ENCRYPT encrypt = WIRELESS_ENCRYPT_AES) {
  KnownNetwork network{};
  network.network = library::Network(name, auth, encrypt);
  CopyText(network.szKey, secret);
  return network;
}

std::string TextOf(const KnownNetwork& network, bool isHidden = false) {
  return CodeOf(network, isHidden, "it").text;
}

TEST(JoinCode, SaysHowANetworkIsProtected) {
  EXPECT_EQ(TextOf(Known("Home", "open sesame")), "WIFI:T:WPA;S:Home;P:open sesame;;");
  EXPECT_EQ(TextOf(Known("Home", "open sesame", WIRELESS_AUTH_WPAPSK)), "WIFI:T:WPA;S:Home;P:open sesame;;");
  EXPECT_EQ(TextOf(Known("Home", "", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE)), "WIFI:T:nopass;S:Home;;");
  EXPECT_EQ(TextOf(Known("Home", "sesam", WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP)), "WIFI:T:WEP;S:Home;P:sesam;;");
  EXPECT_EQ(TextOf(Known("Home", "open sesame"), true), "WIFI:T:WPA;S:Home;P:open sesame;H:true;;");
}

TEST(JoinCode, EscapesWhatHasAMeaningInIt) {
  EXPECT_EQ(TextOf(Known(R"(a;b,c:d"e\f)", R"(";P:x;\\H:")")),
            R"(WIFI:T:WPA;S:a\;b\,c\:d\"e\\f;P:\"\;P\:x\;\\\\H\:\";;)");
  EXPECT_EQ(TextOf(Known("\xff\x1b[2J", "open sesame")), "WIFI:T:WPA;S:\xff\x1b[2J;P:open sesame;;");
}

// Digits would be taken for the bytes that they stand for.
TEST(JoinCode, PutsATextOfHexadecimalDigitsInQuotes) {
  EXPECT_EQ(TextOf(Known("Cafe", "12345678")), R"(WIFI:T:WPA;S:"Cafe";P:"12345678";;)");
  EXPECT_EQ(TextOf(Known("Home", "abcde", WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP)),
            R"(WIFI:T:WEP;S:Home;P:"abcde";;)");
  EXPECT_EQ(TextOf(Known("Home", "0123456789", WIRELESS_AUTH_SHARED, WIRELESS_ENCRYPT_WEP)),
            "WIFI:T:WEP;S:Home;P:0123456789;;");
  const std::string key(64, 'a');
  EXPECT_EQ(TextOf(Known("Home", key)), "WIFI:T:WPA;S:Home;P:" + key + ";;");
}

// ---- The command ----

class Share : public ToolTest {
 protected:
  Share() {
    library::Known({library::Home()});
    library::SavedAp(library::Office());
    std::filesystem::create_directories("/tmp/pictures");
  }
  ~Share() override { std::filesystem::remove_all("/tmp/pictures"); }

  // What a camera reads, from the picture.
  static std::string Seen() {
    return Shell("zbarimg --nodbus --quiet --raw -Sdisable -Sqrcode.enable " + std::string(kPng));
  }

  static constexpr char kPng[] = "/tmp/pictures/code.png";
  static constexpr char kSvg[] = "/tmp/pictures/code.svg";
};

TEST_F(Share, GivesAPictureThatACameraReads) {
  const Ran ran = Tool({"share", "Home", "--png", kPng});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "the code of Home is in /tmp/pictures/code.png: whoever sees it can join\n");
  EXPECT_EQ(Seen(), "WIFI:T:WPA;S:Home;P:open sesame;;\n");
  EXPECT_EQ(ModeOf(kPng), 0600U);
  EXPECT_EQ(NamesIn("/tmp/pictures"), std::vector<std::string>{"code.png"});
}

TEST_F(Share, KeepsEveryCharacterOfNamesAndSecrets) {
  for (const char* szName : {"Caf\xC3\xA9 du coin", R"(;P:\"x",)", "\xE7\xBD\x91\xE7\xBB\x9C", "$(reboot)\t`x`"}) {
    WIRELESS_NETWORK_CONFIG network = library::Home();
    CopyText(network.network.szEssid, szName);
    CopyText(network.szKey, R"(\;,:" $'<>&/~)");
    library::Known({network});
    EXPECT_EQ(Tool({"share", szName, "--png", kPng}).status, 0) << szName;
    EXPECT_EQ(Seen(), CodeOf(network, false, "").text + "\n") << szName;
  }
}

// A code's fields, row by row: dark ones are "#".
using Fields = std::vector<std::string>;

// What a camera reads, from the fields.
std::string SeenIn(const Fields& fields) {
  constexpr std::size_t kScale = 4;
  const std::size_t side = fields.size();
  std::string picture =
      "P2 " + std::to_string(kScale * fields.at(0).size()) + " " + std::to_string(kScale * side) + " 1\n";
  for (std::size_t row = 0; row < kScale * side; ++row) {
    for (const char field : fields[row / kScale]) {
      for (std::size_t i = 0; i < kScale; ++i) picture += field == '#' ? "0 " : "1 ";
    }
    picture += "\n";
  }
  WriteText("/tmp/pictures/fields.pgm", picture);
  return Shell("zbarimg --nodbus --quiet --raw -Sdisable -Sqrcode.enable /tmp/pictures/fields.pgm");
}

// By the lines on a screen, whose light fields are drawn: two rows in each.
Fields OnScreen(const std::string& screen) {
  Fields fields;
  std::istringstream lines(screen);
  for (std::string line; std::getline(lines, line) && line.find("join") == line.npos;) {
    std::string upper, lower;
    for (std::size_t at = 0; at < line.size();) {
      const std::string field = line.substr(at, line[at] == ' ' ? 1 : 3);
      upper += field == " " || field == "▄" ? '#' : ' ';
      lower += field == " " || field == "▀" ? '#' : ' ';
      at += field.size();
    }
    fields.push_back(upper);
    fields.push_back(lower);
  }
  return fields;
}

TEST_F(Share, DrawsTheCodeOnTheScreen) {
  const std::string screen = Tool({"share", "Home"}).out;
  EXPECT_THAT(screen, EndsWith("\nwhoever sees this can join Home\n"));
  EXPECT_EQ(SeenIn(OnScreen(screen)), "WIFI:T:WPA;S:Home;P:open sesame;;\n");
}

TEST_F(Share, DrawsItInAsciiWhereTheLocaleIs) {
  std::istringstream lines(Tool({"share", "Home"}, {.environment = {{"LC_ALL", "C"}}}).out);
  Fields fields;
  for (std::string line; std::getline(lines, line) && line.find("join") == line.npos;) {
    std::string row;
    for (std::size_t at = 0; at < line.size(); at += 2) row += line.substr(at, 2) == "##" ? ' ' : '#';
    fields.push_back(row);
  }
  EXPECT_EQ(fields.size(), 37U);
  EXPECT_EQ(SeenIn(fields), "WIFI:T:WPA;S:Home;P:open sesame;;\n");
}

// Light letters on dark ground, whatever the colours of the terminal, since a camera needs the contrast.
TEST_F(Share, HasItsColoursOnEveryTerminalThatTakesThem) {
  const Surroundings plain{.environment = {{"NO_COLOR", "1"}}};
  EXPECT_THAT(ToolOnTerminal({"share", "Home"}, 80, plain).out, StartsWith("\x1b[1;37;40m█████"));
  const Surroundings dumb{.environment = {{"TERM", "dumb"}}};
  EXPECT_THAT(ToolOnTerminal({"share", "Home"}, 80, dumb).out, StartsWith("█████"));
}

// The words of a sentence that has been broken into lines.
std::string OneLine(const std::string& text) {
  std::istringstream words(text);
  std::string line;
  for (std::string word; words >> word;) line += (line.empty() ? "" : " ") + word;
  return line;
}

TEST_F(Share, IsNotDrawnWhereItHasNoRoom) {
  const Ran ran = ToolOnTerminal({"share", "Home"}, 36, {.environment = {{"TERM", "dumb"}}});
  EXPECT_EQ(ran.status, 1);
  constexpr char kMessage[] = "the code does not fit on the screen, and takes 37 columns";
  EXPECT_EQ(OneLine(ran.out).substr(0, 14 + sizeof kMessage), "merowireless: " + std::string(kMessage) + ":");
}

TEST_F(Share, GivesADrawingWithTheSameFields) {
  EXPECT_EQ(Tool({"share", "Home", "--svg", kSvg}).out,
            "the code of Home is in /tmp/pictures/code.svg: whoever sees it can join\n");
  EXPECT_EQ(ModeOf(kSvg), 0600U);
  const std::string svg = ReadText(kSvg);
  EXPECT_THAT(svg, StartsWith("<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 37 37\""));
  Fields fields(37, std::string(37, ' '));
  for (std::size_t at = svg.find("d=\"M") + 3; svg[at] == 'M';) {
    std::size_t column = 0, row = 0, length = 0, back = 0;
    int end = 0;
    ASSERT_EQ(std::sscanf(svg.c_str() + at, "M%zu %zuh%zuv1h-%zuz%n", &column, &row, &length, &back, &end), 4);
    EXPECT_EQ(length, back);
    fields.at(row).replace(column, length, std::string(length, '#'));
    at += static_cast<std::size_t>(end);
  }
  EXPECT_EQ(SeenIn(fields), "WIFI:T:WPA;S:Home;P:open sesame;;\n");
}

// ---- The secret ----

TEST_F(Share, ShowsMachinesTheSecretOnRequestAlone) {
  for (const char* szForm : {"--json", "--porcelain"}) {
    EXPECT_THAT(Tool({"share", "Home", szForm}).out, Not(HasSubstr("sesame"))) << szForm;
    EXPECT_THAT(Tool({"share", "Home", szForm, "--show-secrets"}).out, HasSubstr("P:open sesame;;")) << szForm;
  }
  EXPECT_EQ(Tool({"share", "Home", "--json"}).out,
            R"({"result":"ok","code":{"name":"Home","name_hex":null,"protection":"wpa","hidden":false,"png":null,)"
            R"("svg":null}})"
            "\n");
  EXPECT_THAT(Tool({"share", "Home", "-v"}).out + Tool({"share", "Home", "-v"}).err, Not(HasSubstr("sesame")));
  EXPECT_THAT(Tool({"share", "Home", "--show-secrets"}).out, HasSubstr("\nWIFI:T:WPA;S:Home;P:open sesame;;\nwhoever"));
}

TEST_F(Share, WritesNoFileWhereSomethingElseIs) {
  for (const char* szThere : {"ln -s /tmp/elsewhere ", "mkdir ", "mkfifo "}) {
    Shell(std::string(szThere) + kPng);
    const Ran ran = Tool({"share", "Home", "--png", kPng});
    EXPECT_EQ(ran.status, 1) << szThere;
    EXPECT_THAT(ran.err, HasSubstr("/tmp/pictures/code.png is no plain file, and was not replaced: ")) << szThere;
    EXPECT_FALSE(Exists("/tmp/elsewhere"));
    Shell(std::string("rm -r ") + kPng);
  }
  EXPECT_THAT(Tool({"share", "Home", "--svg", "/tmp/missing/code.svg"}).err,
              HasSubstr("merowireless: /tmp/missing/code.svg cannot be written: No such file or directory: "));
}

// ---- Which network ----

std::string TextShared(std::vector<std::string> words) {
  words.insert(words.begin(), "share");
  words.insert(words.end(), {"--porcelain", "--show-secrets"});
  const std::string line = Tool(words).out;
  return line.substr(std::min(line.rfind('\t') + 1, line.size()));
}

TEST_F(Share, IsOfTheNetworkThatIsJoined) {
  library::Connected("Home");
  EXPECT_EQ(TextShared({}), "WIFI:T:WPA;S:Home;P:open sesame;;\n");
  constexpr char kSupplicant[] = "/usr/mero/etc/wpa_supplicant.conf";
  WriteText(kSupplicant, "network={\n\tssid=\"Home\"\n\tkey_mgmt=WPA-PSK\n\tpsk=\"the new secret\"\n}\n");
  EXPECT_EQ(TextShared({}), "WIFI:T:WPA;S:Home;P:the new secret;;\n") << "what it was joined with";
  std::filesystem::remove(kSupplicant);
  library::Known({});
  EXPECT_THAT(Tool({"share"}).err, HasSubstr("merowireless: the secret of Home, which is joined, is not known: "));
  library::MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  EXPECT_THAT(Tool({"share"}).err, HasSubstr("no network is joined, and no access point is on the air: "));
}

TEST_F(Share, IsOfTheAccessPointThatIsOnTheAir) {
  EXPECT_EQ(TextShared({"ap"}), "WIFI:T:WPA;S:Office;P:open sesame;;\n") << "by its name also when it is off";
  EXPECT_EQ(TextShared({"AP"}), "WIFI:T:WPA;S:Office;P:open sesame;;\n");
  kernel::BecomeAccessPoint("Office");
  EXPECT_EQ(TextShared({}), "WIFI:T:WPA;S:Office;P:open sesame;;\n");
  WriteText("/etc/hostapd/hostapd-wlan0-host.conf", "ssid=Old Office\n");
  EXPECT_THAT(Tool({"share"}).err,
              HasSubstr("merowireless: the code is of the settings that are saved, and others are on the air\n"));
  MERO_AP_CONF conf = library::Office();
  conf.hostapConf.hideSSID = 1;
  library::SavedAp(conf);
  EXPECT_EQ(TextShared({}), "WIFI:T:WPA;S:Office;P:open sesame;H:true;;\n");
  library::MEROWirelessGetAPConfig = [](const char*, PMERO_AP_CONF) { return 0; };
  EXPECT_THAT(Tool({"share", "ap"}).err, HasSubstr("no access point has been set up, and so none can be shared: "));
}

TEST_F(Share, IsOfTheGuestNetwork) {
  EXPECT_THAT(Tool({"share", "--guest"}).err, HasSubstr("there is no guest network, and so none can be shared: "));
  MERO_AP_CONF conf = library::Office();
  conf.hostapConf.guestNet.blEnable = TRUE;
  library::SavedAp(conf);
  EXPECT_EQ(TextShared({"--guest"}), "WIFI:T:nopass;S:Guests;;\n");
  EXPECT_EQ(TextShared({"ap", "--guest"}), "WIFI:T:nopass;S:Guests;;\n");
  EXPECT_THAT(Tool({"share", "Home", "--guest"}).err, HasSubstr("only the access point has a guest network: "));
}

TEST_F(Share, IsOfNoNetworkThatACodeCannotTellOf) {
  WIRELESS_NETWORK_CONFIG network = library::Home();
  network.network.auth = WIRELESS_AUTH_WPA2EAP;
  library::Known({network});
  Ran ran = Tool({"share", "Home"});
  EXPECT_EQ(ran.status, 10);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: Home asks who you are, and cannot be shared by a code: "));
  network.network.auth = WIRELESS_AUTH_UNKNOWN;
  library::Known({network});
  EXPECT_THAT(Tool({"share", "Home"}).err, HasSubstr("merowireless: Home cannot be shared by a code: "));
  network = library::Home();
  network.szKey[0] = '\0';
  library::Known({network});
  EXPECT_THAT(Tool({"share", "Home"}).err, HasSubstr("merowireless: the secret of Home is not known: "));
  ran = Tool({"share", "Elsewhere"});
  EXPECT_EQ(ran.status, 4);
  EXPECT_THAT(ran.err, HasSubstr("Elsewhere cannot be shared, since no such network is known: "));
}

}  // namespace
