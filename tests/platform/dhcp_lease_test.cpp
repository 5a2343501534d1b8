// Leasing an address: the script that applies a lease and gives it back, and the client that runs it.
#include <arpa/inet.h>
#include <linux/if_packet.h>
#include <net/ethernet.h>
#include <net/if.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <deque>
#include <filesystem>
#include <string>
#include <vector>

#include "common/descriptor.h"
#include "common/text.h"
#include "tests/platform/network_interfaces.h"
#include "tests/platform/platform_test.h"
#include "tests/platform/simulated_radio.h"
#include "tests/support/processes.h"

namespace {

namespace fs = std::filesystem;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;

constexpr char kScript[] = "/usr/mero/sbin/udhcpc.lease";
constexpr char kResolver[] = "/etc/resolv.conf";
constexpr char kLogged[] = "/tmp/platform/logged";
constexpr char kSaid[] = "/tmp/platform/said";

using Lease = std::vector<std::string>;  // NAME=VALUE, each

class ALease : public PlatformTest {
 protected:
  void SetUp() override {
    PlatformTest::SetUp();
    fs::create_directories("/usr/mero/sbin");
    fs::copy_file(APPLIANCE_KIT "/sbin/udhcpc.lease", kScript, fs::copy_options::overwrite_existing);
    WriteScript("/tmp/platform/logger", "echo \"$@\" >>/tmp/platform/logged\n");
    WriteText(kLogged, "");
    fs::remove(kResolver);
    Shell("ip link set net0 up && ip link set eth5 up");
  }

  // Runs the script; its exit status.
  static int Run(const std::vector<const char*>& words, const Lease& lease = {}, mode_t mask = 022) {
    return RunInChild([&] {
      ::umask(mask);
      ::clearenv();
      ::setenv("PATH", "/tmp/platform:/usr/sbin:/usr/bin:/sbin:/bin", 1);
      for (const std::string& value : lease) ::putenv(const_cast<char*>(value.c_str()));
      std::vector<char*> argv = {const_cast<char*>(kScript)};
      for (const char* szWord : words) argv.push_back(const_cast<char*>(szWord));
      argv.push_back(nullptr);
      (void)!::freopen(kSaid, "w", stderr);
      ::execv(kScript, argv.data());
      return 127;
    });
  }

  // A lease of net0 with an address in 10.1.0.0/24, and what else is said.
  static Lease Usual(const Lease& more = {}) {
    Lease lease = {"interface=net0", "ip=10.1.0.7", "subnet=255.255.255.0"};
    lease.insert(lease.end(), more.begin(), more.end());
    return lease;
  }

  static int Bound(const Lease& more = {}) { return Run({"bound"}, Usual(more)); }

  static std::string IndexOf(const std::string& name) {
    const std::string line = Shell("ip -o link show dev " + name);
    return line.substr(0, line.find(':'));
  }

  static std::string MetricOf(const std::string& name, int base = 200) {
    return std::to_string(base + std::stoi(IndexOf(name)));
  }

  // Nobody is at the other end of the cables, which is told too.
  static std::string DefaultRoutes() { return Shell("ip -4 route show default | sed 's/ linkdown//; s/ *$//'"); }

  // The block of an interface in the resolver's file.
  static std::string Block(const std::string& lines, const std::string& name = "net0") {
    return "# By the DHCP client of " + name + ", until it leaves the network:\n" + lines +
           "# (end of what the DHCP client of " + name + " has added)\n";
  }

  static void ExpectLogged(const std::string& text) {
    EXPECT_THAT(ReadText(kLogged), HasSubstr("-t udhcpc.lease -p daemon.err -- " + text));
    WriteText(kLogged, "");
  }

  static void ExpectNothingLogged() { EXPECT_EQ(ReadText(kLogged), ""); }

