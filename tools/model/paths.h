// The library's files that this program has to know.
#ifndef MERO_TOOLS_PATHS_H
#define MERO_TOOLS_PATHS_H

// Exist while a network is being joined, or an access point set up.
inline constexpr char kJoinMarker[] = "/var/tmp/.wireless_connecting";
inline constexpr char kApMarker[] = "/var/tmp/.wireless_ap_connecting";

// The known networks, each in a section that its access point's address names.
inline constexpr char kKnownNetworks[] = "/usr/mero/etc/wireless.conf";

// The access-point settings, and the form of their lines.
inline constexpr char kApSettings[] = "/usr/mero/etc/wireless_ap.conf";
inline constexpr char kApSettingsLine[] = "\t%s=%s\n";

// What the appliance's model can do.
inline constexpr char kModelFacts[] = "/etc.defaults/meroinfo.conf";

// The supplicant's pid file, which is removed when it ends, and the program that sends it requests.
inline constexpr char kSupplicantPid[] = "/var/run/wpa_supplicant.pid";
inline constexpr char kSupplicantClient[] = "/usr/sbin/wpa_cli";

// Where the supplicant has a control socket named after each interface.
inline constexpr char kSupplicantDirectory[] = "/var/run/wpa_supplicant/";

#endif  // MERO_TOOLS_PATHS_H
