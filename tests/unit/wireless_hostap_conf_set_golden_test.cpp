// The access-point daemon's files, byte for byte, and the rules by which their lines come about.
#include <climits>
#include <optional>
#include <set>
#include <sstream>

#include "hostapd_files.h"
#include "hostile_texts.h"

namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;

using Settings = MERO_HOSTAP_CONF;

// ---- Whole files ----

std::string GoldenText(const std::string& name) {
  return ReadText(MERO_TEST_DATA "/hostapd/" + name + ".conf");
}

// A file as it must be, and a setting that it comes of.
struct Row {
  std::string name;
  void (*set)(Settings& conf);
};

const Row kHostRows[] = {
    {"open", [](Settings&) {}},
    {"open", [](Settings& conf) { conf.encryption = static_cast<MERO_AP_ENCRYPT>(-1); }},
    {"open", [](Settings& conf) { conf.encryption = static_cast<MERO_AP_ENCRYPT>(INT_MIN); }},
    {"open", [](Settings& conf) { conf.encryption = AP_ENCRYPT_MAX; }},
    {"open", [](Settings& conf) { conf.encryption = static_cast<MERO_AP_ENCRYPT>(INT_MAX); }},
    {"open", [](Settings& conf) { conf.ieee80211n = -1; }},
    {"open", [](Settings& conf) { conf.wirelessWidth = AP_FREQ_ALL; }},  // says nothing without 802.11n

    {"wep-5-characters", [](Settings& conf) { SetWep(conf, "abcde"); }},
    {"wep-13-characters", [](Settings& conf) { SetWep(conf, "thirteenchars"); }},
    {"wep-10-digits", [](Settings& conf) { SetWep(conf, "0123456789"); }},
    {"wep-26-digits", [](Settings& conf) { SetWep(conf, "0123456789abcdef0123456789"); }},
    {"wep-8-characters", [](Settings& conf) { SetWep(conf, "12345678"); }},

    {"wpa-psk-tkip", [](Settings& conf) { SetPsk(conf, TYPE_WPA, TYPE_TKIP); }},
    {"wpa-psk-ccmp", [](Settings& conf) { SetPsk(conf, TYPE_WPA, TYPE_CCMP); }},
    {"wpa2-psk-tkip", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, TYPE_TKIP); }},
    {"wpa2-psk-ccmp", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, TYPE_CCMP); }},
    {"wpa-wpa2-psk-tkip-ccmp", [](Settings& conf) { SetPsk(conf, TYPE_WPA | TYPE_WPA2, TYPE_TKIP_CCMP); }},
    {"wpa2-psk-unknown-cipher", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, 0); }},
    {"wpa2-psk-unknown-cipher", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, 4); }},

    {"wpa-eap-tkip", [](Settings& conf) { SetEap(conf, TYPE_WPA, TYPE_TKIP); }},
    {"wpa2-eap-ccmp", [](Settings& conf) { SetEap(conf, TYPE_WPA2, TYPE_CCMP); }},
    {"wpa-wpa2-eap-tkip-ccmp", [](Settings& conf) { SetEap(conf, TYPE_WPA | TYPE_WPA2, TYPE_TKIP_CCMP); }},
    {"wpa2-eap-unknown-cipher", [](Settings& conf) { SetEap(conf, TYPE_WPA2, -1); }},

    {"a",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211A;
       conf.channel = 36;
     }},
    {"b",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211B;
       conf.channel = 1;
     }},
    {"no-mode", [](Settings& conf) { conf.hwMode = AP_MODE_80211G | AP_MODE_80211N; }},
    {"no-mode", [](Settings& conf) { conf.hwMode = AP_MODE_80211A | AP_MODE_80211N; }},
    {"no-mode", [](Settings& conf) { conf.hwMode = AP_MODE_80211B | AP_MODE_80211G; }},
    {"no-mode", [](Settings& conf) { conf.hwMode = 0; }},
    {"n-alone-without-11n", [](Settings& conf) { conf.hwMode = AP_MODE_80211N; }},

    {"11n-a-channel-36-40mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211A;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_ALL;
       conf.channel = 36;
     }},
    {"11n-a-channel-149-40mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211A;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_40_MHZ;
       conf.channel = 149;
     }},
    {"11n-an-channel-36-40mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211A | AP_MODE_80211N;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_ALL;
       conf.channel = 36;
     }},
    {"11n-bg-channel-5-40mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211B | AP_MODE_80211G;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_ALL;
       conf.channel = 5;
     }},
    {"11n-gn-channel-11-20mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211G | AP_MODE_80211N;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_20_MHZ;
       conf.channel = 11;
     }},
    {"11n-gn-channel-11-40mhz",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211G | AP_MODE_80211N;
       conf.ieee80211n = 2;
       conf.wirelessWidth = AP_FREQ_ALL;
       conf.channel = 11;
       SetPsk(conf, TYPE_WPA2, TYPE_CCMP);
     }},
    {"11n-n-alone-wpa2-psk-ccmp",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211N;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_ALL;
       conf.channel = 1;
       SetPsk(conf, TYPE_WPA2, TYPE_CCMP);
     }},
    {"11n-n-alone-wpa2-psk-tkip",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211N;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_20_MHZ;
       conf.channel = 1;
       SetPsk(conf, TYPE_WPA2, TYPE_TKIP);
     }},
    {"11n-n-alone-wep",
     [](Settings& conf) {
       conf.hwMode = AP_MODE_80211N;
       conf.ieee80211n = 1;
       conf.wirelessWidth = AP_FREQ_40_MHZ;
       conf.channel = 13;
       SetWep(conf, "abcde");
     }},

    {"hidden-limited-no-bridge-no-wmm",
     [](Settings& conf) {
       std::strcpy(conf.szSSID, " Caf\xc3\xa9 #1 \"x\" ");
       conf.szBridge[0] = '\0';
       conf.hideSSID = 1;
       conf.maxStation = 25;
       conf.wmm = 0;
     }},
};