  const NetworkInterface interface_{"net0"};
  const NetworkInterface wired_{"eth5"};
};

TEST_F(ALease, IsAppliedAndGivenBack) {
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  EXPECT_EQ(Bound({"router=10.1.0.1", "dns=10.1.0.2 10.1.0.3", "domain=home.example", "broadcast=10.1.0.255"}), 0);
  EXPECT_EQ(interface_.addresses(), "10.1.0.7/24 ");
  EXPECT_EQ(DefaultRoutes(), "default via 10.1.0.1 dev net0 metric " + MetricOf("net0") + "\n");
  EXPECT_EQ(ReadText(kResolver),
            "nameserver 192.0.2.1\n" + Block("search home.example\nnameserver 10.1.0.2\nnameserver 10.1.0.3\n"));

  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(DefaultRoutes(), "");
  EXPECT_EQ(ReadText(kResolver), "nameserver 192.0.2.1\n");
  EXPECT_EQ(interface_.addresses(), "10.1.0.7/24 ");
  ExpectNothingLogged();
}

TEST_F(ALease, IsToldFromNone) {
  const auto is_none = [] { return Run({"none", "net0"}) == 0; };
  EXPECT_TRUE(is_none()) << "nor is there a file of name servers";
  WriteText(kResolver, "nameserver 192.0.2.1\n# net0, By the DHCP client of net01, until it leaves the network:\n",
            0644);
  EXPECT_TRUE(is_none());
  EXPECT_EQ(Bound({"router=10.1.0.1"}), 0);
  EXPECT_FALSE(is_none()) << "a route";
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_TRUE(is_none());
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  EXPECT_FALSE(is_none()) << "a name server";
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(Run({"servers", "net0", "10.1.0.3"}), 0);
  EXPECT_FALSE(is_none()) << "a name server that was saved";
  EXPECT_EQ(Run({"none", "eth5"}), 0);
  EXPECT_NE(Run({"none", "../net0"}), 0);
}

TEST_F(ALease, IsGivenBackWithTheAddressesWhenTheClientBeginsAnew) {
  EXPECT_EQ(Bound({"router=10.1.0.1", "dns=10.1.0.2"}), 0);
  EXPECT_EQ(Run({"deconfig"}, {"interface=net0"}), 0);
  EXPECT_EQ(interface_.addresses(), "");
  EXPECT_EQ(DefaultRoutes(), "");
  EXPECT_EQ(ReadText(kResolver), "");
  ExpectNothingLogged();
}

TEST_F(ALease, ChangesNothingWhenAServerDoesNotAnswer) {
  EXPECT_EQ(Bound({"router=10.1.0.1", "dns=10.1.0.2"}), 0);
  const std::string before = ReadText(kResolver) + DefaultRoutes();
  EXPECT_EQ(Run({"leasefail"}, {"interface=net0"}), 0);
  EXPECT_EQ(Run({"nak"}, {"interface=net0"}), 0);
  EXPECT_EQ(ReadText(kResolver) + DefaultRoutes(), before);
}

// Joining a network took the way out of the house away from the wire, and the name servers with it.
TEST_F(ALease, ReplacesNoRouteOfAnotherInterface) {
  Shell(
      "ip address add 192.0.2.9/24 dev eth5 && ip route add default via 192.0.2.1 dev eth5 &&"
      " ip route add default via 192.0.2.2 dev eth5 metric 5000");
  const std::string wired = "default via 192.0.2.1 dev eth5\n";
  const std::string last = "default via 192.0.2.2 dev eth5 metric 5000\n";
  const std::string metric = " dev net0 metric " + MetricOf("net0") + "\n";
  EXPECT_EQ(Bound({"router=10.1.0.1"}), 0);
  EXPECT_EQ(DefaultRoutes(), wired + "default via 10.1.0.1" + metric + last);
  EXPECT_EQ(Run({"renew"}, Usual({"router=10.1.0.2 10.1.0.3"})), 0);
  EXPECT_EQ(DefaultRoutes(), wired + "default via 10.1.0.2" + metric + last);
  EXPECT_EQ(Run({"renew"}, Usual()), 0);
  EXPECT_EQ(DefaultRoutes(), wired + last);
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(DefaultRoutes(), wired + last);
}

TEST_F(ALease, TakesItsOwnRouteAloneFromAnotherLease) {
  EXPECT_EQ(Bound({"router=10.1.0.1"}), 0);
  EXPECT_EQ(Run({"bound"}, {"interface=eth5", "ip=10.2.0.7", "subnet=255.255.255.0", "router=10.2.0.1"}), 0);
  const std::string other = "default via 10.2.0.1 dev eth5 metric " + MetricOf("eth5") + "\n";
  EXPECT_THAT(DefaultRoutes(), HasSubstr(other));
  EXPECT_THAT(DefaultRoutes(), HasSubstr("default via 10.1.0.1 dev net0"));
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(DefaultRoutes(), other);
}

TEST_F(ALease, OfAWirelessInterfaceRoutesBehindThatOfAWire) {
  for (const char* szMark : {"phy80211", "wireless"}) {
    const std::string index = IndexOf("net0");
    const ShownInterfaces shown({{"net0", szMark}, {"eth5", ""}});
    WriteText("/sys/class/net/net0/ifindex", index + "\n");
    EXPECT_EQ(Bound({"router=10.1.0.1"}), 0);
    EXPECT_EQ(DefaultRoutes(), "default via 10.1.0.1 dev net0 metric " + MetricOf("net0", 3000) + "\n");
    EXPECT_EQ(Run({"left", "net0"}), 0);
    EXPECT_EQ(DefaultRoutes(), "");
  }
}

TEST_F(ALease, RoutesThroughARouterOutsideTheSubnet) {
  EXPECT_EQ(Bound({"router=10.9.0.1"}), 0);
  EXPECT_EQ(DefaultRoutes(), "default via 10.9.0.1 dev net0 metric " + MetricOf("net0") + " onlink\n");
  EXPECT_EQ(Run({"bound"}, {"interface=net0", "ip=10.1.0.7", "subnet=255.255.255.255", "router=10.1.0.1"}), 0);
  EXPECT_EQ(interface_.addresses(), "10.1.0.7/32 ");
  EXPECT_EQ(DefaultRoutes(), "default via 10.1.0.1 dev net0 metric " + MetricOf("net0") + " onlink\n");
  ExpectNothingLogged();
}

TEST_F(ALease, WithoutANetmaskHasThatOfTheAddresssClass) {
  const std::pair<const char*, const char*> rows[] = {
      {"10.1.0.7", "10.1.0.7/8 "}, {"172.16.0.7", "172.16.0.7/16 "}, {"192.168.1.7", "192.168.1.7/24 "}};
  for (const auto& [szAddress, szGiven] : rows) {
    for (const char* szMask : {"", "subnet=", "subnet=0.0.0.0"}) {
      EXPECT_EQ(Run({"deconfig"}, {"interface=net0"}), 0);
      EXPECT_EQ(Run({"bound"}, {"interface=net0", std::string("ip=") + szAddress, szMask}), 0);
      EXPECT_EQ(interface_.addresses(), szGiven);
    }
  }
}

TEST_F(ALease, LeavesAllElseInTheResolversFileAsItIs) {
  for (const std::string& text : {
           std::string(),
           std::string("nameserver 192.0.2.1\n"),
           std::string("nameserver 192.0.2.1"),
           std::string("\n\n# by hand\r\nnameserver 192.0.2.1\r\n\n\n"),
           std::string("options ndots:2 \\t %s $x `x` *\n\tnameserver\t192.0.2.1\n\xff\xfe\n"),
           Block("nameserver 10.7.0.1\n", "wlan7") + "nameserver 192.0.2.1\n",
           std::string("# By the DHCP client of net0, until it leaves the network:\nnameserver 192.0.2.1\n"),
           std::string("# (end of what the DHCP client of net0 has added)\n"),
       }) {
    WriteText(kResolver, text, 0644);
    EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
    std::string with = text + (text.empty() || text.ends_with('\n') ? "" : "\n") + Block("nameserver 10.1.0.2\n");
    if (!text.empty() && !text.ends_with('\n')) with.pop_back();
    EXPECT_EQ(ReadText(kResolver), with) << text;
    EXPECT_EQ(Run({"renew"}, Usual({"dns=10.1.0.3"})), 0);
    EXPECT_THAT(ReadText(kResolver), HasSubstr("10.1.0.3"));
    EXPECT_THAT(ReadText(kResolver), Not(HasSubstr("10.1.0.2")));
    EXPECT_EQ(Run({"left", "net0"}), 0);
    EXPECT_EQ(ReadText(kResolver), text);
  }
  ExpectNothingLogged();
}

TEST_F(ALease, PutsItsBlockAtTheEndAgainWhenSomebodyHasWrittenBehindIt) {
  WriteText(kResolver, "", 0644);
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  Shell("echo nameserver 192.0.2.1 >>/etc/resolv.conf");
  EXPECT_EQ(Run({"renew"}, Usual({"dns=10.1.0.2"})), 0);
  EXPECT_EQ(ReadText(kResolver), "nameserver 192.0.2.1\n" + Block("nameserver 10.1.0.2\n"));
}

TEST_F(ALease, NamesADomainOnlyWhereThereIsNone) {
  for (const char* szText : {"search work.example\n", "nameserver 192.0.2.1\ndomain\twork.example\n"}) {
    WriteText(kResolver, szText, 0644);
    EXPECT_EQ(Bound({"dns=10.1.0.2", "domain=home.example"}), 0);
    EXPECT_EQ(ReadText(kResolver), szText + Block("nameserver 10.1.0.2\n"));
    EXPECT_EQ(Run({"left", "net0"}), 0);
  }
}

TEST_F(ALease, NamesNoMoreServersThanTheLibraryAsks) {
  EXPECT_EQ(Bound({"dns=10.1.0.1 10.1.0.2 10.1.0.3 10.1.0.4"}), 0);
  EXPECT_EQ(ReadText(kResolver), Block("nameserver 10.1.0.1\nnameserver 10.1.0.2\nnameserver 10.1.0.3\n"));
}

TEST_F(ALease, KeepsTheModeAndTheOwnerOfTheResolversFileWhateverTheUmask) {
  for (const mode_t mask : {0u, 077u}) {
    WriteText(kResolver, "nameserver 192.0.2.1\n", 0664);
    ASSERT_EQ(::chown(kResolver, 3, 4), 0);
    EXPECT_EQ(Run({"bound"}, Usual({"dns=10.1.0.2"}), mask), 0);
    for (int round = 0; round < 2; ++round) {
      struct stat info = {};
      ASSERT_EQ(::stat(kResolver, &info), 0);
      EXPECT_EQ(info.st_mode & 07777, 0664u) << mask;
      EXPECT_EQ(info.st_uid, 3u);
      EXPECT_EQ(info.st_gid, 4u);
      EXPECT_EQ(Run({"left", "net0"}, {}, mask), 0);
    }
    fs::remove(kResolver);
    EXPECT_EQ(Run({"bound"}, Usual({"dns=10.1.0.2"}), mask), 0);
    EXPECT_EQ(ModeOf(kResolver), 0644u) << mask;
    EXPECT_EQ(Run({"left", "net0"}, {}, mask), 0);
    EXPECT_EQ(ModeOf(kResolver), 0644u) << mask;
    EXPECT_EQ(ReadText(kResolver), "");
  }
}

TEST_F(ALease, ReplacesTheTargetOfALinkInItsOwnDirectory) {
  fs::create_directory("/tmp/platform/resolver");
  WriteText("/tmp/platform/resolver/conf", "nameserver 192.0.2.1\n", 0644);
  fs::create_symlink("/tmp/platform/resolver/conf", kResolver);
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  EXPECT_TRUE(fs::is_symlink(kResolver));
  EXPECT_EQ(ReadText("/tmp/platform/resolver/conf"), "nameserver 192.0.2.1\n" + Block("nameserver 10.1.0.2\n"));
  EXPECT_THAT(NamesIn("/tmp/platform/resolver"), testing::ElementsAre("conf"));
}

TEST_F(ALease, LeavesAFileAloneThatItHasNothingToSayIn) {
  fs::create_symlink("/tmp/platform/none/conf", kResolver);
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 1);
  ExpectLogged("cannot find where /etc/resolv.conf leads\n");
  // A link that leads nowhere kept interfaces from other addresses, although nothing had been leased.
  EXPECT_EQ(Bound(), 0);
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_TRUE(fs::is_symlink(kResolver));
  fs::remove(kResolver);
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_FALSE(fs::exists(kResolver));
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  const auto before = fs::last_write_time(kResolver);
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(fs::last_write_time(kResolver), before);
  ExpectNothingLogged();
}

