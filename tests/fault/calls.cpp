// What the exported functions cost.
#include "tests/fault/calls.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <utility>

#include "common/paths.h"
#include "common/text.h"
#include "platform.h"
#include "tests/fault/scene.h"
#include "tests/support/files.h"
#include "tests/support/ring.h"

namespace fs = std::filesystem;

namespace {

const std::string kHostFile = InterfacePath(kHostapdHostFormat, "wlan0").c_str();
const std::string kInfoFile = InterfacePath(kHostapdInfoFormat, "wlan0").c_str();
const std::string kInterfaceScript = InterfacePath(kInterfaceScriptFormat, "wlan0").c_str();
const std::string kBridgeScript = InterfacePath(kInterfaceScriptFormat, "lbr0").c_str();
const std::string kServerConf = InterfacePath(kDhcpConfFormat, "lbr0", "lbr0").c_str();
const std::string kServerInfo = InterfacePath(kDhcpInfoFormat, "lbr0", "lbr0").c_str();
constexpr char kModel[] = "RT-5370";
constexpr char kHeader[] = "[RT-5370]\n";

WIRELESS_NETWORK_CONFIG KnownNetwork(int number) {
  WIRELESS_NETWORK_CONFIG config = {};
  CopyText(config.szKey, "correct horse battery");
  CopyText(config.szIp, "192.168.1.2");
  CopyText(config.szMask, "255.255.255.0");
  CopyText(config.szGateway, "192.168.1.1");
  CopyText(config.network.szEssid, "Network " + std::to_string(number));
  config.network.bssid[5] = static_cast<unsigned char>(number);
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.network.auth = WIRELESS_AUTH_WPA2PSK;
  config.network.encrypt = WIRELESS_ENCRYPT_AES;
  return config;
}

WIRELESS_NETWORK_CONFIG OpenCell() {
  WIRELESS_NETWORK_CONFIG config = KnownNetwork(1);
  config.network.opmode = WIRELESS_OPMODE_ADHOC;
  config.network.encrypt = WIRELESS_ENCRYPT_NONE;
  return config;
}

MERO_AP_CONF ApSettings() {
  MERO_AP_CONF conf = {};
  conf.blEnable = TRUE;
  conf.blWifiUnblock = TRUE;
  CopyText(conf.szSecName, kModel);
  CopyText(conf.hostapConf.szSSID, "Home");
  CopyText(conf.hostapConf.szBridge, "lbr0");
  conf.hostapConf.hwMode = AP_MODE_80211G;
  conf.hostapConf.channel = 6;
  conf.hostapConf.encryption = AP_ENCRYPT_WPA_PSK;
  CopyText(conf.hostapConf.encryptInfo.wpaPskInfo.szPassPhrase, "correct horse");
  conf.hostapConf.encryptInfo.wpaPskInfo.wpaType = TYPE_WPA2;
  conf.hostapConf.encryptInfo.wpaPskInfo.encryptType = TYPE_CCMP;
  return conf;
}

// ---- States ----

void NothingMore(SimulatedDriver&) {}

void SomeNetworksAreKnown(SimulatedDriver&) {
  for (int i = 0; i < kNetworks; ++i) {
    const WIRELESS_NETWORK_CONFIG config = KnownNetwork(i);
    EXPECT_EQ(MEROWirelessConfSet(&config), 0);
  }
}

void ThereAreApSettings(SimulatedDriver&) {
  WriteText(kAdapterInfoPath, "PRODUCT=RT-5370\n", 0644);
  MERO_AP_CONF conf = ApSettings();
  EXPECT_EQ(MEROWirelessSetAPConfig(&conf), TRUE);
}

void AnAccessPointIsEnabled(SimulatedDriver& driver) {
  ThereAreApSettings(driver);
  EXPECT_EQ(MEROWirelessAPEnable(), TRUE);
}

void ANetworkIsJoined(SimulatedDriver& driver) {
  driver.accessPoint = {2, 0, 0, 0, 0, 1};
}

// ---- Calls ----

Answer OfInt(int result) {
  return result == 0 ? Answer::kDone : result == -1 ? Answer::kFailed : Answer::kWrong;
}

Answer OfBool(BOOL result) {
  return result == TRUE ? Answer::kDone : result == FALSE ? Answer::kFailed : Answer::kWrong;
}

// Whatever the function gives, the ring is walked, and must be one.
template <class Record>
Answer OfList(int (*enumerate)(WIRELESS_LIST*)) {
  Ring<Record> ring;
  int count = 0;
  const int result = enumerate(ring.head());
  ring.ForEach([&](const Record&) { ++count; });
  if (result != 0 || count == kNetworks) return OfInt(result);
  return count < kNetworks ? Answer::kLess : Answer::kWrong;
}

Answer SaveOtherSecret() {
  WIRELESS_NETWORK_CONFIG config = KnownNetwork(3);
  CopyText(config.szKey, "correct horse stapler");
  return OfInt(MEROWirelessConfSet(&config));
}

Answer Scan() {
  const auto scan = [](WIRELESS_LIST* pHead) { return MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, pHead); };
  return OfList<WIRELESS_NETWORK>(scan);
}