const Row kGuestRows[] = {
    {"guest-open", [](Settings&) {}},
    {"guest-open", [](Settings& conf) { conf.guestNet.blEnable = TRUE; }},
    {"guest-open", [](Settings& conf) { SetEap(conf.guestNet, TYPE_WPA2, TYPE_CCMP); }},
    {"guest-open", [](Settings& conf) { conf.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(-1); }},
    {"guest-open", [](Settings& conf) { conf.guestNet.encryption = AP_ENCRYPT_MAX; }},
    {"guest-open", [](Settings& conf) { SetPsk(conf, TYPE_WPA2, TYPE_CCMP); }},  // the main network's

    {"guest-wep-5-characters", [](Settings& conf) { SetWep(conf.guestNet, "abcde"); }},
    {"guest-wep-26-digits", [](Settings& conf) { SetWep(conf.guestNet, "0123456789abcdef0123456789"); }},
    {"guest-wep-8-characters", [](Settings& conf) { SetWep(conf.guestNet, "12345678"); }},

    {"guest-wpa-psk-tkip", [](Settings& conf) { SetPsk(conf.guestNet, TYPE_WPA, TYPE_TKIP); }},
    {"guest-wpa2-psk-ccmp", [](Settings& conf) { SetPsk(conf.guestNet, TYPE_WPA2, TYPE_CCMP); }},
    {"guest-wpa-wpa2-psk-tkip-ccmp",
     [](Settings& conf) { SetPsk(conf.guestNet, TYPE_WPA | TYPE_WPA2, TYPE_TKIP_CCMP); }},
    {"guest-wpa2-psk-unknown-cipher", [](Settings& conf) { SetPsk(conf.guestNet, TYPE_WPA2, 0); }},

    {"guest-no-address", [](Settings& conf) { conf.guestNet.szBSSID[0] = '\0'; }},
    {"guest-hidden-isolated-limited",
     [](Settings& conf) {
       std::strcpy(conf.guestNet.szSSID, " Visitors = all ");
       conf.guestNet.hideSSID = 2;
       conf.guestNet.blAPIsolate = TRUE;
       conf.guestNet.maxStation = 8;
     }},
};

class HostapdFiles : public HostapdFilesTest {
 protected:
  HostapdFiles() { CreateDirectoryOnce(); }

  std::string TextAfterWriting(const std::string& path) {
    EXPECT_EQ(Write(), TRUE);
    return ReadText(path);
  }
};

