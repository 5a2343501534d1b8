// The appliance kit's scripts, by their parts and as they are called, where no radio is needed.
#include "kit.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

namespace {

using testing::ContainsRegex;
using testing::HasSubstr;
using testing::StartsWith;

TEST_F(Kit, TakesNamesOfInterfacesOnly) {
  for (const char* szGood : {"wlan0", "br-lan", "eth0.7", "a_b", "123456789012345"}) {
    EXPECT_EQ(RunInParts("expect_name '" + std::string(szGood) + "'").status, 0) << szGood;
  }
  for (const char* szBad : {"../x", "a b", "a/b", ".", "..", "-x", "1234567890123456", "a;b", "a\nb"}) {
    const Ran ran = RunInParts("expect_name '" + std::string(szBad) + "'");
    EXPECT_EQ(ran.status, 1) << szBad;
    EXPECT_THAT(ran.out, HasSubstr("is no name of an interface"));
  }
}

TEST_F(Kit, LeavesOutWhatTheCardCannotDo) {
  const std::string all = "[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935][HT40-]";
  const struct {
    const char* szBits;
    std::string left;
  } rows[] = {
      {"0x0c62", "ieee80211n=1\nht_capab=" + all + "\nrequire_ht=1\n"},
      {"0x107e", "ieee80211n=1\nht_capab=[SHORT-GI-20][SHORT-GI-40][HT40-]\nrequire_ht=1\n"},
      {"0x0020", "ieee80211n=1\nht_capab=[SHORT-GI-20]\nrequire_ht=1\n"},
      {"0x0000", "ieee80211n=1\nht_capab=\nrequire_ht=1\n"},
      {"", ""},  // no 802.11n at all
  };
  const std::string asked = "ieee80211n=1\nht_capab=" + all + "\nrequire_ht=1\n";
  const auto left = [](const std::string& card, const std::string& configuration) {
    WriteText("/tmp/conf", configuration);
    return Tells(card +
                 "; country=''; lines=$(cat /tmp/conf); make_configuration; "
                 "printf '%s' \"${content:+$content$newline}\"");
  };
  for (const auto& [szBits, expected] : rows) {
    const std::string bits = "='" + std::string(szBits) + "' ";
    EXPECT_EQ(left("ht_of_2ghz" + bits + "ht_of_5ghz=0x0800", asked), expected) << szBits;
    EXPECT_EQ(left("ht_of_5ghz" + bits + "ht_of_2ghz=0x0800", "hw_mode=a\n" + asked), "hw_mode=a\n" + expected)
        << szBits;
  }
}

TEST_F(Kit, ReadsTheCapabilitiesOfTheBand) {
  Install("iw",
          "cat <<END\nWiphy phy0\n\tBand 1:\n\t\tCapabilities: 0x11\n\t\tCapabilities: 0x99\n"
          "\tBand 2:\n\t\tCapabilities: 0x22\n\t\tCapabilities: 0x98\n\tBand 3:\n\t\tFrequencies:\nEND\n");
  RunInShell("echo phy0 >/tmp/phy; sed -i 's,/sys/class/net/$1/phy80211/name,/tmp/phy,' /usr/mero/lib/network/*.sh");
  const std::string learn = "learn_capabilities wlan0; echo \"$ht_of_2ghz $ht_of_5ghz\"";
  EXPECT_EQ(Tells(learn), "0x11 0x22\n");
  Install("iw", "printf 'Wiphy phy0\\n\\tBand 2:\\n\\t\\tHT Max RX data rate: 1\\n\\tBand 1:\\n\\t\\tBitrates:\\n'\n");
  EXPECT_EQ(Tells(learn), " \n");
}

TEST_F(Kit, FindsTheLineInWhichADaemonSaysWhy) {
  const struct {
    const char* szLog;
    const char* szReason;
  } rows[] = {
      {"1795.2: rfkill: Cannot open RFKILL control device\n1795.3: Line 22: invalid WPA passphrase\n1795.4: 1 errors\n",
       "Line 22: invalid WPA passphrase\n"},
      {"1795.2: wlan0: interface state UNINITIALIZED->DISABLED\nDriver does not support configured HT\n",
       "Driver does not support configured HT\n"},
      {"only this\n\n", "only this\n"},
  };
  for (const auto& row : rows) {
    WriteText("/tmp/log", row.szLog);
    EXPECT_EQ(Tells("reason_in /tmp/log"), row.szReason);
  }
  WriteText("/tmp/log", "");
  EXPECT_EQ(Tells("reason_in /tmp/log 'hostapd: unable to do it'"), "hostapd: unable to do it\n");
}

TEST_F(Kit, FollowsAScheduleByTheHourOfTheWeek) {
  const auto is_off = [](const std::string& hours, const char* szSwitch, const char* szDay, const char* szHour) {
    WriteText("/usr/mero/etc/wireless_ap.conf",
              std::string("[RT [5370]\n\twifi_sched=") + hours + "\n\twifi_sched_enabled=" + szSwitch);
    Install("date", std::string("echo ") + szDay + " " + szHour + "\n");
    return RunInParts("is_off_now wifi_sched_enabled wifi_sched").status == 0;
  };
  const std::string on(168, '1');
  const auto without = [&](size_t hour) {
    std::string hours = on;
    hours[hour] = '0';
    return hours;
  };
  EXPECT_TRUE(is_off(without(0), "1", "0", "00"));
  EXPECT_FALSE(is_off(without(0), "0", "0", "00"));
  EXPECT_FALSE(is_off(without(0), "1", "0", "01"));
  EXPECT_TRUE(is_off(without(9), "1", "0", "09"));
  EXPECT_TRUE(is_off(without(24 + 8), "1", "1", "08"));
  EXPECT_TRUE(is_off(without(167), "1", "6", "23"));
  EXPECT_FALSE(is_off("", "1", "6", "23"));
}

TEST_F(Kit, EndsADaemonOnlyWhenItIsStillTheOneOfItsPidFile) {
  // Beside it somebody waits for its end, as init does for a daemon's.
  const std::string runs =
      "(sleep 60 & echo $! >/tmp/pid; wait) >/dev/null 2>&1 & until read -r running </tmp/pid && "
      "grep -qx sleep /proc/$running/comm; do sleep 0.01; done 2>/dev/null; ";
  EXPECT_EQ(Tells(runs + "end_daemon hostapd /tmp/pid; kill $running"), "");
  EXPECT_FALSE(fs::exists("/tmp/pid"));
  EXPECT_EQ(Tells(runs + "end_daemon sleep /tmp/pid; ! kill -0 $running 2>/dev/null"), "");
  EXPECT_FALSE(fs::exists("/tmp/pid"));
  for (const char* szText : {"", "no number\n", "-1\n", "999999999\n"}) {
    WriteText("/tmp/pid", szText);
    EXPECT_EQ(Tells("end_daemon sleep /tmp/pid"), "") << szText;
  }
  EXPECT_EQ(Tells("end_daemon sleep /tmp/missing"), "");
}

// The kernel keeps a process that has ended until its parent asks for it, and not every parent does.
TEST_F(Kit, EndsADaemonThatNobodyWaitsFor) {
  EXPECT_EQ(Tells("(sleep 60 & echo $! >/tmp/pid; exec sleep 61) >/dev/null 2>&1 & until read -r running </tmp/pid && "
                  "grep -qx sleep /proc/$running/comm; do sleep 0.01; done 2>/dev/null; "
                  "end_daemon sleep /tmp/pid; grep -o 'Z (zombie)' /proc/$running/status; kill $!"),
            "Z (zombie)\n");
  EXPECT_FALSE(fs::exists("/tmp/pid"));
}

// It would go on, and nobody would know of it.
TEST_F(Kit, EndsADaemonThatHasNotNotedItsProcessYet) {
  EXPECT_EQ(Tells(">/tmp/pid; (sleep 60 & echo $! >/tmp/later; wait) >/dev/null 2>&1 & "
                  "(sleep 0.5; mv /tmp/later /tmp/pid) & end_daemon sleep /tmp/pid; wait $!"),
            "");
  EXPECT_FALSE(fs::exists("/tmp/pid"));
}

// For a command that it does not understand, ip does not tell which of them that was.
TEST_F(Kit, SaysWhichOfThePlannedCommandsIpDidNotTake) {
  for (const char* szCommand : {"address replace 192.0.2.1/99 dev lo", "address replace none dev lo",
                                "link set dev lo address zz", "link set dev gone up", "link set dev lo master gone"}) {
    const Ran ran = RunInParts("plan 'cannot begin' 'link set dev lo up'; plan 'cannot go on' '" +
                               std::string(szCommand) + "'; plan 'cannot end' 'link set dev lo up'; run_plan");
    EXPECT_EQ(ran.status, 1) << szCommand;
    EXPECT_THAT(ran.out, ContainsRegex("^sh: cannot go on: .*(192.0.2.1/99|none|zz|gone)")) << szCommand;
  }
}

TEST_F(Kit, ReplacesAFileThatOnlyRootMayRead) {
  EXPECT_EQ(Tells("put /tmp/secret secret"), "");
  EXPECT_EQ(ReadText("/tmp/secret"), "secret\n");
  EXPECT_EQ(ModeOf("/tmp/secret"), 0600u);
  const Ran ran = RunInParts("put /tmp/missing/secret secret");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("cannot write /tmp/missing/secret"));
}

