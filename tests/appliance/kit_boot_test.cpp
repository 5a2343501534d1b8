// What happens at boot: the units, and the network start script's part, which makes every bridge that can be made.
#include <gmock/gmock.h>

#include "kit.h"

namespace {

using testing::HasSubstr;

const std::string kScripts = "/etc/sysconfig/network-scripts/ifcfg-";

class KitBoot : public Kit {
 protected:
  static void Bridge(const std::string& file, const std::string& more) {
    WriteText(kScripts + file,
              "TYPE=Bridge\nBOOTPROTO=static\nIPADDR=192.0.2.1\nNETMASK=255.255.255.0\nONBOOT=yes\n" + more);
  }
  static std::string Bridges() {
    return RunInShell(
               "for bridge in /sys/class/net/*/bridge; do [ ! -e $bridge ] || echo $bridge; done | cut -d / -f 5 | "
               "xargs")
        .out;
  }
};

// Each was there for good.
TEST_F(KitBoot, RemovesAtItsStartWhatIsOfNothingThatRunsAndNoOtherFile) {
  const std::string left =
      "/tmp/wireless.info.abcdefghij /var/tmp/.wireless_current_connection.abcdef /etc/resolv.conf.new.abcdef "
      "/etc/hostapd/hostapd-wlan0.info.abcdefghij /var/tmp/.wireless_current_connection /var/tmp/.wireless_connecting "
      "/var/tmp/.wireless_ap_connecting /usr/mero/etc/.wireless.conf.edit /usr/mero/etc/.wireless_ap.conf.edit "
      "/etc/hostapd/.hostapd-wlan0-host.conf.edit /etc/sysconfig/network-scripts/.ifcfg-lbr0.edit "
      "/etc/dhcpd/.dhcpd-lbr0-lbr0.info.edit";
  const std::string kept =
      "/etc/hostapd/hostapd-wlan0.info /etc/resolv.conf /tmp/wireless.info.foreign-abcdef "
      "/etc/hostapd/hostapd-wlan0.info.2026-11-22 /etc/resolv.conf.new.my-own";
  RunInShell("mkdir -p /etc/hostapd /etc/dhcpd /etc/sysconfig/network-scripts; touch " + left + " " + kept);
  ASSERT_EQ(RunInShell("systemd-tmpfiles --create --remove --boot " APPLIANCE_KIT "/systemd/mero-wireless.conf").out,
            "");
  EXPECT_EQ(RunInShell("ls -d " + left + " 2>/dev/null").out, "");
  EXPECT_EQ(RunInShell("ls -d " + kept + " >/dev/null").out, "");
}

// Debian 13 cleans up what has been there for 30 days.
TEST_F(KitBoot, KeepsTheRecordOfAConnectionThatStandsHoweverOldItIs) {
  WriteText("/tmp/age.conf", "d /var/tmp 1777 root root m:30d\n");
  RunInShell("touch -d 2001-01-01 /var/tmp/.wireless_current_connection /var/tmp/other");
  ASSERT_EQ(RunInShell("systemd-tmpfiles --clean /tmp/age.conf " APPLIANCE_KIT "/systemd/mero-wireless.conf").out, "");
  EXPECT_EQ(RunInShell("ls -A /var/tmp").out, ".wireless_current_connection\n");
}

TEST_F(KitBoot, HasUnitsThatSystemdUnderstandsWhole) {
  WriteScript("/usr/bin/merowireless", "");
  const std::string units = APPLIANCE_KIT "/systemd/";
  const Ran ran = RunInShell("systemd-analyze verify --man=no " + units + "*.service " + units + "*.timer");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out, "");
}

// What systemd makes of the rights that they have, from 0 for none to 10 for all: they had 9.6 when they had all.
// Taking away what remains would keep them from their work; confined.conf has the reasons.
TEST_F(KitBoot, HasUnitsThatAreConfinedAsFarAsTheirWorkAllows) {
  const std::string system = "/tmp/root/usr/lib/systemd/system/";
  for (const std::string unit : {"mero-network", "mero-wireless@", "mero-wireless-schedule"}) {
    fs::create_directories(system + unit + ".service.d");
    fs::copy(APPLIANCE_KIT "/systemd/" + unit + ".service", system);
    fs::copy(APPLIANCE_KIT "/systemd/confined.conf", system + unit + ".service.d");
    const std::string name = unit + (unit.back() == '@' ? "wlan0" : "") + ".service";
    const Ran ran =
        RunInShell("systemd-analyze security --no-pager --offline=true --threshold=45 --root=/tmp/root " + name);
    EXPECT_EQ(ran.status, 0) << ran.out;
    EXPECT_THAT(ran.out, HasSubstr("Overall exposure level for " + name));
  }
}