Answer LookUp() {
  WIRELESS_NETWORK network;
  const int result = MEROWirelessNetworkGet("Network 3", WIRELESS_FILTER_ESSID, &network);
  if (result == 1) return std::string_view(network.szEssid) == "Network 3" ? Answer::kDone : Answer::kWrong;
  return result == 0 ? Answer::kLess : result == -1 ? Answer::kFailed : Answer::kWrong;
}

Answer MakeCell() {
  const WIRELESS_NETWORK_CONFIG config = OpenCell();
  return OfInt(MEROWirelessAdhocCreate(&config));
}

Answer Join() {
  const WIRELESS_NETWORK_CONFIG config = KnownNetwork(3);
  return OfInt(MEROWirelessNetworkConnect(&config));
}

Answer AskStatus() {
  const WIRELESS_STATUS status = MEROWirelessConnStatusGet();
  if (status == WIRELESS_STATUS_CONNECTED_MANAGED) return Answer::kDone;
  return status == WIRELESS_STATUS_UNKNOWN || status == WIRELESS_STATUS_NO_ADAPTER ? Answer::kFailed : Answer::kWrong;
}

// Without the file or the section, the record has the defaults.
Answer ReadApSettings() {
  MERO_AP_CONF conf;
  const int result = MEROWirelessGetAPConfig(kModel, &conf);
  const bool saved = std::string_view(conf.hostapConf.szSSID) == "Home";
  if (result > 0) return saved ? Answer::kDone : Answer::kWrong;
  return saved ? Answer::kWrong : Answer::kFailed;
}

Answer NameSection() {
  char szSection[32];
  const BOOL named = MEROWirelessApConfigSecNameGet(szSection, sizeof szSection);
  return named == TRUE && std::string_view(szSection) != kModel ? Answer::kWrong : OfBool(named);
}

Answer SaveOtherChannel() {
  MERO_AP_CONF conf = ApSettings();
  conf.hostapConf.channel = 1;
  return OfBool(MEROWirelessSetAPConfig(&conf));
}

Answer CheckBlock() {
  const int result = MEROWirelessCheckBlock();
  return result == 1 ? Answer::kDone : result == -1 ? Answer::kFailed : Answer::kWrong;
}

Answer WriteDaemonsFiles() {
  MERO_AP_CONF conf = ApSettings();
  return OfBool(MEROWirelessSetHostAPConf("wlan0", &conf.hostapConf));
}

// ---- The functions ----

// Bringing an interface up or taking it down: its flags are read and set.
constexpr int kFlags = 2;

// Giving it its only address: the kernel is asked for those it has, answers in two parts, and is told of the new one.
constexpr int kAddress = 5;

Exported Row(const char* szName, Today today, const char* szState, std::function<void(SimulatedDriver&)> prepare,
             std::function<Answer()> call, Least least) {
  return {szName, today, szState, std::move(prepare), std::move(call), std::move(least)};
}