TEST_F(Kit, GivesGuestsTheRulesThatAreSet) {
  Install("ip", "echo '198.51.100.0/24 dev eth0'\n");
  const auto rules = [](const std::string& settings) {
    WriteText("/usr/mero/etc/wireless_ap.conf", "[RT [5370]\n" + settings);
    return Tells("guest_rules");
  };
  const std::string usual = rules("");
  EXPECT_THAT(usual, HasSubstr("tcp dport { 80, 443 } accept"));
  EXPECT_THAT(usual, ContainsRegex("ip daddr @local-networks reject\n\t*accept\n"));
  EXPECT_THAT(usual, HasSubstr("10.0.0.0/8,100.64.0.0/10,172.16.0.0/12,192.168.0.0/16,169.254.0.0/16,198.51.100.0/24"));
  EXPECT_THAT(usual, Not(HasSubstr("meta nfproto ipv4 accept")));

  const std::string other = rules(
      "\tguest_net_lan_block=0\n\tguest_net_access_ds=1\n\tguest_net_internet_block=1\n\tguest_net_allow_http=0\n");
  EXPECT_THAT(other, Not(HasSubstr("{ 80, 443 }")));
  EXPECT_THAT(other, ContainsRegex("ip daddr @local-networks accept\n\t*reject\n"));
  EXPECT_THAT(other, HasSubstr("meta nfproto ipv4 accept"));
}