// A bridge that could not be made kept the bridges after it from being made.
TEST_F(KitBoot, MakesTheOtherBridgesWhenOneCannotBeMade) {
  Bridge("abr", "IPADDR=nonsense\n");
  Bridge("bbr", "");
  Bridge("cbr", "HWADDR=01:00:00:00:00:00\n");
  Bridge("dbr", "");
  const Ran ran = RunInShell("/etc/rc.network boot");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("rc.network: cannot give abr the address nonsense/255.255.255.0: it is none\n"));
  EXPECT_THAT(ran.out, HasSubstr("rc.network: cannot give cbr the address 01:00:00:00:00:00: "));
  EXPECT_EQ(RunInShell("ip -brief -4 address show up | awk '$3 { print $1 }' | grep br | xargs").out, "bbr dbr\n");
}

// A bridge whose first member came a moment later was not made.
TEST_F(KitBoot, WaitsForAFirstMember) {
  Bridge("abr", "PRIMARY=eth7\n");
  const Ran ran = RunInShell(
      "(sleep 1; ip link add eth7 type veth peer name wire) & /etc/rc.network boot; status=$?; wait; exit $status");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out, "");
  EXPECT_EQ(RunInShell("ls /sys/class/net/abr/brif").out, "eth7\n");
}

TEST_F(KitBoot, MakesABridgeWhoseFirstMemberDoesNotCome) {
  Bridge("abr", "PRIMARY=eth7\n");
  Bridge("bbr", "PRIMARY=eth8\n");
  Bridge("cbr", "");
  const Ran ran = RunInShell("start=$(date +%s); /etc/rc.network boot; echo $? after $(($(date +%s) - start))");
  EXPECT_THAT(ran.out, HasSubstr("rc.network: there is no interface 'eth7' for the bridge abr\n"));
  EXPECT_THAT(ran.out, HasSubstr("rc.network: there is no interface 'eth8' for the bridge bbr\n"));
  EXPECT_THAT(ran.out, testing::ContainsRegex("\n1 after [4-8]\n"));  // 5 s in all
  EXPECT_EQ(Bridges(), "abr bbr cbr\n");
  EXPECT_THAT(RunInShell("ip -brief -4 address show abr").out, HasSubstr("192.0.2.1/24"));
}

// Copies that editors and package managers leave were bridges of their own.
TEST_F(KitBoot, ReadsTheFilesOfInterfacesAlone) {
  for (const char* szFile : {"br1~", "br1.bak", "br1.rpmsave", "br1.new", "br1.dpkg-old", "#br1#", "br2.bak"}) {
    Bridge(szFile, "DEVICE=br1\n");
  }
  for (const char* szFile : {"br3~", "br3.bak", "br3.rpmsave", "br3.", "br3.7.orig"}) Bridge(szFile, "");
  const Ran nothing = RunInShell("/etc/rc.network boot");
  EXPECT_EQ(nothing.out, "");
  EXPECT_EQ(nothing.status, 0);
  EXPECT_EQ(Bridges(), "\n");

  Bridge("br4", "");
  Bridge("br5.7", "");
  Bridge("br6.lan", "DEVICE=\"br6.lan\"\n");
  Bridge("br7", "DEVICE=br7\n");
  EXPECT_EQ(RunInShell("/etc/rc.network boot").out, "");
  EXPECT_EQ(Bridges(), "br4 br5.7 br6.lan br7\n");
}

// The way out that an interface had was gone once it was in a bridge.
TEST_F(KitBoot, TakesTheRoutesOfItsFirstMemberAlongAndNotesNothing) {
  RunInShell(
      "ip link add eth0 type veth peer name wire; ip link set eth0 up; ip link set wire up; "
      "ip address add 192.0.2.1/24 dev eth0; ip route add default via 192.0.2.254");
  Bridge("abr", "PRIMARY=eth0\n");
  EXPECT_EQ(RunInShell("/etc/rc.network boot").out, "");
  EXPECT_EQ(RunInShell("ip -4 route show default | sed 's/ *$//'").out, "default via 192.0.2.254 dev abr\n");
  EXPECT_EQ(RunInShell("ls /run/rc.network | grep wire").out, "");
}

}  // namespace
