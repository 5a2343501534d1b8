// The DHCP server's files: written, read back, and taken by a real server.
#include <sys/stat.h>

#include <cstring>
#include <filesystem>
#include <functional>
#include <optional>
#include <random>
#include <span>

#include "common/text.h"
#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"

namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

constexpr char kConf[] = "/etc/dhcpd/dhcpd-lbr0-lbr0.conf";
constexpr char kInfo[] = "/etc/dhcpd/dhcpd-lbr0-lbr0.info";
constexpr char kHeading[] = "# Written from the DHCP server's record, and read back into it.\n";

MERO_DHCPD_CONF Server() {
  MERO_DHCPD_CONF conf{};
  conf.blEnable = TRUE;
  conf.autoTime = 30;
  conf.leaseTime = 86400;
  CopyText(conf.szRangeStart, "10.1.14.2");
  CopyText(conf.szRangeEnd, "10.1.14.254");
  CopyText(conf.szInterface, "lbr0");
  CopyText(conf.szDns, "10.1.14.1");
  CopyText(conf.szSubnet, "255.255.255.0");
  CopyText(conf.szRouter, "10.1.14.1");
  CopyText(conf.szTag, "lbr0");
  return conf;
}

// A record with a value in every field.
MERO_DHCPD_CONF FullServer() {
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szDomain, "home.example");
  CopyText(conf.szSDns, "10.1.14.3");
  CopyText(conf.szLeaseFile, "/var/lib/leases, of the bridge");
  return conf;
}

std::optional<MERO_DHCPD_CONF> Find(const char* szIfName = "lbr0", const char* szTag = "lbr0") {
  MERO_DHCPD_CONF conf;
  std::memset(&conf, 0x55, sizeof conf);
  const int found = MERONetGetDhcpServerConf(szIfName, szTag, &conf);
  EXPECT_TRUE(found == 0 || found == 1);
  return found != 0 ? std::optional(conf) : std::nullopt;
}

void ExpectSame(const std::optional<MERO_DHCPD_CONF>& is, const MERO_DHCPD_CONF& want) {
  ASSERT_TRUE(is.has_value());
  EXPECT_EQ(is->blEnable, want.blEnable);
  EXPECT_EQ(is->autoTime, want.autoTime);
  EXPECT_EQ(is->leaseTime, want.leaseTime);
  EXPECT_STREQ(is->szRangeStart, want.szRangeStart);
  EXPECT_STREQ(is->szRangeEnd, want.szRangeEnd);
  EXPECT_STREQ(is->szInterface, want.szInterface);
  EXPECT_STREQ(is->szDomain, want.szDomain);
  EXPECT_STREQ(is->szDns, want.szDns);
  EXPECT_STREQ(is->szSDns, want.szSDns);
  EXPECT_STREQ(is->szSubnet, want.szSubnet);
  EXPECT_STREQ(is->szRouter, want.szRouter);
  EXPECT_STREQ(is->szLeaseFile, want.szLeaseFile);
  EXPECT_STREQ(is->szTag, want.szTag);
}

// A text field of the record, and what a report calls it.
struct Field {
  const char* szName;
  size_t offset;
  size_t size;
  bool takesCommas;

  char* In(MERO_DHCPD_CONF& conf) const { return reinterpret_cast<char*>(&conf) + offset; }
};

#define FIELD(member) offsetof(MERO_DHCPD_CONF, member), sizeof(MERO_DHCPD_CONF::member)
constexpr Field kFields[] = {
    {"first address", FIELD(szRangeStart), false},
    {"last address", FIELD(szRangeEnd), false},
    {"netmask", FIELD(szSubnet), false},
    {"router", FIELD(szRouter), false},
    {"name server", FIELD(szDns), false},
    {"second name server", FIELD(szSDns), false},
    {"domain", FIELD(szDomain), true},
    {"lease file", FIELD(szLeaseFile), true},
    {"interface", FIELD(szInterface), false},
    {"tag", FIELD(szTag), false},
};
#undef FIELD
constexpr std::span kTexts = std::span(kFields).first<8>();  // those that may be empty

