// What the contract of each exported function says of failures.
#include "tests/fault/contracts.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <map>

#include "common/paths.h"

namespace {

using enum Exception;

const std::string kBackup = "/etc/resolv.conf.wireless.bak";
const std::string kHostFile = InterfacePath(kHostapdHostFormat, "wlan0").c_str();
const std::string kInfoFile = InterfacePath(kHostapdInfoFormat, "wlan0").c_str();
const std::string kInterfaceScript = InterfacePath(kInterfaceScriptFormat, "wlan0").c_str();
const std::string kBridgeScript = InterfacePath(kInterfaceScriptFormat, "lbr0").c_str();
const std::string kServerInfo = InterfacePath(kDhcpInfoFormat, "lbr0", "lbr0").c_str();

constexpr char kAsLongAsItRuns[] = "a command that never ends is waited for without end";
constexpr char kReadAgain[] = "a listing that could not be read is read again";
constexpr char kNotNoticed[] = "whether a command was run, and whether it succeeded, is not noticed";
constexpr char kBehind[] = "the supplicant is started in the background, and whether it joins is asked for later";
constexpr char kAskedAgain[] = "the supplicant is asked again";
constexpr char kNothingLeased[] = "a lease script that is missing or fails keeps nobody from another network";
constexpr char kNotLookedFor[] = "a daemon that cannot be looked for, and an interface that stays up, are no failure";
constexpr char kNobodyThere[] = "a listing tool that is missing or fails looks like nothing in range";
constexpr char kNobodyReads[] = "nobody reads it meanwhile, and the next attempt writes it anew";
constexpr char kNextRefused[] =
    "the marker of a call that was killed has the next one refused, which removes it: every call does";
constexpr char kFirstRefused[] =
    "the marker of a call that was killed has the next one pass over its first network, which removes it";
constexpr char kNotForeseen[] =
    "the new record has a name that nobody can foresee, since anyone may write there: the machine's next start removes "
    "it";
constexpr char kRadioUnknown[] = "where it is not known whether the radio may be used, nothing is tried";
constexpr char kRecordIsLess[] = "a connection that is up is worth more than its record";
constexpr char kOutlastsNothing[] = "the record is not flushed: a connection does not outlast a power cut";
constexpr char kBackupIsLess[] = "a backup that could not be made takes nothing from the connection";
constexpr char kOtherNetwork[] = "a network that cannot be joined is passed over, and one that is not seen is tried";
constexpr char kDownIsLess[] = "an interface that stays up is reported, and the files are written";
constexpr char kUnopened[] = "a host file that cannot be opened is a failure without a message";
constexpr char kBridgeForgotten[] =
    "the interface has left its bridge, and the next call does not know of which the server was";
constexpr char kFewerChanged[] =
    "the next change of a file clears away what is left of one: the next call changes fewer";
constexpr char kNoBridge[] =
    "where the bridge cannot be read, or the interface has left it, the start script is told of none: it has noted "
    "which";
constexpr char kNone[] = "(none)";  // a unit that reports nothing
constexpr char kSupplicant[] = "/usr/sbin/wpa_supplicant";
constexpr char kClient[] = "/usr/sbin/wpa_cli";
constexpr char kDisabledAllTheSame[] = "what cannot be changed is reported, and the other steps are taken";

std::vector<Excuse> OfJoin() {
  return {{kRunsOn, kSupplicant, kBehind},
          {kIgnores, kSupplicant, kBehind},
          {kRepeats, kClient, kAskedAgain},
          {kStays, std::string(kConnectionRecordPath) + ".", kNotForeseen},
          {kInPlace, kSupplicantConfigPath, kNobodyReads},
          {kTolerates, kConnectionRecordPath, kRecordIsLess},
          {kUnnoticed, kBackup, kBackupIsLess},
          {kNarrower, kConnectionRecordPath, kRecordIsLess},
          {kUnflushed, "", kOutlastsNothing},
          {kNothingTried, kApSettingsPath, kRadioUnknown}};
}

std::vector<Excuse> OfAutoConnect() {
  std::vector<Excuse> excuses = OfJoin();
  excuses.push_back({kPassedOver, kJoinMarkerPath, kFirstRefused});
  excuses.push_back({kRepeats, "/usr/sbin/iwlist", kReadAgain});
  excuses.push_back({kRepeats, "driver", kOtherNetwork});
  excuses.push_back({kIgnores, kLeaseScript, kNothingLeased});
  excuses.push_back({kRepeats, kSupplicant, kOtherNetwork});
  excuses.push_back({kIgnores, "/usr/sbin/iwlist", kNobodyThere});
  for (const char* szPath : {kSupplicantConfigPath, kConnectionRecordPath, kSupplicant, kClient}) {
    excuses.push_back({kLeftOut, szPath, kRadioUnknown});
  }
  for (const char* szPath : {kSupplicantConfigPath, kConnectionRecordPath}) {
    excuses.push_back({kAnother, szPath, kOtherNetwork});
  }
  return excuses;
}

std::vector<Excuse> OfHostFiles() {
  return {{kInPlace, kHostFile, kNobodyReads},
          {kTolerates, "wlan0", kDownIsLess},
          {kIgnores, "driver", kNotLookedFor},
          {kIgnores, "/usr/bin/ps", kNotLookedFor}};
}

// Of a call that is killed at the file, and whose successor finds the file as it is to be.
const std::vector<Excuse> kLeftovers = {{kStays, "/etc/sysconfig/network-scripts/.ifcfg-lbr0.", kFewerChanged},
                                        {kStays, "/etc/dhcpd/.dhcpd-lbr0-lbr0.", kFewerChanged}};

std::vector<Excuse> With(std::vector<Excuse> excuses, const std::vector<Excuse>& others) {
  excuses.insert(excuses.end(), others.begin(), others.end());
  return excuses;
}

const std::vector<std::string> kJoining = {kSupplicant, kClient, "/usr/bin/grep", "/usr/bin/cp", "/usr/bin/sh"};
const std::vector<std::string> kWritingForDaemon = {"/usr/bin/ps", "/usr/bin/grep", "/usr/bin/awk", "/usr/bin/mkdir",
                                                    "/usr/bin/sh"};

std::vector<std::string> With(std::vector<std::string> commands, const std::string& another) {
  commands.push_back(another);
  return commands;
}

std::map<std::string, Contract> AllContracts() {
  return {
      {"MEROWirelessConfSet",
       {"wireless_conf_set",
        {"Failed to alloc memory", "Failed to get section", "Failed to touch", "Failed to set section",
         "Failed to add section"},
        {},
        {}}},
      {"MEROWirelessConfEnum",
       {"wireless_conf_enum", {"Failed to alloc memory", "Failed to enumerate sections"}, {}, {}}},
      {"MEROWirelessConfEnumByAtime",
       {"wireless_conf_enum_by_atime", {"Failed to alloc memory", "Failed to enumerate sections"}, {}, {}}},
      {"MEROWirelessNetworkScan",
       {"wireless_network_scan",
        {"There is no wireless USB adapter plugged", "Failed to activate network interface",
         "Failed to get network scanning result"},
        {"/usr/sbin/iwlist", "/usr/bin/sh"},
        {{kLess, "", kNobodyThere}, {kRepeats, "/usr/sbin/iwlist", kReadAgain}}}},
      {"MEROWirelessNetworkGet",
       {"wireless_network_get",
        {"Failed to scan wireless networks"},
        {"/usr/sbin/iwlist", "/usr/bin/sh"},
        {{kLess, "", kNobodyThere}, {kRepeats, "/usr/sbin/iwlist", kReadAgain}}}},
      {"MEROWirelessProtocolStringGet", {"", {}, {}, {}}},
      {"MEROWirelessAdhocCreate",
       {"wireless_adhoc_create",
        {"There is no wireless USB adapter plugged", "Failed to deactivate network interface",
         "Failed to set Ad-Hoc mode", "Failed to execute", "Failed to activate network interface"},
        {"/usr/sbin/iwconfig", "/usr/bin/sh"},
        {{kIgnores, "/usr/sbin/iwconfig", kNotNoticed}}}},
      {"MEROWirelessNetworkConnect",
       {"wireless_network_connect",
        {"There is no wireless USB adapter plugged", "Another connection construction is going",
         "Failed to connect network."},
        kJoining,
        With(OfJoin(), {{kRefused, kJoinMarkerPath, kNextRefused}})}},
      {"MEROWirelessAutoConnect",
       {"wireless_auto_connect",
        {"Failed to connect any access point", "Failed to set interface configuration"},
        With(With(kJoining, "/usr/sbin/iwlist"), kLeaseScript),
        OfAutoConnect()}},
      {"MEROWirelessIfconfigSet",
       {"wireless_ifcfg_set",
        {"Failed to set network interface"},
        {kLeaseScript},
        {{kIgnores, kLeaseScript, kNothingLeased}}}},
      {"MEROWirelessDefaultGatewaySet",
       {"wireless_default_gateway_set",
        {"Failed to execute"},
        {"/usr/sbin/route", "/usr/bin/sh"},
        {{kIgnores, "/usr/sbin/route", kNotNoticed}}}},
      {"MEROWirelessConnStatusGet",
       {kNone, {}, {}, {{kBelow, "", "the platform says why the adapter cannot be asked"}}}},
      {"MEROWirelessGetAPConfig", {kNone, {}, {}, {{kBelow, "", "the platform says why the section cannot be read"}}}},
      {"MEROWirelessApConfigSecNameGet",
       {kNone, {}, {}, {{kBelow, "", "the platform says why the name cannot be read"}}}},
      {"MEROWirelessSetAPConfig",
       {"wireless_ap_conf_set",
        {"Failed to alloc memory", "Failed to execute command", "Failed to touch", "Failed to set section",
         "Failed to add section"},
        {"/usr/bin/grep", "/usr/bin/sh"},
        {}}},
      {"MEROWirelessCheckBlock", {"", {}, {}, {{kSilent, "", "that it is unknown is an answer, and not reported"}}}},
      {"MEROWirelessSetHostAPConf",
       {"wireless_hostap_conf_set",
        {"Failed to mkdir", "Failed to write file"},
        kWritingForDaemon,
        With(OfHostFiles(), {{kSilent, "", kUnopened}})}},
      {"MEROWirelessAPEnable",
       {"wireless_ap_enable",
        {"Another ap construction is going", "Failed to enable AP.", "Failed to restart /etc/rc.network"},
        With(kWritingForDaemon, kNetworkScriptPath),
        With(With(OfHostFiles(), kLeftovers), {{kRefused, kApMarkerPath, kNextRefused}})}},
      {"MEROWirelessAPDisable",
       {"wireless_ap_disable",
        {"Failed to set AP config files.", "Failed to restart /etc/rc.network"},
        {kNetworkScriptPath},
        With(kLeftovers, {{kTolerates, kInfoFile, kDisabledAllTheSame},
                          {kTolerates, kBridgeScript, kDisabledAllTheSame},
                          {kTolerates, kInterfaceScript, kDisabledAllTheSame},
                          {kTolerates, kServerInfo, kDisabledAllTheSame},
                          {kOtherWords, kNetworkScriptPath, kNoBridge},
                          {kMissed, kServerInfo, kBridgeForgotten},
                          {kMissed, kBridgeScript, kBridgeForgotten}})}},
      {"MEROWirelessModeChange",
       {"wireless_mode_change", {"Failed to change to wireless client mode."}, {kHotPlugScriptPath}, {}}},
      {"MEROWirelessAPInterfaceGet", {"", {}, {}, {}}},
      {"MEROWirelessAPIsSupported", {"", {}, {}, {}}},
      {"MEROWirelessTestAPMode",
       {"", {}, {}, {{kSilent, "", "a marker that cannot be looked at is taken to be there"}}}},
  };
}

}  // namespace

