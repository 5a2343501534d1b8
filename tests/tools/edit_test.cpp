// What was saved of a network is changed, and nothing else of it; and its name servers go with the connection.
#include <dlfcn.h>

#include <filesystem>

#include "real_store.h"
#include "running.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr char kPath[] = "/usr/mero/etc/wireless.conf";
constexpr char kScript[] = "/usr/mero/sbin/udhcpc.lease";

// Two access points of a network, with what other programs and hands have put there, and another network.
constexpr char kStore[] =
    "# by hand\n"
    "[0A:0A:0A:0A:0A:0A]\n"
    "\tKEY=open sesame\n"
    " IPADDR =DHCP\n"
    "\tNETMASK=\n"
    "\tGATEWAY=\n"
    "\tESSID=Home\n"
    "\tBSSID=0A:0A:0A:0A:0A:0A\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86400\n"
    "\tAUTH=WPA2PSK\n"
    "\tENCRYPT=AES\n"
    "\tCOLOUR= blue \n"
    "; a remark\n"
    "\n"
    "[0A:0A:0A:0A:0A:0B]\n"
    "\tKEY=open sesame\n"
    "\tIPADDR=DHCP\n"
    "\tESSID=Home\n"
    "\tBSSID=0A:0A:0A:0A:0A:0B\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86300\n"
    "\tAUTH=WPA2PSK\n"
    "\tENCRYPT=AES\n"
    "[0A:0A:0A:0A:0A:0C]\n"
    "\tIPADDR=10.0.0.5\n"
    "\tNETMASK=255.255.255.0\n"
    "\tGATEWAY=10.0.0.1\n"
    "\tESSID=square\n"
    "\tBSSID=0A:0A:0A:0A:0A:0C\n"
    "\tMODE=MANAGED\n"
    "\tACCESS_TIME=86200\n"
    "\tAUTH=OPEN\n"
    "\tENCRYPT=NONE\n";

std::string Replaced(std::string text, const std::string& old, const std::string& by) {
  std::size_t at = 0;
  while ((at = text.find(old, at)) != std::string::npos) {
    text.replace(at, old.size(), by);
    at += by.size();
  }
  return text;
}

class Edit : public ToolTest {
 protected:
  Edit() {
    UseRealStore();
    WriteText(kPath, kStore);
    WIRELESS_NETWORK square = library::Network("square", WIRELESS_AUTH_OPEN, WIRELESS_ENCRYPT_NONE);
    square.bssid[5] = 0x0C;
    library::InRange({library::Network("Home"), square});
  }

  static std::string Without(const std::string& key) {
    std::istringstream lines(ReadText(kPath));
    std::string rest;
    for (std::string line; std::getline(lines, line);) {
      if (!line.starts_with("\t" + key + "=")) rest += line + "\n";
    }
    return rest;
  }

  // Says why the command is refused, and that nothing was changed.
  static void ExpectRefused(const std::vector<std::string>& words, int status, const std::string& why) {
    const Ran ran = Tool(words);
    EXPECT_EQ(ran.status, status) << why;
    EXPECT_THAT(ran.err, HasSubstr("merowireless: " + why + ": "));
    EXPECT_EQ(ReadText(kPath), kStore);
  }
};

TEST_F(Edit, ChangesOnlyTheLinesOfWhatIsNamed) {
  const Ran ran = Tool({"edit", "square", "--gateway", "10.0.0.2"});
  EXPECT_EQ(ran.status, 0) << ran.err;
  EXPECT_EQ(ran.out, "changed square\n");
  EXPECT_EQ(ReadText(kPath), Replaced(kStore, "GATEWAY=10.0.0.1", "GATEWAY=10.0.0.2"));
  EXPECT_EQ(Tool({"edit", "Home", "--dns", "192.168.1.1"}).status, 0);
  EXPECT_EQ(Without("DNS"), Replaced(kStore, "GATEWAY=10.0.0.1", "GATEWAY=10.0.0.2"));
}

