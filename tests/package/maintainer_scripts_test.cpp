// The scripts that dpkg runs when packages come and go, among things that somebody has put in their way.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>

#include <filesystem>
#include <string>
#include <vector>

#include "tests/support/files.h"
#include "tests/support/shell.h"

namespace fs = std::filesystem;

namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

constexpr char kAdapter[] = "/tmp/wireless.info";
constexpr char kState[] = "/run/rc.network";
constexpr char kLeaseLock[] = "/run/udhcpc.lease";
constexpr char kStart[] = "/etc/rc.network";
constexpr char kConnection[] = "/usr/mero/etc/wpa_supplicant.conf";

// The files that the scripts remove from directories that anyone may write.
const std::vector<std::string> kPublic = {"/var/tmp/.wireless_connecting", "/var/tmp/.wireless_current_connection",
                                          "/var/tmp/.wireless_ap_connecting",
                                          "/var/tmp/.wireless_current_connection.aB3xYz", kAdapter};

Ran Script(const std::string& name, const std::string& arguments) {
  return RunInShell("PATH=/tmp/bin:$PATH sh " PACKAGE_SCRIPTS "/" + name + " " + arguments);
}

// Runs the scripts that dpkg runs when the packages are removed, in its order; all that they say.
Ran Remove(const std::string& how = "remove") {
  Ran all = {.status = 0, .out = "", .err = ""};
  const std::vector<std::string> scripts =
      how == "remove"
          ? std::vector<std::string>{"merowireless-appliance.prerm remove", "merowireless-appliance.postrm remove",
                                     "libmerowireless-core1.postrm remove"}
          : std::vector<std::string>{"merowireless-appliance.postrm purge", "libmerowireless-core1.postrm purge"};
  for (const std::string& script : scripts) {
    const Ran ran = Script(script.substr(0, script.find(' ')), script.substr(script.find(' ')));
    EXPECT_EQ(ran.status, 0) << script << "\n" << ran.out;
    all.out += ran.out;
  }
  return all;
}

class PackageScripts : public testing::Test {
 protected:
  PackageScripts() {
    Install("dpkg-divert", "echo \"$*\" >>/tmp/diverted\n");
    Install("udevadm", "echo \"$*\" >>/tmp/asked\n");
    Install("deb-systemd-invoke", "echo \"$*\" >>/tmp/asked\n");
    // Nobody waits two minutes here.
    Install("timeout", "shift 3\nexec /usr/bin/timeout -s KILL 1 \"$@\"\n");
    SetStartScript("echo \"$*\" >>/tmp/started\n");
    for (const char* szPath : {"/usr/mero/lib", "/usr/mero/sbin"}) fs::create_directories(szPath);
    fs::copy(SETTINGS_PROGRAM, "/usr/mero/sbin/mero-settings", fs::copy_options::overwrite_existing);
    fs::copy(APPLIANCE_KIT "/lib", "/usr/mero/lib/network",
             fs::copy_options::recursive | fs::copy_options::overwrite_existing);
    for (const std::string& path : kPublic) fs::remove_all(path);
    fs::remove_all(kState);
  }

  static void SetStartScript(const std::string& script) {
    fs::remove(kStart);
    WriteScript(kStart, script);
  }

  static std::string Told(const std::string& path) { return RunInShell("cat " + path).out; }
};

TEST_F(PackageScripts, LeaveNothingOfWhatRan) {
  for (const std::string& path : kPublic) WriteText(path, "");
  WriteText(std::string(kState) + "/lock", "");
  WriteText(kConnection, "");
  fs::create_directory(kLeaseLock);
  EXPECT_EQ(Remove().out, "");
  for (const std::string& path : kPublic) EXPECT_FALSE(Exists(path)) << path;
  EXPECT_FALSE(Exists(kState));
  EXPECT_FALSE(Exists(kLeaseLock));
  EXPECT_TRUE(Exists(kConnection));
  EXPECT_EQ(Remove("purge").out, "");
  EXPECT_FALSE(Exists(kConnection));
}

