// The store of known networks, and what stands in it.
#ifndef MERO_TESTS_UNIT_KNOWN_NETWORKS_H
#define MERO_TESTS_UNIT_KNOWN_NETWORKS_H

#include <cstring>
#include <string>

#include "tests/support/early.h"
#include "wireless.h"

EARLY inline const std::string kStore = "/usr/mero/etc/wireless.conf";

// A network with a value in every field, and the name of its section.
EARLY inline const std::string kHomeSection = "00:11:22:AA:BB:CC";

inline WIRELESS_NETWORK_CONFIG HomeNetwork() {
  WIRELESS_NETWORK_CONFIG config{};
  std::strcpy(config.szKey, "correct horse");
  std::strcpy(config.szIp, "192.168.1.20");
  std::strcpy(config.szMask, "255.255.255.0");
  std::strcpy(config.szGateway, "192.168.1.1");
  config.atime = 77;
  std::strcpy(config.network.szEssid, "Home Net");
  std::memcpy(config.network.bssid, "\x00\x11\x22\xAA\xBB\xCC", 6);
  config.network.channel = 11;
  config.network.signal = -40;
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.network.protocol = WIRELESS_PROTO_11N;
  config.network.auth = WIRELESS_AUTH_WPA2PSK;
  config.network.encrypt = WIRELESS_ENCRYPT_AES;
  config.noneBssid = 1;
  std::strcpy(config.szUser, "alice");
  return config;
}

// The section that saving it at a time leaves.
inline std::string HomeSectionSavedAt(long long seconds) {
  return "[" + kHomeSection +
         "]\n"
         "\tKEY=correct horse\n"
         "\tIPADDR=192.168.1.20\n"
         "\tNETMASK=255.255.255.0\n"
         "\tGATEWAY=192.168.1.1\n"
         "\tESSID=Home Net\n"
         "\tBSSID=00:11:22:AA:BB:CC\n"
         "\tMODE=MANAGED\n"
         "\tACCESS_TIME=" +
         std::to_string(seconds) +
         "\n"
         "\tAUTH=WPA2PSK\n"
         "\tENCRYPT=AES\n";
}

// The nth of many networks, saved at a time, as a section.
inline std::string NthBssid(unsigned n) {
  char szText[32];
  std::snprintf(szText, sizeof szText, "02:00:%02X:%02X:%02X:%02X", n >> 24 & 0xff, n >> 16 & 0xff, n >> 8 & 0xff,
                n & 0xff);
  return szText;
}

inline std::string NthSection(unsigned n, const std::string& seconds) {
  const std::string bssid = NthBssid(n);
  return "[" + bssid + "]\n\tESSID=net " + std::to_string(n) + "\n\tBSSID=" + bssid + "\n\tACCESS_TIME=" + seconds +
         "\n";
}

#endif  // MERO_TESTS_UNIT_KNOWN_NETWORKS_H
