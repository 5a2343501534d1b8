// Networks with several access points: which of them are joined, and which are not.
#include <cstring>
#include <filesystem>

#include "running.h"

using library::Network;
using testing::AllOf;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

namespace {

constexpr char kSecretPath[] = "/tmp/secret-of-networks";

// An access point of the network "Home", or of another one.
WIRELESS_NETWORK Heard(unsigned char last, int signal, std::string_view name = "Home",
                       WIRELESS_AUTH auth = WIRELESS_AUTH_WPA2PSK, WIRELESS_ENCRYPT encrypt = WIRELESS_ENCRYPT_AES) {
  WIRELESS_NETWORK network = Network(name, auth, encrypt);
  network.bssid[5] = last;
  network.signal = signal;
  return network;
}

WIRELESS_NETWORK Open(unsigned char last, int signal, std::string_view name = "Home") {
  return Heard(last, signal, name, WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
}

// One that was saved at the time `atime`.
WIRELESS_NETWORK_CONFIG Saved(const WIRELESS_NETWORK& network, int atime, const char* szSecret = "open sesame") {
  WIRELESS_NETWORK_CONFIG config = library::Home();
  config.network = network;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.atime = atime;
  std::strcpy(config.szKey, network.auth == WIRELESS_AUTH_OPEN ? "" : szSecret);
  return config;
}

std::string Told(const WIRELESS_NETWORK_CONFIG& config) {
  return std::string(config.network.szEssid) + "|" + std::to_string(config.network.bssid[5]) + "|" + config.szKey +
         (config.noneBssid != 0 ? "|any" : "|this one");
}

// Records each join, and that it was given an address. Those whose secret is "wrong" are refused.
class SavedNetworks : public ToolTest {
 protected:
  SavedNetworks() {
    std::filesystem::remove("/var/run/wpa_supplicant.pid");
    WriteText(kSecretPath, "new secret\n");
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
      return library::Record(Told(*config)), std::strcmp(config->szKey, "wrong") == 0 ? -1 : 0;
    };
    library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG config) {
      return library::Record(config.szIp), 0;
    };
    library::MEROWirelessConfSet = [](const WIRELESS_NETWORK_CONFIG* config) {
      library::Record(Told(*config) + "|" + config->szIp + "|" + std::to_string(config->network.auth));
      return 0;
    };
  }

  // The networks that were tried, one after the other, and no more.
  static std::string Tried() {
    std::string tried;
    for (const std::string& call : library::Calls()) {
      if (call.find('|') != call.npos) tried += (tried.empty() ? "" : " ") + call;
    }
    return tried;
  }

  // What a command tries in this world.
  static std::string Tried(const std::vector<std::string>& command, const std::vector<WIRELESS_NETWORK_CONFIG>& known,
                           const std::vector<WIRELESS_NETWORK>& inRange) {
    const std::size_t before = Tried().size();
    library::Known(known);
    library::InRange(inRange);
    const Ran ran = Tool(command);
    EXPECT_EQ(ran.status, 0) << ran.err;
    const std::string tried = Tried().substr(before);
    return tried.starts_with(' ') ? tried.substr(1) : tried;
  }
};

// It was not in range when the access point was off that it had been saved with.
TEST_F(SavedNetworks, AreJoinedByNameThroughTheStrongestOfTheirAccessPoints) {
  const auto home = Saved(Heard(1, -50), 7);
  for (const std::string command : {"connect", "autoconnect"}) {
    const auto words = command == "connect" ? std::vector<std::string>{command, "Home"} : std::vector{command};
    EXPECT_EQ(Tried(words, {home}, {Heard(2, -70), Heard(3, -60)}), "Home|3|open sesame|any");
    EXPECT_EQ(Tried(words, {home}, {Heard(1, -80), Heard(3, -60)}), "Home|3|open sesame|any");
    EXPECT_EQ(Tried(words, {home}, {Heard(1, -50)}), "Home|1|open sesame|any");
  }
}

TEST_F(SavedNetworks, AreJoinedByAddressThroughThatAccessPointAlone) {
  const auto home = Saved(Heard(1, -50), 7);
  EXPECT_EQ(Tried({"connect", "0A:0A:0A:0A:0A:01"}, {home}, {Heard(2, -40), Heard(1, -90)}),
            "Home|1|open sesame|this one");
  EXPECT_EQ(Tried({"connect", "0A:0A:0A:0A:0A:02"}, {home}, {Heard(1, -40), Heard(2, -90)}),
            "Home|2|open sesame|this one")
      << "which it was not saved with";
  EXPECT_EQ(Tried({"connect", "0A:0A:0A:0A:0A:01", "--any-ap"}, {home}, {Heard(1, -40)}), "Home|1|open sesame|any");
}