TEST_F(HostapdFiles, AreExactlyThatOfTheMainNetwork) {
  for (const Row& row : kHostRows) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(TextAfterWriting(kHostFile), GoldenText(row.name)) << row.name << ", row " << &row - kHostRows;
  }
}

TEST_F(HostapdFiles, AreExactlyThatOfTheGuestNetwork) {
  for (const Row& row : kGuestRows) {
    conf_ = HomeAccessPoint();
    row.set(conf_);
    EXPECT_EQ(TextAfterWriting(kGuestFile), GoldenText(row.name)) << row.name << ", row " << &row - kGuestRows;
  }
}

TEST_F(HostapdFiles, AreAllComparedWithTheirExamples) {
  std::set<std::string> compared;
  for (const Row& row : kHostRows) compared.insert(row.name + ".conf");
  for (const Row& row : kGuestRows) compared.insert(row.name + ".conf");
  std::set<std::string> examples;
  for (const auto& file : std::filesystem::directory_iterator(MERO_TEST_DATA "/hostapd")) {
    examples.insert(file.path().filename());
  }
  EXPECT_EQ(compared, examples);
}

TEST_F(HostapdFiles, TellWhetherTheGuestNetworkIsSwitchedOn) {
  for (const int enable : {0, 1, 2, -1}) {
    conf_.guestNet.blEnable = static_cast<BOOL>(enable);
    EXPECT_EQ(TextAfterWriting(kGuestInfoFile), enable == 0 ? "enable=no\n" : "enable=yes\n") << enable;
  }
}

// ---- Rules of single lines ----

// The value of a key's only line; none when there is no line.
std::optional<std::string> ValueOf(const std::string& key, const std::string& text) {
  std::optional<std::string> value;
  std::istringstream lines(text);
  for (std::string line; std::getline(lines, line);) {
    if (!line.starts_with(key + "=")) continue;
    EXPECT_FALSE(value.has_value()) << "two lines of " << key;
    value = line.substr(key.size() + 1);
  }
  return value;
}

using Value = std::optional<std::string>;
constexpr std::nullopt_t kNoLine = std::nullopt;

class HostapdRule : public HostapdFiles {
 protected:
  Value HostValue(const std::string& key) { return ValueOf(key, TextAfterWriting(kHostFile)); }
  Value GuestValue(const std::string& key) { return ValueOf(key, TextAfterWriting(kGuestFile)); }
};

// Channels of either band, and others.
const std::vector<int> kChannels = {INT_MIN, -1, 0,  1,  2,  3,  4,  5,  6,   7,   8,   9,   10,  11,  12,     13,
                                    14,      34, 35, 36, 37, 38, 40, 42, 44,  46,  48,  50,  52,  54,  56,     58,
                                    60,      62, 63, 64, 65, 68, 72, 96, 100, 104, 140, 149, 153, 161, INT_MAX};

TEST_F(HostapdRule, TheSecondChannelLiesBySingleChannelsFor80211aAloneAndBy5And6ForAnythingElse) {
  const std::set<int> aboveOn5GHz = {36, 44, 52, 60};
  const std::set<int> belowOn5GHz = {40, 48, 56, 64};
  conf_.ieee80211n = 1;
  conf_.wirelessWidth = AP_FREQ_40_MHZ;
  for (const int channel : kChannels) {
    conf_.channel = channel;
    const std::string on5GHz = aboveOn5GHz.contains(channel)   ? "[HT40+]"
                               : belowOn5GHz.contains(channel) ? "[HT40-]"
                                                               : "";
    const std::string onOthers = channel <= 5 ? "[HT40+]" : "[HT40-]";
    for (const int mode : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 12, 15, 16, 17, -1}) {
      conf_.hwMode = mode;
      EXPECT_EQ(HostValue("ht_capab"),
                "[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935]" + (mode == 1 ? on5GHz : onOthers))
          << "mode " << mode << ", channel " << channel;
      EXPECT_EQ(HostValue("channel"), std::to_string(channel));
    }
  }
}

