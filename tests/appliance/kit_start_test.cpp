// The network start script's start and restart: all of an access point, or nothing of it.
#include "kit_radio.h"

namespace {

using testing::HasSubstr;
using testing::StartsWith;

using KitAccessPoint = KitRadio;

TEST_F(KitAccessPoint, IsOnTheAirWithItsRulesAndOffWithoutALeftover) {
  const Ran started = Script("start wlan0 lbr0");
  EXPECT_EQ(started.out, "");
  EXPECT_EQ(started.status, 0);
  EXPECT_EQ(Daemons(), OnAir());
  EXPECT_THAT(RunInShell("cat /tmp/rules").out, HasSubstr("ip saddr 10.1.14.0/24 oifname != \"lbr0\" masquerade"));
  EXPECT_EQ(RunInShell("cat /proc/sys/net/ipv4/ip_forward").out, "1\n");
  const Ran ended = Script("restart wlan0 lbr0");
  EXPECT_EQ(ended.out, "");
  EXPECT_EQ(ended.status, 0);
  EXPECT_EQ(Left(), "");
}

// The rules came last: until then, and for good where they could not be set, anybody who joined was without them.
TEST_F(KitAccessPoint, HasItsRulesBeforeItIsOnTheAir) {
  ASSERT_EQ(Script("start wlan0 lbr0").status, 0);
  const std::string calls = RunInShell("grep -oE '^(nft|dnsmasq|hostapd) ' /tmp/calls | xargs").out;
  EXPECT_EQ(calls, "nft hostapd dnsmasq\n");
}

TEST_F(KitAccessPoint, LeavesNothingWhenAStepFails) {
  const struct {
    const char* szProgram;
    const char* szCalls;
    const char* szReason;
  } rows[] = {
      {"nft", "", "rc.network: cannot set the rules between networks: nft is broken\n"},
      {"dnsmasq", "", "rc.network: cannot serve addresses on lbr0: dnsmasq is broken\n"},
      {"hostapd", "", "rc.network: cannot start the access point on wlan0: hostapd is broken\n"},
      {"iw", "info", "iw is broken\nrc.network: cannot tell the capabilities of wlan0\n"},
      {"ip", "address replace", "rc.network: cannot give lbr0 the address 10.1.14.1/255.255.255.0: ip is broken\n"},
      {"ip", "route show", "rc.network: cannot tell the networks around the appliance: ip is broken\n"},
      {"ip", "wlan0 up", "rc.network: cannot switch wlan0 up: ip is broken\n"},
  };
  for (const bool again : {false, true}) {
    for (const auto& row : rows) {
      if (again) {
        ASSERT_EQ(Script("start wlan0 lbr0").out, "");
        RunInShell("ip link set dev wlan0 down");  // as the daemon's end leaves it
      }
      BreakOnce(row.szProgram, row.szCalls);
      const Ran ran = Script("start wlan0 lbr0");
      EXPECT_EQ(ran.status, 1) << row.szProgram << row.szCalls;
      EXPECT_EQ(ran.out, row.szReason);
      EXPECT_EQ(Left(), "") << row.szProgram << row.szCalls;
    }
  }
}

// A lease file with blanks around its name, as dnsmasq reads it, gave way to the kit's own.
TEST_F(KitAccessPoint, KeepsLeasesInTheFileThatItsServerNames) {
  const struct {
    const char* szLine;
    bool named;
  } rows[] = {
      {"dhcp-leasefile=/tmp/leases\n", true}, {"\tdhcp-leasefile = /tmp/leases\n", true},
      {"dhcp-leasefile=/tmp/leases", true},   {"#dhcp-leasefile=/tmp/leases\n", false},
      {"no-dhcp-leasefile=x\n", false},       {"", false},
  };
  for (const auto& row : rows) {
    WriteText("/etc/dhcpd/dhcpd-lbr0-lbr0.conf", std::string("interface=lbr0\n") + row.szLine);
    WriteText("/tmp/calls", "");
    ASSERT_EQ(Script("start wlan0 lbr0").out, "") << row.szLine;
    const std::string own = RunInShell("grep -o 'dhcp-leasefile=.*' /tmp/calls").out;
    EXPECT_EQ(own, row.named ? "" : "dhcp-leasefile=/var/run/rc.network/dnsmasq-lbr0.leases\n") << row.szLine;
  }
}

TEST_F(KitAccessPoint, NeedsNoNftWithoutRules) {
  SetBridge("NAT=no");
  fs::remove("/tmp/bin/nft");
  fs::remove("/usr/sbin/nft");
  ASSERT_NE(RunInShell("command -v nft").status, 0);
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(Daemons(), OnAir());
  EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
  EXPECT_EQ(Left(), "");

  SetBridge("NAT=yes");
  const Ran refused = Script("start wlan0 lbr0");
  EXPECT_EQ(refused.status, 1);
  EXPECT_THAT(refused.out, StartsWith("rc.network: cannot set the rules between networks: "));
  EXPECT_EQ(Daemons(), "");
}

TEST_F(KitAccessPoint, SaysThatRulesStandWhichItCannotRemove) {
  ASSERT_EQ(Script("start wlan0 lbr0").status, 0);
  fs::remove("/tmp/bin/nft");
  fs::remove("/usr/sbin/nft");
  for (const char* szWords : {"restart wlan0 lbr0", "restart wlan0"}) {
    const Ran ran = Script(szWords);
    EXPECT_EQ(ran.status, 1);
    EXPECT_THAT(ran.out, StartsWith("rc.network: cannot remove the rules between networks: ")) << szWords;
    EXPECT_EQ(Daemons(), "");
  }
  SetBridge("NAT=no");
  EXPECT_EQ(Script("start wlan0 lbr0").status, 1);
}

// A step that failed kept all later steps from being made: the interface stayed an access point's.
TEST_F(KitAccessPoint, IsTakenDownWhateverStepFails) {
  const struct {
    const char* szProgram;
    const char* szCalls;
  } rows[] = {
      {"nft", ""}, {"ip", "link delete"}, {"ip", "address flush"}, {"ip", "wlan0 down"}, {"iw", "type managed"}};
  for (const auto& row : rows) {
    ASSERT_EQ(Script("start wlan0 lbr0").out, "");
    Break(row.szProgram, row.szCalls);
    RunInShell("rm -f /tmp/calls");
    const Ran ran = Script("restart wlan0 lbr0");
    EXPECT_EQ(ran.status, 1) << row.szProgram << row.szCalls;
    EXPECT_THAT(ran.out, StartsWith("rc.network: cannot ")) << row.szProgram << row.szCalls;
    EXPECT_EQ(Daemons(), "");
    EXPECT_FALSE(fs::exists("/run/rc.network/hostapd-wlan0.conf"));
    const std::string calls = RunInShell("cat /tmp/calls").out;
    for (const char* szStep : {"nft -f -", "ip link delete dev lbr0", "ip address flush dev wlan0",
                               "ip link set dev wlan0 down", "iw dev wlan0 set type managed"}) {
      EXPECT_THAT(calls, HasSubstr(szStep)) << row.szProgram << row.szCalls;
    }
    Mend();
    EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
    EXPECT_EQ(Left(), "");
  }
}

// Anyone in range could fill the memory that the log is in.
TEST_F(KitAccessPoint, LogsOneMebibyteAtMost) {
  StandIn("hostapd", "log=$4\n" + Daemon("hostapd", "-P") +
                         "echo '17.5: wlan0: interface state UNINITIALIZED->ENABLED' >>$log\n"
                         "head -c 2000000 /dev/zero >>$log 2>/dev/null\n"
                         "grep -q '^SigIgn:.*[13579bdf]......$' /proc/$(cat $file)/status\n");
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(fs::file_size("/run/rc.network/hostapd-wlan0.log"), 1u << 20);
  EXPECT_EQ(Daemons(), OnAir());
}

// What the former daemon has logged would count for the new one.
TEST_F(KitAccessPoint, IsNotTakenToBeOnTheAirForWhatItsFormerDaemonHasLogged) {
  const std::string logs = "echo '17.5: wlan0: interface state UNINITIALIZED->ENABLED' >>$4\n";
  StandIn("hostapd", logs + Daemon("hostapd", "-P"));
  StandIn("hostapd_cli", "echo state=DISABLED\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  StandIn("hostapd", Daemon("hostapd", "-P"));
  EXPECT_THAT(Script("start wlan0 lbr0").out, StartsWith("rc.network: the access point on wlan0 does not come up"));
  EXPECT_EQ(Left(), "");
}

// A daemon is on the air as soon as it has gone into the background, and its process may be noted a moment later.
TEST_F(KitAccessPoint, IsStartedThoughItsDaemonNotesItsProcessLate) {
  StandIn("hostapd",
          "file=$6\necho '17.5: wlan0: interface state UNINITIALIZED->ENABLED' >>$4\n"
          "(/tmp/daemons/hostapd 60 & pid=$!; sleep 1; echo $pid >$file; wait) >/dev/null 2>&1 &\n");
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(Daemons(), OnAir());
}

TEST_F(KitAccessPoint, IsStartedAndTakenDownBesideNotesThatSomebodyWasKilledOver) {
  for (const char* szNote : {"ip_forward", "wire-lbr0", "bridge-wlan0"}) {
    const std::string leave = "mkdir -p -m 700 /run/rc.network; >/run/rc.network/" + std::string(szNote);
    RunInShell(leave);
    EXPECT_EQ(Script("restart wlan0 lbr0").out, "") << szNote;
    RunInShell(leave);
    BreakOnce("hostapd");
    EXPECT_EQ(Script("start wlan0 lbr0").out,
              "rc.network: cannot start the access point on wlan0: hostapd is broken\n");
    RunInShell(leave);
    EXPECT_EQ(Script("start wlan0 lbr0").out, "") << szNote;
    EXPECT_EQ(Script("restart wlan0 lbr0").out, "") << szNote;
    RunInShell("rm -f /run/rc.network/" + std::string(szNote));
    EXPECT_EQ(Left(), "") << szNote;
  }
}

// A full disk left a note without what it tells, which no later run could read.
TEST_F(KitAccessPoint, LeavesNoNoteThatCouldNotBeWritten) {
  EXPECT_EQ(RunInShell("mount -t tmpfs -o size=8k none /run && mkdir -m 700 /run/rc.network && "
                       "head -c 8192 /dev/zero >/run/full; ls /run/rc.network")
                .out,
            "");
  EXPECT_THAT(RunInParts("note $forwarding_before 1").out, HasSubstr("cannot write /var/run/rc.network/ip_forward: "));
  EXPECT_FALSE(fs::exists("/run/rc.network/ip_forward"));
}

// A second call to disable the access point, after one that failed, cannot name its bridge any more.
TEST_F(KitAccessPoint, IsTakenDownWithItsBridgeWhenNobodyNamesThat) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  Break("ip", "link delete");
  EXPECT_EQ(Script("restart wlan0 lbr0").status, 1);
  EXPECT_TRUE(fs::exists("/sys/class/net/lbr0"));
  Mend();
  EXPECT_EQ(Script("restart wlan0 ''").out, "");
  EXPECT_EQ(Left(), "");
}

TEST_F(KitAccessPoint, IsTakenOutOfTheBridgeThatTheKernelHasItIn) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  ASSERT_EQ(RunInShell("rm /run/rc.network/bridge-wlan0; ip link set dev wlan0 master lbr0").out, "");
  EXPECT_EQ(Script("restart wlan0").out, "");
  EXPECT_EQ(Left(), "");
}

