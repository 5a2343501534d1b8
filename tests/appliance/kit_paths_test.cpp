// The kit's scripts, its units and the packages' scripts know the paths that the library knows. They spell them
// themselves, since they cannot include the libraries' header; here what they say is compared with it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <iterator>
#include <regex>
#include <set>
#include <string>

#include "common/paths.h"
#include "kit.h"

namespace {

using testing::HasSubstr;

using Paths = std::set<std::string>;

class KitPaths : public Kit {};

std::string PathOf(const char* szFormat) {
  return InterfacePath(szFormat, "if0", "if0").c_str();
}

TEST_F(KitPaths, OfTheScriptsAreTheLibrarys) {
  // What stands in the way of a function tells which path the function comes to it with.
  const std::string asks = "ask() { printf '%s' \"$2\"; exit; }; ";
  const std::string ends = "end_daemon() { printf '%s' \"$2\"; exit; }; ";
  const std::string serves =
      "end_dnsmasq() { :; }; serves=yes leases='' known_server=if0; is_there() { :; }; "
      "start_dnsmasq() { printf '%s' \"$2\"; }; ";
  const struct {
    std::string command;
    std::string path;
  } rows[] = {
      {"printf '%s' \"$adapter_info\"", kAdapterInfoPath},
      {"printf '%s' \"$country_settings\"", kCountryPath},
      {"write_configuration() { printf '%s' \"$2\"; exit; }; start_hostapd if0", PathOf(kHostapdStartedFormat)},
      {"printf '%s' \"$guest_interface\"", kGuestInterface},
      {"printf '%s' \"$guest_bridge\"", kGuestBridge},
      {"printf '%s' \"$guest_rights\"", kGuestRightsPath},
      {"printf '%s' \"$control\"", kHostapdControlDirectory},
      {"printf '%s' \"$scripts\"", kInterfaceScriptDirectory},
      {"printf '%s' \"$hostapd_run-if0.pid\"", PathOf(kHostapdPidFormat)},
      {asks + "script_value KEY if0", PathOf(kInterfaceScriptFormat)},
      {asks + "access_point_is if0 yes", PathOf(kHostapdInfoFormat)},
      {"put() { printf '%s' \"$1\"; }; set_access_point if0 yes", PathOf(kHostapdInfoFormat)},
      {asks + "guest_is_on if0", PathOf(kHostapdGuestInfoFormat)},
      {"fail() { printf '%s' \"$host\"; exit; }; write_configuration if0 /tmp/file", PathOf(kHostapdHostFormat)},
      {"guests=yes; fail() { :; }; learn_capabilities() { printf '%s' \"$guest\"; exit; }; "
       "write_configuration if0 /tmp/file",
       PathOf(kHostapdGuestFormat)},
      {"end_dnsmasq() { :; }; " + asks + "serve_addresses if0", PathOf(kDhcpInfoFormat)},
      {serves + "serve_addresses if0", PathOf(kDhcpConfFormat)},
      {"dnsmasq() { printf '%s' \"${6#*=}\"; exit; }; run_dnsmasq if0 file ''", PathOf(kLeasesFormat)},
      {ends + "end_client if0", kSupplicantPidPath},
      {ends + "end_lease if0", PathOf(kDhcpClientPidFormat)},
      {"attempt() { eval \"printf '%s' \\\"\\${$#}\\\"\"; }; lease_address if0", kLeaseScript},
  };
  for (const auto& row : rows) EXPECT_EQ(Tells(row.command), row.path) << row.command;
}

// What a file says outside of comments.
std::string TextOf(const std::string& path) {
  return RunInShell("grep -v '^#' " APPLIANCE_KIT "/" + path).out;
}

// The absolute paths in a file, but for those of the system's own directories. /run is what /var/run leads to.
Paths PathsIn(const std::string& path) {
  static const std::regex pattern("/(etc|sbin|tmp|usr|var|run/(?!systemd))[^\\s'\"();}]*");
  const std::string text = TextOf(path);
  Paths paths;
  for (std::sregex_iterator match(text.begin(), text.end(), pattern), end; match != end; ++match) {
    const std::string found = match->str();
    paths.insert(found.starts_with("/run/") ? "/var" + found : found);
  }
  return paths;
}

TEST_F(KitPaths, OfTheUnitsAreTheLibrarysAndTheScripts) {
  const std::string note = kAdapterInfoPath;
  const auto letters = [](size_t count) {
    std::string pattern = ".";
    while (count-- > 0) pattern += "[0-9A-Za-z]";
    return pattern;
  };
  const auto copy = [](const std::string& path) {
    const auto name = path.rfind('/') + 1;
    return path.substr(0, name) + "." + path.substr(name) + ".edit";
  };
  const std::string script = InterfacePath(kInterfaceScriptFormat, "*").c_str();
  const std::string host = InterfacePath(kHostapdHostFormat, "*").c_str();
  const std::string server = InterfacePath(kDhcpConfFormat, "*", "").c_str();
  const std::string record = kConnectionRecordPath;
  const Paths made = {note,
                      note + letters(10),
                      record,
                      record + letters(6),
                      kJoinMarkerPath,
                      kApMarkerPath,
                      copy(kKnownNetworksPath),
                      copy(kApSettingsPath),
                      copy(script),
                      copy(host.substr(0, host.rfind('*') + 1)),
                      copy(server.substr(0, server.rfind('*') + 1)),
                      std::string(kResolverPath) + ".new" + letters(6),
                      InterfacePath(kHostapdInfoFormat, "*").c_str() + letters(10)};
  EXPECT_EQ(PathsIn("systemd/mero-wireless.conf"), made);
  EXPECT_EQ(PathsIn("systemd/mero-network.service"), Paths{kNetworkScriptPath});
  EXPECT_EQ(PathsIn("systemd/mero-wireless@.service"), Paths{kHotPlugScriptPath});
  EXPECT_EQ(PathsIn("systemd/mero-wireless-schedule.service"), Paths{kNetworkScriptPath});
  EXPECT_EQ(PathsIn("systemd/mero-wireless-autoconnect.service"), Paths{"/usr/bin/merowireless"});

  EXPECT_THAT(TextOf("systemd/90-mero-wireless.rules"), HasSubstr("KERNEL!=\"" + std::string(kGuestInterface) + "\""));
  EXPECT_THAT(TextOf("systemd/mero-wireless-schedule.service"), HasSubstr(" schedule " + std::string(kFirstAdapter)));
  EXPECT_THAT(TextOf("systemd/mero-wireless-autoconnect.service"),
              HasSubstr("BindsTo=mero-wireless@" + std::string(kFirstAdapter) + ".service"));
}

TEST_F(KitPaths, OfTheHotPlugScriptAreTheLibrarys) {
  EXPECT_THAT(TextOf("hotplug/usb.wireless.function"), HasSubstr("\t" + std::string(kNetworkScriptPath) + " "));
  EXPECT_THAT(RunInShell("/usr/mero/hotplug/usb.wireless.function help").out, HasSubstr(kAdapterInfoPath));
}

// What a line of the script that applies leases gives a variable, as it stands there.
std::string LeaseScripts(const std::string& variable) {
  return RunInShell("sed -n 's/^[[:space:]]*" + variable + "=//p' " APPLIANCE_KIT "/sbin/udhcpc.lease").out;
}

TEST_F(KitPaths, OfTheLeaseScriptAreTheProgramsAndSoAreTheLinesAroundNameServers) {
  EXPECT_EQ(LeaseScripts("resolver"), std::string(kResolverPath) + "\n");
  const auto lines = [](const char* szLeased, const char* szSaved) {
    std::string both;
    for (const char* szFormat : {szLeased, szSaved}) {
      both += '"' + std::string(InterfacePath(szFormat, "$interface").c_str()) + "\"\n";
    }
    return both;
  };
  EXPECT_EQ(LeaseScripts("first_line"), lines(kLeasedServersBegin, kSavedServersBegin));
  EXPECT_EQ(LeaseScripts("last_line"), lines(kLeasedServersEnd, kSavedServersEnd));
}

TEST_F(KitPaths, OfThePackagesScriptsAreTheLibrarysAndTheScripts) {
  const std::string record = kConnectionRecordPath;
  EXPECT_EQ(PathsIn("../debian/libmerowireless-core1.postrm"),
            (Paths{kJoinMarkerPath, record, record + ".??????", kApMarkerPath, kSupplicantConfigPath}));

  const std::string state = Tells("printf '%s' \"$state\"");
  const std::string leaseLock = RunInShell("sed -n 's/^lock=//p' " APPLIANCE_KIT "/sbin/udhcpc.lease").out;
  EXPECT_EQ(PathsIn("../debian/merowireless-appliance.postrm"),
            (Paths{"/sbin/iwlist", "/sbin/iwlist.distrib", "/usr/sbin/iwlist", "/usr/sbin/iwlist.ordinary", state,
                   leaseLock.substr(0, leaseLock.find('\n')), kAdapterInfoPath}));
  EXPECT_EQ(PathsIn("../debian/merowireless-appliance.prerm"),
            (Paths{kAdapterInfoPath, Tells("printf '%s' \"$settings_reader\""), state + "/hostapd-*.pid",
                   state + "/hostapd-", state + "/hostapd-$1.pid", state + "/dnsmasq-*.pid",
                   "/usr/mero/lib/network/$part.sh", kNetworkScriptPath}));
  EXPECT_EQ(Tells("printf '%s' \"$dnsmasq_run-if0.pid\""), state + "/dnsmasq-if0.pid");
  EXPECT_EQ(Tells("printf '%s' \"$hostapd_run-if0.pid\""), state + "/hostapd-if0.pid");
}

}  // namespace