TEST_F(ALease, SaysThatTheResolversFileCannotBeChanged) {
  MemoryFileSystem files("/tmp/platform/read-only", "");
  WriteText("/tmp/platform/read-only/conf", "nameserver 192.0.2.1\n", 0644);
  fs::create_symlink("/tmp/platform/read-only/conf", kResolver);
  files.MakeReadOnly();
  EXPECT_EQ(Bound({"dns=10.1.0.2", "router=10.1.0.1"}), 1);
  ExpectLogged("cannot change /tmp/platform/read-only/conf: ");
  EXPECT_THAT(DefaultRoutes(), HasSubstr("10.1.0.1"));
}

// The file was in its place, and was said to be none that could be changed.
TEST_F(ALease, SaysThatTheResolversFileMayNotOutlastAPowerCut) {
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  WriteScript("/tmp/platform/sync", "case $1 in /etc) echo broken >&2; exit 1 ;; esac\n");
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  const std::string text = "/etc/resolv.conf may be the old one again after a power cut: broken\n";
  ExpectLogged(text);
  EXPECT_EQ(ReadText(kSaid), "udhcpc.lease: " + text);
  EXPECT_THAT(ReadText(kResolver), HasSubstr("10.1.0.2"));
}

// A lease is a stranger's text.
TEST_F(ALease, CannotDoAnythingButSetAddresses) {
  const std::string hostile[] = {
      "a; touch /tmp/platform/made",
      "$(touch /tmp/platform/made)",
      "`touch /tmp/platform/made`",
      "a\nnameserver fe80::1",
      "a\noptions use-vc",
      "home.example\n",
      "-x",
      "*",
      "/etc/*",
      "a b",
      "%s%n",
  };
  for (const std::string& text : hostile) {
    WriteText(kResolver, "", 0644);
    EXPECT_EQ(Bound({"dns=10.1.0.2", "domain=" + text}), 0);
    EXPECT_EQ(ReadText(kResolver), Block("nameserver 10.1.0.2\n")) << text;
    ExpectLogged("the lease of net0 has a domain that is no name\n");

    EXPECT_EQ(Bound({"dns=" + text + " 10.1.0.2", "router=" + text + " 10.1.0.1"}), 0);
    EXPECT_THAT(ReadText(kResolver), HasSubstr("nameserver 10.1.0.2\n"));
    EXPECT_THAT(DefaultRoutes(), HasSubstr("default via 10.1.0.1 dev net0"));
    ExpectLogged("the lease of net0 has a router that is no host's address\n");

    EXPECT_EQ(Run({"bound"}, {"interface=net0", "ip=10.1.0.7", "subnet=" + text}), 1);
    ExpectLogged("the lease of net0 has a netmask that is none\n");
    EXPECT_EQ(Run({"bound"}, {"interface=net0", "ip=" + text, "subnet=255.255.255.0"}), 1);
    ExpectLogged("the lease of net0 has no address\n");
    EXPECT_EQ(Bound({"broadcast=" + text}), 0);
    EXPECT_EQ(Run({"bound"}, {"interface=" + text, "ip=10.1.0.7", "subnet=255.255.255.0"}), 1);
    EXPECT_EQ(Run({"left", text.c_str()}), 1);
    WriteText(kLogged, "");
  }
  EXPECT_FALSE(fs::exists("/tmp/platform/made"));
  EXPECT_EQ(Shell("cat /etc/resolv.conf"), "");
}