TEST_F(KitAccessPoint, LeavesABridgeThatIsNoneOfTheFilesAsItIs) {
  ASSERT_EQ(RunInShell("ip link add other type bridge && ip link set dev wlan0 master other").out, "");
  EXPECT_EQ(Script("restart wlan0").out, "");
  EXPECT_TRUE(fs::exists("/sys/class/net/other"));
}

TEST_F(KitAccessPoint, LeavesNothingInTheBridgeThatItMovesFrom) {
  WriteText("/etc/sysconfig/network-scripts/ifcfg-abr0",
            "DEVICE=abr0\nTYPE=Bridge\nPRIMARY=eth0\nBOOTPROTO=static\nIPADDR=192.0.2.1\nNETMASK=255.255.255.0\nONBOOT="
            "yes\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  ASSERT_EQ(Script("start wlan0 abr0").out, "");
  EXPECT_FALSE(fs::exists("/sys/class/net/lbr0"));
  EXPECT_EQ(Daemons(), "hostapd\n");
  EXPECT_EQ(Script("restart wlan0 ''").out, "");
  EXPECT_TRUE(fs::exists("/sys/class/net/abr0/brif/eth0"));
}

// A start that was ended by a signal left what it had made by then.
TEST_F(KitAccessPoint, LeavesNothingWhenASignalEndsItsStart) {
  const struct {
    const char* szSignal;
    const char* szWhere;
  } rows[] = {
      {"TERM", "hostapd_cli"}, {"TERM", "nft"}, {"TERM", "hostapd"}, {"HUP", "hostapd_cli"}, {"INT", "hostapd_cli"}};
  for (const auto& row : rows) {
    for (const char* szWhom : {"$!", "-$!"}) {  // the script alone, and all that it runs
      const std::string where = row.szWhere;
      RunInShell("rm -f /tmp/calls");
      StandIn("hostapd_cli", where == "hostapd_cli" ? "sleep 0.1\n" : "echo state=ENABLED\n");
      StandIn("nft", where == "nft" ? "sleep 0.3; cat >/tmp/rules\n" : "cat >/tmp/rules\n");
      StandIn("hostapd", (where == "hostapd" ? "sleep 0.3\n" : "") + Daemon("hostapd", "-P"));
      // A shell with job control gives the script a group of its own, and lets it hear of SIGINT.
      const Ran ran = Run("bash -c 'set -m; /etc/rc.network start wlan0 lbr0 & until grep -q \"^" + where +
                          " \" /tmp/calls 2>/dev/null; do sleep 0.02; done; kill -s " + row.szSignal + " -- " + szWhom +
                          "; wait $!; echo status $?'");
      EXPECT_THAT(ran.out, HasSubstr("status 1\n")) << row.szSignal << szWhom << where;
      EXPECT_THAT(ran.out, HasSubstr("rc.network: ")) << row.szSignal << szWhom << where;
      EXPECT_EQ(Left(), "") << row.szSignal << szWhom << where;
    }
  }
}

// Guests came on the air when their hour struck between their rules, which there were none of yet, and their network.
TEST_F(KitAccessPoint, AsksOnceWhetherThereAreGuests) {
  WriteText("/usr/mero/etc/wireless_ap.conf",
            "[RT [5370]\n\tguest_net_sched_enable=1\n\tguest_net_sched=0" + std::string(167, '1') + "\n");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
  Install("date", "if [ -e /tmp/struck ]; then echo 0 01; else >/tmp/struck; echo 0 00; fi\n");
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(RunInShell("grep -c gwlan /run/rc.network/hostapd-wlan0.conf").out, "0\n");

  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(RunInShell("grep -c gwlan /run/rc.network/hostapd-wlan0.conf").out, "1\n");
  EXPECT_THAT(RunInShell("cat /tmp/rules").out, HasSubstr("chain guest-forward"));
  EXPECT_TRUE(fs::exists("/sys/class/net/gbr"));
  EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
  EXPECT_EQ(Left(), "");
}

TEST_F(KitAccessPoint, NotesWhatItsGuestsMayReachAsLongAsThereAreAny) {
  const std::string note = "/run/rc.network/guest-rights";
  const std::string settings = "[RT [5370]\n\tguest_net_lan_block=0\n\tguest_net_access_ds=1\n";
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
  WriteText("/usr/mero/etc/wireless_ap.conf", settings);
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(ReadText(note),
            "guest_net_lan_block=no\nguest_net_access_ds=yes\nguest_net_internet_block=no\nguest_net_allow_http=yes\n");
  WriteText("/usr/mero/etc/wireless_ap.conf", settings + "\tguest_net_internet_block=1\n");
  EXPECT_THAT(ReadText(note), HasSubstr("guest_net_internet_block=no\n")) << "the rules are the former ones still";
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_THAT(ReadText(note), HasSubstr("guest_net_internet_block=yes\n"));
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"no\"\n");
  EXPECT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_FALSE(fs::exists(note));
  EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
}

