// Writing the access-point daemon's files: the effects on the daemon, the interface and the files.
#include <fcntl.h>
#include <sys/stat.h>

#include <climits>
#include <set>

#include "hostapd_files.h"
#include "hostile_texts.h"
#include "reports.h"

namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::Not;
using testing::UnorderedElementsAre;

constexpr char kModel[] = "/etc.defaults/meroinfo.conf";
const std::string kListsDaemons = "ps | grep hostapd | grep wlan0 | awk {'print $1'}";

// All that writing the files does while a daemon runs.
const Effects kCourse = {
    "popen(" + kListsDaemons + ", r)",
    "kill(4711, 15)",
    "PLIBNetIfDown(wlan0)",
    "PLIBCSysUnlink(" + kHostFile + ")",
    "PLIBCExec(/bin/mkdir, -p, /etc/hostapd, null, null)",
    "PLIBCFileCheckKeyValue(/etc.defaults/meroinfo.conf, support_pci_wifi, yes, 0)",
    "pclose(&)",
};

std::string ReportOf(const std::string& message) {
  return fake::Report("wireless_hostap_conf_set:# " + message);
}

Effects ReportsOf(const std::vector<std::string>& messages) {
  Effects reports;
  for (const std::string& message : messages) reports.push_back(ReportOf(message));
  return reports;
}

// The course with reports behind a step, and with no step between these and the end when it is given up.
Effects CourseWith(const std::string& step, const std::vector<std::string>& messages, bool isGivenUp) {
  const auto at = std::ranges::find(kCourse, step);
  EXPECT_NE(at, kCourse.end()) << step;
  Effects course(kCourse.begin(), at + 1);
  for (const std::string& report : ReportsOf(messages)) course.push_back(report);
  course.insert(course.end(), isGivenUp ? kCourse.end() - 1 : at + 1, kCourse.end());
  return course;
}

class WritingHostapdFiles : public HostapdFilesTest {
 protected:
  WritingHostapdFiles() { Begin(); }

  static void Begin() {
    HostapdFilesTest::Begin();
    std::filesystem::create_directory("/etc/hostapd");
  }

  // From here on a daemon runs too.
  static void BeginWithDaemon() {
    Begin();
    fake::PipesGive({"4711\n"});
  }

  static Effects Messages() {
    Effects messages = WithoutLines(fake::Messages());
    const std::string unit = "wireless_hostap_conf_set:# ";
    for (std::string& message : messages) {
      if (message.starts_with(unit)) message.erase(0, unit.size());
    }
    return messages;
  }

  // The three files as they are after a write in which nothing fails.
  struct Files {
    std::string host, guest, guestInfo;
    bool operator==(const Files&) const = default;
  };
  static Files FilesNow() { return {TextOf(kHostFile), TextOf(kGuestFile), TextOf(kGuestInfoFile)}; }

  // Of a device that stands in a file's place there is no end.
  static std::string TextOf(const std::string& path) {
    return std::filesystem::is_regular_file(path) ? ReadText(path) : "";
  }

  Files WholeFiles() {
    EXPECT_EQ(Write(), TRUE);
    return FilesNow();
  }
};

TEST_F(WritingHostapdFiles, EndsTheDaemonAndTakesTheInterfaceDownFirst) {
  BeginWithDaemon();
  WriteText(kHostFile, "old");
  fake::PLIBNetIfDown.Does([](const char*) {
    EXPECT_EQ(ReadText(kHostFile), "old");
    return 1;
  });
  fake::PLIBCFileCheckKeyValue.Does([](const char*, const char*, const char*, int) {
    EXPECT_NE(ReadText(kHostFile), "old");
    EXPECT_FALSE(Exists(kGuestFile));
    EXPECT_FALSE(Exists(kGuestInfoFile));
    return 1;
  });
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(kCourse));
  EXPECT_THAT(ReadText(kHostFile), AllOf(HasSubstr("interface=wlan0\n"), HasSubstr("ssid=Home\n")));
  EXPECT_THAT(ReadText(kGuestFile), HasSubstr("ssid=Guest\n"));
  EXPECT_EQ(ReadText(kGuestInfoFile), "enable=no\n");
}

