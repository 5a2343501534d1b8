// Settings that cannot be read end the scripts, before anything is done by what is not known.
#include <sys/stat.h>

#include <filesystem>
#include <string>

#include "settings.h"

namespace {

using namespace std::string_literals;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

// Everything that is read for something else than to be shown.
constexpr const char* kQuestions[] = {
    "read_setting wifi_sched",
    "is_on guest_net_lan_block",
    "! is_on guest_net_access_ds",
    "value_of BRIDGE /etc/sysconfig/network-scripts/ifcfg-wlan0",
    "bridge=$(script_value BRIDGE wlan0) || exit 1",
    "! is_enabled /etc/hostapd/hostapd-wlan0.info",
    "! access_point_is wlan0 yes",
    "! guest_is_on wlan0",
    "! is_bridge br0",
    "! is_nat br0",
    "! comes_up_at_boot br0",
    "make_bridge br0",
    "give_up_bridge br0",
    "decide_on_guests wlan0",
    "! is_off_now wifi_sched_enabled wifi_sched",
    "decide_on_main",
    "serve_addresses br0",
    "guest_rules",
    "verdict guest_net_lan_block",
    "rules br0",
    "set_firewall br0",
    "note_adapter lo",
};

void ExpectEveryQuestionToEndTheScript(const std::string& why) {
  Install("nft", "touch /tmp/rules-are-set\n");
  Install("ip",
          "case $* in\n*-batch*) grep -v show ;;\n*show*) false ;;\nesac && touch /tmp/addresses-are-set\nexit 0\n");
  for (const std::string question : kQuestions) {
    const Ran ran = RunInParts(question + "\necho went on");
    EXPECT_EQ(ran.status, 1) << question << " with " << why << "\n" << ran.out;
    EXPECT_THAT(ran.out, HasSubstr("sh: cannot read settings: ")) << question << " with " << why;
    EXPECT_THAT(ran.out, Not(HasSubstr("went on"))) << question << " with " << why;
  }
  EXPECT_FALSE(fs::exists("/tmp/rules-are-set"));
  EXPECT_FALSE(fs::exists("/tmp/addresses-are-set"));
}

TEST_F(Settings, EndTheScriptWhereTheirReaderIsMissing) {
  fs::remove("/usr/mero/sbin/mero-settings");
  ExpectEveryQuestionToEndTheScript("no reader");
}

TEST_F(Settings, EndTheScriptWhereTheirReaderFails) {
  for (const char* szFailure :
       {"exit 2", "kill -s SEGV $$", "kill -s KILL $$", "echo 1; exit 3", "echo yes; exit 126"}) {
    WriteScript("/usr/mero/sbin/mero-settings", std::string(szFailure) + "\n");
    ExpectEveryQuestionToEndTheScript(szFailure);
  }
}

TEST_F(Settings, EndTheScriptWhereTheyAreNeitherOnNorOff) {
  for (const char* szAnswer : {"", "on", "yes "}) {
    WriteScript("/usr/mero/sbin/mero-settings",
                "[ $1 = access-point ] || shift; shift; for value; do echo '"s + szAnswer + "'; done\n");
    for (const std::string question : {"! is_nat br0", "! comes_up_at_boot br0", "! is_on guest_net_lan_block"}) {
      const Ran ran = RunInParts(question + "\necho went on");
      EXPECT_EQ(ran.status, 1) << question;
      EXPECT_THAT(ran.out, AllOf(HasSubstr("'"s + szAnswer + "'"), Not(HasSubstr("went on")))) << question;
    }
  }
}

TEST_F(Settings, EndTheScriptWhereTheyCannotBeRead) {
  const struct {
    const char* szPath;
    const char* szQuestion;
  } rows[] = {
      {kApSettings, "guest_rules"},
      {kApSettings, "is_on guest_net_lan_block"},
      {"/tmp/wireless.info", "guest_rules"},
      {"/tmp/wireless.info", "read_setting wifi_sched"},
      {kBridgeScript, "is_nat br0"},
      {kBridgeScript, "make_bridge br0"},
      {"/etc/hostapd/hostapd-wlan0.info", "access_point_is wlan0 yes"},
      {"/etc/hostapd/hostapd-wlan0-guest.info", "guest_is_on wlan0"},
      {"/etc/sysconfig/network-scripts/ifcfg-wlan0", "script_value BRIDGE wlan0"},
  };
  for (const auto& row : rows) {
    fs::remove_all(row.szPath);
    fs::create_directories(row.szPath);  // what root cannot read either
    const Ran ran = RunInParts(row.szQuestion + "\necho went on"s);
    EXPECT_EQ(ran.status, 1) << row.szQuestion;
    EXPECT_THAT(ran.out,
                AllOf(HasSubstr("mero-settings: cannot read "s + row.szPath + "; the system log has the reason\n"),
                      HasSubstr("sh: cannot read"), Not(HasSubstr("went on"))))
        << row.szQuestion;
    fs::remove_all(row.szPath);
    WriteText("/tmp/wireless.info", "PRODUCT=\"RT [5370\"\n");
  }
}

TEST_F(Settings, EndTheScriptsBeforeTheyActOnAnEmptyBridge) {
  const std::string script = "/etc/sysconfig/network-scripts/ifcfg-wlan0";
  fs::create_directories(script);
  WriteText("/etc/hostapd/hostapd-wlan0.info", "enable=yes\n");
  fs::remove("/etc/rc.network");
  WriteScript("/etc/rc.network", "touch /tmp/ran\n");
  ::chmod("/etc/rc.network", 0755);
  const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function remove");
  EXPECT_EQ(ran.status, 1);
  EXPECT_THAT(ran.out, HasSubstr("cannot read settings: file " + script + " BRIDGE"));
  EXPECT_FALSE(fs::exists("/tmp/ran"));
}

}  // namespace
