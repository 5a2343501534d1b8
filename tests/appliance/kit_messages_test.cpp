// What the kit says when something cannot be done: each message, from a program that fails at that step.
#include "kit_radio.h"

namespace {

using testing::HasSubstr;

// A command in the kit's parts, what of its programs fails, and what is said then.
struct Step {
  const char* szCommand;
  const char* szProgram;
  const char* szCalls;
  const char* szMessage;
};

class KitMessage : public KitRadio {
 protected:
  KitMessage() {
    for (const char* szName :
         {"busybox", "chmod", "date", "find", "flock", "mktemp", "mv", "readlink", "rm", "stat", "sync"}) {
      StandIn(szName, "exec /usr/bin/" + std::string(szName) + " \"$@\"\n");
    }
  }

  // Runs it with a state directory of its own, as somebody who started nothing yet.
  static void ExpectMessages(std::initializer_list<Step> steps) {
    for (const Step& step : steps) {
      RunInShell("rm -rf /run/rc.network; mkdir -p -m 700 /run/rc.network");
      Mend();
      if (*step.szProgram != '\0') Break(step.szProgram, step.szCalls);
      const Ran ran = RunInParts(step.szCommand);
      EXPECT_THAT(ran.out, HasSubstr(std::string(step.szMessage) + "\n")) << step.szCommand;
    }
  }
};

TEST_F(KitMessage, OfABridgeSaysWhichStepCannotBeTaken) {
  SetBridge("PRIMARY=eth0");
  ExpectMessages({
      {"make_bridge br9", "", "", "/etc/sysconfig/network-scripts/ifcfg-br9 describes no bridge"},
      {"make_bridge lbr0", "ip", "route show", "cannot tell the routes of eth0"},
      {"remove_bridge lbr0; make_bridge lbr0", "ip", "add name lbr0", "cannot make the bridge lbr0: ip is broken"},
      {"make_bridge lbr0", "ip", "lbr0 up", "cannot bring lbr0 up: ip is broken"},
      {"make_bridge lbr0", "ip", "master lbr0", "cannot bring eth0 into lbr0: ip is broken"},
      {"make_bridge lbr0", "ip", "address flush", "cannot remove the addresses of eth0: ip is broken"},
      {"make_bridge lbr0", "ip", "address show", "cannot tell the addresses of lbr0: ip is broken"},
      {"leave_bridge eth0 lbr0", "ip", "nomaster", "cannot take eth0 out of lbr0: ip is broken"},
      {"remove_bridge lbr0", "ip", "link delete", "cannot remove the bridge lbr0: ip is broken"},
      {"move_routes lbr0 'default via 192.0.2.1'", "ip", "route add",
       "cannot route over lbr0 as before, 'default via 192.0.2.1': ip is broken"},
      {"lease_address lbr0", "busybox", "udhcpc", "cannot lease an address for lbr0: busybox is broken"},
  });
}

TEST_F(KitMessage, OfAWireSaysWhatCannotBeGivenBack) {
  WriteScript("/usr/mero/sbin/udhcpc.lease", "exit 1\n");
  const std::string noted = "note_wire eth0 lbr0; ";
  const std::string gives = noted + "give_wire_back lbr0";
  const std::string routes =
      noted + "echo 203.0.113.0/24 via 198.51.100.1 >/run/rc.network/wire-lbr0.routes; give_wire_back lbr0";
  ExpectMessages({
      {"note_wire eth0 lbr0", "ip", "address save", "cannot note the addresses of eth0"},
      {"note_wire eth0 lbr0", "ip", "route show", "cannot tell the routes of eth0"},
      {"note_wire eth9 lbr0", "", "", "cannot tell the number of eth9"},
      {gives.c_str(), "ip", "address restore", "cannot give eth0 its addresses back: ip is broken"},
      {gives.c_str(), "ip", "eth0 up", "cannot bring eth0 up: ip is broken"},
      {routes.c_str(), "ip", "route add", "cannot give eth0 its routes back: ip is broken"},
      {routes.c_str(), "", "",
       "cannot give eth0 its route back, '203.0.113.0/24 via 198.51.100.1': Error: Nexthop has "
       "invalid gateway."},
      {"chmod 755 /usr/mero/sbin/udhcpc.lease; end_lease eth0", "", "", "what eth0 had leased is not all given back"},
      {"take_down wlan0", "ip", "wlan0 down", "cannot take wlan0 down: ip is broken"},
      {"make_client wlan0", "iw", "managed", "cannot make wlan0 a client's: iw is broken"},
  });
}

TEST_F(KitMessage, OfSettingsSaysWhatIsWrongWithThem) {
  ExpectMessages({
      {"settings_reader=/tmp/bin/ip; read_setting ssid", "ip", "", "cannot read settings: access-point ssid"},
      {"ask() { answer=perhaps; }; is_on guests", "", "", "the setting guests is 'perhaps', which is no number"},
      {"ask() { return 1; }; read_setting ssid", "", "", "cannot read the setting ssid"},
      {"ask() { return 1; }; is_on guests", "", "", "cannot read the setting guests"},
      {"ask() { answer=perhaps; }; is_nat lbr0", "", "", "neither yes nor no, but 'perhaps': bridge lbr0 nat"},
      {"guests=yes; learn_capabilities() { :; }; write_configuration wlan0 /tmp/conf", "", "",
       "cannot read /etc/hostapd/hostapd-wlan0-host.conf or /etc/hostapd/hostapd-wlan0-guest.conf"},
      {"write_configuration wlan1 /tmp/conf", "", "", "/etc/hostapd/hostapd-wlan1-host.conf is missing or empty"},
  });
}

TEST_F(KitMessage, OfAFileSaysWhichItIs) {
  ExpectMessages({
      {">/tmp/file; remove_files /tmp/missing /tmp/file", "rm", "/tmp/file", "cannot remove /tmp/file: rm is broken"},
      {"note /tmp/missing/note text", "", "", "cannot write /tmp/missing/note: Directory nonexistent"},
      {"note /dev/full text", "", "", "cannot write /dev/full: I/O error"},
      {"put /tmp/file ''", "mktemp", "", "cannot write /tmp/file: mktemp is broken"},
      {"put /tmp/file ''", "mv", "", "cannot replace /tmp/file: mv is broken"},
      {"put /etc/file ''", "sync", "/etc/file", "cannot write /etc/file: sync is broken"},
      {"sync() { [ ! -d $1 ] || { echo it is broken; false; }; }; put /etc/file ''", "", "",
       "/etc/file may be the old one again after a power cut: it is broken"},
      {"set_aside /tmp/file", "mktemp", "", "cannot move /tmp/file aside"},
      {"set_aside /tmp/file", "mv", "", "cannot move /tmp/file aside: mv is broken"},
      {"mktemp() { echo /tmp/other; }; >/tmp/file; set_aside /tmp/file", "", "",
       "/tmp/file was in the way, and is /tmp/other now"},
      {"mkdir -p /tmp/device/driver; numbers_of /tmp/device", "readlink", "", "cannot tell what drives /tmp/device"},
  });
}

TEST_F(KitMessage, OfTrafficBetweenNetworksSaysWhatDoesNotPass) {
  const std::string closed = "forwarding=/proc/version; is_nat() { return 1; }; rules() { :; }; guests=yes; ";
  const std::string opens = closed + "set_firewall lbr0";
  const std::string closes = closed + "echo 0 >$forwarding_before; clear_firewall";
  ExpectMessages({
      {opens.c_str(), "", "", "cannot pass traffic on between networks"},
      {closes.c_str(), "", "", "cannot stop passing traffic on between networks"},
      {"subnet_of lo", "", "", "lo has no address, and so no network to translate"},
      {"forwarding=/dev/null; is_nat() { return 1; }; rules() { :; }; guests=yes; set_firewall lbr0", "", "",
       "cannot read /dev/null"},
      {"local_networks", "ip", "route show", "cannot tell the networks around the appliance: ip is broken"},
  });
}

TEST_F(KitMessage, OfADaemonSaysWhatItDoesNotDo) {
  const std::string pid = RunInShell("{ sleep 60 >/dev/null 2>&1 & } && echo $! | tee /tmp/pid").out;
  EXPECT_EQ(RunInParts("kill() { :; }; sleep() { :; }; end_daemon sleep /tmp/pid").out,
            "sh: cannot end sleep (process " + pid.substr(0, pid.size() - 1) + ")\n");
  RunInShell("kill $(cat /tmp/pid)");

  WriteText("/tmp/log", "1795.2: Driver does not support configured HT\n");
  StandIn("hostapd_cli", "echo state=DISABLED\n");
  ExpectMessages({
      {"cp /tmp/log $hostapd_run-wlan0.log; await_access_point wlan0", "", "",
       "the access point on wlan0 does not come up: Driver does not support configured HT"},
      {"await() { outcome=ENABLED; }; await_access_point wlan0", "", "",
       "the access point on wlan0 has not noted its process"},
      {"rm /tmp/phy; learn_capabilities nowhere; echo phy0 >/tmp/phy", "", "", "nowhere is no wireless interface"},
      {"ht_of_2ghz=''; lines=wpa_passphrase=x; make_configuration", "", "",
       "a network would be open that is to be protected: its key or its version of WPA is none"},
  });
}

TEST_F(KitMessage, OfAScheduleSaysThatItCannotBeFollowed) {
  const std::string is_off = "is_on() { :; }; read_setting() { answer=1; }; is_off_now wifi_sched_enabled wifi_sched";
  ExpectMessages({
      {is_off.c_str(), "date", "", "cannot tell the hour of the week"},
  });
}

TEST_F(KitMessage, OfTheStateDirectorySaysWhatCannotBeMadeOfIt) {
  const struct {
    const char* szProgram;
    const char* szCalls;
    const char* szMessage;
  } rows[] = {
      {"stat", "rc.network", "cannot tell whose /var/run/rc.network is"},
      {"chmod", "rc.network", "cannot keep /var/run/rc.network to root: chmod is broken"},
      {"find", "rc.network", "cannot tell what of /var/run/rc.network is root's"},
      {"find", "-exec", "cannot remove what is not root's from /var/run/rc.network"},
      {"flock", "", "cannot lock /var/run/rc.network/lock"},
  };
  for (const auto& row : rows) {
    RunInShell("rm -rf /run/rc.network; mkdir -p /run/rc.network/directory");
    Mend();
    Break(row.szProgram, row.szCalls);
    EXPECT_THAT(Script("boot").out, HasSubstr("rc.network: " + std::string(row.szMessage) + "\n"));
  }
  Mend();
  StandIn("find", "");
  RunInShell("rm -rf /run/rc.network; mkdir -p -m 700 /run/rc.network/lock");
  EXPECT_THAT(Script("boot").out, HasSubstr("rc.network: cannot open /var/run/rc.network/lock\n"));
}

class KitMessageOfAnAdapter : public KitMessage {
 protected:
  KitMessageOfAnAdapter() {
    RunInShell(
        "sed -i 's,/sys/class/net,/tmp/net,' /usr/mero/lib/network/adapter.sh; "
        "mkdir -p /tmp/net/wlan0/phy80211/rfkill7; cd /tmp/net/wlan0/phy80211; echo phy0 >name; echo 0 >rfkill7/soft");
  }