// It was taken for one that works, since its daemon runs: nobody got an address, also after further calls.
TEST_F(KitAccessPoint, IsStartedAgainWhenItsStartWasKilled) {
  StandIn("dnsmasq", "kill -s KILL 0\n");
  EXPECT_NE(RunInShell("PATH=/tmp/bin:$PATH setsid -w /etc/rc.network start wlan0 lbr0").status, 0);
  EXPECT_EQ(Daemons(), "hostapd\n");
  StandIn("dnsmasq", "for word; do case $word in --pid-file=*) file=${word#*=} ;; esac; done\n" + Launch("dnsmasq"));
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(Daemons(), OnAir());
  EXPECT_EQ(ReadText("/run/rc.network/bridge-wlan0"), "lbr0\n");
}

TEST_F(KitAccessPoint, IsStartedUnlessItRunsAndWasStartedToTheEnd) {
  EXPECT_EQ(Script("ensure wlan0 lbr0").out, "");
  EXPECT_EQ(Daemons(), OnAir());
  const std::string daemon = ReadText("/run/rc.network/hostapd-wlan0.pid");
  EXPECT_EQ(Script("ensure wlan0 lbr0").out, "");
  EXPECT_EQ(ReadText("/run/rc.network/hostapd-wlan0.pid"), daemon);
  WriteText("/run/rc.network/bridge-wlan0", "lbr0 begun\n");
  EXPECT_EQ(Script("ensure wlan0 lbr0").out, "");
  EXPECT_NE(ReadText("/run/rc.network/hostapd-wlan0.pid"), daemon);
  EXPECT_EQ(Daemons(), OnAir());

  RunInShell("cd /etc/sysconfig/network-scripts && sed s/lbr0/br0/ ifcfg-lbr0 >ifcfg-br0");
  EXPECT_EQ(Script("ensure wlan0 br0").out, "");
  EXPECT_EQ(ReadText("/run/rc.network/bridge-wlan0"), "br0\n");
  EXPECT_EQ(Script("restart wlan0 br0").out, "");

  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  EXPECT_EQ(Script("ensure wlan0 lbr0").out, "") << "somebody has switched it off meanwhile";
  EXPECT_EQ(Daemons(), "");
}

