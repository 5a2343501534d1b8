// The access-point daemon's files, and settings that they are written from.
#ifndef MERO_TESTS_UNIT_HOSTAPD_FILES_H
#define MERO_TESTS_UNIT_HOSTAPD_FILES_H

#include <cstring>
#include <filesystem>
#include <string>

#include "tests/support/early.h"
#include "unit_test.h"

EARLY inline const std::string kHostFile = "/etc/hostapd/hostapd-wlan0-host.conf";
EARLY inline const std::string kGuestFile = "/etc/hostapd/hostapd-wlan0-guest.conf";
EARLY inline const std::string kGuestInfoFile = "/etc/hostapd/hostapd-wlan0-guest.info";

// An open network on channel 6, and an open guest network that is switched off.
inline MERO_HOSTAP_CONF HomeAccessPoint() {
  MERO_HOSTAP_CONF conf{};
  std::strcpy(conf.szSSID, "Home");
  std::strcpy(conf.szBridge, "lbr0");
  conf.hwMode = AP_MODE_80211G;
  conf.wirelessWidth = AP_FREQ_20_MHZ;
  conf.channel = 6;
  conf.wmm = 1;
  std::strcpy(conf.guestNet.szSSID, "Guest");
  std::strcpy(conf.guestNet.szBSSID, "02:11:22:33:44:55");
  return conf;
}

// The security of a main network (MERO_HOSTAP_CONF) or of a guest network (MERO_HOSTAP_GUEST_NET).
template <class Network>
void SetWep(Network& network, const std::string& key) {
  network.encryption = AP_ENCRYPT_WEP;
  network.encryptInfo = {};
  std::strcpy(network.encryptInfo.szWepPwd, key.c_str());
}

template <class Network>
void SetPsk(Network& network, int wpaType, int encryptType, const std::string& passphrase = "correct horse") {
  network.encryption = AP_ENCRYPT_WPA_PSK;
  network.encryptInfo = {};
  network.encryptInfo.wpaPskInfo.wpaType = wpaType;
  network.encryptInfo.wpaPskInfo.encryptType = encryptType;
  std::strcpy(network.encryptInfo.wpaPskInfo.szPassPhrase, passphrase.c_str());
}

template <class Network>
void SetEap(Network& network, int wpaType, int encryptType) {
  network.encryption = AP_ENCRYPT_WPA_EAP;
  network.encryptInfo = {};
  network.encryptInfo.wpaEapInfo.wpaType = wpaType;
  network.encryptInfo.wpaEapInfo.encryptType = encryptType;
  std::strcpy(network.encryptInfo.wpaEapInfo.szAuthIP, "192.168.1.9");
  network.encryptInfo.wpaEapInfo.authPort = 1812;
  std::strcpy(network.encryptInfo.wpaEapInfo.szAuthSharedSecret, "radius secret");
}

class HostapdFilesTest : public UnitTest {
 protected:
  HostapdFilesTest() { Begin(); }

  // From here on no daemon runs, the model has a guest network, and none of the files is there.
  static void Begin() {
    fake::Begin();
    fake::PipesGive({""});
    fake::kill.Returns(0);
    fake::PLIBNetIfDown.Returns(1);
    fake::PLIBCFileCheckKeyValue.Returns(1);
    std::filesystem::remove_all("/etc/hostapd");
  }

  // Spares hundreds of writes the program that creates the directory.
  static void CreateDirectoryOnce() {
    std::filesystem::create_directory("/etc/hostapd");
    fake::PLIBCExec.Returns(0);
  }

  BOOL Write(const char* szIfName = "wlan0") {
    return memory::Run(0, [&] { return MEROWirelessSetHostAPConf(szIfName, &conf_); });
  }

  MERO_HOSTAP_CONF conf_ = HomeAccessPoint();
};

#endif  // MERO_TESTS_UNIT_HOSTAPD_FILES_H
