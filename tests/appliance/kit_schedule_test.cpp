// The network start script's hour: networks on and off as their schedules have it, and what a run before has left.
#include "kit_radio.h"

namespace {

using testing::HasSubstr;
using testing::StartsWith;

using KitAccessPoint = KitRadio;

// Has the main network be off the air in the first hour of the week, and sets the hour.
void SetHours(const std::string& now) {
  WriteText("/usr/mero/etc/wireless_ap.conf",
            "[RT [5370]\n\twifi_sched_enabled=1\n\twifi_sched=0" + std::string(167, '1') + "\n");
  Install("date", "cat /tmp/hour\n");
  WriteText("/tmp/hour", now + "\n");
}

std::string StateOfMain() {
  return RunInShell("ip -brief link show up dev wlan0 | grep -q wlan0 && echo up || echo down").out;
}

// The hour put an access point on the air again that was switched off, and whose end had failed.
TEST_F(KitAccessPoint, IsEndedByTheNextHourWhenItsEndHasFailed) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  Break("iw");
  EXPECT_EQ(Script("restart wlan0 lbr0").status, 1);
  Mend();
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(Daemons(), "");
  EXPECT_FALSE(fs::exists("/run/rc.network/bridge-wlan0"));

  // Nothing had been done to it, as when another run was in the way.
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(Daemons(), "");
}

// The hour took the network from whoever had joined one since.
TEST_F(KitAccessPoint, LeavesAClientItsNetworkWhenItsEndHasFailed) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  Break("iw");
  EXPECT_EQ(Script("restart wlan0 lbr0").status, 1);
  Mend();
  RunInShell(
      "cp /bin/sleep /tmp/daemons/wpa_supplicant; (/tmp/daemons/wpa_supplicant 100 >/dev/null 2>&1 & "
      "echo $! >/var/run/wpa_supplicant.pid); ip address add 192.0.2.8/24 dev wlan0");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(RunInShell("kill $(cat /var/run/wpa_supplicant.pid)").status, 0);
  EXPECT_THAT(RunInShell("ip -4 -brief address show wlan0").out, HasSubstr("192.0.2.8/24"));
  EXPECT_FALSE(fs::exists("/run/rc.network/bridge-wlan0"));
}

// The access point was off from the hour on in which its start for the guests had failed.
TEST_F(KitAccessPoint, IsStartedAgainInTheNextHourWhenItsScheduleFailed) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
  WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
  BreakOnce("nft", "-f");
  EXPECT_EQ(Script("schedule wlan0").out, "rc.network: cannot set the rules between networks: nft is broken\n");
  EXPECT_EQ(Daemons(), "");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(Daemons(), "dnsmasq\ndnsmasq\nhostapd\n");
  EXPECT_EQ(Script("restart wlan0 lbr0").out, "");

  // An access point that is ended meanwhile stays off.
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  BreakOnce("nft", "-f");
  EXPECT_EQ(Script("schedule wlan0").status, 1);
  EXPECT_EQ(Script("restart wlan0 lbr0").out, "");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(Left(), "");
}

// Nobody noticed a daemon that had been killed.
TEST_F(KitAccessPoint, IsStartedAnewInTheNextHourWhenItsDaemonHasEnded) {
  EXPECT_EQ(Script("start wlan0 lbr0").status, 0);
  RunInShell("kill -KILL $(cat /run/rc.network/hostapd-wlan0.pid); sleep 0.1");
  EXPECT_EQ(Script("schedule wlan0").status, 0);
  EXPECT_EQ(Daemons(), OnAir());
  EXPECT_EQ(Script("restart wlan0 lbr0").status, 0);
  EXPECT_EQ(Script("schedule wlan0").status, 0);
  EXPECT_EQ(Left(), "");
}

// A kill in the middle of the note left it empty, and each hour took the access point for one that nobody had started.
TEST_F(KitAccessPoint, IsStartedAnewInTheNextHourWhenAKillHasLeftItsNoteEmpty) {
  const std::string note = "/run/rc.network/bridge-wlan0";
  for (const char* szMore : {":", "kill -KILL $(cat /run/rc.network/hostapd-wlan0.pid); sleep 0.1"}) {
    ASSERT_EQ(Script("start wlan0 lbr0").status, 0);
    WriteText(note, "");
    RunInShell(szMore);
    EXPECT_EQ(Script("schedule wlan0").status, 0) << szMore;
    EXPECT_EQ(Daemons(), OnAir()) << szMore;
    EXPECT_EQ(ReadText(note), "lbr0\n") << szMore;
  }
}

// A start at the hour that failed at its very last step was not tried again: the access point stayed off.
TEST_F(KitAccessPoint, IsStartedAnewInTheNextHourWhicheverNoteCouldNotBeRemoved) {
  StandIn("rm", "exec /bin/rm \"$@\"\n");
  SetBridge("NAT=yes\nPRIMARY=eth0\nONBOOT=no");
  for (const char* szNote : {"wire-lbr0", "late-wlan0"}) {
    WriteText("/run/rc.network/late-wlan0", "");
    BreakOnce("rm", szNote);
    const Ran failed = Script("schedule wlan0");
    EXPECT_EQ(failed.status, 1) << szNote;
    EXPECT_EQ(Daemons(), "") << szNote << failed.out;
    EXPECT_EQ(Script("schedule wlan0").status, 0) << szNote;
    EXPECT_EQ(Daemons(), OnAir()) << szNote;
    EXPECT_EQ(Script("restart wlan0 lbr0").status, 0);
  }
}

// It was on the air for a moment, in which anybody could join.
TEST_F(KitAccessPoint, IsNotOnTheAirForAMomentAtAnHourThatItsScheduleHasItOff) {
  constexpr char kConfiguration[] = "/run/rc.network/hostapd-wlan0.conf";
  SetHours("0 00");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_THAT(ReadText(kConfiguration), StartsWith("start_disabled=1\ninterface=wlan0\n"));
  EXPECT_EQ(StateOfMain(), "down\n");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(StateOfMain(), "down\n");
  SetHours("0 01");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(StateOfMain(), "up\n");
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_THAT(ReadText(kConfiguration), StartsWith("interface=wlan0\n"));
  EXPECT_EQ(StateOfMain(), "up\n");
}

// A network without its beacon would stay so if its interface did not go down and come up again.
TEST_F(KitAccessPoint, IsOnTheAirInTheNextHourWhenThatComesDuringItsStart) {
  SetHours("0 00");
  StandIn("hostapd", "echo 0 01 >/tmp/hour\n" + Daemon("hostapd", "-P"));
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(StateOfMain(), "down\n");
  EXPECT_EQ(Script("schedule wlan0").out, "");
  EXPECT_EQ(StateOfMain(), "up\n");
}

}  // namespace