TEST_F(ALease, PassesOverWhatIsNoHostsAddress) {
  for (const char* szText :
       {"0.0.0.0", "127.0.0.1", "224.0.0.1", "255.255.255.255", "256.1.1.1", "10.1.0", "10.1.0.1.2", "10..0.1",
        "10.1.0.1.", "10.1.0.0001", "99999999999999999999.1.1.1", "::1", "home"}) {
    EXPECT_EQ(Bound({std::string("dns=") + szText + " 10.1.0.2"}), 0);
    EXPECT_EQ(ReadText(kResolver), Block("nameserver 10.1.0.2\n")) << szText;
    ExpectLogged("the lease of net0 has a name server that is no host's address\n");
    EXPECT_EQ(Run({"bound"}, {"interface=net0", std::string("ip=") + szText, "subnet=255.255.255.0"}), 1);
    ExpectLogged("the lease of net0 has no address\n");
  }
}

TEST_F(ALease, SaysWhatTheKernelDoesNotTake) {
  // A mask of one bit would have taken the routes of half of all addresses.
  for (const char* szMask :
       {"255.0.255.0", "128.0.0.0", "254.0.0.0", "255.255.255.1", "255.255.256.0", "255.255.255"}) {
    EXPECT_EQ(Run({"bound"}, {"interface=net0", "ip=10.1.0.7", std::string("subnet=") + szMask}), 1) << szMask;
    ExpectLogged("the lease of net0 has a netmask that is none\n");
  }
  EXPECT_EQ(Bound({"router=10.1.0.255"}), 1);
  ExpectLogged("cannot route through 10.1.0.255 on net0: ");
  EXPECT_EQ(Run({"something"}, {"interface=net0"}), 1);
  ExpectLogged("unknown event 'something'\n");
}

