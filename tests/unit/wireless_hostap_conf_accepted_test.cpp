// The files that are written, judged by the daemon that reads them: Debian's hostapd.
#include "hostapd_files.h"
#include "tests/support/shell.h"

namespace {

using testing::HasSubstr;
using testing::IsEmpty;

using Settings = MERO_HOSTAP_CONF;

const std::string kJoinedFile = "/tmp/joined.conf";

// A setting, and what the daemon has to say to it.
struct Row {
  std::string what;
  void (*set)(Settings& conf);
  std::string verdict;
};

class HostapdAccepts : public HostapdFilesTest {
 protected:
  HostapdAccepts() { CreateDirectoryOnce(); }

  // All that the daemon prints. It ends by itself, since there is no radio.
  static std::string OutputOfDaemon(const std::string& path) { return RunInShell("/usr/sbin/hostapd " + path).out; }

  // The daemon's verdict on a file: empty when it reads all of it and goes on to the radio of `szIfName`, else the
  // errors that it finds.
  static std::string VerdictOn(const std::string& path, const char* szIfName) {
    const std::string output = OutputOfDaemon(path);
    const size_t end = output.find(" errors found in configuration file '" + path + "'\n");
    if (end != std::string::npos) return output.substr(0, output.rfind('\n', end) + 1);
    return output.find(std::string(szIfName) + ": AP-DISABLED") != std::string::npos ? "" : output;
  }

  std::string VerdictOnHost() {
    EXPECT_EQ(Write(), TRUE);
    return VerdictOn(kHostFile, "wlan0");
  }

