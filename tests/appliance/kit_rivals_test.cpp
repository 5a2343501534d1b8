// Other users put things in the way of the kit's files, in directories that anybody can write to. It does no harm.
#include <gmock/gmock.h>
#include <sys/stat.h>

#include "kit.h"

namespace {

using testing::HasSubstr;

const std::string kState = "/run/rc.network";
const std::string kNote = "/tmp/wireless.info";

class KitRivals : public Kit {
 protected:
  KitRivals() {
    ::chmod("/tmp", 01777);
    fs::remove(kNote);
    for (const char* szDirectory : {"/etc", "/run", "/tmp"}) {
      WriteText(std::string(szDirectory) + "/victim", "root's own\n");
    }
  }

  void SetUp() override {
    if (AsNobody("true").status != 0) GTEST_SKIP() << "there is no other user than root";
  }

  void TearDown() override {
    for (const char* szDirectory : {"/etc", "/run", "/tmp"}) {
      const std::string victim = std::string(szDirectory) + "/victim";
      EXPECT_EQ(RunInShell("cat " + victim + "; stat -c '%a %u' " + victim).out, "root's own\n600 0\n") << victim;
    }
  }

  static Ran AsNobody(const std::string& command) {
    return RunInShell("setpriv --reuid=65534 --regid=65534 --clear-groups sh -c '" + command + "'");
  }

