// The access point's settings, as they are shown and set.
#include "model/ap_settings.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include "base/choices.h"
#include "common/ap_settings.h"
#include "common/paths.h"
#include "model/ap_protection.h"
#include "model/library.h"

namespace {

// ---- Tables of names ----

constexpr Name kWidths[] = {{"20", AP_FREQ_20_MHZ}, {"40", AP_FREQ_40_MHZ}, {"both", AP_FREQ_ALL}};
constexpr Name kYesNo[] = {{"yes", TRUE}, {"no", FALSE}};

// The access-point daemon is given one of the modes b, g and a, and 802.11n as a switch of its own.
struct Mode {
  std::string_view text;
  int hwMode;
  int n;
};

constexpr Mode kModes[] = {
    {"b", AP_MODE_80211B, 0}, {"g", AP_MODE_80211G, 0}, {"bn", AP_MODE_80211B, 1}, {"gn", AP_MODE_80211G, 1},
    {"n", AP_MODE_80211N, 1}, {"a", AP_MODE_80211A, 0}, {"an", AP_MODE_80211A, 1},
};

constexpr int k5GHzChannels[] = {36,  40,  44,  48,  52,  56,  60,  64,  100, 104, 108, 112, 116,
                                 120, 124, 128, 132, 136, 140, 144, 149, 153, 157, 161, 165};

// ---- Names, modes, protection ----

const Mode* ModeOf(const ApConf& conf) {
  const auto* found = std::ranges::find_if(kModes, [&](const Mode& mode) {
    return mode.hwMode == conf.hostapConf.hwMode && mode.n == (conf.hostapConf.ieee80211n > 0 ? 1 : 0);
  });
  return found != std::end(kModes) ? found : nullptr;
}

void SetMode(ApConf& conf, const std::string& text) {
  const Mode& mode = RowOf<Mode>(kModes, text, "hw-mode");
  if ((mode.hwMode == AP_MODE_80211A) != Is5GHz(conf)) {
    throw Wrong("this is no mode of the " + std::string(Is5GHz(conf) ? "5" : "2.4") + " GHz band",
                std::string("add --band ") + (Is5GHz(conf) ? "2.4" : "5") + ", or use another mode");
  }
  conf.hostapConf.hwMode = mode.hwMode;
  conf.hostapConf.ieee80211n = mode.n;
}

void SetBand(ApConf& conf, const std::string& text) {
  if (text != "2.4" && text != "5") throw Wrong("--band cannot be this", "it is 2.4 or 5");
  const bool had5 = Is5GHz(conf);
  if (had5 == (text == "5")) return;
  conf.hostapConf.hwMode = had5 ? AP_MODE_80211G : AP_MODE_80211A;
  conf.hostapConf.channel = had5 ? 1 : k5GHzChannels[0];  // until --channel says which
}

// A channel is one of its band; 0 leaves it to the daemon.
void RequireChannel(const ApConf& conf) {
  const int channel = conf.hostapConf.channel;
  if (channel == 0 || IsChannelOfBand(channel, Is5GHz(conf))) return;
  if (Is5GHz(conf)) {
    throw Wrong("there is no such channel in the 5 GHz band", "it is auto, 36, 40, 44, 48 ... 165; or add --band 2.4");
  }
  throw Wrong("there is no such channel in the 2.4 GHz band", "it is auto or 1 to 14; or add --band 5");
}

void SetChannel(ApConf& conf, const std::string& text) {
  constexpr int kLast = k5GHzChannels[std::size(k5GHzChannels) - 1];
  conf.hostapConf.channel = IsWord(text, "auto") ? 0 : NumberOf(text, 0, kLast, "channel");
}

bool HasEap(const ApConf& conf) {
  return conf.hostapConf.encryption == AP_ENCRYPT_WPA_EAP;
}

MERO_HOSTAP_WPA_EAP_INFO& Eap(ApConf& conf) {
  if (!HasEap(conf)) throw Wrong("only EAP has a RADIUS server", "add --encryption eap");
  return conf.hostapConf.encryptInfo.wpaEapInfo;
}

Value RadiusAddress(const ApConf& conf) {
  return HasEap(conf) ? Value(conf.hostapConf.encryptInfo.wpaEapInfo.szAuthIP) : nullptr;
}

void SetRadiusAddress(ApConf& conf, const std::string& text) {
  auto& eap = Eap(conf);
  if (!IsIpAddress(text)) throw Wrong("the RADIUS server's address is none", "give A.B.C.D");
  SetText(eap.szAuthIP, text, "the RADIUS server");
}

Value RadiusPort(const ApConf& conf) {
  return HasEap(conf) ? Value(int64_t{conf.hostapConf.encryptInfo.wpaEapInfo.authPort}) : nullptr;
}

void SetRadiusPort(ApConf& conf, const std::string& text) {
  constexpr int kLastPort = 65535;
  Eap(conf).authPort = NumberOf(text, 1, kLastPort, "auth-server-port");
}

// ---- Bridges and schedules ----

// A bridge that is not there yet is made.
bool IsNoBridge(const char* szInterface) {
  const std::filesystem::path interface = std::filesystem::path("/sys/class/net") / szInterface;
  return std::filesystem::exists(interface) && !std::filesystem::exists(interface / "bridge");
}

void SetBridge(ApConf& conf, const std::string& text) {
  const std::string advice = "such as " + std::string(kNatBridge);
  const bool plain = std::ranges::all_of(text, [](unsigned char c) { return std::isgraph(c) != 0 && c != '/'; });
  if (text.empty() || !plain || text == "." || text == "..") throw Wrong("this is no bridge's name", advice);
  if (text == kGuestBridge) throw Wrong("this bridge is the guests'", "give another one, " + advice);
  SetText(conf.hostapConf.szBridge, text, "the bridge");
  if (!IsNoBridge(conf.hostapConf.szBridge)) return;
  throw Wrong("there is an interface of this name, and it is no bridge", "give a bridge, " + advice);
}

// The hours of a week as 168 zeros and ones.
void SetHours(MERO_WIFI_SCHED_CONF& schedule, const std::string& hours) {
  if (hours.size() != sizeof schedule.szWifiSched - 1 || hours.find_first_not_of("01") != hours.npos) {
    throw Wrong("the schedule is not 168 hours", "give seven lines of 24 zeros and ones");
  }
  SetText(schedule.szWifiSched, hours, "the schedule");
  schedule.wifiSchedEnabled = 1;
}

// The same from a file, white space between them aside.
void SetSchedule(MERO_WIFI_SCHED_CONF& schedule, const std::string& path) {
  if (IsWord(path, "off")) {
    schedule.wifiSchedEnabled = 0;
    return;
  }
  std::ifstream file(path);
  if (!file) throw Wrong("the schedule cannot be read from " + Harmless(path, false), "give a file, or off");
  std::string hours;
  for (char c; file.get(c) && hours.size() < sizeof schedule.szWifiSched;) {
    if (std::isspace(static_cast<unsigned char>(c)) == 0) hours += c;
  }
  SetHours(schedule, hours);
}

Value ScheduleValue(const MERO_WIFI_SCHED_CONF& schedule) {
  return schedule.wifiSchedEnabled != 0 ? Value(schedule.szWifiSched) : nullptr;
}

Shown ShowSchedule(const MERO_WIFI_SCHED_CONF& schedule) {
  if (schedule.wifiSchedEnabled == 0) return {"always on"};
  const std::string_view hours = schedule.szWifiSched;
  return {std::to_string(std::ranges::count(hours, '1')) + " of 168 hours a week"};
}

Shown ShowSwitch(bool on) {
  return on ? Shown{"on", Tone::kGood} : Shown{"off", Tone::kFair};
}

MERO_HOSTAP_GUEST_NET& Guest(ApConf& conf) {
  return conf.hostapConf.guestNet;
}

const MERO_HOSTAP_GUEST_NET& Guest(const ApConf& conf) {
  return conf.hostapConf.guestNet;
}

// Without a built-in card the library writes no guest network and reports nothing.
void SetGuest(ApConf& conf, const std::string& text) {
  Guest(conf).blEnable = ValueOf(kYesNo, text, "guest-net-enable") != 0 ? TRUE : FALSE;
  if (Guest(conf).blEnable == FALSE || PLIBCFileCheckKeyValue(kModelPath, "support_pci_wifi", "yes", 0) != 0) return;
  throw Failure(Exit::kFailed, "this appliance has no guest network",
                "it takes a built-in card, of which " + std::string(kModelPath) + " says support_pci_wifi=\"yes\"");
}

// ---- Settings that are one number of the record ----

// A key of the settings file, for a template.
struct Key {
  template <std::size_t kSize>
  consteval Key(const char (&literal)[kSize]) {
    std::ranges::copy(literal, text);
  }

