// How many processes the scripts take for what they do. Each takes longer than all that the shell does by
// itself, and until the last of them has ended nobody can join.
#include "kit_radio.h"

namespace {

// The scripts find no program but through a stand-in that notes it, so that none is left uncounted.
class KitCost : public KitRadio {
 protected:
  KitCost() {
    fs::create_directories("/tmp/noted");
    WriteScript("/tmp/noted/tool", R"(echo "${0##*/}" >>/tmp/ran
PATH=/tmp/bin:/usr/sbin:/usr/bin:/sbin:/bin
exec "${0##*/}" "$@"
)");
    for (const char* szTool : kTools) fs::create_symlink("tool", std::string("/tmp/noted/") + szTool);
    // The scripts name it by its path.
    fs::remove("/usr/mero/sbin/mero-settings");
    WriteScript("/usr/mero/sbin/mero-settings",
                "echo mero-settings >>/tmp/ran\necho \"$*\" >>/tmp/asked\nexec " SETTINGS_PROGRAM " \"$@\"\n");
    StandIn("hostapd",
            "log=$4\n" + Daemon("hostapd", "-P") + "ip link set dev wlan0 up; " + Log("UNINITIALIZED->ENABLED"));
    fs::copy(APPLIANCE_KIT "/sbin/udhcpc.lease", "/usr/mero/sbin/udhcpc.lease");
    WriteText("/etc/resolv.conf", "nameserver 192.0.2.53\n");
    RunInShell("mkdir -m 700 /run/rc.network");
    WriteText("/usr/mero/etc/wireless_ap.conf", "[RT [5370]\n\tssid=home\n");
    WriteText("/usr/mero/etc/wireless_country.conf", "country=\"DE\"\n");
  }

  // Has the daemon log a change of its state.
  static std::string Log(const std::string& change) {
    return "echo '17.5: wlan0: interface state " + change + "' >>$log\n";
  }

  // The programs that a script runs, in order, but for pauses.
  static std::string ProgramsOf(const std::string& words, const std::string& script = "/etc/rc.network") {
    RunInShell("rm -f /tmp/ran /tmp/asked");
    const Ran ran = RunInShell("PATH=/tmp/noted " + script + " " + words);
    EXPECT_EQ(ran.out, "");
    EXPECT_EQ(ran.status, 0);
    return RunInShell("grep -v sleep /tmp/ran | xargs").out;
  }

  static void SetGuests() {
    WriteText("/etc/hostapd/hostapd-wlan0-guest.info", "enable=\"yes\"\n");
    WriteText("/etc/hostapd/hostapd-wlan0-guest.conf", "bss=gwlan\nbssid=\nssid=visitors\n");
  }
};

// There were 92 before the daemon, seven of them to read settings.
TEST_F(KitCost, OfAStartIsSevenProcessesBeforeTheDaemon) {
  EXPECT_EQ(ProgramsOf("start wlan0 lbr0"), "find flock mero-settings ip nft iw sed hostapd dnsmasq chown\n");
}

// hostapd was asked for its state ten times a second while it looked for neighbours, by two processes each time.
TEST_F(KitCost, OfAScanForNeighboursIsPausesAlone) {
  StandIn("hostapd", "log=$4\n" + Daemon("hostapd", "-P") + "ip link set dev wlan0 up\n" +
                         Log("UNINITIALIZED->HT_SCAN") + "{ sleep 0.4; " + Log("HT_SCAN->ENABLED") +
                         "} >/dev/null 2>&1 &\n");
  EXPECT_EQ(ProgramsOf("start wlan0 lbr0"), "find flock mero-settings ip nft iw sed hostapd dnsmasq chown\n");
  EXPECT_THAT(ReadText("/run/rc.network/hostapd-wlan0.log"), testing::HasSubstr("->ENABLED"));
}

TEST_F(KitCost, OfGuestsIsABridgeWithItsServerMore) {
  SetGuests();
  EXPECT_EQ(ProgramsOf("start wlan0 lbr0"),
            "find flock mero-settings ip ip nft iw sed hostapd dnsmasq chown dnsmasq chown\n");
}

// Each was read anew for each thing that was to be known, so that an answer could be of another time than the next.
TEST_F(KitCost, OfAStartIsOneReadingOfEachFile) {
  SetGuests();
  ProgramsOf("start wlan0 lbr0");
  const std::string asked = " -- " + ReadText("/tmp/asked");
  for (const char* szRequest :
       {" access-point ", " bridge lbr0 ", " check /etc/dhcpd/dhcpd-lbr0-lbr0.info ",
        " file /etc/dhcpd/dhcpd-lbr0-lbr0.conf ", " check /etc/hostapd/hostapd-wlan0-guest.info ",
        " file /usr/mero/etc/wireless_country.conf "}) {
    const size_t at = asked.find(szRequest);
    EXPECT_NE(at, std::string::npos) << szRequest;
    EXPECT_EQ(asked.find(szRequest, at + 1), std::string::npos) << szRequest;
  }
}

TEST_F(KitCost, OfAnEndIsThirteenProcessesAndTheWaitForItsDaemons) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(ProgramsOf("restart wlan0 lbr0"), "find flock rm rm nft rm mero-settings rm ip ip ip iw rm\n");
}

TEST_F(KitCost, OfAnHourWithoutAChangeIsFourProcesses) {
  ASSERT_EQ(Script("start wlan0 lbr0").out, "");
  EXPECT_EQ(ProgramsOf("schedule wlan0"), "find flock mero-settings nft\n");
}

TEST_F(KitCost, OfABootIsTwoProcessesForEachBridge) {
  WriteText("/etc/sysconfig/network-scripts/ifcfg-abr0",
            "DEVICE=abr0\nTYPE=Bridge\nBOOTPROTO=static\nIPADDR=192.0.2.1\nNETMASK=255.255.255.0\nONBOOT=yes\n");
  // The third file is that of the wireless interface.
  EXPECT_EQ(ProgramsOf("boot"), "find flock mero-settings ip mero-settings ip mero-settings\n");
}

// ---- The hot-plug script ----

class HotPlugCost : public KitCost {
 protected:
  HotPlugCost() {
    fs::create_directories("/tmp/adapters/wlan0/phy80211");
    RunInShell("sed -i 's,/sys/class/net/\\*/phy80211,/tmp/adapters/*/phy80211,' /usr/mero/lib/network/adapter.sh");
    fs::create_directories("/tmp/usb/device");
    WriteText("/tmp/usb/product", "RT [5370\n");
    Install("readlink", "echo /tmp/usb/device\n");
    StandIn("iw", "[ \"$*\" != 'reg get' ] || echo 'country DE: DFS-ETSI'\n");
    WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"yes\"\n");
    fs::remove("/tmp/wireless.info");
  }