std::vector<Exported> AllFunctions() {
  const auto listing = static_cast<int64_t>(Listing().size());
  const auto connected = static_cast<int64_t>(kConnected.size());
  const int64_t header = sizeof kHeader - 1;
  // One adapter, up, and two readings that agree.
  const Least scanning = {.pipes = 2, .listings = 1, .sockets = 1, .asks = kFlags, .sleeps = 1, .piped = 2 * listing};
  const std::vector<std::string> ofJoin = {kJoinMarkerPath, kSupplicantConfigPath, kConnectionRecordPath};
  return {
      Row("MEROWirelessConfSet", {0, 5}, "one of 10, another secret", SomeNetworksAreKnown, SaveOtherSecret,
          {.reads = {kKnownNetworksPath}, .replaced = {kKnownNetworksPath}}),
      Row("MEROWirelessConfEnum", {0, 1}, "10 networks", SomeNetworksAreKnown,
          [] { return OfList<WIRELESS_NETWORK_CONFIG>(MEROWirelessConfEnum); }, {.reads = {kKnownNetworksPath}}),
      Row("MEROWirelessConfEnumByAtime", {0, 1}, "10 networks", SomeNetworksAreKnown,
          [] { return OfList<WIRELESS_NETWORK_CONFIG>(MEROWirelessConfEnumByAtime); }, {.reads = {kKnownNetworksPath}}),

      Row("MEROWirelessNetworkScan", {4, 3}, "10 networks, interface up", NothingMore, Scan, scanning),
      Row("MEROWirelessNetworkGet", {4, 3}, "10 networks, interface up", NothingMore, LookUp, scanning),
      Row("MEROWirelessProtocolStringGet", {0, 0}, "", NothingMore,
          [] { return OfBool(MEROWirelessProtocolStringGet(WIRELESS_PROTO_11AGN) != nullptr ? TRUE : FALSE); }, {}),

      // Down, the mode, two commands, up.
      Row("MEROWirelessAdhocCreate", {4, 5}, "an open cell", NothingMore, MakeCell,
          {.commands = 2, .listings = 1, .sockets = 1, .asks = 2 * kFlags + 1}),
      // The supplicant is started behind a shell, its state goes through grep, resolv.conf is copied. Looked for are
      // the settings of an access point, the marker, an old configuration, a supplicant, and resolv.conf.
      Row("MEROWirelessNetworkConnect", {7, 6}, "WPA2, joined within a second", NothingMore, Join,
          {.commands = 2,
           .pipes = 1,
           .besides = 1,
           .listings = 1,
           .looks = 5,
           .removals = 2,
           .sleeps = 1,
           .piped = connected,
           .reads = {"/etc/meroinfo.conf"},
           .written = ofJoin}),
      // The state of the connection, a list of the known networks, a scan, a join, and an address.
      Row("MEROWirelessAutoConnect", {12, 32}, "10 known, the latest in range; static address", SomeNetworksAreKnown,
          [] { return OfInt(MEROWirelessAutoConnect()); },
          {.programs = 1,
           .commands = 2,
           .pipes = 3,
           .besides = 1,
           .listings = 1,
           .sockets = 2,
           .asks = 3 + kFlags + kAddress,
           .looks = 6,
           .removals = 2,
           .sleeps = 2,
           .piped = 2 * listing + connected,
           .reads = {kKnownNetworksPath, "/etc/meroinfo.conf"},
           .replaced = {kInterfaceScript},
           .written = ofJoin}),
      // A client of DHCP is looked for, and what it has left is taken back by a program.
      Row("MEROWirelessIfconfigSet", {1, 18}, "a static address", NothingMore,
          [] { return OfInt(MEROWirelessIfconfigSet("wlan0", KnownNetwork(3))); },
          {.programs = 1, .sockets = 2, .asks = kFlags + kAddress, .looks = 1, .replaced = {kInterfaceScript}}),
      Row("MEROWirelessDefaultGatewaySet", {2, 1}, "", NothingMore,
          [] { return OfInt(MEROWirelessDefaultGatewaySet("192.168.1.1")); }, {.commands = 1, .listings = 1}),
      // Whether it is up, its mode, its access point.
      Row("MEROWirelessConnStatusGet", {0, 3}, "connected", ANetworkIsJoined, AskStatus,
          {.listings = 1, .sockets = 1, .asks = 3}),

      Row("MEROWirelessGetAPConfig", {0, 1}, "", ThereAreApSettings, ReadApSettings, {.reads = {kApSettingsPath}}),
      Row("MEROWirelessApConfigSecNameGet", {0, 1}, "", ThereAreApSettings, NameSection, {.reads = {kAdapterInfoPath}}),
      // The section is looked for by a command.
      Row("MEROWirelessSetAPConfig", {2, 4}, "another channel", ThereAreApSettings, SaveOtherChannel,
          {.pipes = 1, .piped = header, .reads = {kApSettingsPath}, .replaced = {kApSettingsPath}}),
      Row("MEROWirelessCheckBlock", {0, 2}, "", ThereAreApSettings, CheckBlock,
          {.reads = {kApSettingsPath, kAdapterInfoPath}}),
      // A pipeline of four looks for a daemon, mkdir makes the directory.
      Row("MEROWirelessSetHostAPConf", {6, 2}, "no daemon, no guests", NothingMore, WriteDaemonsFiles,
          {.programs = 1,
           .pipes = 1,
           .besides = 3,
           .sockets = 1,
           .asks = kFlags,
           .looks = 1,
           .removals = 1,
           .written = {kHostFile}}),
      // As above, the bridge, its DHCP server and the interface, and the start script.
      Row("MEROWirelessAPEnable", {7, 87}, "a new bridge with a DHCP server", ThereAreApSettings,
          [] { return OfBool(MEROWirelessAPEnable()); },
          {.programs = 2,
           .pipes = 1,
           .besides = 3,
           .sockets = 1,
           .asks = kFlags,
           .looks = 4,
           .removals = 2,
           .reads = {kAdapterInfoPath, kApSettingsPath},
           .replaced = {kInfoFile, kBridgeScript, kServerConf, kServerInfo, kInterfaceScript},
           .written = {kApMarkerPath, kHostFile}}),
      Row("MEROWirelessAPDisable", {1, 22}, "as the one before has left it", AnAccessPointIsEnabled,
          [] { return OfBool(MEROWirelessAPDisable()); },
          {.programs = 1,
           .listings = 1,
           .removals = 1,
           .reads = {kInterfaceScript, kServerConf, kServerInfo, kBridgeScript},
           .replaced = {kInterfaceScript, kServerInfo, kBridgeScript}}),

      Row("MEROWirelessModeChange", {1, 0}, "", NothingMore,
          [] { return OfBool(MEROWirelessModeChange(WIRELESS_CLIENT_MODE)); }, {.programs = 1}),
      Row("MEROWirelessAPInterfaceGet", {0, 0}, "", NothingMore,
          [] { return OfBool(MEROWirelessAPInterfaceGet() != nullptr ? TRUE : FALSE); }, {}),
      Row("MEROWirelessAPIsSupported", {0, 0}, "", NothingMore,
          [] { return OfBool(MEROWirelessAPIsSupported() == FALSE ? TRUE : FALSE); }, {}),
      Row("MEROWirelessTestAPMode", {0, 0}, "", NothingMore,
          [] { return OfBool(MEROWirelessTestAPMode() == FALSE ? TRUE : FALSE); }, {.looks = 1}),
  };
}