TEST_F(WritingHostapdFiles, CreatesTheirDirectory) {
  HostapdFilesTest::Begin();
  EXPECT_FALSE(Exists("/etc/hostapd"));
  EXPECT_EQ(Write(), TRUE);
  EXPECT_TRUE(Exists(kHostFile));
}

TEST_F(WritingHostapdFiles, NeedsAnInterface) {
  for (MERO_HOSTAP_CONF* pConf : {&conf_, static_cast<MERO_HOSTAP_CONF*>(nullptr)}) {
    Begin();
    EXPECT_EQ(MEROWirelessSetHostAPConf(nullptr, pConf), FALSE);
    EXPECT_THAT(Steps(), ElementsAre(ReportOf("Bad parameter.")));
  }
}

// ---- The daemon that runs ----

TEST_F(WritingHostapdFiles, EndsTheFirstDaemonThatIsListed) {
  for (const char* szOutput :
       {"4711\n", "4711", "  4711\n", "\n\n\t4711\n", "4711\n4712\n4713\n", "4711 4712", "4711x"}) {
    Begin();
    fake::PipesGive({szOutput});
    EXPECT_EQ(Write(), TRUE);
    EXPECT_THAT(Steps(), ElementsAreArray(kCourse)) << szOutput;
  }
}

TEST_F(WritingHostapdFiles, EndsNothingWhenNoProcessIsListed) {
  Effects course = kCourse;
  std::erase(course, "kill(4711, 15)");
  for (const char* szOutput : {"", "\n", " ", "hostapd\n", "PID\n4711\n", "x4711\n", "-\n", "-x"}) {
    Begin();
    fake::PipesGive({szOutput});
    EXPECT_EQ(Write(), TRUE);
    EXPECT_THAT(Steps(), ElementsAreArray(course)) << szOutput;
  }
}

// To kill() these are many processes, or all.
TEST_F(WritingHostapdFiles, EndsNothingForANumberThatIsNoProcess) {
  for (const char* szOutput : {"0\n", "-0\n", "-1\n", "-4711\n", "0 4711\n"}) {
    Begin();
    fake::PipesGive({szOutput});
    EXPECT_EQ(Write(), TRUE);
    EXPECT_EQ(fake::kill.calls(), 0) << szOutput;
  }
}

TEST_F(WritingHostapdFiles, GoesOnWhenProcessesCannotBeListed) {
  Effects course = kCourse;
  std::erase(course, "kill(4711, 15)");
  std::erase(course, "pclose(&)");
  fake::PipesGive({fake::kNoPipe});
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(course));
}

TEST_F(WritingHostapdFiles, GoesOnWhenTheDaemonCannotBeEnded) {
  const Files whole = WholeFiles();
  BeginWithDaemon();
  fake::kill.Returns(-1);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(CourseWith("kill(4711, 15)", {"Failed to kill hostapd"}, false)));
  EXPECT_EQ(FilesNow(), whole);
}

TEST_F(WritingHostapdFiles, GoesOnWhenTheInterfaceStaysUp) {
  const Files whole = WholeFiles();
  BeginWithDaemon();
  fake::PLIBNetIfDown.Returns(0);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(CourseWith("PLIBNetIfDown(wlan0)",
                                                   {"Failed to deactivate network interface [wlan0]."}, false)));
  EXPECT_EQ(FilesNow(), whole);
}

TEST_F(WritingHostapdFiles, TakesForSuccessWhateverIsNoFailure) {
  BeginWithDaemon();
  fake::kill.Returns(1);
  fake::PLIBNetIfDown.Returns(-1);
  fake::PLIBCSysUnlink.Returns(-1);
  fake::PLIBCFileCheckKeyValue.Returns(-1);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Steps(), ElementsAreArray(kCourse));
  EXPECT_TRUE(Exists(kGuestFile));
}

// ---- Failures ----