class DhcpServerFiles : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    fs::remove_all("/etc/dhcpd");
  }

  static void ExpectWrittenAndReadBack(MERO_DHCPD_CONF conf) {
    for (const int enable : {0, 1}) {
      ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, enable), 1);
      conf.blEnable = enable != 0 ? TRUE : FALSE;
      ExpectSame(Find(conf.szInterface, conf.szTag), conf);
    }
  }

  static void ExpectRefused(const MERO_DHCPD_CONF& conf, const std::string& report) {
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 0) << report;
    ExpectFailure(ERR_BAD_PARAMETERS, report);
  }

  // Nothing is found, and the record stays as it was.
  static void ExpectNone(const char* szIfName, const char* szTag) {
    MERO_DHCPD_CONF conf = FullServer();
    const MERO_DHCPD_CONF before = conf;
    EXPECT_EQ(MERONetGetDhcpServerConf(szIfName, szTag, &conf), 0) << szIfName << " " << szTag;
    ExpectNothingFound(ERR_FILE_NOT_FOUND);
    EXPECT_EQ(std::memcmp(&conf, &before, sizeof conf), 0);
  }

  static void ExpectTakenByTheServer(const MERO_DHCPD_CONF& conf) {
    ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
    Shell(std::string("dnsmasq --test --conf-file=") + kConf + " 2>&1");
  }
};

TEST_F(DhcpServerFiles, AreWrittenAsTheServerReadsThem) {
  const MERO_DHCPD_CONF conf = Server();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  EXPECT_EQ(ReadText(kConf), std::string(kHeading) +
                                 "interface=lbr0\n"
                                 "dhcp-range=10.1.14.2,10.1.14.254,255.255.255.0,86400s\n"
                                 "dhcp-option=option:router,10.1.14.1\n"
                                 "dhcp-option=option:dns-server,10.1.14.1\n"
                                 "dhcp-authoritative\n");
  EXPECT_EQ(ReadText(kInfo), "auto_time=\"30\"\nenable=\"yes\"\n");
  EXPECT_EQ(ModeOf("/etc/dhcpd"), 0755u);
  EXPECT_EQ(ModeOf(kConf), 0644u);
  EXPECT_EQ(ModeOf(kInfo), 0644u);
  ExpectSame(Find(), conf);
}

TEST_F(DhcpServerFiles, HoldEveryField) {
  const MERO_DHCPD_CONF conf = FullServer();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  EXPECT_EQ(ReadText(kConf), std::string(kHeading) +
                                 "interface=lbr0\n"
                                 "dhcp-range=10.1.14.2,10.1.14.254,255.255.255.0,86400s\n"
                                 "dhcp-option=option:router,10.1.14.1\n"
                                 "dhcp-option=option:dns-server,10.1.14.1,10.1.14.3\n"
                                 "domain=home.example\n"
                                 "dhcp-leasefile=/var/lib/leases, of the bridge\n"
                                 "dhcp-authoritative\n");
  ExpectWrittenAndReadBack(conf);
}

TEST_F(DhcpServerFiles, ReadBackTheSameWithAnyFieldsEmpty) {
  for (unsigned empty = 0; empty < 1u << kTexts.size(); ++empty) {
    MERO_DHCPD_CONF conf = FullServer();
    for (size_t i = 0; i < kTexts.size(); ++i) {
      if ((empty >> i & 1) != 0) kTexts[i].In(conf)[0] = '\0';
    }
    conf.leaseTime = empty % 3 == 0 ? 0 : 3600;
    ExpectWrittenAndReadBack(conf);
    ASSERT_FALSE(HasFailure()) << empty;
  }
}