TEST_F(Kit, MakesTheBridgesThatComeUpAtBoot) {
  ASSERT_EQ(RunInShell("ip link add eth0 type veth peer name eth1 && ip address add 192.0.2.9/24 dev eth0").out, "");
  const std::string scripts = "/etc/sysconfig/network-scripts/ifcfg-";
  WriteText(scripts + "br0",
            "DEVICE=br0\nTYPE=Bridge\nPRIMARY=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.1\nNETMASK=255.255.255.0\n"
            "ONBOOT=yes\nHWADDR=02:00:00:00:00:07\n");
  WriteText(scripts + "br1", "DEVICE=br1\nTYPE=Bridge\nBOOTPROTO=static\nONBOOT=no\n");
  WriteText(scripts + "eth1", "DEVICE=eth1\nONBOOT=yes\n");
  for (int round = 0; round < 2; ++round) {
    const Ran ran = RunInShell("/etc/rc.network boot");
    EXPECT_EQ(ran.status, 0) << ran.out;
    EXPECT_EQ(ran.out, "");
    EXPECT_EQ(RunInShell("ls /sys/class/net/br0/brif").out, "eth0\n");
    EXPECT_EQ(RunInShell("ip -brief -4 address show br0 | awk '{ print $1, $3 }'").out, "br0 192.0.2.1/24\n");
    EXPECT_EQ(RunInShell("ip -brief link show br0 | awk '{ print $3 }'").out, "02:00:00:00:00:07\n");
    EXPECT_EQ(RunInShell("ip -brief -4 address show eth0 | awk '{ print $3 }'").out, "");
    EXPECT_FALSE(fs::exists("/sys/class/net/br1"));
  }
}