  static std::string BlockAfter(const std::string& setting) {
    WriteText("/tmp/wireless.info", "INTERFACE=\"wlan0\"\nPRODUCT=\"Stick\"\n");
    WriteText("/usr/mero/etc/wireless_ap.conf", "[Stick]\n\tssid=home\n\t" + setting + "\n");
    EXPECT_EQ(Tells("block_if_switched_off wlan0"), "");
    return ReadText("/tmp/net/wlan0/phy80211/rfkill7/soft");
  }
};

TEST_F(KitMessageOfAnAdapter, SaysThatItCannotBeAnAccessPoint) {
  EXPECT_EQ(Run("/usr/mero/hotplug/usb.wireless.function change-mode ap").out,
            "usb.wireless.function: wlan0 cannot be an access point\n");
}

TEST_F(KitMessageOfAnAdapter, SaysThatItsRadioCannotBeBlocked) {
  BlockAfter("unblock=no");
  RunInShell("cd /tmp/net/wlan0/phy80211/rfkill7; rm soft; mkdir soft");
  EXPECT_THAT(RunInParts("block_if_switched_off wlan0").out, HasSubstr("cannot block the radio of wlan0: "));
  EXPECT_THAT(RunInParts("ask() { return 1; }; block_if_switched_off wlan0").out,
              HasSubstr("cannot read the setting unblock\n"));
}

// An adapter whose radio was off had it on after a boot, or plugged in anew.
TEST_F(KitMessageOfAnAdapter, IsSaidOfNoneWhoseRadioIsBlockedAsItIsSwitched) {
  EXPECT_EQ(BlockAfter(""), "0\n");
  EXPECT_EQ(BlockAfter("unblock=yes"), "0\n");
  EXPECT_EQ(BlockAfter("unblock=no"), "1\n");
}

}  // namespace