TEST_F(DhcpServerFiles, ReadBackTheSameForAnyNumbers) {
  for (const int number : {0, 1, -1, 30, 120, 2147483647, -2147483647 - 1}) {
    MERO_DHCPD_CONF conf = Server();
    conf.leaseTime = number;
    conf.autoTime = number;
    ExpectWrittenAndReadBack(conf);
  }
}

TEST_F(DhcpServerFiles, ReadBackTheSameWhateverTheyHold) {
  std::mt19937 random(14);
  const auto below = [&](size_t count) { return random() % count; };
  const auto text = [&](size_t longest, bool commas) {
    std::string made;
    for (size_t size = below(longest + 1); made.size() < size;) {
      const char c = static_cast<char>(below(256));
      if (static_cast<unsigned char>(c) < ' ' || c == '\x7f' || c == '"' || c == '\\' || c == '#') continue;
      if (c == ',' && !commas) continue;
      made += c;
    }
    return made;
  };
  for (int i = 0; i < 200; ++i) {
    MERO_DHCPD_CONF conf{};
    for (const Field& field : kTexts) {
      const size_t longest = below(4) == 0 ? field.size - 1 : 20;
      CopyText(field.In(conf), field.size, text(std::min(longest, field.size - 1), field.takesCommas));
    }
    CopyText(conf.szInterface, "net" + std::to_string(below(1000)));
    CopyText(conf.szTag, "t" + std::to_string(below(1000)));
    conf.leaseTime = static_cast<int>(random());
    conf.autoTime = static_cast<int>(random());
    ExpectWrittenAndReadBack(conf);
    ASSERT_FALSE(HasFailure()) << i;
  }
}

TEST_F(DhcpServerFiles, HoldTextsAsLongAsTheFields) {
  MERO_DHCPD_CONF conf{};
  for (const Field& field : kFields) CopyText(field.In(conf), field.size, std::string(field.size, 'x'));
  ExpectWrittenAndReadBack(conf);
}

TEST_F(DhcpServerFiles, SayWhetherTheServerServesByTheSwitchAlone) {
  for (const BOOL blEnable : {FALSE, TRUE}) {
    for (const int enable : {0, 1, 2, -1}) {
      MERO_DHCPD_CONF conf = Server();
      conf.blEnable = blEnable;
      EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, enable), 1);
      EXPECT_EQ(PLIBCFileCheckKeyValue(kInfo, "enable", enable != 0 ? "yes" : "no", 0), 1);
      EXPECT_EQ(Find()->blEnable, enable != 0 ? TRUE : FALSE);
    }
  }
}

TEST_F(DhcpServerFiles, KeepAllElseWhenTheServerIsSwitchedOff) {
  MERO_DHCPD_CONF conf = FullServer();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  const std::string before = ReadText(kConf);
  conf = *Find();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 0), 1);
  EXPECT_EQ(ReadText(kConf), before);
  EXPECT_EQ(ReadText(kInfo), "auto_time=\"30\"\nenable=\"no\"\n");
}