  static std::string ProgramsOf(const std::string& words) {
    return KitCost::ProgramsOf(words, "/usr/mero/hotplug/usb.wireless.function");
  }
};

constexpr char kOfAStart[] = "find flock mero-settings ip nft iw sed hostapd dnsmasq chown";

// It read settings five times before the start of the access point.
TEST_F(HotPlugCost, OfAnAdapterThatIsPluggedInIsOneReadingOfItsSettings) {
  EXPECT_EQ(ProgramsOf("add"), "readlink mero-settings iw iw mktemp chmod mv " + std::string(kOfAStart) + "\n");
  EXPECT_EQ(ReadText("/tmp/wireless.info"), "INTERFACE=\"wlan0\"\nPRODUCT=\"RT 5370\"\n");
  EXPECT_EQ(Daemons(), OnAir());
}

TEST_F(HotPlugCost, OfAnAdapterWithoutAnAccessPointIsThatAlone) {
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  EXPECT_EQ(ProgramsOf("add"), "readlink mero-settings iw iw mktemp chmod mv\n");
}

TEST_F(HotPlugCost, OfAnAdapterWithoutANameIsNoMore) {
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  fs::remove("/tmp/usb/product");
  WriteText("/tmp/usb/idVendor", "148f\n");
  WriteText("/tmp/usb/idProduct", "5370\n");
  EXPECT_EQ(ProgramsOf("add"), "readlink mero-settings iw iw mktemp chmod mv\n");
  EXPECT_EQ(ReadText("/tmp/wireless.info"), "INTERFACE=\"wlan0\"\nPRODUCT=\"148f:5370\"\n");
}

// What is known of the adapter before it is noted is what its own section says, and not that of the adapter before it.
TEST_F(HotPlugCost, KeepsTheRadioOffThatIsOffByTheSectionOfTheAdapter) {
  fs::create_directories("/tmp/adapters/wlan0/phy80211/rfkill0");
  RunInShell(
      "sed -i 's,\"/sys/class/net/$1/phy80211\"/rfkill,/tmp/adapters/wlan0/phy80211/rfkill,' "
      "/usr/mero/lib/network/adapter.sh");
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  for (const bool isBlocked : {true, false}) {
    WriteText("/tmp/adapters/wlan0/phy80211/rfkill0/soft", "0\n");
    WriteText("/tmp/wireless.info", "PRODUCT=\"another\"\n", 0644);
    WriteText("/usr/mero/etc/wireless_ap.conf", std::string("[another]\n\tunblock=") + (isBlocked ? "yes" : "no") +
                                                    "\n[RT 5370]\n\tunblock=" + (isBlocked ? "no" : "yes") + "\n");
    ProgramsOf("add");
    EXPECT_EQ(ReadText("/tmp/adapters/wlan0/phy80211/rfkill0/soft"), isBlocked ? "1\n" : "0\n");
  }
}

// Each setting that can be read counts, whichever cannot.
TEST_F(HotPlugCost, OfSettingsThatCannotBeReadIsNotTheAdapter) {
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=\"no\"\n");
  fs::remove("/usr/mero/etc/wireless_country.conf");
  fs::create_directories("/usr/mero/etc/wireless_country.conf");
  RunInShell("PATH=/tmp/bin:$PATH /usr/mero/hotplug/usb.wireless.function add");
  EXPECT_EQ(ReadText("/tmp/wireless.info"), "INTERFACE=\"wlan0\"\nPRODUCT=\"RT 5370\"\n");
}

TEST_F(HotPlugCost, OfAnAdapterThatIsPulledIsOneReadingOfItsNoteAndOneForItsAccessPoint) {
  ASSERT_THAT(ProgramsOf("add"), testing::StartsWith("readlink "));
  RunInShell("ip link delete wlan0");
  EXPECT_EQ(ProgramsOf("remove"),
            "mero-settings mktemp chmod mv mero-settings find flock rm rm nft rm mero-settings rm ip rm\n");
}

}  // namespace