// Who called a network like somebody else's access point was joined, and was given a handshake with the secret.
TEST_F(SavedNetworks, AreNotTakenForAnAccessPointWhoseAddressTheyBearAsTheirName) {
  constexpr char kAddress[] = "0A:0A:0A:0A:0A:01";
  const auto evil = Saved(Heard(9, -20, kAddress), 9);
  const auto home = Saved(Heard(1, -50), 7);
  EXPECT_EQ(Tried({"connect", kAddress}, {evil, home}, {Heard(9, -20, kAddress), Heard(1, -90)}),
            "Home|1|open sesame|this one");
  EXPECT_EQ(Tried({"connect", kAddress, "--no-save"}, {}, {Open(9, -20, kAddress), Open(1, -90)}), "Home|1||this one");
  library::InRange({Open(9, -20, "0A:0A:0A:0A:0A:02")});
  EXPECT_EQ(Tool({"connect", "0A:0A:0A:0A:0A:02"}).status, 4);
}

// Its name was looked up as the address of a known network, whose secret it was given.
TEST_F(SavedNetworks, LendNoSecretToWhoeverBearsTheirAddressAsItsName) {
  const auto home = Saved(Heard(1, -50), 7);
  library::Known({home});
  library::InRange({Heard(9, -20, "0A:0A:0A:0A:0A:01")});
  const Ran ran = Tool({"connect", "0A:0A:0A:0A:0A:09"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("0A:0A:0A:0A:0A:01 needs a secret, and there is no terminal to ask on"));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(SavedNetworks, AreNotSavedUnderAnAddress) {
  EXPECT_EQ(Tool({"save", "0A:0A:0A:0A:0A:01", "--bssid", "0A:0A:0A:0A:0A:09", "--security", "open"}).status, 2);
  const Ran ran = Tool({"adhoc", "0A:0A:0A:0A:0A:01"});
  EXPECT_EQ(ran.status, 2);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: a text that is an address can be no name: "));
  EXPECT_THAT(library::Calls(), IsEmpty());
}

TEST_F(SavedNetworks, AreJoinedAsTheyWereSavedWhenNoScanShowsThem) {
  const auto home = Saved(Heard(1, -50), 7);
  EXPECT_EQ(Tried({"connect", "Home"}, {home}, {}), "Home|1|open sesame|any");
  EXPECT_EQ(Tried({"autoconnect"}, {home}, {}), "Home|1|open sesame|any");
}

TEST_F(SavedNetworks, AreTriedByAutoconnectFromTheNewestOnUntilOneHasJoined) {
  const std::vector known = {Saved(Heard(1, 0, "old"), 1), Saved(Heard(2, 0, "new"), 3, "wrong"),
                             Saved(Heard(3, 0, "fair"), 2)};
  EXPECT_EQ(Tried({"autoconnect"}, known, {Heard(1, -40, "old"), Heard(2, -50, "new"), Heard(3, -60, "fair")}),
            "new|2|wrong|any fair|3|open sesame|any");
}

// Each that was not there took a join of fifteen seconds, while the next one was in range.
TEST_F(SavedNetworks, ThatNoScanShowsAreTriedBehindTheOthers) {
  const std::vector known = {Saved(Heard(1, 0, "old"), 1), Saved(Heard(2, 0, "gone"), 3)};
  EXPECT_EQ(Tried({"autoconnect"}, known, {Heard(1, -40, "old")}), "old|1|open sesame|any");
  const std::vector wrong = {Saved(Heard(1, 0, "old"), 1, "wrong"), Saved(Heard(2, 0, "gone"), 3)};
  EXPECT_EQ(Tried({"autoconnect"}, wrong, {Heard(1, -40, "old")}), "old|1|wrong|any gone|2|open sesame|any");
}

TEST_F(SavedNetworks, ThatAreCellsAreMadeInTheirTurn) {
  auto cell = Saved(Open(2, 0, "bench"), 3);
  cell.network.opmode = WIRELESS_OPMODE_ADHOC;
  EXPECT_EQ(Tried({"autoconnect"}, {Saved(Heard(1, 0, "old"), 1), cell}, {Heard(1, -40, "old")}), "bench|2||this one");
}

// Two neighbours may have left the name of their routers as it was.
TEST_F(SavedNetworks, OfOneNameWithSecretsOfTheirOwnAreTwoNetworks) {
  const std::vector known = {Saved(Heard(1, 0), 2, "wrong"), Saved(Heard(2, 0), 1, "mine, all mine")};
  EXPECT_EQ(Tried({"autoconnect"}, known, {Heard(1, -40), Heard(2, -70)}),
            "Home|1|wrong|this one Home|2|mine, all mine|this one");
}

TEST_F(SavedNetworks, ThatWereSavedWithAnAddressThatNoHostCanHaveArePassedOver) {
  auto home = Saved(Heard(1, 0), 3);
  std::strcpy(home.szIp, "10.0.0");
  EXPECT_EQ(Tried({"autoconnect"}, {home, Saved(Heard(2, 0, "old"), 1)}, {Heard(1, -40), Heard(2, -50, "old")}),
            "old|2|open sesame|any");
}

// ---- Access points that only bear a known name ----

// Whoever put up an open network of a known name was joined, and could look into what was sent.
TEST_F(SavedNetworks, AreNotJoinedThroughWhoOnlyBearsTheirName) {
  library::Known({Saved(Heard(1, 0), 3)});
  for (const auto& pretender : {Open(1, -40), Open(2, -40), Heard(2, -40, "Home", WIRELESS_AUTH_WPA2EAP),
                                Heard(2, -40, "Home", WIRELESS_AUTH_WPAPSK)}) {
    library::InRange({pretender});
    for (const auto& words : std::vector<std::vector<std::string>>{
             {"connect", "Home"}, {"connect", "Home", "--key-file", kSecretPath}, {"autoconnect"}}) {
      const Ran ran = Tool(words);
      EXPECT_EQ(ran.status, 4);
      EXPECT_THAT(ran.err, AllOf(HasSubstr("Home was saved as WPA2 AES and is "),
                                 HasSubstr(" now, so it may be another one of that name: it was given no "
                                           "secret; if it is yours, connect with --changed, or save it again\n")));
    }
  }
  library::InRange({Open(2, -40)});
  EXPECT_THAT(Tool({"connect", "0A:0A:0A:0A:0A:02"}).err, HasSubstr("Home was saved as WPA2 AES and is open now"));
  EXPECT_EQ(Tried(), "");
}

TEST_F(SavedNetworks, AreJoinedThoughAStrongerOneOnlyBearsTheirName) {
  const auto home = Saved(Heard(1, -50), 7);
  EXPECT_EQ(Tried({"connect", "Home"}, {home}, {Open(9, -20), Heard(2, -70)}), "Home|2|open sesame|any");
  EXPECT_EQ(Tried({"autoconnect"}, {home}, {Open(9, -20), Heard(2, -70)}), "Home|2|open sesame|any");
}

TEST_F(SavedNetworks, ThatArePassedOverForTheirProtectionAreTold) {
  library::Known({Saved(Heard(1, 0), 3), Saved(Heard(2, 0, "old"), 1)});
  library::InRange({Open(1, -40), Heard(2, -50, "old")});
  const Ran ran = Tool({"autoconnect"});
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.err,
            "merowireless: Home was saved as WPA2 AES and is open now, so it may be another one of that name\n");
  EXPECT_EQ(Tried(), "old|2|open sesame|any");
}

TEST_F(SavedNetworks, ThatHaveChangedAreJoinedAndSavedAnewOnRequest) {
  const std::vector known = {Saved(Heard(1, 0), 7), Saved(Heard(2, 0), 6)};
  EXPECT_EQ(Tried({"connect", "Home", "--changed"}, known, {Open(1, -40)}),
            "Home|1||any Home|1||any|DHCP|1 Home|2||this one|DHCP|1");
  EXPECT_EQ(
      Tried({"connect", "Home", "--changed"}, {Saved(Heard(1, 0, "Home", WIRELESS_AUTH_WPAPSK), 7)}, {Heard(1, -40)}),
      "Home|1|open sesame|any Home|1|open sesame|any|DHCP|5")
      << "the secret is what it was";
  EXPECT_EQ(Tried({"connect", "Home", "--changed", "--key-file", kSecretPath}, {Saved(Open(1, 0), 7)}, {Heard(1, -40)}),
            "Home|1|new secret|any Home|1|new secret|any|DHCP|5");
  EXPECT_EQ(Tried({"connect", "Home", "--changed"}, {known[0]}, {Heard(1, -40)}), "Home|1|open sesame|any")
      << "nothing has changed";
}

TEST_F(SavedNetworks, ThatHaveChangedStayAsTheyWereSavedWhenTheyAreNotJoined) {
  library::Known({Saved(Heard(1, 0), 7)});
  library::InRange({Open(1, -40)});
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return -1; };
  EXPECT_EQ(Tool({"connect", "Home", "--changed"}).status, 9);
  EXPECT_THAT(library::Calls(), Not(Contains("MEROWirelessConfSet")));
}