// Disabling an access point failed for ever: what was read of its bridge's server was refused on the way back.
TEST_F(DhcpServerFiles, AreLeftAloneButForTheSwitchWhenTheRecordIsGivenBackAsItWasRead) {
  const std::string range = "dhcp-range=10.1.14.2,10.1.14.254,255.255.255.0,";
  const std::string texts[] = {
      range + "12h\n",
      range + "45m",
      range + "1d\n",
      range + "infinite\n",
      range + "300\n",
      range + "12h # half a day\n",
      "interface=lbr0 # the lower bridge\r\n" + range + "12h\r\n",
      "domain=home#1\n" + range + "12h\n",
      "domain=\"home\"\n" + range + "12h\n",
      "dhcp-leasefile=\"/tmp/\\\"a\\\", b\"\n" + range + "12h\n",
      "dhcp-leasefile=/tmp/a\\b\n" + range + "12h\n",
      range + "12h\ndhcp-option=option:dns-server,10.1.14.1,10.1.14.3,10.1.14.4\n",
      "dhcp-range=set:red,10.1.14.2,10.1.14.254,12h\ndhcp-option=tag:red,option:ntp-server,10.1.14.9\n",
      "dhcp-range=10.1.14.2,10.1.14.254\n\n# ours\nport=0\ndhcp-host=02:00:00:00:00:01,10.1.14.7\n",
  };
  fs::create_directory("/etc/dhcpd");
  for (const std::string& text : texts) {
    WriteText(kConf, text, 0640);
    WriteText(kInfo, "# of the appliance\nauto_time=soon\nenable=\"yes\"\n");
    Shell(std::string("dnsmasq --test --conf-file=") + kConf + " 2>&1");
    const auto conf = Find();
    ASSERT_TRUE(conf.has_value());
    EXPECT_STREQ(conf->szRangeStart, "10.1.14.2") << text;  // or enabling would have written its own
    EXPECT_STREQ(conf->szRangeEnd, "10.1.14.254") << text;
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&*conf, 0), 1) << text;
    EXPECT_EQ(ReadText(kConf), text);
    EXPECT_EQ(ReadText(kInfo), "# of the appliance\nauto_time=soon\nenable=\"no\"\n");
    EXPECT_EQ(ModeOf(kConf), 0640u);
  }
}

TEST_F(DhcpServerFiles, AreWrittenWhenTheRecordIsAnother) {
  const std::function<void(MERO_DHCPD_CONF&)> changes[] = {
      [](MERO_DHCPD_CONF& conf) { conf.leaseTime = 60; },
      [](MERO_DHCPD_CONF& conf) { conf.autoTime = 60; },
      [](MERO_DHCPD_CONF& conf) { CopyText(conf.szRangeEnd, "10.1.14.9"); },
      [](MERO_DHCPD_CONF& conf) { CopyText(conf.szLeaseFile, "/tmp/leases"); },
      [](MERO_DHCPD_CONF& conf) { conf.szSDns[0] = '\0'; },
  };
  fs::create_directory("/etc/dhcpd");
  for (const auto& change : changes) {
    MERO_DHCPD_CONF conf = FullServer();
    ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
    WriteText(kConf, ReadText(kConf) + "# by hand\n");
    change(conf);
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
    ExpectSame(Find(), conf);
    EXPECT_THAT(ReadText(kConf), testing::Not(testing::HasSubstr("# by hand")));
  }
}

TEST_F(DhcpServerFiles, HoldALeaseTimeWithoutEnd) {
  MERO_DHCPD_CONF conf = Server();
  conf.leaseTime = -1;
  ExpectTakenByTheServer(conf);
  EXPECT_THAT(ReadText(kConf), testing::HasSubstr("255.255.255.0,infinite\n"));
  ExpectWrittenAndReadBack(conf);
}

TEST_F(DhcpServerFiles, HoldBlanksAtTheEndsOfATextInQuotes) {
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szLeaseFile, " /tmp/leases ");
  ExpectTakenByTheServer(conf);
  EXPECT_THAT(ReadText(kConf), testing::HasSubstr("dhcp-leasefile=\" /tmp/leases \"\n"));
  ExpectWrittenAndReadBack(conf);
}

TEST_F(DhcpServerFiles, AreRefusedForAWordThatTheServerWouldTakeForAnother) {
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szRangeStart, "set:red");
  ExpectRefused(conf, "A DHCP server's first address cannot be 'set:red'");
  conf = Server();
  CopyText(conf.szSubnet, "12h");
  ExpectRefused(conf, "A DHCP server's netmask cannot be '12h'");
}

TEST_F(DhcpServerFiles, LieInADirectoryOfTheSameModeWhateverTheUmask) {
  for (const mode_t mask : {0u, 077u}) {
    fs::remove_all("/etc/dhcpd");
    const MERO_DHCPD_CONF conf = Server();
    ::umask(mask);
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
    ::umask(022);
    EXPECT_EQ(ModeOf("/etc/dhcpd"), 0755u) << mask;
  }
}