TEST_F(Edit, ByNameChangesAllAccessPointsOfTheNetworkAndByAddressThatOne) {
  EXPECT_EQ(Tool({"edit", "Home", "--priority", "5"}).status, 0);
  EXPECT_EQ(Shell("grep -c PRIORITY=5 /usr/mero/etc/wireless.conf"), "2\n");
  EXPECT_EQ(Tool({"edit", "0a:0a:0a:0a:0a:0b", "--priority", "7"}).status, 0);
  EXPECT_EQ(Shell("sed -n '/0B\\]/,/0C\\]/p' /usr/mero/etc/wireless.conf | grep -c PRIORITY=7"), "1\n");
  EXPECT_EQ(Shell("grep -c PRIORITY=5 /usr/mero/etc/wireless.conf"), "1\n");
}

TEST_F(Edit, LeavesAFileThatRootAloneMayRead) {
  EXPECT_EQ(Tool({"edit", "Home", "--auto", "no"}, {.before = [] { ::umask(0); }}).status, 0);
  EXPECT_EQ(Shell("stat -c %a /usr/mero/etc/wireless.conf; ls -A /usr/mero/etc"), "600\nwireless.conf\n");
}

TEST_F(Edit, KeepsTheMaskAndGatewayOfAnAddressThatStaysStatic) {
  EXPECT_EQ(Tool({"edit", "square", "--ip", "10.0.0.6"}).status, 0);
  EXPECT_EQ(ReadText(kPath), Replaced(kStore, "10.0.0.5", "10.0.0.6"));
}

TEST_F(Edit, TakesTheMaskAndGatewayAwayWithAStaticAddress) {
  EXPECT_EQ(Tool({"edit", "square", "--ip", "dhcp"}).status, 0);
  EXPECT_THAT(ReadText(kPath), HasSubstr("\tIPADDR=DHCP\n\tNETMASK=\n\tGATEWAY=\n\tESSID=square\n"));
}

TEST_F(Edit, RefusesAddressesThatDoNotGoTogether) {
  ExpectRefused({"edit", "square", "--ip", "10.0.0.0"}, 2, "no host can have this address");
  ExpectRefused({"edit", "square", "--ip", "10.1.0.5"}, 2, "the gateway is not in this subnet");
  for (const char* szGateway : {"10.0.0.5", "10.0.0.0", "10.0.0.255"}) {
    ExpectRefused({"edit", "square", "--gateway", szGateway}, 2, "no other host can have the gateway's address");
  }
  ExpectRefused({"edit", "Home", "--mask", "255.255.0.0"}, 2, "a static address and its netmask go together");
  ExpectRefused({"edit", "Home", "--ip", "10.0.0.6"}, 2, "a static address and its netmask go together");
}

TEST_F(Edit, RefusesWhatCannotBe) {
  ExpectRefused({"edit", "Home"}, 2, "nothing is named that is to be changed");
  ExpectRefused({"edit", "Nowhere", "--auto", "no"}, 4, "no network named Nowhere is known");
  ExpectRefused({"edit", "Home", "--auto", "maybe"}, 2, "--auto cannot be this");
  for (const char* szPriority : {"-1", "1001", "first", ""}) {
    ExpectRefused({"edit", "Home", "--priority", szPriority}, 2, "--priority cannot be this");
  }
  for (const char* szServers : {"", "home", "10.0.0.1,,x", "127.0.0.1", "224.0.0.1", "1.1.1.1,2.2.2.2,3.3.3.3,4.4.4.4",
                                "1.1.1.1\n2.2.2.2\nKEY=1", "0.0.0.0"}) {
    const Ran ran = Tool({"edit", "Home", "--dns", szServers});
    if (std::string_view(szServers).find('\n') == std::string_view::npos) {
      EXPECT_THAT(ran.err, HasSubstr("merowireless: these can be no name servers: "));
    }
    EXPECT_EQ(ran.status, 2) << szServers;
    EXPECT_EQ(ReadText(kPath), kStore);
  }
}