TEST_F(HostapdRule, TheWidthIsThatOf40MHzWhereItsBitIsSetAndNothingIsSaidWithout80211n) {
  const std::string narrow = "[SHORT-GI-20][DELAYED-BA]";
  const std::string wide = "[SHORT-GI-20][DELAYED-BA][SHORT-GI-40][MAX-AMSDU-7935][HT40-]";
  const struct {
    int width;
    std::string capabilities;
  } kWidths[] = {{0, narrow},
                 {AP_FREQ_20_MHZ, narrow},
                 {AP_FREQ_40_MHZ, wide},
                 {AP_FREQ_ALL, wide},
                 {4, narrow},
                 {5, narrow},
                 {6, wide},
                 {-1, wide}};
  for (const auto& row : kWidths) {
    conf_.wirelessWidth = row.width;
    for (const int ieee80211n : {1, 2, INT_MAX}) {
      conf_.ieee80211n = ieee80211n;
      EXPECT_EQ(HostValue("ht_capab"), row.capabilities) << row.width;
      EXPECT_EQ(HostValue("ieee80211n"), std::to_string(ieee80211n));
    }
    for (const int ieee80211n : {0, -1, INT_MIN}) {
      conf_.ieee80211n = ieee80211n;
      EXPECT_EQ(HostValue("ht_capab"), kNoLine) << row.width;
      EXPECT_EQ(HostValue("ieee80211n"), kNoLine);
    }
  }
}

TEST_F(HostapdRule, TheModeIsASingleOneAnd80211nDoesNotCountBesideAnotherOnceItIsOn) {
  const struct {
    int mode;
    Value without80211n;
    Value with80211n;
  } kModes[] = {
      {0, kNoLine, kNoLine},  {1, "a", "a"},          {2, "b", "b"},          {3, kNoLine, kNoLine},
      {4, "g", "g"},          {5, kNoLine, kNoLine},  {6, kNoLine, kNoLine},  {7, kNoLine, kNoLine},
      {8, "g", "g"},          {9, kNoLine, "a"},      {10, kNoLine, "b"},     {11, kNoLine, kNoLine},
      {12, kNoLine, "g"},     {13, kNoLine, kNoLine}, {14, kNoLine, kNoLine}, {15, kNoLine, kNoLine},
      {16, kNoLine, kNoLine}, {17, kNoLine, "a"},     {24, kNoLine, kNoLine}, {-1, kNoLine, kNoLine},
  };
  for (const auto& row : kModes) {
    conf_.hwMode = row.mode;
    for (const int ieee80211n : {0, -1, INT_MIN}) {
      conf_.ieee80211n = ieee80211n;
      EXPECT_EQ(HostValue("hw_mode"), row.without80211n) << row.mode;
    }
    for (const int ieee80211n : {1, 2, INT_MAX}) {
      conf_.ieee80211n = ieee80211n;
      EXPECT_EQ(HostValue("hw_mode"), row.with80211n) << row.mode;
    }
  }
}

// Where the record keeps the cipher of a pre-shared key, other encryptions have what they have.
TEST_F(HostapdRule, StationsMustMaster80211nUnlessWepOrTheCipherOfAPreSharedKeyIsTkipWhateverTheEncryption) {
  const std::string required = "wmm_enabled=1\nrequire_ht=1\nhw_mode=g\neap_server=";
  const std::string free = "wmm_enabled=1\nhw_mode=g\neap_server=";
  conf_.hwMode = AP_MODE_80211N;
  for (const int encryption : {-1, 0, 1, 2, 3, 4, INT_MAX}) {
    for (const int encryptType : {-1, 0, 1, 2, 3, 4, 257}) {
      for (const int ieee80211n : {0, 1}) {
        conf_.ieee80211n = ieee80211n;
        conf_.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
        conf_.encryptInfo = {};
        conf_.encryptInfo.wpaPskInfo.encryptType = encryptType;
        const bool isRequired = encryption != AP_ENCRYPT_WEP && encryptType != TYPE_TKIP;
        EXPECT_THAT(TextAfterWriting(kHostFile), HasSubstr(isRequired ? required : free))
            << "encryption " << encryption << ", cipher " << encryptType;
      }
    }
  }
}