// An upgrade of the kit made the bridges again, and the way out of the house was gone.
TEST_F(Kit, KeepsTheRoutesOfABridgeThatIsThereAlready) {
  const std::string file = "/etc/sysconfig/network-scripts/ifcfg-br0";
  const std::string text = "DEVICE=br0\nTYPE=Bridge\nBOOTPROTO=static\nNETMASK=255.255.255.0\nONBOOT=yes\nIPADDR=";
  const std::string routes = "ip -4 route show dev br0 | sed 's/ *$//'";
  const std::string addresses = "ip -brief -4 address show br0 | awk '{ $1 = $2 = \"\"; print $0 }'";
  WriteText(file, text + "192.0.2.1\n");
  ASSERT_EQ(RunInShell("/etc/rc.network boot").out, "");
  ASSERT_EQ(RunInShell("ip route add default via 192.0.2.254").out, "");
  const std::string before = RunInShell(routes).out;
  ASSERT_THAT(before, StartsWith("default via 192.0.2.254"));

  EXPECT_EQ(RunInShell("/etc/rc.network boot").out, "");
  EXPECT_EQ(RunInShell(routes).out, before);

  // Another address than the file's goes, whichever was there first.
  for (const char* szOther : {"192.0.2.7/24", "192.0.2.1/16", "198.51.100.1/24"}) {
    ASSERT_EQ(RunInShell(std::string("ip address add dev br0 ") + szOther).out, "");
    EXPECT_EQ(RunInShell("/etc/rc.network boot").out, "");
    EXPECT_EQ(RunInShell(addresses).out, "  192.0.2.1/24\n") << szOther;
  }
  WriteText(file, text + "192.0.2.2\n");
  EXPECT_EQ(RunInShell("/etc/rc.network boot").out, "");
  EXPECT_EQ(RunInShell(addresses).out, "  192.0.2.2/24\n");
}

TEST_F(Kit, SaysWhyABridgeCannotBeMade) {
  const std::string scripts = "/etc/sysconfig/network-scripts/ifcfg-";
  const struct {
    const char* szText;
    const char* szReason;
  } rows[] = {
      {"BOOTPROTO=static\nIPADDR=192.0.2.x\nNETMASK=255.255.255.0\n", "cannot give br0 the address 192.0.2.x"},
      {"BOOTPROTO=static\nHWADDR=01:00:00:00:00:00\n", "cannot give br0 the address 01:00:00:00:00:00"},
  };
  for (const auto& row : rows) {
    WriteText(scripts + "br0", std::string("DEVICE=br0\nTYPE=Bridge\nONBOOT=yes\n") + row.szText);
    const Ran ran = RunInShell("/etc/rc.network boot");
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.out, StartsWith("rc.network: " + std::string(row.szReason)));
  }
}

TEST_F(Kit, RefusesWrongWordsWithItsUsage) {
  for (const char* szWords :
       {"", "start", "start wlan0", "start wlan0 lbr0 more", "restart", "boot wlan0", "schedule", "begin wlan0 lbr0"}) {
    const Ran ran = RunInShell("/etc/rc.network " + std::string(szWords));
    EXPECT_EQ(ran.status, 2) << szWords;
    EXPECT_THAT(ran.out, StartsWith("usage: rc.network start INTERFACE BRIDGE")) << szWords;
  }
  for (const char* szWords : {"", "change-mode", "change-mode both", "add wlan0", "plug"}) {
    const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function " + std::string(szWords));
    EXPECT_EQ(ran.status, 2) << szWords;
    EXPECT_THAT(ran.out, StartsWith("usage: usb.wireless.function add")) << szWords;
  }
}