TEST_F(ALease, SaysWhichStepCannotBeTaken) {
  const struct {
    const char* szProgram;
    const char* szCalls;  // those of its calls that fail
    const char* szEvent;
    const char* szMessage;
  } rows[] = {
      {"busybox", "ifconfig", "bound", "cannot give net0 the address 10.1.0.7/255.255.255.0: broken\n"},
      {"ip", "route delete", "bound", "cannot remove the default route of net0: broken\n"},
      // It was taken for an interface without a route, which stayed.
      {"ip", "route show", "left", "cannot tell the default routes of net0: broken\n"},
      {"ip", "address flush", "deconfig", "cannot remove the addresses of net0: broken\n"},
      {"ip", "net0 up", "deconfig", "cannot bring net0 up: broken\n"},
      {"cat", "resolv.conf", "bound", "cannot read /etc/resolv.conf\n"},
      {"mkdir", "udhcpc.lease", "bound", "cannot make /var/run/udhcpc.lease\n"},
      {"flock", "", "bound", "another run takes too long to change /etc/resolv.conf\n"},
  };
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  for (const auto& row : rows) {
    const std::string program = row.szProgram;
    ASSERT_EQ(Bound({"router=10.1.0.1"}), 0);
    fs::remove("/var/run/udhcpc.lease");
    WriteText("/tmp/platform/" + program,
              "#!/bin/sh\ncase $* in *'" + std::string(row.szCalls) +
                  "'*) echo broken >&2; exit 1 ;; esac\nexec /usr/bin/env PATH=/usr/sbin:/usr/bin " + program +
                  " \"$@\"\n",
              0755);
    if (row.szCalls == std::string("net0 up")) Shell("ip link set net0 down");
    EXPECT_EQ(Run({row.szEvent, "net0"}, Usual({"router=10.1.0.2", "dns=10.1.0.2"})), 1) << row.szMessage;
    ExpectLogged(row.szMessage);
    fs::remove("/tmp/platform/" + program);
  }
  EXPECT_EQ(Run({"left", "a b"}), 1);
  ExpectLogged("'a b' is no name of an interface\n");
}

TEST_F(ALease, SaysThatItsInterfaceHasGone) {
  WriteScript("/tmp/platform/busybox", "ip link set net0 down && exec ip link set net0 name gone0\n");
  EXPECT_EQ(Bound({"router=10.1.0.1"}), 1);
  ExpectLogged("there is no interface net0\n");
  Shell("ip link set gone0 name net0");
}