TEST_F(WritingHostapdFiles, WritesNothingWithoutTheirDirectory) {
  for (const int result : {-1, 1, 127, INT_MIN}) {
    BeginWithDaemon();
    WriteText(kHostFile, "old");
    WriteText(kGuestFile, "old guest");
    WriteText(kGuestInfoFile, "old info");
    fake::PLIBCExec.Returns(result);
    EXPECT_EQ(Write(), FALSE);
    EXPECT_THAT(Steps(), ElementsAreArray(CourseWith(kCourse[4], {"Failed to mkdir /etc/hostapd"}, true))) << result;
    EXPECT_EQ(FilesNow(), (Files{"", "old guest", "old info"}));
    EXPECT_FALSE(Exists(kHostFile));
  }
}

TEST_F(WritingHostapdFiles, SaysNothingWhenTheMainFileCannotBeOpenedAndLeavesThoseOfTheGuests) {
  BeginWithDaemon();
  std::filesystem::create_directory(kHostFile);
  fake::PLIBCSysUnlink.Returns(-1);
  WriteText(kGuestFile, "old guest");
  WriteText(kGuestInfoFile, "old info");
  EXPECT_EQ(Write(), FALSE);
  EXPECT_THAT(Steps(), ElementsAreArray(CourseWith(kCourse[4], {}, true)));
  EXPECT_EQ(FilesNow(), (Files{"", "old guest", "old info"}));
}

// In the place of a file: what cannot be opened, or what takes nothing.
void OccupyByDirectory(const std::string& path) {
  std::filesystem::create_directory(path);
}
void OccupyByFullDevice(const std::string& path) {
  std::filesystem::create_symlink("/dev/full", path);
}

TEST_F(WritingHostapdFiles, FailsWhenAFileOfTheGuestsCannotBeWrittenAndLeavesTheMainOneWhole) {
  const Files whole = WholeFiles();
  const std::string opening = "Failed to open file [";
  const std::string writing = "Failed to write file [";
  const struct {
    std::string path;
    void (*occupy)(const std::string& path);
    std::string message;
    Files left;
  } kFailures[] = {
      {kGuestInfoFile, OccupyByDirectory, opening, {whole.host, "", ""}},
      {kGuestInfoFile, OccupyByFullDevice, writing, {whole.host, "", ""}},
      {kGuestFile, OccupyByDirectory, opening, {whole.host, "", whole.guestInfo}},
      {kGuestFile, OccupyByFullDevice, writing, {whole.host, "", whole.guestInfo}},
  };
  for (const auto& row : kFailures) {
    HostapdFilesTest::Begin();
    BeginWithDaemon();
    row.occupy(row.path);
    EXPECT_EQ(Write(), FALSE);
    EXPECT_THAT(Steps(),
                ElementsAreArray(CourseWith(
                    kCourse[5], {row.message + row.path + "]", "Failed to set hostapd.conf for Guest Network"}, true)));
    EXPECT_EQ(FilesNow(), row.left) << row.message;
  }
}

TEST_F(WritingHostapdFiles, FailsWhenTheMainFileDoesNotReachTheDisk) {
  const Files whole = WholeFiles();
  HostapdFilesTest::Begin();
  BeginWithDaemon();
  OccupyByFullDevice(kHostFile);
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Write(), FALSE);
  EXPECT_THAT(Steps(), ElementsAreArray(CourseWith(kCourse[5], {"Failed to write file [" + kHostFile + "]"}, true)));
  EXPECT_EQ(FilesNow(), (Files{"", whole.guest, whole.guestInfo}));
}

TEST_F(WritingHostapdFiles, ReportsTheGuestsFailureAndTheMainOnes) {
  BeginWithDaemon();
  OccupyByFullDevice(kHostFile);
  OccupyByDirectory(kGuestFile);
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Write(), FALSE);
  EXPECT_THAT(Messages(),
              ElementsAre("Failed to open file [" + kGuestFile + "]", "Failed to set hostapd.conf for Guest Network",
                          "Failed to write file [" + kHostFile + "]"));
}

TEST_F(WritingHostapdFiles, LeavesThemWholeOrFailsWhenMemoryRunsOut) {
  const Files whole = WholeFiles();
  fake::PLIBCExec.Returns(0);
  memory::FailEach([this] { return MEROWirelessSetHostAPConf("wlan0", &conf_); },
                   [&](int n, BOOL result) {
                     if (result == FALSE) {
                       EXPECT_TRUE(memory::HasFailed()) << n;
                     } else {
                       EXPECT_EQ(FilesNow(), whole) << n;
                     }
                   });
}