  // The guest network is one more of the same daemon: its file stands behind the main one.
  std::string VerdictOnGuest() {
    EXPECT_EQ(Write(), TRUE);
    WriteText(kJoinedFile, ReadText(kHostFile) + ReadText(kGuestFile));
    return VerdictOn(kJoinedFile, "gwlan");
  }
};

// ---- All that can be chosen ----

// Sets every security in turn, those of a pre-shared key and of EAP with every generation and cipher of WPA, and also
// with a cipher that is none.
template <class Network>
void ForEachSecurity(Network& network, const std::function<void(const std::string& what)>& check) {
  network.encryption = AP_ENCRYPT_OPEN;
  check("open");
  for (const char* szKey : {"abcde", "thirteenchars", "0123456789", "0123456789abcdef0123456789", "seven77"}) {
    SetWep(network, szKey);
    check(std::string("wep ") + szKey);
  }
  for (const int wpaType : {0, 1, 2, 3}) {
    for (const int encryptType : {0, 1, 2, 3}) {
      const std::string what = " of wpa " + std::to_string(wpaType) + " with cipher " + std::to_string(encryptType);
      SetPsk(network, wpaType, encryptType);
      check("key" + what);
      SetEap(network, wpaType, encryptType);
      check("eap" + what);
    }
  }
}

struct Radio {
  int hwMode;
  int ieee80211n;
  int wirelessWidth;
  int channel;
};

// Every mode with and without 802.11n, in either width, on channels with either suffix and with none.
std::vector<Radio> Radios() {
  std::vector<Radio> radios;
  for (const int hwMode : {1, 2, 4, 8, 12, 9, 6, 0, 15}) {
    for (const int channel : {1, 6, 36, 40, 149}) {
      radios.push_back({hwMode, 0, AP_FREQ_20_MHZ, channel});
      radios.push_back({hwMode, 1, AP_FREQ_20_MHZ, channel});
      radios.push_back({hwMode, 1, AP_FREQ_ALL, channel});
    }
  }
  return radios;
}

void SetRadio(Settings& conf, const Radio& radio) {
  conf.hwMode = radio.hwMode;
  conf.ieee80211n = radio.ieee80211n;
  conf.wirelessWidth = radio.wirelessWidth;
  conf.channel = radio.channel;
}

std::string Show(const Radio& radio) {
  return "mode " + std::to_string(radio.hwMode) + ", 802.11n " + std::to_string(radio.ieee80211n) + ", width " +
         std::to_string(radio.wirelessWidth) + ", channel " + std::to_string(radio.channel);
}

TEST_F(HostapdAccepts, EverySecurityUnder80211nAndWithout) {
  for (const Radio& radio : {Radio{AP_MODE_80211G, 0, AP_FREQ_20_MHZ, 6}, Radio{12, 1, AP_FREQ_ALL, 6},
                             Radio{AP_MODE_80211N, 1, AP_FREQ_20_MHZ, 1}, Radio{AP_MODE_80211A, 1, AP_FREQ_ALL, 36}}) {
    SetRadio(conf_, radio);
    ForEachSecurity(conf_, [&](const std::string& what) { EXPECT_EQ(VerdictOnHost(), "") << what << Show(radio); });
  }
}

TEST_F(HostapdAccepts, EveryRadioOpenAndProtected) {
  for (const Radio& radio : Radios()) {
    SetRadio(conf_, radio);
    conf_.encryption = AP_ENCRYPT_OPEN;
    EXPECT_EQ(VerdictOnHost(), "") << Show(radio);
    SetPsk(conf_, TYPE_WPA2, TYPE_CCMP);
    EXPECT_EQ(VerdictOnHost(), "") << Show(radio);
  }
}

TEST_F(HostapdAccepts, EverySecurityOfTheGuestsBesideEveryKindOfTheMainNetwork) {
  for (const int encryption : {AP_ENCRYPT_OPEN, AP_ENCRYPT_WEP, AP_ENCRYPT_WPA_PSK, AP_ENCRYPT_WPA_EAP}) {
    conf_.encryption = AP_ENCRYPT_OPEN;
    if (encryption == AP_ENCRYPT_WEP) SetWep(conf_, "abcde");
    if (encryption == AP_ENCRYPT_WPA_PSK) SetPsk(conf_, TYPE_WPA2, TYPE_CCMP);
    if (encryption == AP_ENCRYPT_WPA_EAP) SetEap(conf_, TYPE_WPA2, TYPE_CCMP);
    ForEachSecurity(conf_.guestNet, [&](const std::string& what) {
      EXPECT_EQ(VerdictOnGuest(), "") << what << " beside encryption " << encryption;
    });
  }
}

const Row kAccepted[] = {
    {"the longest name", [](Settings& conf) { std::strcpy(conf.szSSID, std::string(32, 'x').c_str()); }, ""},
    {"any bytes in the name", [](Settings& conf) { std::strcpy(conf.szSSID, " \"#=\\\t\r\x01\xff "); }, ""},
    {"a hidden name", [](Settings& conf) { conf.hideSSID = 1; }, ""},
    {"no bridge", [](Settings& conf) { conf.szBridge[0] = '\0'; }, ""},
    {"the greatest limit", [](Settings& conf) { conf.maxStation = 2007; }, ""},
    {"no channel", [](Settings& conf) { conf.channel = 0; }, ""},
    {"no WMM", [](Settings& conf) { conf.wmm = 0; }, ""},
    {"another kind of 802.11n", [](Settings& conf) { conf.ieee80211n = 2; }, ""},
    {"the shortest passphrase", [](Settings& conf) { SetPsk(conf, 2, 2, "12345678"); }, ""},
    {"the longest passphrase", [](Settings& conf) { SetPsk(conf, 2, 2, std::string(63, 'p')); }, ""},
    {"any characters in the passphrase", [](Settings& conf) { SetPsk(conf, 2, 2, " #\"'=\\ ~ "); }, ""},
    {"quotes in a WEP key", [](Settings& conf) { SetWep(conf, "\"a\"b\""); }, ""},
    {"isolated guests", [](Settings& conf) { conf.guestNet.blAPIsolate = TRUE; }, ""},
    {"hidden guests", [](Settings& conf) { conf.guestNet.hideSSID = 1; }, ""},
    {"limited guests", [](Settings& conf) { conf.guestNet.maxStation = 8; }, ""},
};

TEST_F(HostapdAccepts, WhateverElseCanBeChosen) {
  for (const Row& row : kAccepted) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(VerdictOnHost(), row.verdict) << row.what;
    EXPECT_EQ(VerdictOnGuest(), row.verdict) << row.what;
  }
}

// ---- What it refuses, and why ----

const Row kRefusedHosts[] = {
    {"no name", [](Settings& conf) { conf.szSSID[0] = '\0'; }, "Line 3: invalid SSID ''\n"},
    {"a name of 33 bytes", [](Settings& conf) { std::strcpy(conf.szSSID, std::string(33, 'x').c_str()); },
     "Line 3: invalid SSID 'xxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxxx'\n"},
    {"a limit beyond what a network can have", [](Settings& conf) { conf.maxStation = 2008; },
     "Line 11: Invalid max_num_sta=2008; allowed range 0..2007\n"},
    {"digits of a WEP key that are none", [](Settings& conf) { SetWep(conf, "notinbase8"); },
     "Line 18: invalid WEP key 'wep_key0'\n"},
    {"no passphrase", [](Settings& conf) { SetPsk(conf, 2, 2, ""); },
     "Line 19: invalid WPA passphrase length 0 (expected 8..63)\n"},
    {"a passphrase of 7 characters", [](Settings& conf) { SetPsk(conf, 2, 2, "1234567"); },
     "Line 19: invalid WPA passphrase length 7 (expected 8..63)\n"},
    {"a key of 64 digits", [](Settings& conf) { SetPsk(conf, 2, 2, std::string(64, 'f')); },
     "Line 19: invalid WPA passphrase length 64 (expected 8..63)\n"},
    {"no address of the RADIUS server",
     [](Settings& conf) {
       SetEap(conf, 2, 2);
       conf.encryptInfo.wpaEapInfo.szAuthIP[0] = '\0';
     },
     "Line 22: invalid IP address ''\n"},
    {"a name for the RADIUS server's address",
     [](Settings& conf) {
       SetEap(conf, 2, 2);
       std::strcpy(conf.encryptInfo.wpaEapInfo.szAuthIP, "radius");
     },
     "Line 22: invalid IP address 'radius'\n"},
    {"no secret of the RADIUS server",
     [](Settings& conf) {
       SetEap(conf, 2, 2);
       conf.encryptInfo.wpaEapInfo.szAuthSharedSecret[0] = '\0';
     },
     "Line 24: empty shared secret is not allowed\n"},
};