// A section that somebody has written without an address would have been left, and another one made.
TEST_F(Edit, AddsNoSection) {
  const std::string store = Replaced(kStore, "\tBSSID=0A:0A:0A:0A:0A:0C\n", "");
  WriteText(kPath, store);
  const Ran ran = Tool({"edit", "square", "--auto", "no"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("merowireless: the section of square is not named by its BSSID: "));
  EXPECT_EQ(ReadText(kPath), store);
}

TEST_F(Edit, TakesASecretForAllAccessPoints) {
  EXPECT_EQ(Tool({"edit", "Home", "--key-stdin"}, {.input = "another one\n"}).status, 0);
  EXPECT_EQ(ReadText(kPath), Replaced(kStore, "open sesame", "another one"));
}

TEST_F(Edit, AsksForASecretOnTheTerminal) {
  const Ran ran = ToolOnTerminal({"edit", "Home", "--key"}, 80, {}, {"secret of Home: ", "another one\n"});
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_THAT(ran.out, Not(HasSubstr("another one")));
  EXPECT_EQ(ReadText(kPath), Replaced(kStore, "open sesame", "another one"));
}

TEST_F(Edit, RefusesASecretThatCanBeNone) {
  EXPECT_EQ(Tool({"edit", "Home", "--key-stdin"}, {.input = "short\n"}).status, 5);
  EXPECT_EQ(Tool({"edit", "square", "--key-stdin"}, {.input = "long enough\n"}).err,
            "merowireless: square is open and takes no secret: give none\n");
  EXPECT_EQ(Tool({"edit", "Home", "--key"}).err,
            "merowireless: there is no terminal to ask for the secret: give it with --key-file or --key-stdin\n");
  EXPECT_EQ(ReadText(kPath), kStore);
}

TEST_F(Edit, ThatFailsHalfWayChangesNothing) {
  library::PLIBCFileSetSectionValue = [left = 3, real = library::PLIBCFileSetSectionValue](
                                          const char* szPath, const char* szSection, const char* szKey,
                                          const char* szValue, const char* szFormat) mutable {
    return left-- > 0 ? real(szPath, szSection, szKey, szValue, szFormat) : -1;
  };
  const Ran ran = Tool({"edit", "Home", "--dns", "1.1.1.1", "--priority", "3"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/usr/mero/etc/wireless.conf could not be changed, and is as it was: "));
  EXPECT_EQ(ReadText(kPath), kStore);
  EXPECT_EQ(Shell("ls -A /usr/mero/etc"), "wireless.conf\n");
}

TEST_F(Edit, ThatFindsNoRoomChangesNothing) {
  std::filesystem::create_directory("/usr/mero/etc/.wireless.conf.edit");  // stands in the copy's way
  const Ran ran = Tool({"edit", "Home", "--auto", "no"});
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.err, HasSubstr("/usr/mero/etc/wireless.conf could not be changed: "));
  EXPECT_EQ(ReadText(kPath), kStore);
  std::filesystem::remove("/usr/mero/etc/.wireless.conf.edit");
}

TEST_F(Edit, WaitsForWhoeverChangesTheFileAndLosesNothing) {
  const StartedChild other([] {
    return Become({"/bin/sh", "-c",
                   "umask 077; exec 9>/usr/mero/etc/.wireless.conf.lock && flock 9 && touch /tmp/locked && sleep 1 &&"
                   "sed 's/square/circle/' /usr/mero/etc/wireless.conf >/usr/mero/etc/new &&"
                   "mv /usr/mero/etc/new /usr/mero/etc/wireless.conf && rm /usr/mero/etc/.wireless.conf.lock"});
  });
  ASSERT_TRUE(Soon([] { return std::filesystem::exists("/tmp/locked"); }));
  EXPECT_EQ(Tool({"edit", "Home", "--key-stdin"}, {.input = "another one\n"}).status, 0);
  EXPECT_EQ(ReadText(kPath), Replaced(Replaced(kStore, "open sesame", "another one"), "square", "circle"));
  std::filesystem::remove("/tmp/locked");
}

TEST_F(Edit, TellsWhatIsKnownNow) {
  EXPECT_THAT(Tool({"edit", "Home", "--dns", "1.1.1.1,8.8.8.8", "--priority", "3", "--auto", "no", "--json"}).out,
              HasSubstr(R"("name_servers":"1.1.1.1 8.8.8.8","priority":3,"autojoin":false})"));
  EXPECT_THAT(Tool({"known", "--json"}).out,
              HasSubstr(R"("name_servers":"1.1.1.1 8.8.8.8","priority":3,"autojoin":false})"));
  EXPECT_THAT(Tool({"known", "--json"}).out, HasSubstr(R"("name_servers":null,"priority":0,"autojoin":true})"));
  EXPECT_EQ(Tool({"edit", "Home", "--dns", "none", "--auto", "yes"}).status, 0);
  EXPECT_THAT(Tool({"known"}).out, HasSubstr("yes, 3\n"));
  EXPECT_THAT(Tool({"known", "--json"}).out, HasSubstr(R"("name_servers":null,"priority":3,"autojoin":true})"));
}

TEST_F(Edit, OfTheNetworkThatIsJoinedSaysThatTheConnectionStays) {
  library::Connected("Home");
  EXPECT_EQ(Tool({"edit", "Home", "--auto", "no"}).out,
            "changed Home; the connection stays as it is until the network is joined again\n");
}

TEST_F(Edit, OfKeysThatMakeNoSenseIsAsIfTheyWereNotThere) {
  WriteText(kPath, Replaced(kStore, "\tCOLOUR= blue \n", "\tDNS=rm -rf\n\tPRIORITY=first\n\tAUTOJOIN=perhaps\n"));
  EXPECT_THAT(Tool({"known", "--json"}).out, HasSubstr(R"("name_servers":null,"priority":0,"autojoin":true})"));
}

TEST_F(Edit, HoldsForAnAccessPointThatTheNetworkIsSavedWithLater) {
  EXPECT_EQ(Tool({"edit", "Home", "--dns", "1.1.1.1", "--auto", "no"}).status, 0);
  WIRELESS_NETWORK attic = library::Network("Home");
  attic.bssid[5] = 0x0E;
  library::InRange({attic});
  EXPECT_EQ(Tool({"save", "Home", "--key-stdin"}, {.input = "another one\n"}).status, 0);
  EXPECT_THAT(Shell("sed -n '/0E\\]/,$p' /usr/mero/etc/wireless.conf"), HasSubstr("\tDNS=1.1.1.1\n\tAUTOJOIN=no\n"));
}

TEST_F(Edit, SaysWhenTheAccessPointIsSavedWithoutIt) {
  EXPECT_EQ(Tool({"edit", "Home", "--auto", "no"}).status, 0);
  WIRELESS_NETWORK attic = library::Network("Home");
  attic.bssid[5] = 0x0E;
  library::InRange({attic});
  library::PLIBCFileSetSectionValue = [](auto&&...) { return -1; };
  EXPECT_THAT(Tool({"save", "Home", "--key-stdin"}, {.input = "another one\n"}).err,
              HasSubstr("merowireless: the network is saved, but not with its name servers and order: "));
}

TEST_F(Edit, DoesNotWaitForEver) {
  const StartedChild other([] {
    return Become(
        {"/bin/sh", "-c", "exec 9>/usr/mero/etc/.wireless.conf.lock && flock 9 && touch /tmp/locked && sleep 60"});
  });
  ASSERT_TRUE(Soon([] { return std::filesystem::exists("/tmp/locked"); }));
  ExpectRefused({"edit", "Home", "--auto", "no"}, 8, "/usr/mero/etc/wireless.conf is being changed by another program");
  std::filesystem::remove("/tmp/locked");
}

// ---- What comes of it ----

std::vector<std::string> Tried() {
  std::vector<std::string> tried;
  for (const std::string& call : library::Calls()) {
    if (call.starts_with("joins ")) tried.push_back(call.substr(6));
  }
  return tried;
}

TEST_F(Edit, SaysWhichNetworksAreJoinedByThemselvesAndInWhichOrder) {
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    library::Record(std::string("joins ") + config->network.szEssid);
    return -1;
  };
  EXPECT_NE(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(Tried(), ElementsAre("Home", "square"));
  EXPECT_EQ(Tool({"edit", "square", "--priority", "1"}).status, 0);
  EXPECT_NE(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(Tried(), ElementsAre("Home", "square", "square", "Home"));
  EXPECT_EQ(Tool({"edit", "square", "--auto", "no"}).status, 0);
  EXPECT_NE(Tool({"autoconnect"}).status, 0);
  EXPECT_THAT(Tried(), ElementsAre("Home", "square", "square", "Home", "Home"));
  EXPECT_EQ(Tool({"edit", "Home", "--auto", "no"}).status, 0);
  EXPECT_EQ(Tool({"autoconnect"}).err,
            "merowireless: none of the known networks is to be joined by itself: "
            "`merowireless edit NAME --auto yes` lets one be\n");
}

class NameServers : public Edit {
 protected:
  NameServers() {
    std::filesystem::create_directories("/usr/mero/sbin");
    std::filesystem::copy_file(MERO_SOURCE "/appliance/sbin/udhcpc.lease", kScript,
                               std::filesystem::copy_options::overwrite_existing);
    WriteText("/etc/resolv.conf", kOthers, 0644);
    library::MEROWirelessIfconfigSet = [](const char*, WIRELESS_NETWORK_CONFIG) { return Left(); };
    library::MEROWirelessNetworkDisconnect = Left;
    library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG*) { return 0; };
    library::Connected("square");
    EXPECT_EQ(Tool({"edit", "square", "--gateway", "none", "--dns", "10.0.0.3,10.0.0.4"}).status, 0);
  }
  ~NameServers() override { std::filesystem::remove(kScript); }

  // As the platform does it.
  static int Left() { return PLIBCExec(kScript, "left", "wlan0", nullptr, nullptr); }

  static constexpr char kOthers[] = "nameserver 192.0.2.1\n";
  static constexpr char kSaved[] =
      "nameserver 192.0.2.1\n"
      "# As saved for the network of wlan0, until it leaves the network:\n"
      "nameserver 10.0.0.3\n"
      "nameserver 10.0.0.4\n"
      "# (end of what was saved for the network of wlan0)\n";
};

TEST_F(NameServers, OfANetworkComeAndGoWithTheConnection) {
  EXPECT_EQ(Tool({"connect", "square"}).status, 0);
  EXPECT_EQ(ReadText("/etc/resolv.conf"), kSaved);
  EXPECT_THAT(Tool({"status", "--json"}).out, HasSubstr(R"("name_servers":"10.0.0.3 10.0.0.4")"));
  EXPECT_EQ(Tool({"disconnect"}).status, 0);
  EXPECT_EQ(ReadText("/etc/resolv.conf"), kOthers);
}

TEST_F(NameServers, AreThoseOfTheNextNetwork) {
  EXPECT_EQ(Tool({"connect", "square"}).status, 0);
  EXPECT_EQ(Tool({"connect", "Home"}).status, 0);
  EXPECT_EQ(ReadText("/etc/resolv.conf"), kOthers);
}

TEST_F(NameServers, AreBackWithAConnectionThatIsBroughtBack) {
  EXPECT_EQ(Tool({"connect", "square"}).status, 0);
  library::MEROWirelessNetworkConnect = [](const WIRELESS_NETWORK_CONFIG* config) {
    return std::string_view(config->network.szEssid) == "Home" ? -1 : 0;
  };
  const Ran ran = Tool({"connect", "Home"});
  EXPECT_NE(ran.status, 0);
  EXPECT_EQ(ReadText("/etc/resolv.conf"), kSaved) << ran.err;
}

TEST_F(NameServers, ThatCannotBeSetAreAFailure) {
  WriteScript(kScript, "exit 1\n");
  EXPECT_THAT(Tool({"connect", "square"}).err, HasSubstr("merowireless: the name servers could not be set: "));
}

}  // namespace