// Also to whoever may not run anything.
TEST_F(Kit, TellsItsUsageWithoutAnythingElse) {
  Install("mkdir", "exit 1\n");
  for (const char* szWord : {"help", "-h", "--help"}) {
    const Ran ran = RunInShell(std::string("PATH=/tmp/bin:$PATH /etc/rc.network ") + szWord);
    EXPECT_EQ(ran.status, 0) << szWord;
    EXPECT_THAT(ran.out, StartsWith("usage: rc.network start INTERFACE BRIDGE")) << szWord;
  }
  const Ran ran = RunInShell("PATH=/tmp/bin:$PATH /etc/rc.network boot");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("rc.network: cannot make /var/run/rc.network"));
}

TEST_F(Kit, SaysThatAnotherRunTakesTooLong) {
  Install("flock", "exec /usr/bin/flock $(echo \"$@\" | sed 's/-w 60/-w 0.01/')\n");
  Install("logger", "echo \"$@\" >>/tmp/logged\n");
  const std::string locked = "PATH=/tmp/bin:$PATH; /etc/rc.network boot; exec 9>/var/run/rc.network/lock; ";
  const Ran late = RunInShell(locked + "/usr/bin/flock 9; /etc/rc.network boot 9>&-");
  EXPECT_EQ(late.status, 1);
  EXPECT_EQ(late.out, "rc.network: another run takes too long, and holds /var/run/rc.network/lock\n");
  EXPECT_EQ(RunInShell("cat /tmp/logged").out,
            "-t rc.network -p daemon.err -- another run takes too long, and holds /var/run/rc.network/lock\n");
  EXPECT_EQ(RunInShell("PATH=/tmp/bin:$PATH; /etc/rc.network boot").status, 0);
}

TEST_F(Kit, SaysThatThereIsNoAdapter) {
  for (const char* szWords : {"add", "change-mode ap", "change-mode client"}) {
    const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function " + std::string(szWords));
    EXPECT_EQ(ran.status, 1) << szWords;
    EXPECT_EQ(ran.out, "usb.wireless.function: no adapter is plugged in\n") << szWords;
  }
  const Ran ran = RunInShell("/etc/rc.network start wlan0 lbr0");
  EXPECT_EQ(ran.status, 1);
  EXPECT_EQ(ran.out, "rc.network: there is no interface 'wlan0'\n");
}

// With guests on the air, the adapter was taken to be their interface: changing to client mode left the main network on
// the air, without its rules.
TEST_F(Kit, TakesNoGuestsInterfaceForTheAdapter) {
  const std::string adapter = "PATH=/tmp/bin; . /tmp/adapter.sh; adapter";
  RunInShell(
      "mkdir -p /tmp/net/gwlan/phy80211 /tmp/net/wlan0/phy80211; sed 's,/sys/class/net,/tmp/net,' "
      "/usr/mero/lib/network/adapter.sh >/tmp/adapter.sh");
  EXPECT_EQ(Tells(adapter), "wlan0");
  fs::remove_all("/tmp/net/wlan0");
  EXPECT_EQ(RunInParts(adapter).status, 1);
  fs::remove_all("/tmp/net/gwlan");
  EXPECT_EQ(RunInParts(adapter).status, 1);
}

TEST_F(Kit, ForgetsAnAdapterThatWasPulled) {
  const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function remove");
  EXPECT_EQ(ran.status, 0) << ran.out;
  EXPECT_EQ(RunInShell("stat -c '%s %a' /tmp/wireless.info").out, "0 644\n");
}

}  // namespace