TEST_F(DhcpServerFiles, AreAPairForEachInterfaceAndTag) {
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szRouter, "1.1.1.1");
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  CopyText(conf.szTag, "other");
  CopyText(conf.szRouter, "2.2.2.2");
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 0), 1);
  EXPECT_THAT(NamesIn("/etc/dhcpd"), ElementsAre("dhcpd-lbr0-lbr0.conf", "dhcpd-lbr0-lbr0.info",
                                                 "dhcpd-lbr0-other.conf", "dhcpd-lbr0-other.info"));
  EXPECT_STREQ(Find("lbr0", "lbr0")->szRouter, "1.1.1.1");
  EXPECT_STREQ(Find("lbr0", "other")->szRouter, "2.2.2.2");
  EXPECT_EQ(Find("lbr0", "lbr0")->blEnable, TRUE);
  EXPECT_EQ(Find("lbr0", "other")->blEnable, FALSE);
  ExpectNone("other", "lbr0");
}

TEST_F(DhcpServerFiles, KeepWhatOthersHaveWrittenBesideTheSwitch) {
  fs::create_directory("/etc/dhcpd");
  WriteText(kInfo, "# of the appliance\nenable=no\nOWNER=\"net\"\n", 0640);
  const MERO_DHCPD_CONF conf = Server();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  EXPECT_EQ(ReadText(kInfo), "# of the appliance\nenable=\"yes\"\nOWNER=\"net\"\nauto_time=\"30\"\n");
  EXPECT_EQ(ModeOf(kInfo), 0640u);
}

TEST_F(DhcpServerFiles, AreReadAsFarAsTheyAreUnderstood) {
  fs::create_directory("/etc/dhcpd");
  WriteText(kConf,
            "# interface=none\n\nport=0\ninterface=other\ndhcp-range=1.1.1.1,2.2.2.2\n"
            "dhcp-range=10.1.14.2,10.1.14.254,255.255.255.0,86400s\ndhcp-option=option:router,10.1.14.1\n"
            "dhcp-option=option:ntp-server,9.9.9.9\ndhcp-option=option:dns-server,10.1.14.1");
  MERO_DHCPD_CONF conf = Server();
  conf.blEnable = FALSE;
  conf.autoTime = 0;
  ExpectSame(Find(), conf);
  const std::pair<const char*, int> times[] = {
      {"", 0},
      {"45", 45},
      {"45s", 45},
      {"45m", 2700},
      {"12h", 43200},
      {"12H", 43200},
      {"1d", 86400},
      {"1w", 604800},
      {"45s ", 45},
      {"infinite", -1},
      {"s", 0},
      {"99999999999s", 0},
      {"99999999w", 0},
      {"12hours", 0},
      {"12x", 0},
      {"INFINITE", 0},
      {"10.1.14.255,", 0},
      {"10.1.14.255", 0},
      {"10.1.14.255,12h", 43200},
  };
  for (const auto& [szTime, seconds] : times) {
    WriteText(kConf, "dhcp-range=10.1.14.2,10.1.14.254,255.255.255.0," + std::string(szTime) + "\n");
    EXPECT_EQ(Find()->leaseTime, seconds) << szTime;
    EXPECT_STREQ(Find()->szSubnet, "255.255.255.0");
  }
  WriteText(kInfo, "enable=YES\nauto_time=soon\n");
  EXPECT_EQ(Find()->blEnable, FALSE);
  EXPECT_EQ(Find()->autoTime, 0);
}

