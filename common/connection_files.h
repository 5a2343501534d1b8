// The files that a connection leaves while it lasts.
#ifndef MERO_COMMON_CONNECTION_FILES_H
#define MERO_COMMON_CONNECTION_FILES_H

// Five lines: name, protocol, authentication, encryption (as numbers), address of the access point.
inline constexpr char kConnectionRecordPath[] = "/var/tmp/.wireless_current_connection";

inline constexpr char kSupplicantPidPath[] = "/var/run/wpa_supplicant.pid";

#endif  // MERO_COMMON_CONNECTION_FILES_H