// ---- The list, and what changes it ----

TEST_F(SavedNetworks, AreListedOnceHoweverManyAccessPointsTheyHave) {
  library::Known({Saved(Heard(1, 0), 86400), Saved(Heard(3, 0, "Cafe"), 86400), Saved(Heard(2, 0), 2 * 86400),
                  Saved(Open(4, 0), 86400), Saved(Heard(5, 0), 86400, "another secret")});
  const Surroundings utc{.environment = {{"TZ", "UTC"}}};
  EXPECT_EQ(Tool({"known"}, utc).out,
            "NAME  SECURITY  ADDRESS  SAVED             ACCESS POINT       AUTO\n"
            "Home  WPA2 AES  DHCP     1970-01-03 00:00  2 access points    yes\n"
            "Cafe  WPA2 AES  DHCP     1970-01-02 00:00  0A:0A:0A:0A:0A:03  yes\n"
            "Home  open      DHCP     1970-01-02 00:00  0A:0A:0A:0A:0A:04  yes\n"
            "Home  WPA2 AES  DHCP     1970-01-02 00:00  0A:0A:0A:0A:0A:05  yes\n");
  EXPECT_THAT(Tool({"known", "--json"}).out, HasSubstr(R"("addresses":"0A:0A:0A:0A:0A:02 0A:0A:0A:0A:0A:01",)"));
}