// Lines that mean the same to the server as ours do, and the record that they are read into.
TEST_F(DhcpServerFiles, AreReadAsTheServerReadsThem) {
  MERO_DHCPD_CONF conf = FullServer();
  conf.blEnable = FALSE;
  conf.autoTime = 0;
  CopyText(conf.szLeaseFile, "/tmp/\"a\", b # c");
  const char* const lines[] = {
      "interface=lbr0 # the lower one",
      "dhcp-range = 10.1.14.2 ,10.1.14.254,\t255.255.255.0, 1d\r",
      "dhcp-range=set:red,10.1.14.2,10.1.14.254,255.255.255.0,10.1.14.255,24h",
      "dhcp-range=tag:blue,set:red,10.1.14.2,10.1.14.254,255.255.255.0,1440m #",
      " dhcp-option=option:router , 10.1.14.1\r",
      "dhcp-option=option:dns-server,10.1.14.1,10.1.14.3,10.1.14.4 # three",
      "domain = \"home.example\" # \"",
      "dhcp-leasefile=\"/tmp/\\\"a\\\", b # c\"",
  };
  fs::create_directory("/etc/dhcpd");
  for (const char* szRange : {lines[1], lines[2], lines[3]}) {
    std::string text = "# dhcp-range=1.1.1.1,2.2.2.2\n";
    for (const char* szLine : {lines[0], szRange, lines[4], lines[5], lines[6], lines[7]}) {
      text += std::string(szLine) + "\n";
    }
    WriteText(kConf, text);
    Shell(std::string("dnsmasq --test --conf-file=") + kConf + " 2>&1");
    ExpectSame(Find(), conf);
  }
  WriteText(kConf, "dhcp-range=10.1.14.2,10.1.14.254,12h\n");
  Shell(std::string("dnsmasq --test --conf-file=") + kConf + " 2>&1");
  EXPECT_STREQ(Find()->szSubnet, "");
  EXPECT_EQ(Find()->leaseTime, 43200);
}

TEST_F(DhcpServerFiles, AreReadWithTextsCutToTheFields) {
  fs::create_directory("/etc/dhcpd");
  const std::string text(10000, 'x');
  WriteText(kConf, "dhcp-range=" + text + "," + text + "\ndomain=" + text + "\n");
  const MERO_DHCPD_CONF conf = *Find();
  EXPECT_EQ(conf.szRangeStart, text.substr(0, sizeof conf.szRangeStart - 1));
  EXPECT_EQ(conf.szRangeEnd, text.substr(0, sizeof conf.szRangeEnd - 1));
  EXPECT_EQ(conf.szDomain, text.substr(0, sizeof conf.szDomain - 1));
}

TEST_F(DhcpServerFiles, AreNotFoundUnderOtherNames) {
  ExpectNone("lbr0", "lbr0");
  const MERO_DHCPD_CONF conf = Server();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);
  const std::pair<const char*, const char*> names[] = {
      {"", ""},
      {"lbr0", ""},
      {"", "lbr0"},
      {"lbr1", "lbr0"},
      {"lbr0", "lbr"},
      {"lbr0", "LBR0"},
      {"lbr0 ", "lbr0"},
      {"x/../dhcpd-lbr0", "lbr0"},
      {"lbr0", "lbr0/"},
      {"a-name-of-sixteen", "lbr0"},
      {"lbr0", "a-tag-of-twenty-char"},
  };
  for (const auto& [szIfName, szTag] : names) ExpectNone(szIfName, szTag);
}

TEST_F(DhcpServerFiles, AreRefusedForATextThatALineCannotHold) {
  const MERO_DHCPD_CONF good = FullServer();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&good, 0), 1);
  const std::string before = ReadText(kConf);
  for (const std::string& junk : {std::string("1\n2"), std::string("1\r"), std::string("\t"), std::string("\x1b"),
                                  std::string("\x7f"), std::string("\""), std::string("\\n"), std::string("a #b")}) {
    for (const Field& field : kFields) {
      MERO_DHCPD_CONF conf = FullServer();
      CopyText(field.In(conf), field.size, junk);
      ExpectRefused(conf, "A DHCP server's " + std::string(field.szName) + " cannot be '" + junk + "'");
    }
  }
  EXPECT_EQ(ReadText(kConf), before);
  EXPECT_EQ(ReadText(kInfo), "auto_time=\"30\"\nenable=\"no\"\n");
  EXPECT_THAT(NamesIn("/etc/dhcpd"), ElementsAre("dhcpd-lbr0-lbr0.conf", "dhcpd-lbr0-lbr0.info"));
}