// ---- Values that would be lines of their own ----

TEST_F(WritingHostapdFiles, RefusesALineFeedInAnyValue) {
  const std::string secret = "secret\nwpa=0";
  const struct {
    std::string key;
    std::string path;
    void (*set)(MERO_HOSTAP_CONF& conf, const std::string& value);
    std::string value;
  } kValues[] = {
      {"ssid", kHostFile, [](auto& conf, auto& value) { std::strcpy(conf.szSSID, value.c_str()); }, secret},
      {"bridge", kHostFile, [](auto& conf, auto& value) { std::strcpy(conf.szBridge, value.c_str()); }, secret},
      {"wep_key0", kHostFile, [](auto& conf, auto& value) { SetWep(conf, value); }, "a\nb=c"},
      {"wep_key0", kHostFile, [](auto& conf, auto& value) { SetWep(conf, value); }, "01234\nb=cd"},
      {"wpa_passphrase", kHostFile, [](auto& conf, auto& value) { SetPsk(conf, 2, 2, value); }, secret},
      {"auth_server_addr", kHostFile,
       [](auto& conf, auto& value) {
         SetEap(conf, 2, 2);
         std::strcpy(conf.encryptInfo.wpaEapInfo.szAuthIP, value.c_str());
       },
       secret},
      {"auth_server_shared_secret", kHostFile,
       [](auto& conf, auto& value) {
         SetEap(conf, 2, 2);
         std::strcpy(conf.encryptInfo.wpaEapInfo.szAuthSharedSecret, value.c_str());
       },
       secret},
      {"bssid", kGuestFile, [](auto& conf, auto& value) { std::strcpy(conf.guestNet.szBSSID, value.c_str()); }, secret},
      {"ssid", kGuestFile, [](auto& conf, auto& value) { std::strcpy(conf.guestNet.szSSID, value.c_str()); }, secret},
      {"wep_key0", kGuestFile, [](auto& conf, auto& value) { SetWep(conf.guestNet, value); }, "a\nb=c"},
      {"wpa_passphrase", kGuestFile, [](auto& conf, auto& value) { SetPsk(conf.guestNet, 2, 2, value); }, secret},
      {"ssid", kHostFile, [](auto& conf, auto& value) { std::strcpy(conf.szSSID, value.c_str()); }, "\n"},
      {"ssid", kHostFile, [](auto& conf, auto& value) { std::strcpy(conf.szSSID, value.c_str()); }, "Home\n"},
  };
  for (const auto& row : kValues) {
    Begin();
    conf_ = HomeAccessPoint();
    row.set(conf_, row.value);
    EXPECT_EQ(Write(), FALSE) << row.key;
    Effects messages = {"The value of " + row.key + " holds a line feed", "Failed to write file [" + row.path + "]"};
    if (row.path == kGuestFile) messages.push_back("Failed to set hostapd.conf for Guest Network");
    EXPECT_THAT(Messages(), ElementsAreArray(messages));
    EXPECT_THAT("\n" + ReadText(row.path), Not(HasSubstr("\n" + row.key + "="))) << "refused, and still written";
  }
}

TEST_F(WritingHostapdFiles, RefusesALineFeedInTheInterfacesName) {
  EXPECT_EQ(Write("wlan0\nssid=x"), FALSE);
  EXPECT_THAT(Messages(), ElementsAre("The value of interface holds a line feed",
                                      "Failed to write file [/etc/hostapd/hostapd-wlan0\nssid=x-host.conf]"));
}

TEST_F(WritingHostapdFiles, DoesNotLookAtValuesThatAreNotWritten) {
  SetPsk(conf_, TYPE_WPA2, TYPE_CCMP, "a\nb");
  SetPsk(conf_.guestNet, TYPE_WPA2, TYPE_CCMP, "a\nb");
  conf_.encryption = conf_.guestNet.encryption = AP_ENCRYPT_OPEN;
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(Messages(), IsEmpty());
}

// ---- Models without a guest network ----

