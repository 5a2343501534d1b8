// The wired member of an access point's bridge: what it had before, and what becomes of that.
#include "kit_radio.h"

namespace {

using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

class KitWire : public KitRadio {
 protected:
  // Gives the wire an address and a way out, and the file of a bridge that it is the first member of.
  static void SetWire(const std::string& atBoot) {
    ASSERT_EQ(RunInShell("ip address add 192.0.2.9/24 dev eth0; ip link set eth0 up; ip link set wire up; "
                         "until grep -qx up /sys/class/net/eth0/operstate; do sleep 0.05; done; "
                         "ip route add default via 192.0.2.1 metric 7; ip route add 198.51.100.0/24 via 192.0.2.2")
                  .out,
              "");
    WriteText("/etc/sysconfig/network-scripts/ifcfg-br0",
              "DEVICE=br0\nTYPE=Bridge\nPRIMARY=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.9\nNETMASK=255.255.255.0\n"
              "ONBOOT=" +
                  atBoot + "\n");
  }

  // What the wire, and the bridge that it is in, are reached by.
  static std::string Ways() { return RunInShell("ip -4 -brief address show up | grep -v ^lo; ip -4 route").out; }

  static std::string Notes() { return RunInShell("ls /run/rc.network | grep wire").out; }

  // Has the script killed where it runs a command of ip.
  static void KillStart(const std::string& where, const std::string& words = "start wlan0 br0") {
    Install("ip", "case $* in *'" + where + "'*) kill -s KILL 0 ;; esac\nexec /usr/sbin/ip \"$@\"\n");
    EXPECT_NE(RunInShell("PATH=/tmp/bin:$PATH setsid -w /etc/rc.network " + words).status, 0);
    StandInForIp();
  }
};

// A wired appliance that had an access point put into its network lost its address and its way out, also when that
// failed.
TEST_F(KitWire, IsAsItWasWhenAStartFailsAndGivesItsRoutesWhenItDoesNot) {
  SetWire("yes");
  const std::string before = Ways();
  Break("hostapd");
  const Ran failed = Script("start wlan0 br0");
  EXPECT_EQ(failed.status, 1);
  EXPECT_THAT(failed.out, StartsWith("rc.network: cannot start the access point on wlan0"));
  EXPECT_EQ(Ways(), before);
  EXPECT_FALSE(fs::exists("/sys/class/net/br0"));
  EXPECT_EQ(Notes(), "");

  Mend();
  EXPECT_EQ(Script("start wlan0 br0").out, "");
  EXPECT_EQ(RunInShell("ip -4 -brief address show br0 | awk '{ print $3 }'").out, "192.0.2.9/24\n");
  EXPECT_THAT(RunInShell("ip -4 route").out, HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
  EXPECT_EQ(Notes(), "");
  Break("hostapd");
  EXPECT_EQ(Script("start wlan0 br0").status, 1);
  EXPECT_THAT(RunInShell("ip -4 route").out, HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
}

// The next start took what was left of the wire for what it had had: the way out was gone for good.
TEST_F(KitWire, IsAsItWasBehindAStartThatWasKilled) {
  SetWire("yes");
  const std::string before = Ways();
  for (const char* szWhere : {"-batch", "route add"}) {
    KillStart(szWhere);
    EXPECT_EQ(Script("start wlan0 br0").out, "") << szWhere;
    EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7")) << szWhere;
    EXPECT_EQ(Notes(), "") << szWhere;
    EXPECT_EQ(Script("restart wlan0 br0").out, "");
    RunInShell("ip link delete br0");
    SetWire("yes");

    KillStart(szWhere);
    BreakOnce("hostapd");
    EXPECT_EQ(Script("start wlan0 br0").status, 1) << szWhere;
    EXPECT_EQ(Ways(), before) << szWhere;

    KillStart(szWhere);
    EXPECT_EQ(Script("restart wlan0 br0").out, "") << szWhere;
    EXPECT_EQ(Ways(), before) << szWhere;
    EXPECT_EQ(Notes(), "") << szWhere;
  }
}

// The start succeeded with a warning, and no further one gave the bridge the route.
TEST_F(KitWire, IsAsItWasWhenTheBridgeCannotHaveItsRoute) {
  SetWire("yes");
  const std::string before = Ways();
  BreakOnce("ip", "route add");
  const Ran failed = Script("start wlan0 br0");
  EXPECT_EQ(failed.out,
            "rc.network: cannot route over br0 as before, 'default via 192.0.2.1 metric 7': ip is broken\n");
  EXPECT_EQ(failed.status, 1);
  EXPECT_EQ(Ways(), before);
  EXPECT_EQ(Script("start wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
}

TEST_F(KitWire, KeepsNoRouteThatABridgeOfAnotherSubnetCannotHave) {
  SetWire("yes");
  RunInShell("sed -i 's/192.0.2.9/10.7.0.1/' /etc/sysconfig/network-scripts/ifcfg-br0");
  const Ran ran = Script("start wlan0 br0");
  EXPECT_THAT(ran.out, StartsWith("rc.network: cannot route over br0 as before, 'default via 192.0.2.1 metric 7': "));
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(Ways(), Not(HasSubstr("default")));
}

TEST_F(KitWire, MayBeGoneBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell("ip link delete eth0");
  EXPECT_EQ(Script("start wlan0 br0").out, "rc.network: there is no interface 'eth0' for the bridge br0\n");
  EXPECT_EQ(Notes(), "");
}

TEST_F(KitWire, IsAsItWasInTheFormerBridgeBehindAStartThatWasKilled) {
  SetWire("yes");
  const std::string before = Ways();
  KillStart("route add");
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(RunInShell("ip -4 -brief address show eth0; ip -4 route show default").out,
            "eth0@wire        UP             192.0.2.9/24 \ndefault via 192.0.2.1 dev eth0 metric 7 \n");
  EXPECT_FALSE(fs::exists("/sys/class/net/br0"));
}

// With the note of a start that had come to its end, the next one that failed removed a bridge that it had not made.
TEST_F(KitWire, StaysInItsBridgeWhateverAStartThatWasKilledAtItsEndHasLeft) {
  SetWire("yes");
  const std::string leave = "cd /run/rc.network && echo eth0 >wire-br0 && : >wire-br0.addresses && : >wire-br0.routes";
  ASSERT_EQ(Script("start wlan0 br0").out, "");
  ASSERT_EQ(RunInShell(leave).status, 0);
  Break("hostapd");
  EXPECT_EQ(Script("start wlan0 br0").status, 1);
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
  EXPECT_EQ(Notes(), "");

  Mend();
  ASSERT_EQ(Script("start wlan0 br0").out, "");
  ASSERT_EQ(RunInShell(leave).status, 0);
  WriteText("/usr/mero/etc/wireless_country.conf", "country=\"xx1\"\n");
  EXPECT_EQ(Script("start wlan0 br0").status, 1);
  fs::remove("/usr/mero/etc/wireless_country.conf");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
  EXPECT_EQ(Notes(), "");

  ASSERT_EQ(Script("start wlan0 br0").out, "");
  ASSERT_EQ(RunInShell(leave).status, 0);
  EXPECT_EQ(Script("restart wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
  EXPECT_EQ(Notes(), "");
}

// ip tells that there is no carrier in each route, and takes none back that says so: no access point could be started,
// and behind a failure none ever again.
TEST_F(KitWire, MayHaveNoCable) {
  SetWire("yes");
  RunInShell("ip link set wire down; until ip route | grep -q linkdown; do sleep 0.02; done");
  BreakOnce("hostapd");
  EXPECT_EQ(Script("start wlan0 br0").out, "rc.network: cannot start the access point on wlan0: hostapd is broken\n");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev eth0 metric 7"));
  KillStart("route add");
  EXPECT_EQ(Script("start wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7 linkdown"));
}

// A command was refused for the address that routes had come from, at each start.
TEST_F(KitWire, GivesItsRoutesWithoutAnAddressThatTheBridgeHasNot) {
  SetWire("yes");
  RunInShell(
      "ip address add 192.0.2.55/24 dev eth0; ip route delete default; "
      "ip route add default via 192.0.2.1 proto dhcp src 192.0.2.55 metric 202");
  EXPECT_EQ(Script("start wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 proto dhcp metric 202"));
}

// One route that cannot be had kept those behind it from being tried.
TEST_F(KitWire, GivesTheRoutesThatTheBridgeCanHave) {
  SetWire("yes");
  RunInShell("ip route add 203.0.113.1 dev eth0; ip route add default via 203.0.113.1 dev eth0 metric 3");
  const Ran ran = Script("start wlan0 br0");
  EXPECT_EQ(
      ran.out,
      "rc.network: cannot route over br0 as before, 'default via 203.0.113.1 metric 3': Error: Nexthop has invalid "
      "gateway.\n");
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
}

// What had been noted names an interface by its number: each start behind it failed.
TEST_F(KitWire, MayBeAnotherBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell(
      "ip link delete eth0; ip link delete br0; ip link add eth0 type veth peer name wire; "
      "ip link set eth0 up; ip link set wire up");
  BreakOnce("hostapd");
  EXPECT_EQ(Script("start wlan0 br0").out, "rc.network: cannot start the access point on wlan0: hostapd is broken\n");
  EXPECT_THAT(Ways(), Not(HasSubstr("192.0.2.9")));
}

TEST_F(KitWire, MayBeInABridgeOfSomebodyElsesBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell("ip link delete br0; ip link add br7 type bridge; ip link set eth0 master br7");
  BreakOnce("hostapd");
  EXPECT_EQ(Script("start wlan0 lbr0").status, 1);
  EXPECT_THAT(Ways(), Not(HasSubstr("192.0.2.9")));
  EXPECT_EQ(Notes(), "");
}

// What a step had given back before it failed was taken for somebody's, and the rest was not given back any more.
TEST_F(KitWire, IsAsItWasWhenAStepTowardsThatFails) {
  SetWire("yes");
  const std::string before = Ways();
  for (const char* szStep : {"route add", "address restore", "eth0 up", "link delete"}) {
    KillStart("route add");
    BreakOnce("ip", szStep);
    EXPECT_EQ(Script("restart wlan0 br0").status, 0) << szStep;
    EXPECT_EQ(Ways(), before) << szStep;
    EXPECT_EQ(Notes(), "") << szStep;
  }
}

// A way out by way of a neighbour that is in no subnet of its own was tried before the route to that neighbour.
TEST_F(KitWire, IsAsItWasWithRoutesThatNeedOthers) {
  SetWire("yes");
  RunInShell(
      "ip route add 203.0.113.1 dev eth0; ip route add default via 203.0.113.1 dev eth0 metric 3; "
      "ip address add 198.51.100.9/24 dev eth0 noprefixroute; "
      "ip route replace 198.51.100.0/24 dev eth0 metric 100");
  const std::string before = Ways();
  BreakOnce("hostapd");
  EXPECT_THAT(Script("start wlan0 br0").out, HasSubstr("cannot start the access point on wlan0: hostapd is broken\n"));
  EXPECT_EQ(Ways(), before);
}

// Somebody's own way out of the same metric was replaced.
TEST_F(KitWire, LeavesOthersTheirRoutesBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell(
      "ip link add eth1 type veth peer name wire1; ip link set wire1 up; ip link set eth1 up; "
      "ip address add 203.0.113.9/24 dev eth1; ip route add default via 203.0.113.1 dev eth1 metric 7");
  EXPECT_EQ(Script("restart wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 203.0.113.1 dev eth1 metric 7"));
}

TEST_F(KitWire, MayHaveBeenTakenDownBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell("ip link set eth0 down");
  EXPECT_EQ(Script("start wlan0 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
}

// It was given its former address besides, and a second way out.
TEST_F(KitWire, IsLeftToWhoeverHasMendedItBehindAStartThatWasKilled) {
  SetWire("yes");
  KillStart("route add");
  RunInShell(
      "ip link delete br0; ip address add 192.0.2.77/24 dev eth0; "
      "ip route add default via 192.0.2.254 dev eth0 metric 7");
  const std::string mended = Ways();
  BreakOnce("hostapd");
  EXPECT_EQ(Script("start wlan0 br0").status, 1);
  EXPECT_EQ(Ways(), mended);
}

// Of a bridge that is there already nothing was noted: its way out was lost.
TEST_F(KitWire, GivesItsRoutesToABridgeInTheRunBehindAFailure) {
  const std::string route = "default via 192.0.2.1 dev br0 metric 7";
  SetWire("yes");
  KillStart("route add", "boot");
  EXPECT_THAT(Ways(), Not(HasSubstr(route)));
  EXPECT_EQ(Script("boot").out, "");
  EXPECT_THAT(Ways(), HasSubstr(route));

  for (const bool isKilled : {true, false}) {
    RunInShell(
        "ip link set eth0 nomaster; ip route delete default; ip address add 192.0.2.8/24 dev eth0; "
        "ip link set eth0 up; ip route add default via 192.0.2.1 dev eth0 metric 7");
    if (isKilled) {
      KillStart("route add");
    } else {
      BreakOnce("ip", "route add");
      EXPECT_EQ(Script("start wlan0 br0").status, 1);
    }
    EXPECT_EQ(Script("start wlan0 br0").out, "");
    EXPECT_THAT(Ways(), HasSubstr(route)) << isKilled;
    EXPECT_EQ(RunInShell("ls /run/rc.network | grep -e wire -e routes").out, "");
  }
}

// The note of one interface's access point was asked about another's start.
TEST_F(KitWire, IsAsItWasBehindAStartOfAnotherInterfaceThatWasKilled) {
  SetWire("yes");
  RunInShell(
      "ip link add wlan1 type veth peer name air1; "
      "cp /etc/hostapd/hostapd-wlan0-host.conf /etc/hostapd/hostapd-wlan1-host.conf");
  KillStart("route add");
  EXPECT_EQ(Script("start wlan1 br0").out, "");
  EXPECT_THAT(Ways(), HasSubstr("default via 192.0.2.1 dev br0 metric 7"));
}

// A signal that came while the notes were removed failed the start, and nobody knew any more what the wire had had: it
// was left without an address.
TEST_F(KitWire, HasGivenItsAddressWhenASignalComesWithTheLastStep) {
  SetWire("no");
  const Ran ran = ScriptWithSignal("start wlan0 br0", "wire-br0");
  EXPECT_EQ(ran.out, "");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(Daemons(), "hostapd\n");
  EXPECT_EQ(RunInShell("ip -4 -brief address show br0 | awk '{ print $3 }'").out, "192.0.2.9/24\n");
}

}  // namespace