TEST_F(HostapdRule, StationsMustMaster80211nAlsoUnderEapWithTkip) {
  conf_.hwMode = AP_MODE_80211N;
  SetEap(conf_, TYPE_WPA, TYPE_TKIP);
  EXPECT_EQ(HostValue("require_ht"), "1");
}

TEST_F(HostapdRule, StationsNeedNotMaster80211nWhenItIsNotTheOnlyMode) {
  for (const int mode : {0, 1, 2, 3, 4, 5, 6, 7, 9, 10, 11, 12, 13, 14, 15, 24}) {
    for (const int ieee80211n : {0, 1}) {
      conf_.hwMode = mode;
      conf_.ieee80211n = ieee80211n;
      EXPECT_EQ(HostValue("require_ht"), kNoLine) << mode;
    }
  }
}

TEST_F(HostapdRule, NumbersStandAsTheyAreAndALimitOnlyWhereThereIsOne) {
  for (const int number : {INT_MIN, -1, 0, 1, 2, 25, INT_MAX}) {
    conf_.hideSSID = conf_.maxStation = conf_.wmm = conf_.guestNet.hideSSID = conf_.guestNet.maxStation = number;
    const std::string text = std::to_string(number);
    const Value limit = number > 0 ? Value(text) : kNoLine;
    EXPECT_EQ(HostValue("ignore_broadcast_ssid"), text);
    EXPECT_EQ(HostValue("max_num_sta"), limit);
    EXPECT_EQ(HostValue("wmm_enabled"), number > 0 ? "1" : "0") << number;
    EXPECT_EQ(GuestValue("ignore_broadcast_ssid"), text);
    EXPECT_EQ(GuestValue("max_num_sta"), limit);
  }
}

TEST_F(HostapdRule, GuestsAreKeptApartWhenTheyAreToBe) {
  for (const int isolate : {0, 1, 2, -1}) {
    conf_.guestNet.blAPIsolate = static_cast<BOOL>(isolate);
    EXPECT_EQ(GuestValue("ap_isolate"), isolate == 0 ? kNoLine : Value("1"));
    EXPECT_EQ(HostValue("ap_isolate"), kNoLine);
  }
}

// ---- Security ----

std::string CipherLines(int encryptType) {
  switch (encryptType) {
    case 1:
      return "wpa_pairwise=TKIP\nrsn_pairwise=TKIP\n";
    case 2:
      return "wpa_pairwise=CCMP\nrsn_pairwise=CCMP\n";
    case 3:
      return "wpa_pairwise=TKIP CCMP\nrsn_pairwise=TKIP CCMP\n";
    default:
      return "";
  }
}

TEST_F(HostapdRule, EveryWpaTypeStandsAsItIsWithTheLinesOfEveryCipher) {
  for (const int wpaType : {INT_MIN, -1, 0, 1, 2, 3, 4, INT_MAX}) {
    for (const int encryptType : {INT_MIN, -1, 0, 1, 2, 3, 4, 257, INT_MAX}) {
      const std::string wpa = "auth_algs=1\nwpa=" + std::to_string(wpaType) + "\n";
      const std::string psk = wpa + "wpa_key_mgmt=WPA-PSK\nwpa_passphrase=correct horse\n" + CipherLines(encryptType);
      SetPsk(conf_, wpaType, encryptType);
      SetPsk(conf_.guestNet, wpaType, encryptType);
      EXPECT_THAT(TextAfterWriting(kHostFile), EndsWith("\nhw_mode=g\neap_server=1\n" + psk));
      EXPECT_THAT(ReadText(kGuestFile), EndsWith("\nignore_broadcast_ssid=0\n" + psk));

      SetEap(conf_, wpaType, encryptType);
      EXPECT_THAT(TextAfterWriting(kHostFile),
                  EndsWith("\nhw_mode=g\neap_server=0\n" + wpa + "wpa_key_mgmt=WPA-EAP\n" + CipherLines(encryptType) +
                           "ieee8021x=1\nauth_server_addr=192.168.1.9\nauth_server_port=1812\n"
                           "auth_server_shared_secret=radius secret\n"));
    }
  }
}