const char* NameOf(Exception exception) {
  constexpr const char* kNames[] = {"kSilent",    "kBelow",     "kLess",       "kNothingTried", "kLeftOut",
                                    "kTolerates", "kUnnoticed", "kAnother",    "kNarrower",     "kInPlace",
                                    "kUnflushed", "kRefused",   "kPassedOver", "kStays",        "kMissed",
                                    "kIgnores",   "kRepeats",   "kOtherWords", "kWaits",        "kRunsOn"};
  static_assert(std::size(kNames) == static_cast<size_t>(kRunsOn) + 1, "name every exception");
  return kNames[static_cast<size_t>(exception)];
}

const Excuse* Contract::Find(Exception exception, const std::string& path) const {
  const auto fits = [&](const Excuse& excuse) {
    if (excuse.exception != exception) return false;
    return exception == kStays ? path.starts_with(excuse.path) : excuse.path == path;
  };
  const auto found = std::ranges::find_if(excuses, fits);
  return found != excuses.end() ? &*found : nullptr;
}

namespace {

// A command is waited for, but for one that is started in the background.
std::map<std::string, Contract> AllWithWaits() {
  std::map<std::string, Contract> all = AllContracts();
  for (auto& [name, contract] : all) {
    for (const std::string& command : contract.commands) {
      if (contract.Find(kRunsOn, command) != nullptr) continue;
      contract.excuses.push_back({kWaits, command, kAsLongAsItRuns});
    }
  }
  return all;
}

}  // namespace

const Contract& ContractOf(const char* function) {
  static const std::map<std::string, Contract> all = AllWithWaits();
  const auto found = all.find(function);
  if (found == all.end()) ADD_FAILURE() << "there is no contract of " << function;
  return found != all.end() ? found->second : all.begin()->second;
}