  char text[40]{};
};

// The library's row of a key; one that the library does not know is no constant.
constexpr const Setting& RowOfKey(std::string_view key) {
  for (const SettingRow& row : kSettingRows) {
    if (row.setting.szKey != nullptr && row.setting.szKey == key) return row.setting;
  }
  throw std::invalid_argument("no such key");
}

template <Key kKey>
inline constexpr const Setting& kRow = RowOfKey(kKey.text);

template <Key kKey>
constexpr ApSetting Switch(const char* szHelp) {
  return {{kKey.text, kKey.text, [](const ApConf& of) { return Value(NumberIn(&of, kRow<kKey>) != 0); }},
          "yes|no",
          szHelp,
          [](ApConf& of, const std::string& text) {
            PutNumber(&of, kRow<kKey>, ValueOf(kYesNo, text, OptionOf(kKey.text)));
          }};
}

template <Key kKey, int kLeast, int kGreatest>
constexpr ApSetting Number(const char* szHelp) {
  return {{kKey.text, kKey.text, [](const ApConf& of) { return Value(int64_t{NumberIn(&of, kRow<kKey>)}); }},
          "N",
          szHelp,
          [](ApConf& of, const std::string& text) {
            PutNumber(&of, kRow<kKey>, NumberOf(text, kLeast, kGreatest, OptionOf(kKey.text)));
          }};
}

// A field whose title is its key.
constexpr Field<ApConf> Told(const char* szKey, Value (*value)(const ApConf&),
                             Shown (*shown)(const ApConf&, bool utf8) = nullptr) {
  return {szKey, szKey, value, Layout::kLeft, shown};
}

constexpr int kMostStations = 2007;  // as many as an access point can tell apart

// Later rows build on earlier ones: --band sets a channel that --channel replaces, and a cipher is one of its
// protection. A new row stands last, since scripts know the fields of a porcelain line by their places.
constexpr ApSetting kSettings[] = {
    {Told(
        "enable", [](const ApConf& of) { return Value(of.blEnable != FALSE); },
        [](const ApConf& of, bool) { return ShowSwitch(of.blEnable != FALSE); })},
    {Told("ssid", [](const ApConf& of) { return Value(of.hostapConf.szSSID); }), "NAME", "the network's name",
     [](ApConf& of, const std::string& text) { SetNetworkName(of.hostapConf.szSSID, text); }},
    {Told("encryption",
          [](const ApConf& of) { return Value(ProtectionText(of.hostapConf.encryption, of.hostapConf.encryptInfo)); }),
     "open|wep|wpa|wpa2|mixed|eap", "how the network is protected",
     [](ApConf& of, const std::string& text) {
       SetProtection(of.hostapConf.encryption, of.hostapConf.encryptInfo, text, kMainOptions);
     }},
    {Told("wpa_encrypt_type",
          [](const ApConf& of) { return CipherValue(of.hostapConf.encryption, of.hostapConf.encryptInfo); }),
     "tkip|aes|both", "the ciphers of WPA",
     [](ApConf& of, const std::string& text) {
       SetCipher(of.hostapConf.encryption, of.hostapConf.encryptInfo, text, kMainOptions);
     }},
    {Told("auth_server_addr", RadiusAddress), "A.B.C.D", "the RADIUS server of EAP", SetRadiusAddress},
    {Told(
         "band", [](const ApConf& of) { return Value(Is5GHz(of) ? "5" : "2.4"); },
         [](const ApConf& of, bool) { return Shown{Is5GHz(of) ? "5 GHz" : "2.4 GHz"}; }),
     "2.4|5", "the band of --hw-mode, in GHz", SetBand},
    {Told("hw_mode",
          [](const ApConf& of) { return ModeOf(of) != nullptr ? Value(std::string(ModeOf(of)->text)) : nullptr; }),
     "b|g|bn|gn|n|a|an", "the radio standard", SetMode},
    {Told(
         "channel", [](const ApConf& of) { return Value(int64_t{of.hostapConf.channel}); },
         [](const ApConf& of, bool) {
           return Shown{of.hostapConf.channel == 0 ? "left to the daemon" : std::to_string(of.hostapConf.channel)};
         }),
     "N|auto", "the channel; auto takes the quietest", SetChannel},
    {Told(
         "ieee80211n_wireless_width",
         [](const ApConf& of) { return Value(NameOf(kWidths, of.hostapConf.wirelessWidth)); },
         [](const ApConf& of, bool) {
           return Shown{of.hostapConf.wirelessWidth == AP_FREQ_ALL
                            ? "20 and 40 MHz"
                            : NameOf(kWidths, of.hostapConf.wirelessWidth) + " MHz"};
         }),
     "20|40|both", "the channel's width, in MHz",
     [](ApConf& of, const std::string& text) {
       of.hostapConf.wirelessWidth = ValueOf(kWidths, text, "ieee80211n-wireless-width");
     }},
    Switch<"ignore_broadcast_ssid">("yes keeps the name out of the beacons"),
    Number<"max_num_sta", 1, kMostStations>("the most clients at a time"),
    Switch<"wmm_enabled">("yes gives speech and pictures precedence"),
    Number<"txpower", 0, 30>("0 to 30; kept for other programs, nothing sets it"),
    {Told("bridge", [](const ApConf& of) { return Value(of.hostapConf.szBridge); }), "NAME",
     "the bridge that the access point joins", SetBridge},
    {Told(
         "wifi_sched", [](const ApConf& of) { return ScheduleValue(of.wifiSchedConf); },
         [](const ApConf& of, bool) { return ShowSchedule(of.wifiSchedConf); }),
     "FILE|off", "a file of 7 lines of 24 zeros and ones",
     [](ApConf& of, const std::string& text) { SetSchedule(of.wifiSchedConf, text); }, Show::kAlways,
     [](ApConf& of, const std::string& hours) { SetHours(of.wifiSchedConf, hours); }},
    {Told(
         "guest_net_enable", [](const ApConf& of) { return Value(Guest(of).blEnable != FALSE); },
         [](const ApConf& of, bool) { return ShowSwitch(Guest(of).blEnable != FALSE); }),
     "yes|no", "yes puts up the guest network beside the main one", SetGuest},
    {Told("guest_net_ssid", [](const ApConf& of) { return Value(Guest(of).szSSID); }), "NAME",
     "the guest network's name",
     [](ApConf& of, const std::string& text) { SetNetworkName(Guest(of).szSSID, text, "the guest network's name"); }},
    {Told("guest_net_encryption",
          [](const ApConf& of) { return Value(ProtectionText(Guest(of).encryption, Guest(of).encryptInfo)); }),
     "open|wep|wpa|wpa2|mixed", "how the guest network is protected",
     [](ApConf& of, const std::string& text) {
       if (IsWord(text, "eap")) throw Wrong("a guest network cannot have EAP", "use wpa2");
       SetProtection(Guest(of).encryption, Guest(of).encryptInfo, text, kGuestOptions);
     }},
    {Told("guest_net_wpa_encrypt_type",
          [](const ApConf& of) { return CipherValue(Guest(of).encryption, Guest(of).encryptInfo); }),
     "tkip|aes|both", "the ciphers of its WPA",
     [](ApConf& of, const std::string& text) {
       SetCipher(Guest(of).encryption, Guest(of).encryptInfo, text, kGuestOptions);
     }},
    Switch<"guest_net_ignore_broadcast_ssid">("yes keeps its name out of the beacons"),
    Number<"guest_net_max_num_sta", 1, kMostStations>("the most guests at a time"),
    Switch<"ap_isolate">("yes keeps guests from each other"),
    Switch<"guest_net_lan_block">("yes keeps guests out of the appliance's network"),
    Switch<"guest_net_internet_block">("yes keeps guests out of the internet"),
    Switch<"guest_net_access_ds">("yes lets guests reach the appliance itself"),
    Switch<"guest_net_allow_http">("yes lets guests reach the appliance's web pages"),
    {Told(
         "guest_net_sched", [](const ApConf& of) { return ScheduleValue(of.guestNetSchedConf); },
         [](const ApConf& of, bool) { return ShowSchedule(of.guestNetSchedConf); }),
     "FILE|off", "as --wifi-sched",
     [](ApConf& of, const std::string& text) { SetSchedule(of.guestNetSchedConf, text); }, Show::kAlways,
     [](ApConf& of, const std::string& hours) { SetHours(of.guestNetSchedConf, hours); }},
    {{"has_secret", "",
      [](const ApConf& of) { return Value(*SecretOf(of.hostapConf.encryption, of.hostapConf.encryptInfo) != '\0'); }}},
    {{"guest_net_has_secret", "",
      [](const ApConf& of) { return Value(*SecretOf(Guest(of).encryption, Guest(of).encryptInfo) != '\0'); }}},
    {.field =
         Told("secret",
              [](const ApConf& of) { return Value(SecretOf(of.hostapConf.encryption, of.hostapConf.encryptInfo)); }),
     .show = Show::kOnRequest},
    {.field = Told("guest_net_secret",
                   [](const ApConf& of) { return Value(SecretOf(Guest(of).encryption, Guest(of).encryptInfo)); }),
     .show = Show::kOnRequest},
    {Told("auth_server_port", RadiusPort), "N", "the port of the RADIUS server", SetRadiusPort},
};

// ---- What was saved ----

// A record that nothing was saved for knows of no guests; they get what a section has that says nothing of them. A name
// is not made up for them.
void SetGuestDefaults(ApConf& conf) {
  for (const auto& [turn, setting] : kSettingRows) {
    const bool isNumber = setting.kind == SettingKind::kInteger;
    if (isNumber && NumberIn(&conf, setting) == 0) PutNumber(&conf, setting, setting.missing);
  }
  SetText(conf.guestNetSchedConf.szWifiSched, kAlwaysOn, "the schedule");
}

}  // namespace

