// The traces of a connection: its record, a media service that knows of it, and a copy of the resolver's settings.
#include <sys/mount.h>
#include <sys/stat.h>

#include <functional>

#include "hostile_texts.h"
#include "joining.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// ---- The record ----

class ConnectionRecord : public JoiningTest {};

TEST_F(ConnectionRecord, HoldsNameProtocolAuthenticationEncryptionAndAddressOnALineEach) {
  WriteText(kRecord, std::string(1000, 'x'));
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(ReadText(kRecord), "Home Net\n7\n5\n8\n00:11:22:AA:BB:CC\n");
}

TEST_F(ConnectionRecord, HoldsNumbersAndAddressesAsTheyAre) {
  config_.network.protocol = static_cast<WIRELESS_PROTOCOL>(12);
  config_.network.auth = WIRELESS_AUTH_WPA2EAP;
  config_.network.encrypt = static_cast<WIRELESS_ENCRYPT>(12);
  config_.noneBssid = 0;
  std::memset(config_.network.bssid, 0, 6);
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(ReadText(kRecord), "Home Net\n12\n8\n12\n00:00:00:00:00:00\n");

  config_.network.protocol = WIRELESS_PROTO_UNKNOWN;
  config_.network.auth = WIRELESS_AUTH_OPEN;
  config_.network.encrypt = WIRELESS_ENCRYPT_UNKNOWN;
  config_.network.szEssid[0] = '\0';
  std::memset(config_.network.bssid, 0xff, 6);
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(ReadText(kRecord), "\n0\n1\n0\nFF:FF:FF:FF:FF:FF\n");
}

TEST_F(ConnectionRecord, HoldsTheAccessPointAlsoWhenTheNameAloneCounts) {
  config_.noneBssid = 1;
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(ReadText(kRecord), testing::EndsWith("\n00:11:22:AA:BB:CC\n"));
}

TEST_F(ConnectionRecord, HoldsNamesAsTheyAre) {
  for (const std::string& name : kHostileTexts) {
    if (name.find('\n') != std::string::npos) continue;
    std::strcpy(config_.network.szEssid, name.c_str());
    EXPECT_EQ(Join(), 0);
    EXPECT_EQ(ReadText(kRecord), name + "\n7\n5\n8\n00:11:22:AA:BB:CC\n");
  }
}

TEST_F(ConnectionRecord, CanBeReadByOtherProgramsWhateverTheUmask) {
  for (const mode_t mask : {0022u, 0000u, 0077u}) {
    const mode_t before = umask(mask);
    EXPECT_EQ(Join(), 0);
    umask(before);
    EXPECT_EQ(ModeOf(kRecord), 0644u) << mask;
  }
}

// Has the record's name in use again as soon as the old record is gone.
template <class Occupy>
void OccupyWhenRemoved(Occupy occupy) {
  fake::PLIBCSysUnlink.Does([occupy](const char* szPath) {
    const int result = fake::PLIBCSysUnlink.Real(szPath);
    if (szPath == kRecord) occupy();
    return result;
  });
}

const std::vector<std::string> kCannotRecord = {"wireless_network_connect:# Failed to record this connection.",
                                                "wireless_network_connect:# Failed to connect network."};

TEST_F(ConnectionRecord, IsGoneWhenTheNewOneCannotBeWrittenAndTheSupplicantStays) {
  WriteText(kRecord, "old");
  WriteText(kResolver, "");
  OccupyWhenRemoved([] {
    EXPECT_FALSE(Exists(kRecord));
    std::filesystem::create_directory(kRecord);
  });
  EXPECT_EQ(Join(), -1);
  EXPECT_THAT(WithoutLines(fake::Messages()), testing::ElementsAreArray(kCannotRecord));
  EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant)));
  EXPECT_EQ(fake::PLIBCFileCheckKeyValue.calls(), 0);
  EXPECT_FALSE(Exists(kMarker));
}