// A directory at one of these paths, which anyone may make there, kept the package from being removed.
TEST_F(PackageScripts, RemoveWhateverStandsThereInstead) {
  const struct {
    const char* szText;
    void (*make)(const char* szPath);
  } rows[] = {
      {"an empty directory", [](const char* szPath) { ::mkdir(szPath, 0700); }},
      {"a link to a file", [](const char* szPath) { fs::create_symlink("/etc/mine", szPath); }},
      {"a link to a directory", [](const char* szPath) { fs::create_symlink("/etc/ours", szPath); }},
      {"a link to nothing", [](const char* szPath) { fs::create_symlink("/etc/nothing", szPath); }},
      {"a fifo", [](const char* szPath) { ::mkfifo(szPath, 0600); }},
  };
  WriteText("/etc/mine", "mine\n");
  WriteText("/etc/ours/ours", "ours\n");
  for (const auto& row : rows) {
    for (const std::string& path : kPublic) row.make(path.c_str());
    row.make(kState);
    EXPECT_EQ(Remove().out, "") << row.szText;
    for (const std::string& path : kPublic) EXPECT_FALSE(Exists(path)) << path << ": " << row.szText;
    EXPECT_FALSE(Exists(kState)) << row.szText;
    EXPECT_EQ(Told("/etc/mine") + Told("/etc/ours/ours"), "mine\nours\n") << row.szText;
  }
}

TEST_F(PackageScripts, LeaveADirectoryOfSomebodysThings) {
  for (const std::string& path : kPublic) WriteText(path + "/thesis.txt", "mine\n");
  const Ran ran = Remove();
  for (const std::string& path : kPublic) {
    EXPECT_EQ(Told(path + "/thesis.txt"), "mine\n");
    EXPECT_THAT(ran.out, HasSubstr("rm: cannot remove '" + path + "'"));
  }
  EXPECT_THAT(Told("/tmp/diverted"), HasSubstr("--remove"));
}

TEST_F(PackageScripts, TellWhatCannotBeRemoved) {
  std::vector<std::string> paths = kPublic;
  paths.emplace_back(std::string(kState) + "/lock");
  paths.emplace_back(kConnection);
  for (const std::string& path : paths) {
    WriteText(path, "");
    ASSERT_EQ(::mount("/dev/null", path.c_str(), nullptr, MS_BIND, nullptr), 0);  // busy, to whoever removes it
  }
  const std::string told = Remove().out + Remove("purge").out;
  for (const std::string& path : paths) {
    EXPECT_THAT(told, HasSubstr("rm: cannot remove '" + path + "'"));
    ::umount(path.c_str());
  }
  EXPECT_EQ(Remove("purge").out, "");  // once more
  for (const std::string& path : paths) EXPECT_FALSE(Exists(path)) << path;
}

TEST_F(PackageScripts, TellThatTheListingToolCannotBePutBack) {
  Install("dpkg-divert", "echo 'dpkg-divert: error: rename involves overwriting' >&2\nexit 2\n");
  WriteText(kAdapter, "");
  EXPECT_THAT(Remove().out, AllOf(HasSubstr("rename involves overwriting"),
                                  HasSubstr("the ordinary iwlist may still be /sbin/iwlist.distrib\n"),
                                  HasSubstr("the ordinary iwlist may still be /usr/sbin/iwlist.ordinary\n")));
  EXPECT_FALSE(Exists(kAdapter));
}

// This alone kept the package.
TEST_F(PackageScripts, GoBackToTheFirstReleaseWhenTheListingToolCannotBePutBack) {
  Install("mv", "echo 'mv: cannot move' >&2\nexit 1\n");
  WriteText("/usr/sbin/iwlist", "");
  WriteText("/usr/sbin/iwlist.ordinary", "");
  const Ran ran = Script("merowireless-appliance.postrm", "upgrade 0.1.0");
  EXPECT_EQ(ran.status, 0);
  EXPECT_EQ(ran.out, "mv: cannot move\nthe ordinary iwlist may still be /usr/sbin/iwlist.ordinary\n");
  EXPECT_THAT(Told("/tmp/diverted"), HasSubstr("--remove --no-rename --divert /usr/sbin/iwlist.ordinary"));
}

TEST_F(PackageScripts, EndTheAccessPointsThatRun) {
  WriteText(std::string(kState) + "/hostapd-wlan0.pid", "123\n");
  WriteText(std::string(kState) + "/hostapd-wlan1.pid", "rubbish; rm -rf /\n");
  EXPECT_EQ(Remove().out, "");
  EXPECT_EQ(Told("/tmp/started"), "restart wlan0 \nrestart wlan1 \n");
}