bool Is5GHz(const ApConf& conf) {
  return conf.hostapConf.hwMode == AP_MODE_80211A;
}

bool IsChannelOfBand(int channel, bool is5GHz) {
  constexpr int kLast2GHz = 14;
  if (!is5GHz) return channel >= 1 && channel <= kLast2GHz;
  return std::ranges::find(k5GHzChannels, channel) != std::end(k5GHzChannels);
}

bool ReadSavedAp(ApConf& conf) {
  return MEROWirelessGetAPConfig(AdapterModel().c_str(), &conf) > 0;
}

ApConf ReadApSettings() {
  ApConf conf{};
  if (!ReadSavedAp(conf)) SetGuestDefaults(conf);
  return conf;
}

std::string OptionOf(std::string_view key) {
  std::string option(key);
  std::ranges::replace(option, '_', '-');
  return option;
}

std::span<const ApSetting> ApSettings() {
  return kSettings;
}

std::vector<Field<ApConf>> ApFields(bool showSecrets) {
  std::vector<Field<ApConf>> fields;
  for (const ApSetting& setting : kSettings) {
    if (setting.show == Show::kAlways || showSecrets) fields.push_back(setting.field);
  }
  return fields;
}

void SetApSecret(ApConf& conf, const std::string& secret) {
  SetSecretOf(conf.hostapConf.encryption, conf.hostapConf.encryptInfo, secret, kMainOptions);
}