// Whoever is quick enough to put a link there had it written to what it points to, and any file of theirs failed a
// connection that was up.
TEST_F(ConnectionRecord, TakesThePlaceOfWhatIsPutThereMeanwhile) {
  WriteText("/var/tmp/elsewhere", "theirs");
  for (const auto& occupy : std::vector<std::function<void()>>{
           [] { std::filesystem::create_symlink("/var/tmp/elsewhere", kRecord); },
           [] { std::filesystem::create_symlink("/var/tmp/missing", kRecord); },
           [] { std::filesystem::create_hard_link("/var/tmp/elsewhere", kRecord); },
           [] { ASSERT_EQ(::mkfifo(kRecord.c_str(), 0666), 0); },
       }) {
    Begin();
    OccupyWhenRemoved(occupy);
    EXPECT_EQ(Join(), 0);
    EXPECT_THAT(fake::Messages(), IsEmpty());
    EXPECT_TRUE(std::filesystem::is_regular_file(std::filesystem::symlink_status(kRecord)));
    EXPECT_EQ(ReadText(kRecord), "Home Net\n7\n5\n8\n00:11:22:AA:BB:CC\n");
    EXPECT_EQ(ReadText("/var/tmp/elsewhere"), "theirs");
    EXPECT_FALSE(Exists("/var/tmp/missing"));
  }
}

// A full disk ended a connection that was up.
TEST_F(ConnectionRecord, ThatDoesNotReachTheDiskIsReportedAndRemovedAndTheConnectionStays) {
  ASSERT_EQ(::mount("small", "/var/tmp", "tmpfs", 0, "size=4k"), 0);
  WriteText("/var/tmp/full", std::string(1 << 12, 'x'));
  EXPECT_EQ(Join(), 0);
  EXPECT_FALSE(Exists(kRecord));
  EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant)));
  EXPECT_THAT(WithoutLines(fake::Messages()),
              ElementsAre("wireless_network_connect:# Failed to write file [" + kRecord + "]"));
  EXPECT_EQ(::umount("/var/tmp"), 0);
}

// An empty file stayed beside the record's place when memory ran out between making it and writing to it.
TEST_F(ConnectionRecord, ThatFindsNoMemoryLeavesNoFileBehind) {
  std::vector<std::string> names = NamesIn("/var/tmp");
  names.push_back(std::filesystem::path(kRecord).filename());
  int failures = 0;
  memory::FailEach([this] { return MEROWirelessNetworkConnect(&config_); },
                   [&](int n, int result) {
                     failures += result < 0 ? 1 : 0;
                     EXPECT_THAT(NamesIn("/var/tmp"), testing::IsSubsetOf(names)) << n;
                   });
  EXPECT_GT(failures, 0);
  EXPECT_TRUE(Exists(kRecord));
}

TEST_F(ConnectionRecord, StaysWhenTheNetworkIsNotJoined) {
  WriteText(kRecord, "old");
  fake::PipesGive({""});
  EXPECT_EQ(Join(), -1);
  fake::system.Returns(-1);
  EXPECT_EQ(Join(), -1);
  config_.network.auth = WIRELESS_AUTH_UNKNOWN;
  EXPECT_EQ(Join(), -1);
  EXPECT_EQ(ReadText(kRecord), "old");
}

// ---- The media service and the resolver ----

class AfterJoining : public JoiningTest {};

TEST_F(AfterJoining, TheMediaServiceIsToldWhenItRunsOnTheInterface) {
  const struct {
    const char* szIfName;
    const char* szSettings;
    bool told;
  } kCases[] = {
      {"wlan0", "runmediaservice=yes\nnetwork_mediaservice=wlan0\n", true},
      {"wlan0", "network_mediaservice=\"wlan0\"\nother=x\nrunmediaservice=\"yes\"\n", true},
      {"usb7", "runmediaservice=yes\nnetwork_mediaservice=usb7\n", true},
      {"usb7", "runmediaservice=yes\nnetwork_mediaservice=wlan0\n", false},
      {"wlan0", "runmediaservice=no\nnetwork_mediaservice=wlan0\n", false},
      {"wlan0", "runmediaservice=Yes\nnetwork_mediaservice=wlan0\n", false},
      {"wlan0", "runmediaservice=\nnetwork_mediaservice=wlan0\n", false},
      {"wlan0", "runmediaservice=yes\nnetwork_mediaservice=wlan01\n", false},
      {"wlan0", "runmediaservice=yes\nnetwork_mediaservice=WLAN0\n", false},
      {"wlan0", "runmediaservice=yes\nnetwork_mediaservice=\n", false},
      {"wlan0", "runmediaservice=yes\n", false},
      {"wlan0", "network_mediaservice=wlan0\n", false},
      {"wlan0", "", false},
  };
  for (const auto& row : kCases) {
    Begin();
    fake::MEROWirelessInterfaceGet.Returns(row.szIfName);
    WriteText(kSystemSettings, row.szSettings);
    EXPECT_EQ(Join(), 0);
    const Effects expected = row.told ? Effects{"MEROMediaService(2)"} : Effects{};
    EXPECT_EQ(fake::EffectsOf({"MEROMediaService"}), expected) << row.szSettings;
  }
}

