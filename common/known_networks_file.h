// The keys of the file of known networks.
#ifndef MERO_COMMON_KNOWN_NETWORKS_FILE_H
#define MERO_COMMON_KNOWN_NETWORKS_FILE_H

// The keys of a section, in the order in which they are written.
inline constexpr char kKeySecret[] = "KEY";
inline constexpr char kKeyAddress[] = "IPADDR";
inline constexpr char kKeyMask[] = "NETMASK";
inline constexpr char kKeyGateway[] = "GATEWAY";
inline constexpr char kKeyEssid[] = "ESSID";
inline constexpr char kKeyBssid[] = "BSSID";
inline constexpr char kKeyMode[] = "MODE";
inline constexpr char kKeyAccessTime[] = "ACCESS_TIME";
inline constexpr char kKeyAuth[] = "AUTH";
inline constexpr char kKeyEncrypt[] = "ENCRYPT";

#endif  // MERO_COMMON_KNOWN_NETWORKS_FILE_H