// The field behind it stood where scripts look for the secret.
TEST_F(SavedNetworks, HaveTheirSecretInTheFieldInWhichItHasAlwaysBeen) {
  library::Known({Saved(Heard(1, 0), 86400)});
  WriteText("/tmp/list", Tool({"known", "--porcelain", "--show-secrets"}).out);
  EXPECT_EQ(Shell("cut -f 12 /tmp/list"), "open sesame\n");
  EXPECT_EQ(Shell("cut -f 13 /tmp/list"), "0A:0A:0A:0A:0A:01\n");
}

// Each had to be saved anew when the secret of the network had been changed.
TEST_F(SavedNetworks, AreSavedByNameWithAllTheirAccessPoints) {
  const std::vector known = {Saved(Heard(1, 0), 1), Saved(Heard(2, 0), 2, "another secret"), Saved(Open(4, 0), 4),
                             Saved(Heard(5, 0, "Cafe"), 5)};
  EXPECT_EQ(Tried({"save", "Home", "--key-file", kSecretPath, "--ip", "none"}, known, {Heard(3, -50)}),
            "Home|3|new secret|this one||5 Home|1|new secret|this one||5 Home|2|new secret|this one||5");
  EXPECT_EQ(Tool({"save", "Home", "--key-file", kSecretPath}).out, "saved Home (3 access points)\n");
}

TEST_F(SavedNetworks, AreSavedByAddressWithThatAccessPointAlone) {
  const std::vector known = {Saved(Heard(1, 0), 1), Saved(Heard(2, 0), 2)};
  EXPECT_EQ(Tried({"save", "0A:0A:0A:0A:0A:02", "--key-file", kSecretPath}, known, {Heard(1, -50), Heard(2, -60)}),
            "Home|2|new secret|this one|DHCP|5");
}

TEST_F(SavedNetworks, AreSavedByNameAsTheyArePretendedToBeOnlyWhenNoneIsAsItWas) {
  const std::vector known = {Saved(Heard(1, 0), 1), Saved(Heard(2, 0), 2)};
  EXPECT_EQ(Tried({"save", "Home", "--key-file", kSecretPath}, known, {Open(9, -20), Heard(2, -60)}),
            "Home|2|new secret|this one|DHCP|5 Home|1|new secret|this one|DHCP|5");
  EXPECT_EQ(Tried({"save", "Home"}, known, {Open(9, -20)}),
            "Home|9||this one|DHCP|1 Home|1||this one|DHCP|1 Home|2||this one|DHCP|1")
      << "whoever saves it again accepts that it has changed";
}

