// The platform's operations that write or run something: the state in which each does its work, and what its contract,
// the comment in include/platform.h, says of failures.
#include <filesystem>
#include <memory>

#include "common/paths.h"
#include "common/text.h"
#include "platform.h"
#include "tests/fault/daemon.h"
#include "tests/fault/scene.h"
#include "tests/fault/subjects.h"
#include "tests/platform/containers.h"
#include "tests/support/files.h"
#include "tests/support/shell.h"

namespace fs = std::filesystem;

namespace {

using enum Exception;

constexpr char kSettings[] = "/usr/mero/etc/settings";
constexpr char kMissing[] = "/usr/mero/etc/missing";
constexpr char kKeyFormat[] = "%s=%s\n";
constexpr char kProgram[] = "/usr/mero/sbin/program";
constexpr char kMediaScript[] = "/etc/rc.mediaservice";
constexpr char kBusybox[] = "/usr/bin/busybox";
constexpr char kTimeout[] = "/usr/bin/timeout";

const std::string kReadScript = "Failed to read /etc/sysconfig/network-scripts/ifcfg-";
const std::string kWriteScript = "Failed to write /etc/sysconfig/network-scripts/ifcfg-";
const std::string kClientPid = InterfacePath(kDhcpClientPidFormat, "wlan0").c_str();

constexpr char kAsLongAsItRuns[] = "an operation blocks for the commands that it runs, however long that takes";
constexpr char kNothingLeased[] = "a lease script that is missing or fails keeps nobody from another network";
constexpr char kFewerChanged[] =
    "the next change of a file clears away what is left of one: the next call changes fewer";
constexpr char kStatusIsTheAnswer[] = "the exit status of the program is the answer";

// ---- States ----

// A hash that is filled before the calls.
const PLIBSZHASH* Pairs() {
  static TextHash pairs{{"KEY", "new"}, {"MORE", "value"}};
  return pairs.get();
}

void NothingMore(SimulatedDriver&) {}

void ThereAreKeys(SimulatedDriver&) {
  WriteText(kSettings, "# a comment\nFIRST=1\nKEY=old\nLAST=2\n", 0644);
}

void ThereAreSections(SimulatedDriver&) {
  (void)Pairs();
  WriteText(kSettings, "[one]\n\tKEY=1\n\n[two]\n\t# a comment\n\tKEY=2\n\tOTHER=3\n[three]\n\tKEY=4\n", 0600);
}

void ThereIsAProgram(SimulatedDriver&) {
  fs::create_directories("/usr/mero/sbin");
  StandIn(kProgram, ":");
}

void ThereIsAMediaService(SimulatedDriver&) {
  StandIn(kMediaScript, ":");
}

void TheAdapterKnowsNoNetworks(SimulatedDriver& driver) {
  driver.hasResults = false;
}

void ANetworkIsJoined(SimulatedDriver& driver) {
  driver.accessPoint = {2, 0, 0, 0, 0, 1};
  WriteText(kConnectionRecordPath, "Home\n1\n5\n8\n02:00:00:00:00:01\n", 0644);
  WriteText(kSupplicantPidPath, "", 0644);
  WriteText(kClientPid, "", 0644);
  Shell("ip address add 192.0.2.7/24 dev wlan0");
}

void AnAddressIsLeased(SimulatedDriver&) {
  WriteText(kClientPid, "", 0644);
  Shell("ip address add 192.0.2.7/24 dev wlan0");
}

// The stand-in for the client notes the process of a daemon that is there already.
void AServerAnswers(SimulatedDriver&) {
  WriteText("/tmp/busybox.pid", "", 0644);
  StandIn(kBusybox, "read -r pid </tmp/busybox.pid\necho $pid >" + kClientPid +
                        "\nexec /usr/sbin/ip address add 192.0.2.7/24 dev wlan0");
}

// ---- Calls ----

Answer Is(int result, int success, int failure) {
  return result == success ? Answer::kDone : result == failure ? Answer::kFailed : Answer::kWrong;
}

Answer Execute() {
  const int result = PLIBCExec(kProgram, "one", "two words", nullptr, nullptr);
  return result > 0 ? Answer::kLess : Is(result, 0, -1);
}

Answer SetBridge() {
  NETINFO netInfo{};
  netInfo.blManual = netInfo.blActive = TRUE;
  CopyText(netInfo.szInterface, "lbr1");
  CopyText(netInfo.szIp, "10.1.16.1");
  CopyText(netInfo.szMask, "255.255.255.0");
  BRIDGE_INFO bridgeInfo{};
  bridgeInfo.type = TYPE_NAT_MASTER;
  CopyText(bridgeInfo.info.szPrimary, "wlan0");
  return Is(MERONetSetBridgeConfig(&netInfo, &bridgeInfo), 0, -1);
}

Answer SetServer() {
  static constexpr MERO_DHCPD_CONF kConf = {.blEnable = FALSE,
                                            .autoTime = 30,
                                            .leaseTime = 600,
                                            .szRangeStart = "10.1.16.2",
                                            .szRangeEnd = "10.1.16.9",
                                            .szInterface = "lbr1",
                                            .szDomain = "",
                                            .szDns = "",
                                            .szSDns = "",
                                            .szSubnet = "",
                                            .szRouter = "",
                                            .szLeaseFile = "",
                                            .szTag = "lbr1"};
  return Is(MERONetSetDhcpServerConfigFiles(&kConf, 1), 1, 0);
}

Answer SetCard(BOOL blManual) {
  NETINFO netInfo{};
  netInfo.blManual = blManual;
  CopyText(netInfo.szInterface, "wlan0");
  CopyText(netInfo.szIp, "192.168.1.2");
  CopyText(netInfo.szMask, "255.255.255.0");
  return Is(MERONetSetCard1(&netInfo, 0), 0, -1);
}

// The record is untouched by a failure.
Answer Lease() {
  NETINFO netInfo{};
  CopyText(netInfo.szInterface, "wlan0");
  const int result = MEROIGetDHCPTestNetInfo(&netInfo, 1);
  const std::string_view leased = result == 0 ? "192.0.2.7" : "";
  return netInfo.szIp == leased ? Is(result, 0, -1) : Answer::kWrong;
}

// ---- The operations ----

// Of an operation that runs nothing.
Contract Reports(std::vector<std::string> failures, std::vector<Excuse> excuses = {}) {
  return {"", std::move(failures), {}, std::move(excuses), true};
}

// Of one that waits for what it runs.
Contract Runs(std::vector<std::string> failures, const std::vector<std::string>& commands,
              std::vector<Excuse> excuses = {}) {
  for (const std::string& command : commands) excuses.push_back({kWaits, command, kAsLongAsItRuns});
  return {"", std::move(failures), commands, std::move(excuses), true};
}

Subject InFile(const char* szName, std::function<void(SimulatedDriver&)> prepare, std::function<Answer()> call) {
  return {szName, std::move(prepare), std::move(call),
          Reports({"Failed to write /usr/mero/etc/", "Failed to read /usr/mero/etc/"})};
}

std::vector<Subject> OfFiles() {
  return {
      {"PLIBCFileTouch", NothingMore, [] { return Is(PLIBCFileTouch(kMissing), 0, -1); },
       Reports({"Failed to create /usr/mero/etc/missing"})},
      InFile("PLIBCFileSetKeyValue", ThereAreKeys,
             [] { return Is(PLIBCFileSetKeyValue(kSettings, "KEY", "new", kKeyFormat), 1, -1); }),
      InFile("PLIBCFileSetKeyValue, a new file", NothingMore,
             [] { return Is(PLIBCFileSetKeyValue(kMissing, "KEY", "new", kKeyFormat), 1, -1); }),
      InFile("PLIBCFileRemoveKey", ThereAreKeys,
             [] {
               const int result = PLIBCFileRemoveKey(kSettings, "KEY");
               return result == 0 ? Answer::kDone : Is(result, 1, -1);
             }),
      InFile("PLIBCFileAddSection", ThereAreSections,
             [] { return Is(PLIBCFileAddSection(kSettings, "four", Pairs(), kSectionLineFormat), 1, -1); }),
      InFile("PLIBCFileSetSection", ThereAreSections,
             [] { return Is(PLIBCFileSetSection(kSettings, "two", nullptr, Pairs(), kSectionLineFormat), 1, -1); }),
      InFile("PLIBCFileSetSectionValue", ThereAreSections,
             [] { return Is(PLIBCFileSetSectionValue(kSettings, "two", "KEY", "new", kSectionLineFormat), 0, -1); }),
      InFile("PLIBCFileRemoveSection", ThereAreSections,
             [] {
               const int result = PLIBCFileRemoveSection(kSettings, "two");
               return result == 0 ? Answer::kDone : Is(result, 1, -1);
             }),
      {"PLIBCSysUnlink", ThereAreKeys, [] { return Is(PLIBCSysUnlink(kSettings), 0, -1); },
       Reports({"Failed to remove /usr/mero/etc/settings"})},
      {"PLIBCSysRemove", ThereAreKeys, [] { return Is(PLIBCSysRemove(kSettings), 0, -1); },
       Reports({"Failed to remove /usr/mero/etc/settings"})},
  };
}

std::vector<Subject> OfCommands() {
  return {
      {"PLIBCExec", ThereIsAProgram, Execute,
       Runs({"Failed to run /usr/mero/sbin/program"}, {kProgram}, {{kLess, "", kStatusIsTheAnswer}})},
      {"MEROMediaService", ThereIsAMediaService, [] { return Is(MEROMediaService(2), 0, -1); },
       Runs({"Failed to find the media service", "Failed to run /etc/rc.mediaservice",
             "/etc/rc.mediaservice restart ended with status"},
            {kMediaScript})},
  };
}

std::vector<Subject> OfInterface() {
  const auto down = [] { Shell("ip link set wlan0 down"); };
  return {
      {"PLIBNetIfUp", TheAdapterKnowsNoNetworks, [] { return Is(PLIBNetIfUp("wlan0"), 1, 0); },
       Reports({"Failed to bring up wlan0"},
               {{kIgnores, "driver", "whether the adapter scans makes no difference to the result"}}),
       down},
      {"PLIBNetIfDown", NothingMore, [] { return Is(PLIBNetIfDown("wlan0"), 1, 0); },
       Reports({"Failed to take down wlan0"})},
      {"MEROWirelessOpmodeSet", NothingMore, [] { return Is(MEROWirelessOpmodeSet(WIRELESS_OPMODE_ADHOC), 0, -1); },
       Reports({"Failed to set the mode of wlan0"})},
      {"MERONetSetBridgeConfig", NothingMore, SetBridge,
       Reports({"Failed to make /etc/sysconfig", kWriteScript + "lbr1", kReadScript + "lbr1"})},
      {"MERONetSetDhcpServerConfigFiles", NothingMore, SetServer,
       Reports({"Failed to write /etc/dhcpd/", "Failed to read /etc/dhcpd/"},
               {{kStays, "/etc/dhcpd/.dhcpd-lbr1-lbr1.", kFewerChanged}})},
  };
}

// Daemons, and what they lease.
std::vector<Subject> OfConnection() {
  const auto supplicant = std::make_shared<Daemon>("wpa_supplicant", std::vector<std::string>{kSupplicantPidPath});
  const auto client = std::make_shared<Daemon>("busybox", std::vector<std::string>{kClientPid, "/tmp/busybox.pid"});
  const auto renew = [client] { client->Renew(); };
  return {
      {"MEROWirelessNetworkDisconnect", ANetworkIsJoined, [] { return Is(MEROWirelessNetworkDisconnect(), 0, -1); },
       Runs({"Failed to end the supplicant of wlan0", "Failed to end the DHCP client of wlan0",
             "Failed to leave the network of wlan0", "Failed to remove the addresses of wlan0",
             "Failed to forget the connection of wlan0", "Failed to look for the adapter"},
            {kLeaseScript}, {{kIgnores, kLeaseScript, kNothingLeased}}),
       [supplicant, client] { supplicant->Renew(), client->Renew(); }},
      {"MERONetSetCard1, a static address", AnAddressIsLeased, [] { return SetCard(TRUE); },
       Runs({"Failed to end the DHCP client of wlan0", "Failed to address wlan0", "Failed to make /etc/sysconfig",
             kWriteScript + "wlan0", kReadScript + "wlan0"},
            {kLeaseScript}, {{kIgnores, kLeaseScript, kNothingLeased}}),
       renew},
      {"MERONetSetCard1, DHCP", NothingMore, [] { return SetCard(FALSE); },
       Reports({"Failed to bring up wlan0", "Failed to make /etc/sysconfig", kWriteScript + "wlan0",
                kReadScript + "wlan0"})},
      {"MEROIGetDHCPTestNetInfo", AServerAnswers, Lease,
       Runs({"Failed to lease an address for wlan0"}, {kTimeout, kLeaseScript},
            {{kIgnores, kLeaseScript, kNothingLeased}}),
       renew},
  };
}

}  // namespace

std::vector<Subject> PlatformOperations() {
  std::vector<Subject> all;
  for (const auto& group : {OfFiles(), OfCommands(), OfInterface(), OfConnection()}) {
    all.insert(all.end(), group.begin(), group.end());
  }
  return all;
}