// A reload of another firewall left guests without rules, and nobody noticed.
TEST_F(KitAccessPoint, GetsTheRulesBackThatSomebodyHasRemoved) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  for (const char* szWords : {"schedule wlan0", "ensure wlan0 lbr0"}) {
    for (const char* szLeft :
         {"", "table inet mero_ap {\n}\n", "table inet mero_ap {\nchain translate-lbr0 {\n}\n}\n"}) {
      WriteText("/tmp/rules", szLeft);
      EXPECT_EQ(Script(szWords).out,
                "rc.network: somebody has removed the rules between networks: wlan0 is started anew\n");
      EXPECT_THAT(ReadText("/tmp/rules"), HasSubstr("table inet mero_ap {\nchain ")) << szWords;
      EXPECT_EQ(Daemons(), OnAir());
    }
  }
}

// A command that could not be run was taken for rules that are gone, and everybody was thrown off.
TEST_F(KitAccessPoint, StaysOnTheAirWhenItsRulesCannotBeLookedAt) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  const std::string daemon = ReadText("/run/rc.network/hostapd-wlan0.pid");
  Break("nft");
  const Ran ran = Script("schedule wlan0");
  EXPECT_EQ(ran.out, "rc.network: cannot tell whether the rules between networks are there: nft is broken\n");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ReadText("/run/rc.network/hostapd-wlan0.pid"), daemon);
}