// Each adapter that the kernel knew was taken for the kit's: somebody's own bridge with a second adapter was deleted,
// and from a chroot that of the machine outside.
TEST_F(PackageScripts, EndTheClientOfTheAdapterThatIsNotedAndLeaveOtherAdaptersAlone) {
  for (const std::string name : {"gwlan", "wlan0", "wlan1", "wlan2"}) {
    fs::create_directories("/tmp/adapters/" + name + "/phy80211");
    fs::create_symlink("../of-" + name, "/tmp/adapters/" + name + "/master");
  }
  ASSERT_EQ(::mount("/tmp/adapters", "/sys/class/net", nullptr, MS_BIND, nullptr), 0);
  const std::string note = "INTERFACE=\"wlan0\"\nPRODUCT=\"RT 5370\"\n";
  const std::string stopped = "stop mero-wireless@*.service\n";
  const std::string accessPoint = "restart wlan1 of-wlan1\n";
  const struct {
    const char* szText;
    bool systemdRuns;
    void (*leave)(const std::string& text);
    std::string asked;
  } rows[] = {
      {"noted", true, [](const std::string& text) { WriteText(kAdapter, text); },
       stopped + "restart wlan0 \n" + accessPoint},
      {"pulled", true, [](const std::string&) { WriteText(kAdapter, ""); }, stopped + accessPoint},
      {"never there", true, [](const std::string&) {}, stopped + accessPoint},
      {"a link", true,
       [](const std::string& text) {
         WriteText("/tmp/theirs", text);
         fs::create_symlink("/tmp/theirs", kAdapter);
       },
       stopped + accessPoint},
      {"in a chroot", false, [](const std::string& text) { WriteText(kAdapter, text); }, accessPoint},
  };
  ::chmod("/tmp", 01777);
  Install("deb-systemd-invoke", "echo \"$*\" >>/tmp/asked; rm -f /tmp/wireless.info\n");
  SetStartScript("echo \"$*\" >>/tmp/asked\n");
  for (const auto& row : rows) {
    fs::remove("/tmp/asked");
    fs::remove(kAdapter);
    fs::remove_all("/run/systemd/system");
    if (row.systemdRuns) fs::create_directories("/run/systemd/system");
    WriteText(std::string(kState) + "/hostapd-wlan1.pid", "123\n");
    row.leave(note);
    EXPECT_EQ(Script("merowireless-appliance.prerm", "remove").status, 0) << row.szText;
    EXPECT_EQ(Told("/tmp/asked"), row.asked) << row.szText;
  }
  ::umount("/sys/class/net");
}

// A bridge that goes on is served, and nobody could end its server once the kit and its pid file were gone.
TEST_F(PackageScripts, EndTheServersOfBridgesThatGoOn) {
  fs::copy_file("/bin/sleep", "/tmp/bin/dnsmasq");
  Install("timeout", "shift 3\nexec \"$@\"\n");
  SetStartScript(
      "serve() { $1 60 >/dev/null 2>&1 & echo $! | tee /tmp/$2 >/run/rc.network/dnsmasq-$2.pid; }\n"
      "serve /tmp/bin/dnsmasq lbr0; serve sleep other\n"
      "until [ \"$(cat /proc/$(cat /tmp/lbr0)/comm)\" = dnsmasq ]; do :; done\n");
  WriteText(std::string(kState) + "/hostapd-wlan0.pid", "123\n");
  EXPECT_EQ(Remove().out, "");
  EXPECT_NE(RunInShell("grep -s '^State:.[^Z]' /proc/$(cat /tmp/lbr0)/status").status, 0);
  EXPECT_EQ(RunInShell("kill $(cat /tmp/other)").status, 0);  // another program has the number
}

TEST_F(PackageScripts, GoOnWithoutAStartScriptThatWorks) {
  const char* const broken[] = {"exit 1\n", "fi\n", "kill -9 $$\n", "exec sleep 60\n", "cat >/dev/null; exit 1\n"};
  for (const char* szScript : broken) {
    SetStartScript(szScript);
    WriteText(std::string(kState) + "/hostapd-wlan0.pid", "123\n");
    EXPECT_THAT(Remove().out, HasSubstr("the access point or the client on wlan0 may still run")) << szScript;
    EXPECT_FALSE(Exists(kState)) << szScript;
  }
  fs::remove(kStart);
  WriteText(std::string(kState) + "/hostapd-wlan0.pid", "123\n");
  EXPECT_THAT(Remove().out, HasSubstr("the access point or the client on wlan0 may still run"));
}