  static std::string Note() {
    return RunInShell("stat -c '%F %a %u %h' " + kNote).out + RunInShell("cat " + kNote).out;
  }
};

// It was written to, whatever it led to, and what others had made was taken over with its owner.
TEST_F(KitRivals, GetNoHoldOfTheNoteOfTheAdapter) {
  for (const std::string& name : {kNote, kNote + ".new"}) {
    for (const std::string& attack :
         {"ln -s /etc/victim " + name, "ln -s /etc/nowhere " + name, "mkfifo -m 666 " + name,
          "echo PRODUCT=theirs >" + name + "; chmod 666 " + name, "mkdir " + name + "; echo x >" + name + "/file",
          "mkdir /tmp/theirs; ln -s /tmp/theirs " + name}) {
      ASSERT_EQ(AsNobody(attack).out, "") << attack;
      const Ran ran = RunInParts("put $adapter_info PRODUCT=ours 644");
      EXPECT_EQ(ran.status, 0) << attack << ran.out;
      EXPECT_EQ(Note(), "regular file 644 0 1\nPRODUCT=ours\n") << attack;
      EXPECT_EQ(RunInShell("timeout 10 /usr/mero/hotplug/usb.wireless.function remove").out, "") << attack;
      EXPECT_EQ(Note(), "regular empty file 644 0 1\n") << attack;
      EXPECT_EQ(AsNobody("ls -A /tmp/theirs 2>/dev/null").out, "") << attack;
      RunInShell("rm -rf /tmp/wireless* /tmp/theirs");
    }
  }
}

// As where the kernel lets anybody make one more name for a file of root's.
TEST_F(KitRivals, MakeNoSecondNameOfAFileBeWrittenTo) {
  for (const std::string& name : {kNote, kNote + ".new"}) {
    ASSERT_EQ(RunInShell("ln /tmp/victim " + name).out, "");
    EXPECT_EQ(RunInShell("/usr/mero/hotplug/usb.wireless.function remove").status, 0);
    EXPECT_EQ(Note(), "regular empty file 644 0 1\n");
    fs::remove(name);
  }
}

TEST_F(KitRivals, HaveADirectoryInTheWayMovedAside) {
  ASSERT_EQ(AsNobody("mkdir " + kNote + "; echo kept >" + kNote + "/file").out, "");
  const Ran ran = RunInShell("/usr/mero/hotplug/usb.wireless.function remove");
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(ran.out, HasSubstr("usb.wireless.function: /tmp/wireless.info was in the way, and is "
                                 "/tmp/wireless.info.foreign-"));
  EXPECT_EQ(RunInShell("cat /tmp/wireless.info.foreign-*/file").out, "kept\n");
}

TEST_F(KitRivals, CannotReplaceTheNoteThatIsThereFromTheStartOn) {
  ASSERT_EQ(AsNobody("echo PRODUCT=theirs >" + kNote).out, "");
  const std::string line = "systemd-tmpfiles --create --remove --boot " APPLIANCE_KIT "/systemd/mero-wireless.conf";
  ASSERT_EQ(RunInShell(line).out, "");
  EXPECT_EQ(Note(), "regular empty file 644 0 1\n");
  EXPECT_NE(AsNobody("rm -f " + kNote).status, 0);
  EXPECT_NE(AsNobody("ln -sf /etc/victim " + kNote).status, 0);

  // Nor is it cleaned up, however old. That its inode has not changed for long cannot be made up: it is not asked for.
  WriteText("/tmp/age.conf", "d /tmp 1777 root root m:10d\n");
  ASSERT_EQ(RunInShell("touch -d 2001-01-01 " + kNote +
                       " /tmp/other; "
                       "systemd-tmpfiles --clean /tmp/age.conf " APPLIANCE_KIT "/systemd/mero-wireless.conf")
                .out,
            "");
  EXPECT_TRUE(fs::exists(kNote));
  EXPECT_FALSE(fs::exists("/tmp/other"));
}

// Anybody could open the lock, and hold it: every run failed after its 60 s.
TEST_F(KitRivals, CannotHoldUpARun) {
  for (const char* szUmask : {"000", "022", "077"}) {
    fs::remove_all(kState);
    ASSERT_EQ(RunInShell(std::string("umask ") + szUmask + "; /etc/rc.network boot").out, "");
    EXPECT_EQ(RunInShell("stat -c '%a %u' " + kState + " " + kState + "/lock").out, "700 0\n600 0\n") << szUmask;
    EXPECT_NE(AsNobody("flock -n " + kState + "/lock true").status, 0) << szUmask;
    EXPECT_NE(AsNobody("flock -n " + kState + " true").status, 0) << szUmask;
  }
}

TEST_F(KitRivals, CannotHoldUpARunWithALockThatWasOpenToThem) {
  for (const char* szMade :
       {"mkdir -m 755 /run/rc.network; touch /run/rc.network/lock",
        "mkdir -m 777 /run/rc.network; touch /run/rc.network/lock; chmod 666 /run/rc.network/lock"}) {
    fs::remove_all(kState);
    ASSERT_EQ(RunInShell(szMade).out, "");
    const Ran ran = RunInShell(
        "setpriv --reuid=65534 --regid=65534 --clear-groups flock /run/rc.network/lock sleep 30 >/dev/null 2>&1 & "
        "until ! flock -n /run/rc.network/lock true; do sleep 0.05; done; timeout 10 /etc/rc.network boot; echo $?; "
        "kill $!");
    EXPECT_EQ(ran.out, "rc.network: removed from /var/run/rc.network what was not root's alone: lock\n0\n") << szMade;
    EXPECT_EQ(RunInShell("timeout 10 /etc/rc.network boot").out, "");
  }
}

TEST_F(KitRivals, LeaveNothingInTheDirectoryOfWhatRuns) {
  ASSERT_EQ(RunInShell("mkdir -m 777 " + kState + "; echo 0 >" + kState + "/ip_forward; ln /run/victim " + kState +
                       "/hostapd-wlan1.log")
                .out,
            "");
  ASSERT_EQ(
      AsNobody("cd " + kState +
               "; ln -s /etc/victim hostapd-wlan0.conf; mkfifo -m 666 hostapd-wlan0.log; mkdir dnsmasq-gbr.conf; "
               "echo x >dnsmasq-gbr.conf/x; echo 1 >hostapd-wlan0.pid; ln -s /etc lock; ln -s /etc/victim \"a b\"")
          .out,
      "");
  const Ran ran = RunInShell("timeout 10 /etc/rc.network boot");
  EXPECT_EQ(ran.status, 0);
  EXPECT_THAT(ran.out, HasSubstr("rc.network: removed from /var/run/rc.network what was not root's alone: "));
  EXPECT_EQ(RunInShell("ls -A " + kState + "; stat -c %a " + kState).out, "ip_forward\nlock\n700\n");
  EXPECT_EQ(RunInShell("timeout 10 /etc/rc.network boot").out, "");
}

// The pid files of servers that ran since before an upgrade would be gone, and nobody could end the servers.
TEST_F(KitRivals, AreNotTakenForAServerThatRuns) {
  const std::string pid = "/var/run/rc.network/dnsmasq-lbr0.pid";
  ASSERT_EQ(
      RunInShell("mkdir -m 755 /run/rc.network; dnsmasq --conf-file=/dev/null --port=0 --user=nobody --pid-file=" +
                 pid + "; cp " + pid + " /run/rc.network/dnsmasq-other.pid; chown 65534 /run/rc.network/*")
          .out,
      "");
  EXPECT_EQ(RunInShell("/etc/rc.network boot").out,
            "rc.network: removed from /var/run/rc.network what was not root's alone: dnsmasq-other.pid\n");
  EXPECT_EQ(RunInShell("stat -c %u " + pid + "; read -r server <" + pid + "; kill $server").out, "0\n");
}

TEST_F(KitRivals, CannotLookIntoADirectoryThatRootHasMade) {
  ASSERT_EQ(RunInShell("mkdir -m 755 /run/rc.network && /etc/rc.network boot").out, "");
  EXPECT_EQ(RunInShell("stat -c %a " + kState).out, "700\n");
}

TEST_F(KitRivals, HaveADirectoryOfTheirOwnMovedAside) {
  for (const char* szMade : {"mkdir -m 777 /run/rc.network; chown 65534:65534 /run/rc.network",
                             "mkdir -m 777 /tmp/theirs; ln -s /tmp/theirs /run/rc.network", "mkfifo /run/rc.network",
                             "touch /run/rc.network", "ln -s /etc/nowhere /run/rc.network"}) {
    ASSERT_EQ(RunInShell(szMade).out, "") << szMade;
    const Ran ran = RunInShell("timeout 10 /etc/rc.network boot");
    EXPECT_EQ(ran.status, 0) << szMade;
    EXPECT_THAT(ran.out, HasSubstr("rc.network: /var/run/rc.network was in the way, and is "
                                   "/var/run/rc.network.foreign-"))
        << szMade;
    EXPECT_EQ(RunInShell("stat -c '%F %a %u' " + kState + "; ls -A " + kState).out, "directory 700 0\nlock\n")
        << szMade;
    EXPECT_EQ(RunInShell("ls -A /tmp/theirs 2>/dev/null").out, "") << szMade;
    RunInShell("rm -rf /run/rc.network* /tmp/theirs");
  }
}

}  // namespace