// An adapter whose radio is a file, as there is no radio.
void PlugIn() {
  RunInShell(
      "mkdir -p /tmp/adapters/wlan0/phy80211; echo phy0 >/tmp/adapters/wlan0/phy80211/name; "
      "sed -i 's,/sys/class/net/\\*/phy80211,/tmp/adapters/*/phy80211,; "
      "s,\"/sys/class/net/$1/phy80211/name\",/tmp/phy,' /usr/mero/lib/network/adapter.sh");
}

constexpr char kHotPlug[] = "/usr/mero/hotplug/usb.wireless.function";

TEST_F(KitAccessPoint, IsLeftAloneByAChangeToTheModeThatItIsIn) {
  PlugIn();
  StandIn("iw", "printf '\\tSupported interface modes:\\n\\t\\t * AP\\n'\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  const std::string daemon = ReadText("/run/rc.network/hostapd-wlan0.pid");
  EXPECT_EQ(Run(kHotPlug + std::string(" change-mode ap")).out, "");
  EXPECT_EQ(ReadText("/run/rc.network/hostapd-wlan0.pid"), daemon);
}

// It was put on the air by whoever had looked before it was switched off, and came behind that.
TEST_F(KitAccessPoint, StaysOffWhenItIsSwitchedOffWhileSomebodyIsAboutToStartIt) {
  PlugIn();
  StandIn("iw", "printf '\\tSupported interface modes:\\n\\t\\t * AP\\n'\n");
  Install("find",
          "case $(tr '\\0' ' ' </proc/$PPID/cmdline) in *ensure*) touch /tmp/looked; "
          "until [ -e /tmp/off ]; do sleep 0.02; done ;; esac\nexec /usr/bin/find \"$@\"\n");
  const std::string hotPlug(kHotPlug);
  const std::string both = hotPlug + " change-mode ap & until [ -e /tmp/looked ]; do sleep 0.02; done; " + hotPlug +
                           " change-mode client; touch /tmp/off; wait";
  EXPECT_EQ(RunInShell("mkdir -p -m 700 /run/rc.network; PATH=/tmp/bin:$PATH; " + both).out, "");
  EXPECT_EQ(ReadText("/etc/hostapd/hostapd-wlan0.info"), "enable=\"no\"\n");
  EXPECT_EQ(Daemons(), "");
}

// Who asked while a start was under way made another one, which took the access point off the air at once.
TEST_F(KitAccessPoint, IsStartedOnceByTwoWhoWantIt) {
  WriteText("/tmp/calls", "");
  Install("hostapd_cli", "until [ -e /tmp/go ]; do sleep 0.02; done\necho state=ENABLED\n");
  Install("flock", "echo flock >>/tmp/calls\nexec /usr/bin/flock \"$@\"\n");
  const std::string both =
      "/etc/rc.network start wlan0 lbr0 & until grep -q ^hostapd /tmp/calls; do sleep 0.02; done; "
      "/etc/rc.network ensure wlan0 lbr0 & until [ $(grep -c ^flock /tmp/calls) = 2 ]; do sleep 0.02; done; "
      "touch /tmp/go; wait";
  EXPECT_EQ(RunInShell("PATH=/tmp/bin:$PATH; " + both).out, "");
  EXPECT_EQ(RunInShell("grep -c '^hostapd ' /tmp/calls").out, "1\n");
  EXPECT_EQ(Daemons(), OnAir());
}

// Files had the mode that the caller's umask left them.
TEST_F(KitAccessPoint, HasFilesOfTheSameModesWhateverTheUmask) {
  WriteText("/etc/hostapd/hostapd-wlan0-host.conf", "interface=wlan0\nssid=home\nwpa_psk_file=/etc/hostapd.psk\n");
  for (const char* szUmask : {"000", "077", "022"}) {
    EXPECT_EQ(Run(std::string("sh -c 'umask ") + szUmask + "; /etc/rc.network start wlan0 lbr0'").out, "");
    EXPECT_EQ(RunInShell("stat -Lc '%a %n' /run/rc.network /run/rc.network/* /etc/hostapd.psk").out,
              "700 /run/rc.network\n"
              "600 /run/rc.network/bridge-wlan0\n"
              "644 /run/rc.network/dnsmasq-lbr0.pid\n"
              "600 /run/rc.network/hostapd-wlan0.conf\n"
              "600 /run/rc.network/hostapd-wlan0.log\n"
              "600 /run/rc.network/hostapd-wlan0.pid\n"
              "600 /run/rc.network/ip_forward\n"
              "600 /run/rc.network/lock\n"
              "600 /etc/hostapd.psk\n")
        << szUmask;
    EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
    RunInShell("rm -rf /run/rc.network /etc/hostapd.psk");
  }
}

// hostapd serves a network without a key that it can use as an open one, and joins strangers to the bridge.
TEST_F(KitAccessPoint, IsNotOnTheAirOpenWhenItIsToBeProtected) {
  const std::string host = "/etc/hostapd/hostapd-wlan0-host.conf";
  const std::string guest = "/etc/hostapd/hostapd-wlan0-guest.conf";
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
  const std::string open = "interface=wlan0\nssid=home\nauth_algs=1\n";
  const std::string openGuests = "bss=gwlan\nssid=visitors\n";
  for (const char* szLacking : {"auth_algs=3\nwep_default_key=0\n", "wpa=0\nwpa_key_mgmt=WPA-PSK\nwpa_passphrase=x\n",
                                "wpa=4\nwpa_passphrase=x\n", "wpa=0\nwpa_key_mgmt=WPA-EAP\n"}) {
    for (const bool ofGuests : {false, true}) {
      WriteText(host, ofGuests ? open : "interface=wlan0\nssid=home\n" + std::string(szLacking));
      WriteText(guest, openGuests + (ofGuests ? szLacking : ""));
      const Ran ran = Script("start wlan0 lbr0");
      EXPECT_EQ(ran.status, 1) << szLacking;
      EXPECT_THAT(ran.out, HasSubstr("a network would be open that is to be protected")) << szLacking;
      EXPECT_EQ(Left(), "") << szLacking;
    }
  }
  for (const char* szGood :
       {"", "wep_default_key=0\nwep_key0=\"abcde\"\n", "wpa=3\nwpa_passphrase=deux croissants\n"}) {
    WriteText(host, open + szGood);
    WriteText(guest, openGuests + szGood);
    EXPECT_EQ(Script("start wlan0 lbr0").status, 0) << szGood;
  }
}

// A full disk left the daemon's pid file empty: the end of the access point took its rules away, and left it on the
// air.
TEST_F(KitAccessPoint, IsEndedAlsoWhenItsPidFileIsEmpty) {
  StandIn("hostapd",
          "while [ $# -gt 1 ]; do [ \"$1\" != -P ] || file=$2; shift; done\n"
          "(exec -a \"hostapd $1\" /tmp/daemons/hostapd 60) >/dev/null 2>&1 &\necho $! | tee /tmp/started >$file\n");
  RunInShell("sed -i '1s|.*|#!/bin/bash|' /tmp/bin/hostapd");
  EXPECT_EQ(Script("start wlan0 lbr0").status, 0);
  WriteText("/run/rc.network/hostapd-wlan0.pid", "");
  Script("restart wlan0 lbr0");
  EXPECT_NE(RunInShell("grep -v Z /proc/$(cat /tmp/started)/stat").status, 0);
  EXPECT_EQ(Left(), "");
}

// Starts and ends the access point beside a process that has its daemon's name and words, and that `launcher` runs:
// the process goes on.
class KitAccessPointBesideAnother : public KitAccessPoint {
 protected:
  static void ExpectItToGoOn(const std::string& launcher) {
    const Ran other = RunInShell(
        launcher +
        " bash -c 'exec -a \"hostapd /var/run/rc.network/hostapd-wlan0.conf\" /tmp/daemons/hostapd 60' "
        ">/dev/null 2>&1 & echo $! >/tmp/other; until grep -qs wlan0.conf /proc/$!/cmdline; do sleep 0.01; done");
    EXPECT_EQ(other.status, 0);
    EXPECT_EQ(Script("start wlan0 lbr0").status, 0);
    EXPECT_EQ(Script("restart wlan0 lbr0").status, 0);
    EXPECT_EQ(RunInShell("grep -c '^State:.S' /proc/$(cat /tmp/other)/status; kill $(cat /tmp/other)").out, "1\n");
  }
};

// The search through all processes for such a daemon ended that of another network namespace, which has an interface of
// the same name.
TEST_F(KitAccessPointBesideAnother, EndsNoneOfAnotherNetwork) {
  ExpectItToGoOn("unshare -n");
}

// A container may have the machine's network, and files of its own at the same paths.
TEST_F(KitAccessPointBesideAnother, EndsNoneOfAnotherRoot) {
  ASSERT_EQ(RunInShell("mkdir -p /tmp/container/usr /tmp/container/tmp/daemons && cp -P /bin /lib* /tmp/container && "
                       "mount --bind /usr /tmp/container/usr && mount --bind /tmp/daemons /tmp/container/tmp/daemons")
                .out,
            "");
  ExpectItToGoOn("chroot /tmp/container");
}

// A user of the machine held a start up, 5 s for each process that bore the daemon's name and did not want to end.
TEST_F(KitAccessPointBesideAnother, EndsNoneOfAnotherUser) {
  const std::string asNobody = "setpriv --reuid=65534 --regid=65534 --clear-groups";
  if (RunInShell(asNobody + " true").status != 0) GTEST_SKIP() << "there is no other user than root";
  ExpectItToGoOn(asNobody);
}

// The bridge of an access point that had been switched off came up at every boot.
TEST_F(KitAccessPoint, HasNoBridgeAtBootWhileItIsSwitchedOff) {
  SetBridge("NAT=yes\nPRIMARY=wlan0");
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  EXPECT_EQ(Script("boot").status, 0);
  EXPECT_FALSE(fs::exists("/sys/class/net/lbr0"));
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n");
  EXPECT_EQ(Script("boot").status, 0);
  EXPECT_TRUE(fs::exists("/sys/class/net/lbr0"));
}

// In another language the state directory was taken for somebody else's, at every run.
TEST_F(KitAccessPoint, KnowsItsStateInEveryLanguage) {
  const std::string german = "LC_ALL=C.UTF-8 LANGUAGE=de PATH=/tmp/bin:$PATH /etc/rc.network ";
  EXPECT_EQ(RunInShell(german + "start wlan0 lbr0").out, "");
  EXPECT_EQ(RunInShell(german + "restart wlan0 lbr0").out, "");
  EXPECT_EQ(Left(), "");
}

// A signal that came before the second step ended the script, and left the access point on the air.
TEST_F(KitAccessPoint, IsTakenDownWhenASignalComesWithTheFirstStep) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  const Ran ran = ScriptWithSignal("restart wlan0 lbr0", "late-wlan0");
  EXPECT_EQ(ran.out, "");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(Left(), "");
}

}  // namespace
