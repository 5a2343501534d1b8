// What the contract of each exported function says of failures.
#include "tests/fault/contracts.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <string_view>

#include "common/paths.h"

namespace {

using enum Exception;

const std::string kBackup = "/etc/resolv.conf.wireless.bak";
const std::string kHostFile = InterfacePath(kHostapdHostFormat, "wlan0").c_str();
const std::string kInfoFile = InterfacePath(kHostapdInfoFormat, "wlan0").c_str();
const std::string kInterfaceScript = InterfacePath(kInterfaceScriptFormat, "wlan0").c_str();
const std::string kBridgeScript = InterfacePath(kInterfaceScriptFormat, "lbr0").c_str();
const std::string kServerInfo = InterfacePath(kDhcpInfoFormat, "lbr0", "lbr0").c_str();
const std::string kStartedWith = "/tmp/network-script";

constexpr char kFewerListed[] = "a network that cannot be read is left out silently";
constexpr char kNobodyThere[] = "a listing tool that is missing or fails looks like nothing in range";
constexpr char kNobodyReads[] = "nobody reads it meanwhile, and the next attempt writes it anew";
constexpr char kNextRefused[] =
    "the marker of a call that was killed has the next one refused, which removes it: every call does";
constexpr char kFirstRefused[] =
    "the marker of a call that was killed has the next one pass over its first network, which removes it";
constexpr char kNotForeseen[] =
    "the new record has a name that nobody can foresee, since anyone may write there: nobody finds it again";
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
constexpr char kDisabledAllTheSame[] = "what cannot be changed is reported, and the other steps are taken";

std::vector<Excuse> OfJoin() {
  return {{kStays, std::string(kConnectionRecordPath) + ".", kNotForeseen},
          {kInPlace, kSupplicantConfigPath, kNobodyReads},
          {kInPlace, kConnectionRecordPath, kRecordIsLess},
          {kInPlace, kBackup, kBackupIsLess},
          {kTolerates, kConnectionRecordPath, kRecordIsLess},
          {kUnnoticed, kBackup, kBackupIsLess},
          {kNarrower, kConnectionRecordPath, kRecordIsLess},
          {kUnflushed, "", kOutlastsNothing},
          {kNothingTried, "", kRadioUnknown}};
}

std::vector<Excuse> OfAutoConnect() {
  std::vector<Excuse> excuses = OfJoin();
  excuses.push_back({kPassedOver, kJoinMarkerPath, kFirstRefused});
  for (const char* szPath : {kSupplicantConfigPath, kConnectionRecordPath}) {
    excuses.push_back({kAnother, szPath, kOtherNetwork});
    excuses.push_back({kUnnoticed, szPath, kRadioUnknown});
  }
  return excuses;
}

std::vector<Excuse> OfHostFiles() {
  return {{kInPlace, kHostFile, kNobodyReads}, {kTolerates, "wlan0", kDownIsLess}};
}

// Of a call that is killed at the file, and whose successor finds the file as it is to be.
const std::vector<Excuse> kLeftovers = {{kStays, "/etc/sysconfig/network-scripts/.ifcfg-lbr0.", kFewerChanged},
                                        {kStays, "/etc/dhcpd/.dhcpd-lbr0-lbr0.", kFewerChanged}};

std::vector<Excuse> With(std::vector<Excuse> excuses, const std::vector<Excuse>& others) {
  excuses.insert(excuses.end(), others.begin(), others.end());
  return excuses;
}

const std::vector<std::string> kJoining = {"/usr/sbin/wpa_supplicant", "/usr/sbin/wpa_cli", "/usr/bin/grep",
                                           "/usr/bin/cp", "/usr/bin/sh"};
const std::vector<std::string> kWritingForDaemon = {"/usr/bin/ps", "/usr/bin/grep", "/usr/bin/awk", "/usr/bin/mkdir",
                                                    "/usr/bin/sh"};

std::vector<std::string> With(std::vector<std::string> commands, const std::string& another) {
  commands.push_back(another);
  return commands;
}

std::vector<Contract> AllContracts() {
  return {
      {"MEROWirelessConfSet",
       "wireless_conf_set",
       {"Failed to alloc memory", "Failed to get section", "Failed to touch", "Failed to set section",
        "Failed to add section"},
       {},
       {}},
      {"MEROWirelessConfEnum",
       "wireless_conf_enum",
       {"Failed to alloc memory", "Failed to enumerate sections"},
       {},
       {{kLess, "", kFewerListed}}},
      {"MEROWirelessConfEnumByAtime",
       "wireless_conf_enum_by_atime",
       {"Failed to alloc memory", "Failed to enumerate sections"},
       {},
       {{kLess, "", kFewerListed}}},
      {"MEROWirelessNetworkScan",
       "wireless_network_scan",
       {"There is no wireless USB adapter plugged", "Failed to activate network interface",
        "Failed to get network scanning result"},
       {"/usr/sbin/iwlist", "/usr/bin/sh"},
       {{kLess, "", kNobodyThere}}},
      {"MEROWirelessNetworkGet",
       "wireless_network_get",
       {"Failed to scan wireless networks"},
       {"/usr/sbin/iwlist", "/usr/bin/sh"},
       {{kLess, "", kNobodyThere}}},
      {"MEROWirelessProtocolStringGet", "", {}, {}, {}},
      {"MEROWirelessAdhocCreate",
       "wireless_adhoc_create",
       {"There is no wireless USB adapter plugged", "Failed to deactivate network interface",
        "Failed to set Ad-Hoc mode", "Failed to execute", "Failed to activate network interface"},
       {"/usr/sbin/iwconfig", "/usr/bin/sh"},
       {}},
      {"MEROWirelessNetworkConnect",
       "wireless_network_connect",
       {"There is no wireless USB adapter plugged", "Another connection construction is going",
        "Failed to connect network."},
       kJoining,
       With(OfJoin(), {{kRefused, kJoinMarkerPath, kNextRefused}})},
      {"MEROWirelessAutoConnect",
       "wireless_auto_connect",
       {"Failed to connect any access point", "Failed to set interface configuration"},
       With(With(kJoining, "/usr/sbin/iwlist"), kLeaseScript),
       OfAutoConnect()},
      {"MEROWirelessIfconfigSet", "wireless_ifcfg_set", {"Failed to set network interface"}, {kLeaseScript}, {}},
      {"MEROWirelessDefaultGatewaySet",
       "wireless_default_gateway_set",
       {"Failed to execute"},
       {"/usr/sbin/route", "/usr/bin/sh"},
       {}},
      {"MEROWirelessConnStatusGet", "", {}, {}, {{kBelow, "", "the platform says why the adapter cannot be asked"}}},
      {"MEROWirelessGetAPConfig", "", {}, {}, {{kBelow, "", "the platform says why the section cannot be read"}}},
      {"MEROWirelessApConfigSecNameGet", "", {}, {}, {{kBelow, "", "the platform says why the name cannot be read"}}},
      {"MEROWirelessSetAPConfig",
       "wireless_ap_conf_set",
       {"Failed to alloc memory", "Failed to execute command", "Failed to touch", "Failed to set section",
        "Failed to add section"},
       {"/usr/bin/grep", "/usr/bin/sh"},
       {}},
      {"MEROWirelessCheckBlock", "", {}, {}, {{kSilent, "", "that it is unknown is an answer, and not reported"}}},
      {"MEROWirelessSetHostAPConf",
       "wireless_hostap_conf_set",
       {"Failed to mkdir", "Failed to write file"},
       kWritingForDaemon,
       With(OfHostFiles(), {{kSilent, "", kUnopened}})},
      {"MEROWirelessAPEnable",
       "wireless_ap_enable",
       {"Another ap construction is going", "Failed to enable AP.", "Failed to restart /etc/rc.network"},
       With(kWritingForDaemon, kNetworkScriptPath),
       With(With(OfHostFiles(), kLeftovers), {{kRefused, kApMarkerPath, kNextRefused}})},
      {"MEROWirelessAPDisable",
       "wireless_ap_disable",
       {"Failed to set AP config files.", "Failed to restart /etc/rc.network"},
       {kNetworkScriptPath},
       With(kLeftovers, {{kTolerates, kInfoFile, kDisabledAllTheSame},
                         {kTolerates, kBridgeScript, kDisabledAllTheSame},
                         {kTolerates, kInterfaceScript, kDisabledAllTheSame},
                         {kTolerates, kServerInfo, kDisabledAllTheSame},
                         {kTolerates, kStartedWith, kDisabledAllTheSame},
                         {kOtherwise, kStartedWith, kNoBridge},
                         {kMissed, kServerInfo, kBridgeForgotten},
                         {kMissed, kBridgeScript, kBridgeForgotten}})},
      {"MEROWirelessModeChange",
       "wireless_mode_change",
       {"Failed to change to wireless client mode."},
       {kHotPlugScriptPath},
       {}},
      {"MEROWirelessAPInterfaceGet", "", {}, {}, {}},
      {"MEROWirelessAPIsSupported", "", {}, {}, {}},
      {"MEROWirelessTestAPMode", "", {}, {}, {{kSilent, "", "a marker that cannot be looked at is taken to be there"}}},
  };
}

}  // namespace

const Excuse* Contract::Find(Exception exception, const std::string& path) const {
  const auto fits = [&](const Excuse& excuse) {
    if (excuse.exception != exception) return false;
    return exception == kStays ? path.starts_with(excuse.path) : excuse.path == path;
  };
  const auto found = std::ranges::find_if(excuses, fits);
  return found != excuses.end() ? &*found : nullptr;
}

const Contract& ContractOf(const char* function) {
  static const std::vector<Contract> all = AllContracts();
  const auto found =
      std::ranges::find(all, function, [](const Contract& contract) { return std::string_view(contract.szName); });
  if (found == all.end()) ADD_FAILURE() << "there is no contract of " << function;
  return found != all.end() ? *found : all.front();
}