TEST_F(DhcpServerFiles, AreRefusedForACommaInAnythingButTheDomainAndTheLeaseFile) {
  for (const Field& field : kTexts) {
    MERO_DHCPD_CONF conf = FullServer();
    CopyText(field.In(conf), field.size, "a,b");
    if (field.takesCommas) {
      ExpectWrittenAndReadBack(conf);
    } else {
      ExpectRefused(conf, "A DHCP server's " + std::string(field.szName) + " cannot be 'a,b'");
    }
  }
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szInterface, "a,b");
  ExpectRefused(conf, "A DHCP server's interface cannot be 'a,b'");
}

TEST_F(DhcpServerFiles, AreRefusedForATextThatDoesNotEnd) {
  for (const Field& field : kFields) {
    if (field.size > 100) continue;  // whose report is as long
    MERO_DHCPD_CONF conf = Server();
    std::memset(field.In(conf), 'x', field.size);
    ExpectRefused(conf,
                  "A DHCP server's " + std::string(field.szName) + " cannot be '" + std::string(field.size, 'x') + "'");
  }
  for (char(MERO_DHCPD_CONF::* field)[4096] : {&MERO_DHCPD_CONF::szDomain, &MERO_DHCPD_CONF::szLeaseFile}) {
    MERO_DHCPD_CONF conf = Server();
    std::memset(conf.*field, 'x', sizeof(conf.*field));
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 0);
    EXPECT_EQ(PLIBCErrGet(), ERR_BAD_PARAMETERS);
    EXPECT_EQ(TakeLog().size(), 1u);
  }
  EXPECT_FALSE(fs::exists("/etc/dhcpd"));
}

TEST_F(DhcpServerFiles, AreRefusedWithoutAnInterfaceAndATag) {
  for (const char* szIfName : {"", "..", "a/b", "../x", "a b", "a:1"}) {
    MERO_DHCPD_CONF conf = Server();
    CopyText(conf.szInterface, szIfName);
    ExpectRefused(conf, "'" + std::string(szIfName) + "' is no interface to serve");
  }
  for (const char* szTag : {"", "/", "a/b", "/../../x"}) {
    MERO_DHCPD_CONF conf = Server();
    CopyText(conf.szTag, szTag);
    ExpectRefused(conf, "'" + std::string(szTag) + "' is no tag of a DHCP server");
  }
  EXPECT_FALSE(fs::exists("/etc/dhcpd"));
}

TEST_F(DhcpServerFiles, AreReportedWhenTheyCannotBeWritten) {
  const MERO_DHCPD_CONF conf = Server();
  WriteText("/etc/dhcpd", "");
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 0);
  ExpectFailure(ERR_FILE_NOT_FOUND, std::string("Failed to write ") + kInfo + ": Not a directory");
  fs::remove("/etc/dhcpd");

  for (const char* szPath : {kInfo, kConf}) {
    fs::create_directories(szPath);
    EXPECT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 0);
    EXPECT_THAT(TakeLog(), ElementsAre(testing::Field(&LogLine::text,
                                                      testing::StartsWith("Failed to write " + std::string(szPath)))));
    fs::remove_all(szPath);
  }
}

TEST_F(DhcpServerFiles, AreReportedWhenTheyCannotBeRead) {
  fs::create_directories(kConf);
  EXPECT_FALSE(Find().has_value());
  EXPECT_THAT(TakeLog(),
              ElementsAre(testing::Field(&LogLine::text, testing::StartsWith("Failed to read " + std::string(kConf)))));
  fs::remove(kConf);
  WriteText(kConf, "interface=lbr0\n");
  fs::create_directory(kInfo);
  EXPECT_FALSE(Find().has_value());
  EXPECT_THAT(TakeLog(),
              ElementsAre(testing::Field(&LogLine::text, testing::StartsWith("Failed to read " + std::string(kInfo)))));
}