TEST_F(AfterJoining, TheMediaServiceIsAskedAboutInTheSystemsSettings) {
  fake::PLIBCFileCheckKeyValue.Returns(-1);  // not zero: it is so
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(
      fake::EffectsOf({"PLIBCFileCheckKeyValue", "MEROMediaService"}),
      ElementsAre("PLIBCFileCheckKeyValue(/etc/meroinfo.conf, runmediaservice, yes, 0)",
                  "PLIBCFileCheckKeyValue(/etc/meroinfo.conf, network_mediaservice, wlan0, 0)", "MEROMediaService(2)"));
}

// The interface's name was asked for in any case.
TEST_F(AfterJoining, TheInterfaceIsAskedForOnlyWhenTheMediaServiceRuns) {
  const Effects asks = {"MEROWirelessInterfaceGet()"};
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::EffectsOf({"MEROWirelessInterfaceGet"}), asks);  // to join on it
  WriteText(kSystemSettings, "runmediaservice=yes\n");
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(fake::EffectsOf({"MEROWirelessInterfaceGet"}), asks + asks + asks);
}

TEST_F(AfterJoining, AMediaServiceThatFailsIsNoFailureOfTheConnection) {
  WriteText(kSystemSettings, "runmediaservice=yes\nnetwork_mediaservice=wlan0\n");
  WriteText(kResolver, "");
  fake::MEROMediaService.Returns(-1);
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(fake::Messages(), IsEmpty());
  EXPECT_THAT(fake::EffectsOf({"MEROMediaService", "system"}),
              ElementsAre(RunOf(kStartsSupplicant), "MEROMediaService(2)", RunOf(kSavesResolver)));
}

TEST_F(AfterJoining, TheResolverIsSavedWhenThereIsOne) {
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(fake::EffectsOf({"system"}), ElementsAre(RunOf(kStartsSupplicant)));
  WriteText(kResolver, "nameserver 10.0.0.1\n");
  EXPECT_EQ(Join(), 0);
  EXPECT_EQ(Last(fake::EffectsOf({"system"})), RunOf(kSavesResolver));
}

TEST_F(AfterJoining, AResolverThatCannotBeSavedIsReportedAndNoFailureOfTheConnection) {
  WriteText(kResolver, "");
  fake::system.Returns(0, -1);
  EXPECT_EQ(Join(), 0);
  EXPECT_THAT(WithoutLines(fake::Messages()),
              ElementsAre("wireless_network_connect:# Failed to execute '" + kSavesResolver + "'"));
  EXPECT_TRUE(Exists(kRecord));
  EXPECT_FALSE(Exists(kMarker));
}

// The supplicant's pid file could be written to by anybody, and the copy of the resolver's settings be read by nobody.
TEST_F(AfterJoining, CommandsHaveAnOrdinaryUmaskAndTheCallerKeepsItsOwn) {
  WriteText(kResolver, "");
  const auto current = [] {
    const mode_t mask = umask(0);
    umask(mask);
    return mask;
  };
  for (const mode_t mask : {0000u, 0077u}) {
    const mode_t before = umask(mask);
    std::vector<mode_t> seen;
    fake::system.Does([&](const char*) { return seen.push_back(current()), 0; });
    fake::PipesAnswer([&](std::string_view) { return seen.push_back(current()), "wpa_state=COMPLETED\n"; });
    EXPECT_EQ(Join(), 0);
    EXPECT_THAT(seen, ElementsAre(0022u, 0022u, 0022u)) << mask;
    EXPECT_EQ(current(), mask);
    umask(before);
  }
}

TEST_F(AfterJoining, NothingIsDoneForANetworkThatWasNotJoined) {
  WriteText(kSystemSettings, "runmediaservice=yes\nnetwork_mediaservice=wlan0\n");
  WriteText(kResolver, "");
  fake::PipesGive({""});
  EXPECT_EQ(Join(), -1);
  EXPECT_EQ(fake::MEROMediaService.calls(), 0);
  EXPECT_EQ(Last(fake::EffectsOf({"system"})), RunOf(kEndsSupplicant));
}

}  // namespace
