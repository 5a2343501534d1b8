// The files and programs that the units share. Each path is spelled once.
#ifndef MERO_LIB_PATHS_H
#define MERO_LIB_PATHS_H

// The access-point settings, one section an adapter model.
inline constexpr char kApSettingsPath[] = "/usr/mero/etc/wireless_ap.conf";

// What the platform tells about the adapter that is plugged in; "PRODUCT" names its settings section.
inline constexpr char kAdapterInfoPath[] = "/tmp/wireless.info";
inline constexpr char kProductKey[] = "PRODUCT";

// Exists while an access point is being set up.
inline constexpr char kApMarkerPath[] = "/var/tmp/.wireless_ap_connecting";

#endif  // MERO_LIB_PATHS_H