// Has the programs that the script may run note their calls.
void NotePrograms() {
  for (const char* szProgram : {"awk", "busybox", "cat", "chmod", "cp", "flock", "grep", "head", "ip", "mkdir",
                                "mktemp", "mv", "readlink", "sed"}) {
    WriteScript(std::string("/tmp/platform/") + szProgram,
                "echo \"${0##*/} $*\" >>/tmp/platform/ran\n"
                "exec env PATH=/usr/sbin:/usr/bin \"${0##*/}\" \"$@\"\n");
  }
}

// Two more looked for its lines and for a domain.
TEST_F(ALease, ChangesTheNameServersByFivePrograms) {
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  fs::create_directories("/var/run/udhcpc.lease");
  NotePrograms();
  EXPECT_EQ(Bound({"dns=10.1.0.2", "domain=home.example"}), 0);
  EXPECT_EQ(Shell("sed 's/ .*//' /tmp/platform/ran | xargs"), "busybox flock cat mktemp cp mv\n");
}

// A score of programs ran, twice over, before the client sent its first word, although there was nothing to take back.
TEST_F(ALease, ThatWasNeverMadeIsGivenBackWithoutAnyProgram) {
  WriteText(kResolver, "nameserver 192.0.2.1\n", 0644);
  Shell("ip address add 192.0.2.9/24 dev eth5 && ip route add default via 192.0.2.1 dev eth5");
  NotePrograms();
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(TextOrNothing("/tmp/platform/ran"), "");
  EXPECT_EQ(Run({"deconfig"}, {"interface=net0"}), 0);
  EXPECT_EQ(TextOrNothing("/tmp/platform/ran"), "ip -4 address flush dev net0\n");
  ExpectNothingLogged();
}

// The block of the servers that were saved for a network.
std::string SavedBlock(const std::string& lines) {
  return "# As saved for the network of net0, until it leaves the network:\n" + lines +
         "# (end of what was saved for the network of net0)\n";
}

TEST_F(ALease, GivesWayToTheNameServersThatWereSavedUntilTheNetworkIsLeft) {
  const std::string others = "nameserver 192.0.2.1\n";
  const std::string saved = others + SavedBlock("nameserver 10.1.0.8\nnameserver 10.1.0.9\n");
  WriteText(kResolver, others, 0644);
  EXPECT_EQ(Bound({"dns=10.1.0.2", "domain=home.example"}), 0);
  EXPECT_EQ(Run({"servers", "net0", "10.1.0.8 10.1.0.9"}), 0);
  EXPECT_EQ(ReadText(kResolver), saved);
  for (const char* szEvent : {"renew", "deconfig", "bound"}) {
    EXPECT_EQ(Run({szEvent}, Usual({"dns=10.1.0.2"})), 0);
    EXPECT_EQ(ReadText(kResolver), saved) << szEvent;
  }
  EXPECT_EQ(Run({"left", "net0"}), 0);
  EXPECT_EQ(ReadText(kResolver), others);
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  EXPECT_EQ(ReadText(kResolver), others + Block("nameserver 10.1.0.2\n"));
  ExpectNothingLogged();
}

TEST_F(ALease, KeepsItsNameServersWhereNoneWereSaved) {
  EXPECT_EQ(Bound({"dns=10.1.0.2"}), 0);
  EXPECT_EQ(Run({"servers", "net0", ""}), 0);
  EXPECT_EQ(Run({"servers", "net0"}), 0);
  EXPECT_EQ(ReadText(kResolver), Block("nameserver 10.1.0.2\n"));
}

TEST_F(ALease, TakesNoSavedNameServerThatIsNone) {
  WriteText(kResolver, "", 0644);
  for (const char* szText :
       {"home", "127.0.0.1", "10.1.0.2 $(touch /tmp/platform/made)", "10.1.0.2\nnameserver x", "*"}) {
    EXPECT_EQ(Run({"servers", "net0", szText}), 1) << szText;
    ExpectLogged("a name server that was saved for the network of net0 is no host's address\n");
    EXPECT_EQ(ReadText(kResolver), "");
  }
  EXPECT_FALSE(fs::exists("/tmp/platform/made"));
  EXPECT_EQ(Run({"servers", "a b", "10.1.0.2"}), 1);
}

TEST_F(ALease, OfAnInterfaceThatIsGoneIsGivenBack) {
  WriteText(kResolver, "nameserver 192.0.2.1\n" + Block("nameserver 10.1.0.2\n", "wlan9"), 0644);
  EXPECT_EQ(Run({"left", "wlan9"}), 0);
  EXPECT_EQ(ReadText(kResolver), "nameserver 192.0.2.1\n");
  ExpectNothingLogged();
}

