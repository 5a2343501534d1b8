// The access point's settings by the names that people have for them.
#include "model/ap_settings.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <fstream>
#include <iterator>

#include "base/choices.h"
#include "model/ap_protection.h"
#include "model/library.h"
#include "model/paths.h"

namespace {

// ---- Tables of names ----

constexpr Name kWidths[] = {{"20", AP_FREQ_20_MHZ}, {"40", AP_FREQ_40_MHZ}, {"both", AP_FREQ_ALL}};
constexpr Name kSwitch[] = {{"yes", TRUE}, {"no", FALSE}};

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

BOOL SwitchOf(const std::string& text, const char* szOption) {
  return ValueOf(kSwitch, text, szOption) != 0 ? TRUE : FALSE;
}

// ---- Names, modes, protection ----

const Mode* ModeOf(const ApConf& conf) {
  const auto* found = std::ranges::find_if(kModes, [&](const Mode& mode) {
    return mode.hwMode == conf.hostapConf.hwMode && mode.n == (conf.hostapConf.ieee80211n > 0 ? 1 : 0);
  });
  return found != std::end(kModes) ? found : nullptr;
}

bool Is5GHz(const ApConf& conf) {
  return conf.hostapConf.hwMode == AP_MODE_80211A;
}

void SetMode(ApConf& conf, const std::string& text) {
  const Mode& mode = RowOf<Mode>(kModes, text, "mode");
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
  constexpr int kLast2GHz = 14;
  const int channel = conf.hostapConf.channel;
  if (channel == 0) return;
  if (Is5GHz(conf) && std::ranges::find(k5GHzChannels, channel) == std::end(k5GHzChannels)) {
    throw Wrong("there is no such channel in the 5 GHz band", "it is auto, 36, 40, 44, 48 ... 165; or add --band 2.4");
  }
  if (!Is5GHz(conf) && channel > kLast2GHz) {
    throw Wrong("there is no such channel in the 2.4 GHz band", "it is auto or 1 to 14; or add --band 5");
  }
}

void SetChannel(ApConf& conf, const std::string& text) {
  constexpr int kLast = k5GHzChannels[std::size(k5GHzChannels) - 1];
  conf.hostapConf.channel = text == "auto" ? 0 : NumberOf(text, 1, kLast, "channel");
}

bool HasEap(const ApConf& conf) {
  return conf.hostapConf.encryption == AP_ENCRYPT_WPA_EAP;
}

Value RadiusServer(const ApConf& conf) {
  if (!HasEap(conf)) return nullptr;
  return Value(std::string(conf.hostapConf.encryptInfo.wpaEapInfo.szAuthIP) + ":" +
               std::to_string(conf.hostapConf.encryptInfo.wpaEapInfo.authPort));
}

void SetRadiusServer(ApConf& conf, const std::string& text) {
  if (!HasEap(conf)) throw Wrong("only EAP has a RADIUS server", "add --security eap");
  const std::size_t colon = text.find(':');
  const std::string address = text.substr(0, colon);
  if (!IsIpAddress(address)) throw Wrong("the RADIUS server's address is none", "give A.B.C.D or A.B.C.D:PORT");
  auto& eap = conf.hostapConf.encryptInfo.wpaEapInfo;
  SetText(eap.szAuthIP, address, "the RADIUS server");
  if (colon != text.npos) eap.authPort = NumberOf(text.substr(colon + 1), 1, 65535, "radius-server");
}

// ---- Bridges and schedules ----

void SetBridge(ApConf& conf, const std::string& text) {
  const bool plain = std::ranges::all_of(text, [](unsigned char c) { return std::isgraph(c) != 0 && c != '/'; });
  if (text.empty() || !plain || text == "." || text == "..") throw Wrong("this is no bridge's name", "such as lbr0");
  SetText(conf.hostapConf.szBridge, text, "the bridge");
}

// The hours of a week as 168 zeros and ones, white space between them aside.
void SetSchedule(MERO_WIFI_SCHED_CONF& schedule, const std::string& path) {
  if (path == "off") {
    schedule.wifiSchedEnabled = 0;
    return;
  }
  std::ifstream file(path);
  if (!file) throw Wrong("the schedule cannot be read from " + Harmless(path, false), "give a file, or off");
  std::string hours;
  for (char c; file.get(c) && hours.size() < sizeof schedule.szWifiSched;) {
    if (std::isspace(static_cast<unsigned char>(c)) == 0) hours += c;
  }
  if (hours.size() != sizeof schedule.szWifiSched - 1 || hours.find_first_not_of("01") != hours.npos) {
    throw Wrong("the schedule is not 168 hours", "give seven lines of 24 zeros and ones");
  }
  SetText(schedule.szWifiSched, hours, "the schedule");
  schedule.wifiSchedEnabled = 1;
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

Value YesNo(int value) {
  return value != 0;
}

MERO_HOSTAP_GUEST_NET& Guest(ApConf& conf) {
  return conf.hostapConf.guestNet;
}

const MERO_HOSTAP_GUEST_NET& Guest(const ApConf& conf) {
  return conf.hostapConf.guestNet;
}

// Without a built-in card the library writes no guest network and reports nothing.
void SetGuest(ApConf& conf, const std::string& text) {
  Guest(conf).blEnable = SwitchOf(text, "guest");
  if (Guest(conf).blEnable == FALSE || PLIBCFileCheckKeyValue(kModelFacts, "support_pci_wifi", "yes", 0) != 0) return;
  throw Failure(Exit::kFailed, "this appliance has no guest network",
                "it takes a built-in card, of which " + std::string(kModelFacts) + " says support_pci_wifi=\"yes\"");
}

constexpr int kMostStations = 2007;  // as many as an access point can tell apart

// Later rows build on earlier ones: --band sets a channel that --channel replaces, and a cipher is one of its
// protection.
const ApSetting kSettings[] = {
    {{"enabled", "access point", [](const ApConf& of) { return YesNo(of.blEnable); }, Layout::kLeft,
      [](const ApConf& of, bool) { return ShowSwitch(of.blEnable != FALSE); }}},
    {{"ssid", "name", [](const ApConf& of) { return Value(of.hostapConf.szSSID); }},
     "ssid",
     "the network's name",
     [](ApConf& of, const std::string& text) { SetNetworkName(of.hostapConf.szSSID, text); }},
    {{"security", "security",
      [](const ApConf& of) { return Value(ProtectionText(of.hostapConf.encryption, of.hostapConf.encryptInfo)); }},
     "security",
     "open, wep, wpa, wpa2, mixed or eap",
     [](ApConf& of, const std::string& text) {
       SetProtection(of.hostapConf.encryption, of.hostapConf.encryptInfo, text, "security");
     }},
    {{"cipher", "cipher",
      [](const ApConf& of) { return CipherValue(of.hostapConf.encryption, of.hostapConf.encryptInfo); }},
     "cipher",
     "of WPA: tkip, aes or both",
     [](ApConf& of, const std::string& text) {
       SetCipher(of.hostapConf.encryption, of.hostapConf.encryptInfo, text, "cipher");
     }},
    {{"radius_server", "RADIUS server", RadiusServer},
     "radius-server",
     "of EAP: A.B.C.D or A.B.C.D:PORT",
     SetRadiusServer},
    {{"band", "band", [](const ApConf& of) { return Value(Is5GHz(of) ? "5" : "2.4"); }, Layout::kLeft,
      [](const ApConf& of, bool) { return Shown{Is5GHz(of) ? "5 GHz" : "2.4 GHz"}; }},
     "band",
     "2.4 or 5",
     SetBand},
    {{"mode", "mode",
      [](const ApConf& of) { return ModeOf(of) != nullptr ? Value(std::string(ModeOf(of)->text)) : nullptr; }},
     "mode",
     "b, g, bn, gn, n, a or an",
     SetMode},
    {{"channel", "channel", [](const ApConf& of) { return Value(int64_t{of.hostapConf.channel}); }, Layout::kLeft,
      [](const ApConf& of, bool) {
        return Shown{of.hostapConf.channel == 0 ? "auto" : std::to_string(of.hostapConf.channel)};
      }},
     "channel",
     "a number or auto",
     SetChannel},
    {{"width", "width", [](const ApConf& of) { return Value(NameOf(kWidths, of.hostapConf.wirelessWidth)); },
      Layout::kLeft,
      [](const ApConf& of, bool) {
        return Shown{of.hostapConf.wirelessWidth == AP_FREQ_ALL
                         ? "20 and 40 MHz"
                         : NameOf(kWidths, of.hostapConf.wirelessWidth) + " MHz"};
      }},
     "width",
     "20, 40 or both (MHz)",
     [](ApConf& of, const std::string& text) { of.hostapConf.wirelessWidth = ValueOf(kWidths, text, "width"); }},
    {{"hidden", "hidden", [](const ApConf& of) { return YesNo(of.hostapConf.hideSSID); }},
     "hidden",
     "yes keeps the name out of the beacons",
     [](ApConf& of, const std::string& text) { of.hostapConf.hideSSID = SwitchOf(text, "hidden"); }},
    {{"max_stations", "stations", [](const ApConf& of) { return Value(int64_t{of.hostapConf.maxStation}); }},
     "max-stations",
     "the most clients at a time",
     [](ApConf& of, const std::string& text) {
       of.hostapConf.maxStation = NumberOf(text, 1, kMostStations, "max-stations");
     }},
    {{"wmm", "WMM", [](const ApConf& of) { return YesNo(of.hostapConf.wmm); }},
     "wmm",
     "yes gives speech and pictures precedence",
     [](ApConf& of, const std::string& text) { of.hostapConf.wmm = SwitchOf(text, "wmm"); }},
    {{"tx_power", "power", [](const ApConf& of) { return Value(int64_t{of.txpower}); }},
     "tx-power",
     "0 to 30; kept for other programs, nothing sets it",
     [](ApConf& of, const std::string& text) { of.txpower = NumberOf(text, 0, 30, "tx-power"); }},
    {{"bridge", "bridge", [](const ApConf& of) { return Value(of.hostapConf.szBridge); }},
     "bridge",
     "the bridge that the access point joins",
     SetBridge},
    {{"schedule", "on the air", [](const ApConf& of) { return ScheduleValue(of.wifiSchedConf); }, Layout::kLeft,
      [](const ApConf& of, bool) { return ShowSchedule(of.wifiSchedConf); }},
     "schedule",
     "a file of 7 lines of 24 zeros and ones, or off",
     [](ApConf& of, const std::string& text) { SetSchedule(of.wifiSchedConf, text); }},
    {{"guest_enabled", "guest network", [](const ApConf& of) { return YesNo(Guest(of).blEnable); }, Layout::kLeft,
      [](const ApConf& of, bool) { return ShowSwitch(Guest(of).blEnable != FALSE); }},
     "guest",
     "yes puts the guest network up beside the main one",
     SetGuest},
    {{"guest_ssid", "guest name", [](const ApConf& of) { return Value(Guest(of).szSSID); }},
     "guest-ssid",
     "the guest network's name",
     [](ApConf& of, const std::string& text) { SetNetworkName(Guest(of).szSSID, text, "the guest network's name"); }},
    {{"guest_security", "guest security",
      [](const ApConf& of) { return Value(ProtectionText(Guest(of).encryption, Guest(of).encryptInfo)); }},
     "guest-security",
     "open, wep, wpa, wpa2 or mixed",
     [](ApConf& of, const std::string& text) {
       if (text == "eap") throw Wrong("a guest network cannot have EAP", "use wpa2");
       SetProtection(Guest(of).encryption, Guest(of).encryptInfo, text, "guest-security");
     }},
    {{"guest_cipher", "guest cipher",
      [](const ApConf& of) { return CipherValue(Guest(of).encryption, Guest(of).encryptInfo); }},
     "guest-cipher",
     "of WPA: tkip, aes or both",
     [](ApConf& of, const std::string& text) {
       SetCipher(Guest(of).encryption, Guest(of).encryptInfo, text, "guest-cipher");
     }},
    {{"guest_hidden", "guest hidden", [](const ApConf& of) { return YesNo(Guest(of).hideSSID); }},
     "guest-hidden",
     "yes keeps its name out of the beacons",
     [](ApConf& of, const std::string& text) { Guest(of).hideSSID = SwitchOf(text, "guest-hidden"); }},
    {{"guest_max_stations", "guest stations", [](const ApConf& of) { return Value(int64_t{Guest(of).maxStation}); }},
     "guest-max-stations",
     "the most guests at a time",
     [](ApConf& of, const std::string& text) {
       Guest(of).maxStation = NumberOf(text, 1, kMostStations, "guest-max-stations");
     }},
    {{"guest_isolated", "guests apart", [](const ApConf& of) { return YesNo(Guest(of).blAPIsolate); }},
     "guest-isolated",
     "yes keeps guests from each other",
     [](ApConf& of, const std::string& text) { Guest(of).blAPIsolate = SwitchOf(text, "guest-isolated"); }},
    {{"guest_lan", "guests: LAN", [](const ApConf& of) { return Value(of.guestNetAccessRule.blLanBlock == FALSE); }},
     "guest-lan",
     "yes lets guests reach the appliance's own network",
     [](ApConf& of, const std::string& text) {
       of.guestNetAccessRule.blLanBlock = SwitchOf(text, "guest-lan") == FALSE ? TRUE : FALSE;
     }},
    {{"guest_internet", "guests: internet",
      [](const ApConf& of) { return Value(of.guestNetAccessRule.blInternetBlock == FALSE); }},
     "guest-internet",
     "yes lets guests reach the internet",
     [](ApConf& of, const std::string& text) {
       of.guestNetAccessRule.blInternetBlock = SwitchOf(text, "guest-internet") == FALSE ? TRUE : FALSE;
     }},
    {{"guest_appliance", "guests: appliance", [](const ApConf& of) { return YesNo(of.guestNetAccessRule.blAccessDS); }},
     "guest-appliance",
     "yes lets guests reach the appliance itself",
     [](ApConf& of, const std::string& text) { of.guestNetAccessRule.blAccessDS = SwitchOf(text, "guest-appliance"); }},
    {{"guest_web", "guests: its web pages", [](const ApConf& of) { return YesNo(of.guestNetAccessRule.blAllowHttp); }},
     "guest-web",
     "yes lets guests reach the appliance's web pages",
     [](ApConf& of, const std::string& text) { of.guestNetAccessRule.blAllowHttp = SwitchOf(text, "guest-web"); }},
    {{"guest_schedule", "guests on the air", [](const ApConf& of) { return ScheduleValue(of.guestNetSchedConf); },
      Layout::kLeft, [](const ApConf& of, bool) { return ShowSchedule(of.guestNetSchedConf); }},
     "guest-schedule",
     "as --schedule",
     [](ApConf& of, const std::string& text) { SetSchedule(of.guestNetSchedConf, text); }},
    {{"has_secret", "",
      [](const ApConf& of) { return Value(*SecretOf(of.hostapConf.encryption, of.hostapConf.encryptInfo) != '\0'); }}},
    {{"guest_has_secret", "",
      [](const ApConf& of) { return Value(*SecretOf(Guest(of).encryption, Guest(of).encryptInfo) != '\0'); }}},
    {{.key = "secret",
      .title = "secret",
      .value = [](const ApConf& of) { return Value(SecretOf(of.hostapConf.encryption, of.hostapConf.encryptInfo)); }},
     nullptr,
     nullptr,
     nullptr,
     Show::kOnRequest},
    {{.key = "guest_secret",
      .title = "guest secret",
      .value = [](const ApConf& of) { return Value(SecretOf(Guest(of).encryption, Guest(of).encryptInfo)); }},
     nullptr,
     nullptr,
     nullptr,
     Show::kOnRequest},
};

}  // namespace

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
  SetSecretOf(conf.hostapConf.encryption, conf.hostapConf.encryptInfo, secret);
}

