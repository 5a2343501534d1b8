// Where things are, and what they are called: the files, programs, directories and interfaces that more than one of the
// library, the platform, the management program and the appliance kit knows. Each is spelled here, and nowhere else.
// The kit's scripts cannot include this; a test compares what they say.
#ifndef MERO_COMMON_PATHS_H
#define MERO_COMMON_PATHS_H

#include <cstdio>

// ---- Settings ----

// The known networks, each in a section that the address of its access point names.
inline constexpr char kKnownNetworksPath[] = "/usr/mero/etc/wireless.conf";

// The access-point settings, one section an adapter model.
inline constexpr char kApSettingsPath[] = "/usr/mero/etc/wireless_ap.conf";

// What used the radio when it was switched off, until it is switched on again.
inline constexpr char kRadioUsePath[] = "/usr/mero/etc/wireless_radio.conf";

// The country whose rules the radio is to keep to, while one is set.
inline constexpr char kCountryPath[] = "/usr/mero/etc/wireless_country.conf";

// A line of a section, in both of the first files.
inline constexpr char kSectionLineFormat[] = "\t%s=%s\n";

// What the appliance's model can do.
inline constexpr char kModelPath[] = "/etc.defaults/meroinfo.conf";

// ---- The adapter ----

// The adapter that is plugged in; "PRODUCT" names its section of the access-point settings.
inline constexpr char kAdapterInfoPath[] = "/tmp/wireless.info";
inline constexpr char kProductKey[] = "PRODUCT";

// The interface of the first adapter: the access point's, and what the client's is taken for without an adapter.
inline constexpr char kFirstAdapter[] = "wlan0";

// ---- A connection ----

// Exists while a network is being joined.
inline constexpr char kJoinMarkerPath[] = "/var/tmp/.wireless_connecting";

// Five lines: name, protocol, authentication, encryption (as numbers), address of the access point.
inline constexpr char kConnectionRecordPath[] = "/var/tmp/.wireless_current_connection";

// The supplicant's configuration, its pid, and the directory in which it has a control socket for each interface.
inline constexpr char kSupplicantConfigPath[] = "/usr/mero/etc/wpa_supplicant.conf";
inline constexpr char kSupplicantPidPath[] = "/var/run/wpa_supplicant.pid";
inline constexpr char kSupplicantControlDirectory[] = "/var/run/wpa_supplicant";

// A directory that root alone may open; it is locked by the management program while that joins or leaves a network.
inline constexpr char kJoinLock[] = "/var/run/merowireless";

// The pid of an interface's DHCP client, and the program that applies what the client leases and gives it back.
inline constexpr char kDhcpClientPidFormat[] = "/var/run/udhcpc-%s.pid";
inline constexpr char kLeaseScript[] = "/usr/mero/sbin/udhcpc.lease";

// Where the system asks for names, and the lines between which an interface's name servers stand there: those of its
// lease, or those that were saved for its network.
inline constexpr char kResolverPath[] = "/etc/resolv.conf";
inline constexpr char kLeasedServersBegin[] = "# By the DHCP client of %s, until it leaves the network:";
inline constexpr char kLeasedServersEnd[] = "# (end of what the DHCP client of %s has added)";
inline constexpr char kSavedServersBegin[] = "# As saved for the network of %s, until it leaves the network:";
inline constexpr char kSavedServersEnd[] = "# (end of what was saved for the network of %s)";

// ---- An access point ----

// Exists while an access point is being set up.
inline constexpr char kApMarkerPath[] = "/var/tmp/.wireless_ap_connecting";

// The configuration of the access-point daemon of an interface, and of its guest network, and the files that say
// whether they are switched on.
inline constexpr char kHostapdDirectory[] = "/etc/hostapd";
inline constexpr char kHostapdHostFormat[] = "/etc/hostapd/hostapd-%s-host.conf";
inline constexpr char kHostapdGuestFormat[] = "/etc/hostapd/hostapd-%s-guest.conf";
inline constexpr char kHostapdGuestInfoFormat[] = "/etc/hostapd/hostapd-%s-guest.info";
inline constexpr char kHostapdInfoFormat[] = "/etc/hostapd/hostapd-%s.info";

// What the access-point daemon of an interface was started with, its pid, and where it has a control socket for each.
inline constexpr char kHostapdStartedFormat[] = "/var/run/rc.network/hostapd-%s.conf";
inline constexpr char kHostapdPidFormat[] = "/var/run/rc.network/hostapd-%s.pid";
inline constexpr char kHostapdControlDirectory[] = "/var/run/hostapd";

// The guest network's interface, a second one on the adapter's radio, and its bridge.
inline constexpr char kGuestInterface[] = "gwlan";
inline constexpr char kGuestBridge[] = "gbr";

// What the rules that are in force let guests reach, by the keys of the settings; there while guests are on the air.
inline constexpr char kGuestRightsPath[] = "/var/run/rc.network/guest-rights";

// The bridge that translates addresses, which an access point is in when its settings say nothing else.
inline constexpr char kNatBridge[] = "lbr0";

// What the DHCP server of an interface and a tag gives out, and whether it serves. A bridge's tag is its own name.
inline constexpr char kDhcpDirectory[] = "/etc/dhcpd";
inline constexpr char kDhcpConfFormat[] = "/etc/dhcpd/dhcpd-%s-%s.conf";
inline constexpr char kDhcpInfoFormat[] = "/etc/dhcpd/dhcpd-%s-%s.info";

// What the DHCP server of a bridge has leased, unless its settings name another file.
inline constexpr char kLeasesFormat[] = "/var/run/rc.network/dnsmasq-%s.leases";

// The file from which the network start script knows an interface or a bridge.
inline constexpr char kInterfaceScriptDirectory[] = "/etc/sysconfig/network-scripts";
inline constexpr char kInterfaceScriptFormat[] = "/etc/sysconfig/network-scripts/ifcfg-%s";

// ---- The kit's scripts ----

// Start and restart of an access point: "start" or "restart", the wireless interface, the bridge.
inline constexpr char kNetworkScriptPath[] = "/etc/rc.network";

// What the adapter is used for: "change-mode", then "ap" or "client".
inline constexpr char kHotPlugScriptPath[] = "/usr/mero/hotplug/usb.wireless.function";

// The path that one of the formats above gives for an interface or a bridge, and a tag where the format has one.
class InterfacePath {
 public:
  [[gnu::noinline]] InterfacePath(const char* szFormat, const char* szIfName, const char* szTag = "") {
    std::snprintf(szPath_, sizeof szPath_, szFormat, szIfName, szTag);
  }

  const char* c_str() const { return szPath_; }

 private:
  char szPath_[4096];
};

#endif  // MERO_COMMON_PATHS_H