TEST_F(ALease, IsGivenBackWhenTheKitEndsTheClientOrFindsItDead) {
  const std::string ends = std::string("for part in report files daemon bridge; do . ") + APPLIANCE_KIT +
                           "/lib/$part.sh; done; PATH=/tmp/platform:$PATH; end_lease net0 2>&1";
  WriteText("/var/run/udhcpc-net0.pid", "999999999\n");
  EXPECT_EQ(Bound({"router=10.1.0.1", "dns=10.1.0.2"}), 0);
  EXPECT_EQ(Shell(ends), "");
  EXPECT_EQ(DefaultRoutes(), "");
  EXPECT_EQ(ReadText(kResolver), "");
  EXPECT_FALSE(fs::exists("/var/run/udhcpc-net0.pid"));

  WriteScript(kScript, "exit 1\n");
  EXPECT_THAT(Shell(ends), HasSubstr("what net0 had leased is not all given back\n"));
  fs::remove(kScript);
  EXPECT_EQ(Shell(ends), "");
}

TEST_F(ALease, LosesNothingWhenSeveralAreAppliedAtOnce) {
  std::deque<NetworkInterface> interfaces;
  std::string all;
  for (int i = 0; i < 8; ++i) {
    const std::string name = "many" + std::to_string(i);
    interfaces.emplace_back(name);
    all += "env PATH=/tmp/platform:$PATH interface=" + name + " ip=10.3." + std::to_string(i) +
           ".7 subnet=255.255.255.0 dns=10.3." + std::to_string(i) + ".1 " + kScript + " bound & ";
  }
  Shell(all + "wait");
  for (int i = 0; i < 8; ++i) {
    EXPECT_THAT(ReadText(kResolver), HasSubstr("nameserver 10.3." + std::to_string(i) + ".1\n"));
  }
}

// ---- The client ----

class ALeasingClient : public ALease {
 protected:
  void SetUp() override {
    ALease::SetUp();
    Shell(
        "ip link add serve0 type veth peer name wlan0 && ip address add 10.1.14.1/24 dev serve0 &&"
        " ip link set serve0 up && ip link set wlan0 up");
  }

  void TearDown() override {
    Shell("ip link delete serve0; { kill $(cat /var/run/udhcpc-wlan0.pid); } 2>/dev/null || true");
    ALease::TearDown();
  }

  static NETINFO Asker() {
    NETINFO netInfo{};
    CopyText(netInfo.szInterface, "wlan0");
    return netInfo;
  }

  // The pid of the client that runs; empty when none does.
  static std::string Client() {
    return Shell(
        "{ read -r pid </var/run/udhcpc-wlan0.pid && grep -qx busybox /proc/$pid/comm; } 2>/dev/null &&"
        " printf %s $pid || true");
  }

  // Whether a process is no more, or only waits for somebody to ask what became of it.
  static bool HasEnded(const std::string& pid) {
    return Shell("grep ^State: /proc/" + pid + "/status 2>/dev/null | grep -v Z || true") == "";
  }

  static std::string Addresses() { return Shell("ip -4 -o address show dev wlan0 | awk '{ printf \"%s\", $4 }'"); }

  // The name servers are what is applied last.
  static bool IsAppliedWithin(int seconds) {
    return Soon([] { return fs::exists(kResolver); }, seconds);
  }

  static void ExpectApplied() {
    EXPECT_EQ(Addresses(), "10.1.14.77/24");
    EXPECT_EQ(DefaultRoutes(), "default via 10.1.14.2 dev wlan0 metric " + MetricOf("wlan0") + "\n");
    EXPECT_EQ(ReadText(kResolver), Block("nameserver 10.1.14.3\n", "wlan0"));
  }

  static void ExpectGivenBack() {
    EXPECT_EQ(Client(), "");
    EXPECT_EQ(DefaultRoutes(), "");
    EXPECT_EQ(ReadText(kResolver), "");
  }
};

// A server at the other end, for as long as the holder lives.
class Server : public RunningProgram {
 public:
  Server()
      : RunningProgram({"/usr/sbin/dnsmasq", "--conf-file=/dev/null", "--keep-in-foreground", "--interface=serve0",
                        "--port=0", "--user=root", "--pid-file=", "--no-ping", "--dhcp-authoritative",
                        "--dhcp-range=10.1.14.77,10.1.14.77,255.255.255.0,1h", "--dhcp-option=option:router,10.1.14.2",
                        "--dhcp-option=option:dns-server,10.1.14.3", "--dhcp-leasefile=/tmp/platform/leases"}) {}
};