// ---- What it comes to ----

int64_t SizesOf(const std::vector<std::string>& paths) {
  int64_t sum = 0;
  for (const std::string& path : paths) sum += fs::exists(path) ? static_cast<int64_t>(fs::file_size(path)) : 0;
  return sum;
}

}  // namespace

int Least::opens() const {
  return listings + static_cast<int>(reads.size() + 2 * replaced.size() + written.size());
}

int Least::calls() const {
  const size_t files = 3 * reads.size() + 8 * replaced.size() + 3 * written.size();
  return 2 * (programs + commands) + 6 * pipes + 5 * listings + 2 * sockets + asks + looks + removals + sleeps +
         static_cast<int>(files);
}

int Measured::Count(const char* szCall) const {
  return static_cast<int>(std::ranges::count(calls, szCall, &SystemCall::name));
}

const std::vector<Exported>& ExportedFunctions() {
  static const std::vector<Exported> all = AllFunctions();
  return all;
}

Measured Measure(const Exported& function) {
  const Scene scene(function.prepare);
  Measured measured;
  const int64_t before = SizesOf(function.least.reads);
  const Plan plan = {.withoutSleeps = true};
  const Outcome outcome = RunSupervised(plan, [&] { return function.call() == Answer::kDone ? 0 : -1; });
  measured.done = outcome.result == 0;
  measured.cost = outcome.cost;
  measured.calls = outcome.before;
  measured.leastRead = before + function.least.piped;
  measured.leastWritten = SizesOf(function.least.replaced) + SizesOf(function.least.written);
  measured.reports = outcome.reports;
  return measured;
}