TEST_F(WritingHostapdFiles, WritesThoseOfTheGuestsOnModelsWithABuiltInCard) {
  const struct {
    const char* szModel;
    bool hasCard;
  } kModels[] = {
      {"support_pci_wifi=yes\n", true},
      {"unique=x\nsupport_pci_wifi=\"yes\"\n", true},
      {"support_pci_wifi=no\n", false},
      {"support_pci_wifi=Yes\n", false},
      {"support_pci_wifi=yes!\n", false},
      {"support_pci_wifi=\n", false},
      {"support_usb_wifi=yes\n", false},
      {"", false},
      {nullptr, false},
  };
  for (const auto& row : kModels) {
    Begin();
    WriteText(kGuestFile, "old guest");
    WriteText(kGuestInfoFile, "old info");
    // The model is described where nothing can be written, and so from elsewhere here.
    const std::string description = "/tmp/model.conf";
    std::filesystem::remove(description);
    if (row.szModel != nullptr) WriteText(description, row.szModel);
    fake::PLIBCFileCheckKeyValue.Does([&](const char* szPath, const char* szKey, const char* szValue, int flags) {
      EXPECT_STREQ(szPath, kModel);
      return fake::PLIBCFileCheckKeyValue.Real(description.c_str(), szKey, szValue, flags);
    });
    EXPECT_EQ(Write(), TRUE);
    EXPECT_THAT(Messages(), IsEmpty());
    EXPECT_THAT(ReadText(kHostFile), HasSubstr("ssid=Home\n"));
    EXPECT_EQ(ReadText(kGuestFile) != "old guest", row.hasCard) << row.szModel;
    EXPECT_EQ(ReadText(kGuestInfoFile) != "old info", row.hasCard) << row.szModel;
  }
}

// ---- Old files, and who may read the new ones ----

TEST_F(WritingHostapdFiles, LeavesNothingOfLongerOnes) {
  const Files whole = WholeFiles();
  for (const std::string& path : {kHostFile, kGuestFile, kGuestInfoFile}) WriteText(path, std::string(10000, 'x'));
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(WholeFiles(), whole);
}

TEST_F(WritingHostapdFiles, ReplacesTheMainOneInsteadOfWhatItsNamePointsTo) {
  WriteText("/tmp/elsewhere", "untouched");
  std::filesystem::create_symlink("/tmp/elsewhere", kHostFile);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_EQ(ReadText("/tmp/elsewhere"), "untouched");
  EXPECT_TRUE(std::filesystem::is_regular_file(std::filesystem::symlink_status(kHostFile)));
}

TEST_F(WritingHostapdFiles, CreatesThoseWithSecretsForTheirOwnerAlone) {
  for (const mode_t mask : {0u, 022u, 077u}) {
    HostapdFilesTest::Begin();
    Begin();
    const mode_t before = umask(mask);
    WriteText(kHostFile, "old");
    std::filesystem::permissions(kHostFile, std::filesystem::perms(0666));
    EXPECT_EQ(Write(), TRUE);
    umask(before);
    EXPECT_EQ(ModeOf(kHostFile), 0600u);
    EXPECT_EQ(ModeOf(kGuestFile), 0600u);
    EXPECT_EQ(ModeOf(kGuestInfoFile), 0644u);
  }
}

TEST_F(WritingHostapdFiles, LeavesTheModesThatTheGuestsFilesHave) {
  for (const std::string& path : {kGuestFile, kGuestInfoFile}) {
    WriteText(path, "");
    std::filesystem::permissions(path, std::filesystem::perms(0640));
  }
  EXPECT_EQ(Write(), TRUE);
  EXPECT_EQ(ModeOf(kGuestFile), 0640u);
  EXPECT_EQ(ModeOf(kGuestInfoFile), 0640u);
}

// ---- In a real shell ----

class EndingADaemonInAShell : public WritingHostapdFiles {
 protected:
  EndingADaemonInAShell() { BeginInAShell(); }

  static void BeginInAShell() {
    Begin();
    fake::popen.Does([](const char* szCommand, const char* szMode) { return fake::popen.Real(szCommand, szMode); });
    fake::pclose.Does([](FILE* pipe) { return fake::pclose.Real(pipe); });
    ForgetCalls();
  }
};