TEST_F(DhcpServerFiles, WithoutARecordOrANameAreRefused) {
  MERO_DHCPD_CONF conf = Server();
  EXPECT_EQ(MERONetSetDhcpServerConfigFiles(nullptr, 1), 0);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetDhcpServerConf(nullptr, "lbr0", &conf), 0);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetDhcpServerConf("lbr0", nullptr, &conf), 0);
  ExpectNullRefused();
  EXPECT_EQ(MERONetGetDhcpServerConf("lbr0", "lbr0", nullptr), 0);
  ExpectNullRefused();
}

// ---- The server ----

TEST_F(DhcpServerFiles, AreTakenByTheServer) {
  const std::function<void(MERO_DHCPD_CONF&)> changes[] = {
      [](MERO_DHCPD_CONF&) {},
      [](MERO_DHCPD_CONF& conf) { conf = FullServer(); },
      [](MERO_DHCPD_CONF& conf) { conf.leaseTime = 0; },
      [](MERO_DHCPD_CONF& conf) { conf.leaseTime = 60; },
      [](MERO_DHCPD_CONF& conf) { conf.szDns[0] = '\0'; },
      [](MERO_DHCPD_CONF& conf) { conf.szRouter[0] = '\0'; },
      [](MERO_DHCPD_CONF& conf) { conf.leaseTime = conf.szSubnet[0] = '\0'; },
      [](MERO_DHCPD_CONF& conf) { conf.leaseTime = conf.szRangeStart[0] = conf.szRangeEnd[0] = conf.szSubnet[0] = 0; },
      [](MERO_DHCPD_CONF& conf) { CopyText(conf.szLeaseFile, "/" + std::string(1008, 'x')); },
  };
  for (const auto& change : changes) {
    MERO_DHCPD_CONF conf = Server();
    change(conf);
    ExpectTakenByTheServer(conf);
    ASSERT_FALSE(HasFailure()) << ReadText(kConf);
  }
}

TEST_F(DhcpServerFiles, MakeARealServerLeaseWhatTheySay) {
  MERO_DHCPD_CONF conf = Server();
  CopyText(conf.szInterface, "serve0");
  CopyText(conf.szTag, "serve0");
  CopyText(conf.szRangeStart, "10.1.14.77");
  CopyText(conf.szRangeEnd, "10.1.14.77");
  CopyText(conf.szSDns, "10.1.14.3");
  CopyText(conf.szDomain, "home.example");
  CopyText(conf.szLeaseFile, "/tmp/platform/leases");
  conf.leaseTime = 7200;
  ASSERT_EQ(MERONetSetDhcpServerConfigFiles(&conf, 1), 1);

  Shell(
      "ip link add serve0 type veth peer name ask0 && ip address add 10.1.14.1/24 dev serve0 &&"
      " ip link set serve0 up && ip link set ask0 up");
  {
    const RunningProgram server({"/usr/sbin/dnsmasq", "--conf-file=/etc/dhcpd/dhcpd-serve0-serve0.conf",
                                 "--keep-in-foreground", "--port=0", "--user=root", "--pid-file=/tmp/platform/pid",
                                 "--no-ping"});
    WriteText("/tmp/platform/lease",
              "#!/bin/sh\n[ \"$1\" != bound ] || echo \"$ip $subnet $router $dns $domain $lease\""
              " > /tmp/platform/leased\n",
              0755);
    Shell("busybox udhcpc -i ask0 -f -n -q -B -t 20 -T 1 -s /tmp/platform/lease 2>&1");
  }
  Shell("ip link delete serve0");
  EXPECT_EQ(ReadText("/tmp/platform/leased"),
            "10.1.14.77 255.255.255.0 10.1.14.1 10.1.14.1 10.1.14.3 home.example 7200\n");
  EXPECT_THAT(ReadText("/tmp/platform/leases"), testing::HasSubstr(" 10.1.14.77 "));
}

}  // namespace