TEST_F(SavedNetworks, AreForgottenByAddressButForTheirOtherAccessPoints) {
  library::Known({Saved(Heard(1, 0), 1), Saved(Heard(2, 0), 2)});
  library::PLIBCFileRemoveSection = [](const char*, const char* szSection) { return library::Record(szSection), 1; };
  EXPECT_EQ(Tool({"forget", "0A:0A:0A:0A:0A:02"}).out, "forgot 0A:0A:0A:0A:0A:02\n");
  EXPECT_THAT(library::Calls(), ElementsAre("PLIBCFileRemoveSection", "0A:0A:0A:0A:0A:02"));
}

// ---- What cannot be joined ----

// What the listing tool tells of access points that cannot be joined.
class Obstacle {
 public:
  explicit Obstacle(const std::string& lines) {
    WriteScript("/sbin/iwlist", "[ \"$*\" = 'wlan0 scanning mero unsupported' ] && printf '" + lines + "'");
  }
  Obstacle(const Obstacle&) = delete;
  Obstacle& operator=(const Obstacle&) = delete;
  ~Obstacle() { std::filesystem::remove("/sbin/iwlist"); }
};

WIRELESS_NETWORK Strange(unsigned char last, int signal, std::string_view name = "Home") {
  return Heard(last, signal, name, WIRELESS_AUTH_UNKNOWN, WIRELESS_ENCRYPT_AES);
}

// It was said of WPA3 that it is open and takes no secret.
TEST_F(SavedNetworks, ThatCannotBeJoinedAreCalledWhatTheyAre) {
  library::InRange({Strange(1, -40), Strange(2, -50, "Guests"), Strange(3, -60, "Odd")});
  const Obstacle obstacle("0A:0A:0A:0A:0A:01 WPA3\\n0A:0A:0A:0A:0A:02 OWE\\nno address\\n0A:0A:0A:0A:0A:03 unknown\\n");
  WriteText("/tmp/list", Tool({"scan"}).out);
  EXPECT_EQ(Shell("awk 'NR > 1 { print $1, $5 }' /tmp/list"), "Home WPA3\nGuests OWE\nOdd unknown\n");
  WriteText("/tmp/list", Tool({"scan", "--porcelain"}).out);
  EXPECT_EQ(Shell("cut -f 1,4,11 /tmp/list"), "Home\tUNKNOWN\tWPA3\nGuests\tUNKNOWN\tOWE\nOdd\tUNKNOWN\tunknown\n");
  for (const std::string command : {"save", "connect"}) {
    const Ran ran = Tool({command, "Home", "--key-file", kSecretPath});
    EXPECT_EQ(ran.status, 10);
    EXPECT_EQ(ran.err,
              "merowireless: Home is protected by WPA3, and cannot be joined: it can when its access point takes "
              "plain WPA2 as well\n");
    EXPECT_THAT(Tool({command, "Guests"}).err, HasSubstr("Guests is protected by OWE, and cannot be joined"));
    EXPECT_THAT(Tool({command, "Odd"}).err, HasSubstr("Odd is protected in a way that cannot be joined"));
  }
  EXPECT_EQ(Tried(), "");
}

// The router has a new program now.
TEST_F(SavedNetworks, ThatCannotBeJoinedAnyMoreAreCalledWhatTheyAre) {
  const Obstacle obstacle("0A:0A:0A:0A:0A:01 WPA3\\n");
  library::Known({Saved(Heard(1, 0), 7)});
  library::InRange({Strange(1, -40)});
  for (const auto& words :
       std::vector<std::vector<std::string>>{{"connect", "Home"}, {"connect", "Home", "--changed"}, {"autoconnect"}}) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, 10);
    EXPECT_THAT(ran.err, HasSubstr("Home is protected by WPA3, and cannot be joined"));
  }
  EXPECT_EQ(Tried(), "");
}

// The library takes it for WPA2, and the attempt ended when its time was over.
TEST_F(SavedNetworks, AreNotJoinedThroughAnAccessPointThatLetsNobodyInForItsProtection) {
  const Obstacle obstacle("0A:0A:0A:0A:0A:01 WPA2 PMF\\n");
  const auto home = Saved(Heard(1, -50), 7);
  EXPECT_EQ(Tried({"connect", "Home"}, {home}, {Heard(1, -40), Heard(2, -70)}), "Home|2|open sesame|any");
  library::InRange({Heard(1, -40)});
  EXPECT_THAT(Tool({"connect", "Home"}).err, HasSubstr("Home is protected by WPA2 PMF, and cannot be joined"));
}

}  // namespace
