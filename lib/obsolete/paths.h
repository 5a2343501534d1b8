// The files and programs that the units share. Each path is spelled once.
#ifndef MERO_LIB_PATHS_H
#define MERO_LIB_PATHS_H

#include <cstdio>

// The access-point settings, one section an adapter model.
inline constexpr char kApSettingsPath[] = "/usr/mero/etc/wireless_ap.conf";

// The file that describes the adapter that is plugged in; its "PRODUCT" names the settings section.
inline constexpr char kAdapterInfoPath[] = "/tmp/wireless.info";
inline constexpr char kProductKey[] = "PRODUCT";

// Exists while an access point is being set up.
inline constexpr char kApMarkerPath[] = "/var/tmp/.wireless_ap_connecting";

// The appliance's network start script: "start" or "restart", the wireless interface, the bridge.
inline constexpr char kNetworkScriptPath[] = "/etc/rc.network";

// The configuration of the access-point daemon of an interface, and of its guest network, and the files that say
// whether they are switched on.
inline constexpr char kHostapdHostFormat[] = "/etc/hostapd/hostapd-%s-host.conf";
inline constexpr char kHostapdGuestFormat[] = "/etc/hostapd/hostapd-%s-guest.conf";
inline constexpr char kHostapdGuestInfoFormat[] = "/etc/hostapd/hostapd-%s-guest.info";
inline constexpr char kHostapdInfoFormat[] = "/etc/hostapd/hostapd-%s.info";

// The file that says whether the DHCP server of a bridge is switched on.
inline constexpr char kDhcpInfoFormat[] = "/etc/dhcpd/dhcpd-%1$s-%1$s.info";

// The file from which the network start script knows an interface or a bridge.
inline constexpr char kInterfaceScriptFormat[] = "/etc/sysconfig/network-scripts/ifcfg-%s";

// The path that one of the formats above gives for an interface or a bridge.
class InterfacePath {
 public:
  InterfacePath(const char* szFormat, const char* szIfName) {
    std::snprintf(szPath_, sizeof szPath_, szFormat, szIfName);
  }

  const char* c_str() const { return szPath_; }

 private:
  char szPath_[4096];
};

#endif  // MERO_LIB_PATHS_H