TEST_F(HostapdRule, AWepKeyStandsAsTextOrDigitsByItsLengthAloneAndNotAtAllWithAnother) {
  for (size_t size = 0; size < sizeof conf_.encryptInfo.szWepPwd; ++size) {
    const std::string key(size, size % 2 == 0 ? 'z' : '7');
    SetWep(conf_, key);
    SetWep(conf_.guestNet, key);
    const bool isText = size == 5 || size == 13;
    const bool isDigits = size == 10 || size == 26;
    const std::string line = isText ? "wep_key0=\"" + key + "\"\n" : isDigits ? "wep_key0=" + key + "\n" : "";
    const std::string wep = "auth_algs=3\nwep_default_key=0\n" + line;
    EXPECT_THAT(TextAfterWriting(kHostFile), EndsWith("\nhw_mode=g\neap_server=1\n" + wep));
    EXPECT_THAT(ReadText(kGuestFile), EndsWith("\nignore_broadcast_ssid=0\n" + wep));
  }
}

TEST_F(HostapdRule, NamesAndSecretsStandAsTheyAre) {
  for (const std::string& text : kHostileTexts) {
    if (text.find('\n') != std::string::npos) continue;
    std::strcpy(conf_.szSSID, text.c_str());
    std::strcpy(conf_.szBridge, text.substr(0, 15).c_str());
    SetPsk(conf_, TYPE_WPA2, TYPE_CCMP, text);
    std::strcpy(conf_.guestNet.szSSID, text.c_str());
    std::strcpy(conf_.guestNet.szBSSID, text.c_str());
    SetPsk(conf_.guestNet, TYPE_WPA2, TYPE_CCMP, text);
    EXPECT_EQ(HostValue("ssid"), text);
    EXPECT_EQ(HostValue("bridge"), text.substr(0, 15));
    EXPECT_EQ(HostValue("wpa_passphrase"), text);
    EXPECT_EQ(GuestValue("ssid"), text);
    EXPECT_EQ(GuestValue("bssid"), text);
    EXPECT_EQ(GuestValue("wpa_passphrase"), text);

    SetEap(conf_, TYPE_WPA2, TYPE_CCMP);
    std::strcpy(conf_.encryptInfo.wpaEapInfo.szAuthIP, text.substr(0, 19).c_str());
    std::strcpy(conf_.encryptInfo.wpaEapInfo.szAuthSharedSecret, text.c_str());
    EXPECT_EQ(HostValue("auth_server_addr"), text.substr(0, 19));
    EXPECT_EQ(HostValue("auth_server_shared_secret"), text);
  }
}

TEST_F(HostapdRule, ValuesMayFillTheirFields) {
  const std::string name(sizeof conf_.szSSID - 1, 'n');
  const std::string secret(sizeof conf_.encryptInfo.wpaPskInfo.szPassPhrase - 1, 's');
  std::strcpy(conf_.szSSID, name.c_str());
  std::strcpy(conf_.guestNet.szSSID, name.c_str());
  std::strcpy(conf_.guestNet.szBSSID, name.c_str());
  SetPsk(conf_, TYPE_WPA2, TYPE_CCMP, secret);
  SetPsk(conf_.guestNet, TYPE_WPA2, TYPE_CCMP, secret);
  EXPECT_EQ(HostValue("ssid"), name);
  EXPECT_EQ(HostValue("wpa_passphrase"), secret);
  EXPECT_EQ(GuestValue("ssid"), name);
  EXPECT_EQ(GuestValue("bssid"), name);
  EXPECT_EQ(GuestValue("wpa_passphrase"), secret);
}

TEST_F(HostapdRule, ASecretOfAnotherEncryptionIsNotTold) {
  SetPsk(conf_, TYPE_WPA2, TYPE_CCMP, "not to be told");
  SetPsk(conf_.guestNet, TYPE_WPA2, TYPE_CCMP, "not to be told");
  for (const int encryption : {-1, 0, 1, 3, 4}) {
    conf_.encryption = conf_.guestNet.encryption = static_cast<MERO_AP_ENCRYPT>(encryption);
    EXPECT_THAT(TextAfterWriting(kHostFile), Not(HasSubstr("wpa_passphrase")));
    EXPECT_THAT(ReadText(kGuestFile), Not(HasSubstr("not to be told")));
  }
}

}  // namespace