void SetGuestSecret(ApConf& conf, const std::string& secret) {
  SetSecretOf(Guest(conf).encryption, Guest(conf).encryptInfo, secret, kGuestOptions);
}

bool LacksSecret(const ApConf& conf) {
  return LacksSecret(conf.hostapConf.encryption, conf.hostapConf.encryptInfo);
}

void RequireComplete(const ApConf& conf) {
  const MERO_HOSTAP_CONF& main = conf.hostapConf;
  if (main.szSSID[0] == '\0') throw Wrong("the access point has no name", "add --ssid NAME");
  if (main.szBridge[0] == '\0')
    throw Wrong("the access point has no bridge", "add --bridge " + std::string(kNatBridge));
  if (LacksSecret(conf)) throw Wrong("this security needs a secret", "add --key-file or --key-stdin");
  if (HasEap(conf) && main.encryptInfo.wpaEapInfo.szAuthIP[0] == '\0') {
    throw Wrong("EAP needs a RADIUS server", "add --auth-server-addr A.B.C.D");
  }
  RequireChannel(conf);
  if (main.guestNet.blEnable == FALSE) return;
  if (main.guestNet.szSSID[0] == '\0') throw Wrong("the guest network has no name", "add --guest-net-ssid NAME");
  if (LacksSecret(main.guestNet.encryption, main.guestNet.encryptInfo)) {
    throw Wrong("the guest network's security needs a secret", "add --guest-net-key-file FILE");
  }
}