// The processes as the appliance lists them.
TEST_F(EndingADaemonInAShell, FindsItAmongTheProcesses) {
  const std::string others =
      "  PID USER       VSZ STAT COMMAND\n"
      "    1 root      1234 S    init\n"
      "   17 root      1234 S    hostapd /etc/hostapd/hostapd-wlan1-host.conf\n"
      "   18 root      1234 S    wpa_supplicant -iwlan0\n";
  const std::string daemons =
      "  471 root      1234 S    hostapd /etc/hostapd/hostapd-wlan0-host.conf\n"
      "  472 root      1234 S    hostapd /etc/hostapd/hostapd-wlan0-host.conf\n";
  WriteScript("/usr/bin/ps", "cat /tmp/processes\n");

  WriteText("/tmp/processes", others);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_EQ(fake::kill.calls(), 0);

  WriteText("/tmp/processes", others + daemons);
  EXPECT_EQ(Write(), TRUE);
  EXPECT_THAT(fake::EffectsOf({"kill"}), ElementsAre("kill(471, 15)"));
}

TEST_F(EndingADaemonInAShell, LooksForAnInterfaceOfAnyNameUnchanged) {
  InstallNoter("/usr/bin/grep");
  for (const std::string& name : kHostileTexts) {
    BeginInAShell();
    const bool namesAFile = name.find_first_of("/\n") == std::string::npos;
    EXPECT_EQ(Write(name.c_str()), namesAFile ? TRUE : FALSE) << name;
    EXPECT_THAT(NotedCalls(), UnorderedElementsAre(Call{"/usr/bin/grep", "hostapd"}, Call{"/usr/bin/grep", name}))
        << name;
    EXPECT_THAT(fake::EffectsOf({"PLIBNetIfDown", "kill"}), ElementsAre("PLIBNetIfDown(" + name + ")"));
    EXPECT_EQ(TextOrNothing("/etc/hostapd/hostapd-" + name + "-host.conf").starts_with("interface=" + name + "\n"),
              namesAFile)
        << name;
    EXPECT_FALSE(HasIntruder()) << name;
  }
}

TEST_F(EndingADaemonInAShell, LooksForAnEmptyNameAsAWord) {
  InstallNoter("/usr/bin/grep");
  EXPECT_EQ(Write(""), TRUE);
  EXPECT_THAT(NotedCalls(), UnorderedElementsAre(Call{"/usr/bin/grep", "hostapd"}, Call{"/usr/bin/grep", ""}));
}

// A command has up to 1023 bytes.
TEST_F(EndingADaemonInAShell, LooksForTheWholeNameOrForNone) {
  const size_t room = 1023 - (kListsDaemons.size() - std::strlen("wlan0"));
  fake::PipesGive({"4711\n"});
  EXPECT_EQ(Write(std::string(room, 'w').c_str()), FALSE);  // no file can be named like that
  EXPECT_THAT(fake::EffectsOf({"kill", "pclose"}), ElementsAre("kill(4711, 15)", "pclose(&)"));

  BeginWithDaemon();
  fake::PLIBCSysUnlink.Returns(-1);
  EXPECT_EQ(Write(std::string(room + 1, 'w').c_str()), FALSE);
  EXPECT_THAT(fake::EffectsOf({"popen", "kill", "pclose"}), IsEmpty());
  EXPECT_THAT(Messages(), IsEmpty());
}

// Descriptors that a program which is started now would have.
std::set<int> InheritedDescriptors() {
  std::set<int> inherited = OpenDescriptors();
  std::erase_if(inherited, [](int fd) { return (fcntl(fd, F_GETFD) & FD_CLOEXEC) != 0; });
  return inherited;
}

TEST_F(EndingADaemonInAShell, KeepsItsDescriptorsToItself) {
  const std::set<int> before = InheritedDescriptors();
  int nLooks = 0;
  const auto look = [&] {
    EXPECT_EQ(InheritedDescriptors(), before);
    ++nLooks;
  };
  fake::PLIBCExec.Does([&](const char*, const char*, const char*, const char*, const char*) {
    look();
    return 0;
  });
  fake::PLIBCFileCheckKeyValue.Does([&](const char*, const char*, const char*, int) {
    look();
    return 1;
  });
  EXPECT_EQ(Write(), TRUE);
  EXPECT_EQ(nLooks, 2);
}

}  // namespace