TEST_F(ALeasingClient, StaysBehindAndIsEndedWithWhatItHasLeased) {
  const Server server;
  NETINFO netInfo = Asker();
  Shell("ip address add 192.0.2.7/24 dev wlan0");
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 16), 0);
  EXPECT_STREQ(netInfo.szIp, "10.1.14.77");
  EXPECT_STREQ(netInfo.szMask, "255.255.255.0");
  ExpectApplied();
  EXPECT_NE(Client(), "");

  netInfo.blManual = TRUE;
  CopyText(netInfo.szIp, "10.1.14.9");
  EXPECT_EQ(MERONetSetCard1(&netInfo, 0), 0);
  EXPECT_EQ(Addresses(), "10.1.14.9/24");
  ExpectGivenBack();
}

// It gave up, and a server that came late was not asked.
TEST_F(ALeasingClient, GoesOnAskingWhenNobodyAnswersInTime) {
  NETINFO netInfo = Asker();
  const auto begin = std::chrono::steady_clock::now();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 4), -1);
  const auto waited = std::chrono::steady_clock::now() - begin;
  EXPECT_GE(waited, std::chrono::milliseconds(3900));
  EXPECT_LT(waited, std::chrono::seconds(6));
  ExpectFailure(ERR_UNKNOWN, "Failed to lease an address for wlan0: Connection timed out");
  EXPECT_STREQ(netInfo.szIp, "");
  const std::string client = Client();
  EXPECT_NE(client, "");

  const Server server;
  EXPECT_TRUE(IsAppliedWithin(40));  // it rests for 20 s between its rounds
  ExpectApplied();
  EXPECT_EQ(Client(), client);

  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 16), 0);
  EXPECT_NE(Client(), client);
  EXPECT_TRUE(HasEnded(client));
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  ExpectGivenBack();
}

// What is sent to a server while this lives.
class Questions {
 public:
  Questions() : heard_(::socket(AF_PACKET, SOCK_DGRAM | SOCK_CLOEXEC, htons(ETH_P_IP))) {
    sockaddr_ll end{};
    end.sll_family = AF_PACKET;
    end.sll_protocol = htons(ETH_P_IP);
    end.sll_ifindex = static_cast<int>(::if_nametoindex("serve0"));
    EXPECT_EQ(::bind(heard_.get(), reinterpret_cast<const sockaddr*>(&end), sizeof end), 0);
  }

  int Count() const {
    constexpr std::size_t kPort = 22;  // behind a header of 20 bytes, the second of two
    int count = 0;
    unsigned char packet[2048];
    while (::recv(heard_.get(), packet, sizeof packet, MSG_DONTWAIT) > static_cast<ssize_t>(kPort + 1)) {
      if (packet[kPort] == 0 && packet[kPort + 1] == 67) ++count;
    }
    return count;
  }

 private:
  Descriptor heard_;
};

// When one was lost, everybody waited 4 s for the next.
TEST_F(ALeasingClient, AsksEachSecond) {
  const Questions questions;
  NETINFO netInfo = Asker();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 6), -1);
  EXPECT_GE(questions.Count(), 6);
  TakeLog();
}

TEST_F(ALeasingClient, ThatAsksInVainIsEndedByDisconnecting) {
  NETINFO netInfo = Asker();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 4), -1);
  TakeLog();
  EXPECT_NE(Client(), "");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(Client(), "");
}

TEST_F(ALeasingClient, ThatWasKilledHasItsLeaseGivenBack) {
  const Server server;
  NETINFO netInfo = Asker();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 16), 0);
  Shell("kill -KILL $(cat /var/run/udhcpc-wlan0.pid)");
  ExpectApplied();
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  ExpectGivenBack();
}

TEST_F(ALeasingClient, IsEndedWithoutTheScriptThatWouldApplyALease) {
  fs::remove(kScript);
  NETINFO netInfo = Asker();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 4), -1);
  TakeLog();
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  EXPECT_EQ(Client(), "");
}

// A server that offered and refused again and again kept the caller for ever.
TEST_F(ALeasingClient, IsEndedWhenItIsKeptBusy) {
  WriteScript(kScript, "[ \"$1\" = left ] || sleep 1000\n");
  NETINFO netInfo = Asker();
  EXPECT_EQ(MEROIGetDHCPTestNetInfo(&netInfo, 4), -1);
  ExpectFailure(ERR_UNKNOWN, "Failed to lease an address for wlan0: Connection timed out");
  EXPECT_EQ(Client(), "");
}

// A name server that could not be taken out kept an interface from getting a static address.
TEST_F(ALeasingClient, KeepsNobodyFromAnotherAddressByWhatCannotBeGivenBack) {
  WriteScript(kScript, "exit 1\n");
  EXPECT_EQ(MEROWirelessNetworkDisconnect(), 0);
  NETINFO netInfo = Asker();
  netInfo.blManual = TRUE;
  CopyText(netInfo.szIp, "10.9.0.2");
  CopyText(netInfo.szMask, "255.255.255.0");
  EXPECT_EQ(MERONetSetCard1(&netInfo, 0), 0);
}

}  // namespace