TEST_F(PackageScripts, RemoveNothingInAnUpgradeNorWhenOneFails) {
  std::vector<std::string> paths = kPublic;
  paths.emplace_back(std::string(kState) + "/hostapd-wlan0.pid");
  for (const std::string& path : paths) WriteText(path, "");
  const std::vector<std::pair<std::string, std::string>> steps = {
      {"prerm", "upgrade 2"},         {"prerm", "failed-upgrade 1 2"},   {"preinst", "upgrade 1 2"},
      {"postrm", "upgrade 2"},        {"postrm", "failed-upgrade 1 2"},  {"postrm", "abort-upgrade 1 2"},
      {"preinst", "abort-upgrade 2"}, {"postinst", "abort-upgrade 2"},   {"prerm", "deconfigure in-favour x 1"},
      {"postinst", "abort-remove"},   {"postinst", "abort-deconfigure"}, {"postinst", "configure 1"},
  };
  for (const auto& [script, arguments] : steps) {
    EXPECT_EQ(Script("merowireless-appliance." + script, arguments).status, 0) << script << " " << arguments;
  }
  for (const char* szArguments : {"upgrade 2", "failed-upgrade 1 2", "abort-upgrade 1 2"}) {
    EXPECT_EQ(Script("libmerowireless-core1.postrm", szArguments).status, 0) << szArguments;
  }
  for (const std::string& path : paths) EXPECT_TRUE(Exists(path)) << path;
  EXPECT_EQ(Told("/tmp/started 2>/dev/null"), "");
  EXPECT_THAT(Told("/tmp/diverted"), Not(HasSubstr("--remove")));
}

// The units of adapters had been ended by then, and nothing started them.
TEST_F(PackageScripts, TellOfAdaptersAgainWhenARemovalIsBrokenOff) {
  fs::create_directories("/run/systemd/system");
  EXPECT_EQ(Script("merowireless-appliance.postinst", "abort-remove").status, 0);
  EXPECT_THAT(Told("/tmp/asked"), HasSubstr("trigger --action=add"));
}

// Removed, the program had run on from a file that was gone; upgraded, it had been the former version's.
TEST_F(PackageScripts, HaveWhatJoinsNetworksRunTheProgramThatIsThere) {
  const std::string unit = "mero-wireless-autoconnect.service";
  const struct {
    std::string script;
    std::string arguments;
    std::string active;  // units
    std::string asked;
  } rows[] = {
      {"prerm", "remove", unit, "stop " + unit + "\n"},
      {"prerm", "remove", "", ""},
      {"prerm", "upgrade 2", unit, ""},
      {"postinst", "configure 1", unit, "try-restart " + unit + "\n"},
      {"postinst", "configure 1", "mero-wireless@wlan0.service", ""},
      {"postinst", "configure", "mero-wireless@wlan0.service", "start " + unit + "\n"},
      {"postinst", "abort-remove", "mero-wireless@wlan0.service", "start " + unit + "\n"},
      {"postinst", "configure", "", ""},
      {"postinst", "abort-upgrade 2", unit, ""},
  };
  fs::create_directories("/run/systemd/system");
  for (const auto& row : rows) {
    fs::remove("/tmp/asked");
    Install("systemctl", "[ \"$*\" = \"--quiet is-active " + row.active + "\" ]\n");
    const std::string what = row.script + " " + row.arguments + " with " + row.active;
    const Ran ran = Script("merowireless." + row.script, row.arguments);
    EXPECT_EQ(ran.status, 0) << what;
    EXPECT_EQ(ran.out, "") << what;
    EXPECT_EQ(Told("/tmp/asked 2>/dev/null"), row.asked) << what;
  }
  fs::remove("/tmp/asked");
  fs::remove_all("/run/systemd/system");
  EXPECT_EQ(Script("merowireless.postinst", "configure").status, 0);
  EXPECT_EQ(Script("merowireless.prerm", "remove").status, 0);
  EXPECT_EQ(Told("/tmp/asked 2>/dev/null"), "");
}

TEST_F(PackageScripts, TellThatWhatJoinsNetworksCannotBeEnded) {
  fs::create_directories("/run/systemd/system");
  Install("systemctl", "exit 0\n");
  Install("deb-systemd-invoke", "exit 1\n");
  const Ran removed = Script("merowireless.prerm", "remove");
  EXPECT_EQ(removed.status, 0);
  EXPECT_THAT(removed.out, HasSubstr("merowireless autoconnect may still run\n"));
  const Ran upgraded = Script("merowireless.postinst", "configure 1");
  EXPECT_EQ(upgraded.status, 0);
  EXPECT_THAT(upgraded.out, HasSubstr("merowireless autoconnect may not run, or be that of the former version\n"));
}

TEST_F(PackageScripts, UndoAnInstallationThatFails) {
  WriteText(std::string(kAdapter) + "/thesis.txt", "mine\n");
  EXPECT_EQ(Script("merowireless-appliance.preinst", "install").status, 0);
  EXPECT_EQ(Script("merowireless-appliance.postrm", "abort-install").status, 0);
  EXPECT_THAT(Told("/tmp/diverted"), AllOf(HasSubstr("--add"), HasSubstr("--remove")));
}

}  // namespace