TEST_F(HostapdAccepts, NotWhatNoNetworkCanHave) {
  for (const Row& row : kRefusedHosts) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(VerdictOnHost(), row.verdict) << row.what;
  }
}

const Row kRefusedGuests[] = {
    {"no address", [](Settings& conf) { conf.guestNet.szBSSID[0] = '\0'; }, "Line 18: invalid bssid item\n"},
    {"an address in another form", [](Settings& conf) { std::strcpy(conf.guestNet.szBSSID, "02-11-22-33-44-55"); },
     "Line 18: invalid bssid item\n"},
    {"no name", [](Settings& conf) { conf.guestNet.szSSID[0] = '\0'; }, "Line 19: invalid SSID ''\n"},
    {"a limit beyond what a network can have", [](Settings& conf) { conf.guestNet.maxStation = 2008; },
     "Line 22: Invalid max_num_sta=2008; allowed range 0..2007\n"},
    {"digits of a WEP key that are none", [](Settings& conf) { SetWep(conf.guestNet, "notinbase8"); },
     "Line 25: invalid WEP key 'wep_key0'\n"},
    {"a passphrase of 7 characters, and then none", [](Settings& conf) { SetPsk(conf.guestNet, 2, 2, "1234567"); },
     "Line 26: invalid WPA passphrase length 7 (expected 8..63)\n"
     "WPA-PSK enabled, but PSK or passphrase is not configured.\n"},
};

TEST_F(HostapdAccepts, NotWhatNoGuestNetworkCanHave) {
  for (const Row& row : kRefusedGuests) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(VerdictOnHost(), "") << row.what;
    EXPECT_EQ(VerdictOnGuest(), row.verdict) << row.what;
  }
}

// ---- What it accepts, and sets aside ----

const Row kSetAside[] = {
    {"802.11n with WEP",
     [](Settings& conf) {
       conf.ieee80211n = 1;
       SetWep(conf, "abcde");
     },
     "HT (IEEE 802.11n) with WEP is not allowed, disabling HT capabilities\n"},
    {"802.11n with TKIP alone",
     [](Settings& conf) {
       conf.ieee80211n = 1;
       SetPsk(conf, TYPE_WPA2, TYPE_TKIP);
     },
     "HT (IEEE 802.11n) with WPA/WPA2 requires CCMP/GCMP to be enabled, disabling HT capabilities\n"},
    {"802.11n with 802.11b",
     [](Settings& conf) {
       conf.ieee80211n = 1;
       conf.hwMode = AP_MODE_80211B;
     },
     "HT (IEEE 802.11n) in 11b mode is not allowed, disabling HT capabilities\n"},
    {"802.11n with two modes, which are that of no line: 802.11b",
     [](Settings& conf) {
       conf.ieee80211n = 1;
       conf.hwMode = AP_MODE_80211B | AP_MODE_80211G;
     },
     "HT (IEEE 802.11n) in 11b mode is not allowed, disabling HT capabilities\n"},
    {"WPS of a hidden network", [](Settings& conf) { conf.hideSSID = 1; },
     "WPS: ignore_broadcast_ssid configuration forced WPS to be disabled\n"},
    {"WPS with WEP", [](Settings& conf) { SetWep(conf, "abcde"); },
     "WPS: WEP configuration forced WPS to be disabled\n"},
    {"WPS with the first WPA alone", [](Settings& conf) { SetPsk(conf, TYPE_WPA, TYPE_CCMP); },
     "WPS: WPA/TKIP configuration without WPA2/CCMP/GCMP forced WPS to be disabled\n"},
    {"WPS with TKIP alone", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, TYPE_TKIP); },
     "WPS: WPA/TKIP configuration without WPA2/CCMP/GCMP forced WPS to be disabled\n"},
};

TEST_F(HostapdAccepts, ButSetsAsideWhatDoesNotGoTogether) {
  for (const Row& row : kSetAside) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(VerdictOnHost(), "") << row.what;
    EXPECT_THAT(OutputOfDaemon(kHostFile), HasSubstr(row.verdict)) << row.what;
  }
}

}  // namespace