void SetGuestSecret(ApConf& conf, const std::string& secret) {
  SetSecretOf(Guest(conf).encryption, Guest(conf).encryptInfo, secret);
}

bool LacksSecret(const ApConf& conf) {
  return LacksSecret(conf.hostapConf.encryption, conf.hostapConf.encryptInfo);
}

void RequireComplete(const ApConf& conf) {
  const MERO_HOSTAP_CONF& main = conf.hostapConf;
  if (main.szSSID[0] == '\0') throw Wrong("the access point has no name", "add --ssid NAME");
  if (main.szBridge[0] == '\0') throw Wrong("the access point has no bridge", "add --bridge lbr0");
  if (LacksSecret(conf)) throw Wrong("this security needs a secret", "add --key-file or --key-stdin");
  if (HasEap(conf) && main.encryptInfo.wpaEapInfo.szAuthIP[0] == '\0') {
    throw Wrong("EAP needs a RADIUS server", "add --radius-server A.B.C.D");
  }
  RequireChannel(conf);
  if (main.guestNet.blEnable == FALSE) return;
  if (main.guestNet.szSSID[0] == '\0') throw Wrong("the guest network has no name", "add --guest-ssid NAME");
  if (LacksSecret(main.guestNet.encryption, main.guestNet.encryptInfo)) {
    throw Wrong("the guest network's security needs a secret", "add --guest-key-file FILE");
  }
}
