// mero-call FUNCTION [ARGUMENT...]: calls one exported function of the library and prints what came of it.
//
// The first line is `result=N`; each record that the function gave follows on a line of its own, as KEY=VALUE pairs
// in a fixed order. A value that holds anything but ordinary characters is quoted so that a shell reads back exactly
// its bytes, and no value breaks a line. Enumerations are shown, and given, by the names that the header has for
// them, without their prefix.
//
// Exit status: 0 the function succeeded, 1 it did not, 2 the call is wrong and was not made.
#include <algorithm>
#include <array>
#include <charconv>
#include <cstddef>
#include <cstdio>
#include <iterator>
#include <span>
#include <stdexcept>
#include <string>
#include <string_view>

#include "common/ap_settings.h"
#include "platform.h"
#include "tests/support/ring.h"
#include "wireless.h"

namespace {

using Arguments = std::span<char* const>;

struct WrongCall : std::runtime_error {
  using std::runtime_error::runtime_error;
};

// ---- Values as text ----------------------------------------------------------------------------------------------

constexpr std::string_view kOrdinary = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_.:/@%+,-";

bool IsControl(char byte) {
  return static_cast<unsigned char>(byte) < ' ' || byte == '\x7F';
}

// A byte as it stands between $' and ', where every byte can be written without breaking the line.
std::string Escaped(char byte) {
  if (byte == '\'' || byte == '\\') return {'\\', byte};
  if (!IsControl(byte)) return {byte};
  char octal[sizeof("\\177")];
  std::snprintf(octal, sizeof(octal), "\\%03o", static_cast<unsigned>(byte));
  return octal;
}

std::string Quoted(std::string_view text) {
  if (text.find_first_not_of(kOrdinary) == text.npos) return std::string(text);

  const bool plain = text.find('\'') == text.npos && std::ranges::none_of(text, IsControl);
  std::string quoted = plain ? "'" : "$'";
  for (char byte : text) quoted += plain ? std::string(1, byte) : Escaped(byte);
  return quoted + '\'';
}

int Number(std::string_view text) {
  int number = 0;
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  if (error != std::errc() || end != text.data() + text.size()) throw WrongCall("no number: " + std::string(text));
  return number;
}

void SetText(char* field, std::size_t size, std::string_view text) {
  if (text.size() >= size) throw WrongCall("too long: " + std::string(text));
  *std::copy(text.begin(), text.end(), field) = '\0';
}

template <std::size_t size>
void SetText(char (&field)[size], std::string_view text) {
  SetText(field, size, text);
}

using Address = unsigned char[6];

std::string AddressText(const Address& address) {
  char text[sizeof("00:11:22:33:44:55")];
  std::snprintf(text, sizeof(text), "%02x:%02x:%02x:%02x:%02x:%02x", address[0], address[1], address[2], address[3],
                address[4], address[5]);
  return text;
}

void SetAddress(Address& address, std::string_view text) {
  Address read{};
  int length = 0;
  const std::string terminated(text);
  const int octets = std::sscanf(terminated.c_str(), "%2hhx:%2hhx:%2hhx:%2hhx:%2hhx:%2hhx%n", &read[0], &read[1],
                                 &read[2], &read[3], &read[4], &read[5], &length);
  if (octets != 6 || static_cast<std::size_t>(length) != text.size()) throw WrongCall("no address: " + terminated);
  std::copy(std::begin(read), std::end(read), address);
}

// ---- Enumerations ------------------------------------------------------------------------------------------------

constexpr auto kOpmodes = std::to_array<std::string_view>(
    {"AUTO", "ADHOC", "MANAGED", "MASTER", "REPEATER", "SECONDEARY", "MONITOR", "UNKNOWN"});
constexpr auto kAuths = std::to_array<std::string_view>(
    {"UNKNOWN", "OPEN", "SHARED", "WEPAUTO", "WPAPSK", "WPA2PSK", "WPANONE", "WPAEAP", "WPA2EAP"});
constexpr auto kStatuses =
    std::to_array<std::string_view>({"UNKNOWN", "NOT_SUPPORTED", "NO_ADAPTER", "DOWN", "DISCONNECTED",
                                     "CONNECTED_MANAGED", "CONNECTED_ADHOC", "MONITOR"});
constexpr auto kEncryptBits = std::to_array<std::string_view>({"NONE", "WEP", "TKIP", "AES"});
constexpr int kProtocols = WIRELESS_PROTO_11BN + 1;

static_assert(kOpmodes.size() == WIRELESS_OPMODE_MAX);
static_assert(kAuths.size() == WIRELESS_AUTH_WPA2EAP + 1);
static_assert(kStatuses.size() == WIRELESS_STATUS_MONITOR + 1);
static_assert(1 << (kEncryptBits.size() - 1) == WIRELESS_ENCRYPT_AES);

// The name of a value that counts up from 0; the number itself where it has no name.
std::string NameOf(int value, std::span<const std::string_view> names) {
  const auto index = static_cast<std::size_t>(value);
  return index < names.size() ? std::string(names[index]) : std::to_string(value);
}

int ValueOf(std::string_view name, std::span<const std::string_view> names) {
  const auto found = std::find(names.begin(), names.end(), name);
  return found == names.end() ? Number(name) : static_cast<int>(found - names.begin());
}

std::string EncryptText(WIRELESS_ENCRYPT encrypt) {
  if (encrypt == WIRELESS_ENCRYPT_UNKNOWN) return "UNKNOWN";
  if (encrypt < 0 || encrypt >= 1 << kEncryptBits.size()) return std::to_string(encrypt);

  std::string text;
  for (std::size_t bit = 0; bit < kEncryptBits.size(); ++bit) {
    if ((encrypt & 1 << bit) == 0) continue;
    if (!text.empty()) text += '+';
    text += kEncryptBits[bit];
  }
  return text;
}

WIRELESS_ENCRYPT EncryptOf(std::string_view text) {
  if (text == "UNKNOWN") return WIRELESS_ENCRYPT_UNKNOWN;
  int bits = 0;
  while (true) {
    const std::size_t plus = text.find('+');
    const std::string_view name = text.substr(0, plus);
    const auto found = std::find(kEncryptBits.begin(), kEncryptBits.end(), name);
    bits |= found == kEncryptBits.end() ? Number(name) : 1 << (found - kEncryptBits.begin());
    if (plus == text.npos) return static_cast<WIRELESS_ENCRYPT>(bits);
    text.remove_prefix(plus + 1);
  }
}

WIRELESS_PROTOCOL ProtocolOf(std::string_view text) {
  for (int value = 0; value < kProtocols; ++value) {
    const auto protocol = static_cast<WIRELESS_PROTOCOL>(value);
    if (text == MEROWirelessProtocolStringGet(protocol)) return protocol;
  }
  return static_cast<WIRELESS_PROTOCOL>(Number(text));
}

// ---- Records as text ---------------------------------------------------------------------------------------------

// A field of a record, as it is shown and as it is given.
template <class Record>
struct Field {
  std::string_view key;
  std::string (*show)(const Record&);
  void (*set)(Record&, std::string_view);
};

using Network = WIRELESS_NETWORK;
using Config = WIRELESS_NETWORK_CONFIG;

constexpr Field<Network> kNetworkFields[] = {
    {"essid", [](const Network& of) -> std::string { return of.szEssid; },
     [](Network& of, std::string_view text) { SetText(of.szEssid, text); }},
    {"bssid", [](const Network& of) { return AddressText(of.bssid); },
     [](Network& of, std::string_view text) { SetAddress(of.bssid, text); }},
    {"channel", [](const Network& of) { return std::to_string(of.channel); },
     [](Network& of, std::string_view text) { of.channel = Number(text); }},
    {"signal", [](const Network& of) { return std::to_string(of.signal); },
     [](Network& of, std::string_view text) { of.signal = Number(text); }},
    {"opmode", [](const Network& of) { return NameOf(of.opmode, kOpmodes); },
     [](Network& of, std::string_view text) { of.opmode = static_cast<WIRELESS_OPMODE>(ValueOf(text, kOpmodes)); }},
    {"protocol", [](const Network& of) -> std::string { return MEROWirelessProtocolStringGet(of.protocol); },
     [](Network& of, std::string_view text) { of.protocol = ProtocolOf(text); }},
    {"auth", [](const Network& of) { return NameOf(of.auth, kAuths); },
     [](Network& of, std::string_view text) { of.auth = static_cast<WIRELESS_AUTH>(ValueOf(text, kAuths)); }},
    {"encrypt", [](const Network& of) { return EncryptText(of.encrypt); },
     [](Network& of, std::string_view text) { of.encrypt = EncryptOf(text); }},
};

constexpr Field<Config> kConfigFields[] = {
    {"key", [](const Config& of) -> std::string { return of.szKey; },
     [](Config& of, std::string_view text) { SetText(of.szKey, text); }},
    {"user", [](const Config& of) -> std::string { return of.szUser; },
     [](Config& of, std::string_view text) { SetText(of.szUser, text); }},
    {"ip", [](const Config& of) -> std::string { return of.szIp; },
     [](Config& of, std::string_view text) { SetText(of.szIp, text); }},
    {"mask", [](const Config& of) -> std::string { return of.szMask; },
     [](Config& of, std::string_view text) { SetText(of.szMask, text); }},
    {"gateway", [](const Config& of) -> std::string { return of.szGateway; },
     [](Config& of, std::string_view text) { SetText(of.szGateway, text); }},
    {"none_bssid", [](const Config& of) { return std::to_string(of.noneBssid); },
     [](Config& of, std::string_view text) { of.noneBssid = Number(text); }},
    {"atime", [](const Config& of) { return std::to_string(of.atime); },
     [](Config& of, std::string_view text) { of.atime = Number(text); }},
};

// Settings of an access point, by their keys in the settings file; numbers and switches are numbers, texts as they are.
using Settings = MERO_AP_CONF;

// Calls `visit(szKey, setting, record)` for each setting, with the record that has its field: the settings themselves,
// or what an encryption of theirs needs.
template <class Visit>
void ForEachSetting(Settings& settings, Visit visit) {
  MERO_HOSTAP_CONF& main = settings.hostapConf;
  const auto visit_secrets = [&](auto& network, BOOL blGuestNet) {
    ForEachSecret(network.encryption, blGuestNet, [&](const char* szKey, const Setting& setting) {
      visit(szKey, setting, reinterpret_cast<char*>(&network.encryptInfo));
    });
  };
  for (const auto& [turn, setting] : kSettingRows) {
    if (setting.kind == SettingKind::kMainSecrets) {
      visit_secrets(main, FALSE);
    } else if (setting.kind == SettingKind::kGuestSecrets) {
      visit_secrets(main.guestNet, TRUE);
    } else {
      visit(setting.szKey, setting, reinterpret_cast<char*>(&settings));
    }
  }
}

bool IsText(const Setting& setting) {
  return setting.kind == SettingKind::kText || setting.kind == SettingKind::kTextOnlyWritten;
}

// Sets one that the settings have; what an encryption needs, behind the encryption itself.
bool SetSetting(Settings& settings, std::string_view key, std::string_view value) {
  bool found = false;
  ForEachSetting(settings, [&](std::string_view known, const Setting& setting, char* record) {
    if (known != key) return;
    found = true;
    IsText(setting) ? SetText(record + setting.offset, setting.size, value) : PutNumber(record, setting, Number(value));
  });
  // What another encryption needed says nothing to a new one.
  MERO_HOSTAP_CONF& main = settings.hostapConf;
  if (key == "encryption") main.encryptInfo = {};
  if (key == "guest_net_encryption") main.guestNet.encryptInfo = {};
  return found;
}

template <class Record>
std::string Pairs(const Record& record, std::span<const Field<Record>> fields) {
  std::string pairs;
  for (const Field<Record>& field : fields) {
    pairs += pairs.empty() ? "" : " ";
    pairs.append(field.key).append("=").append(Quoted(field.show(record)));
  }
  return pairs;
}

template <class Record>
bool Set(Record& record, std::span<const Field<Record>> fields, std::string_view key, std::string_view value) {
  for (const Field<Record>& field : fields) {
    if (field.key != key) continue;
    field.set(record, value);
    return true;
  }
  return false;
}

void Print(const Network& network) {
  std::puts(Pairs<Network>(network, kNetworkFields).c_str());
}

void Print(Settings& settings) {
  std::string pairs;
  ForEachSetting(settings, [&](const char* szKey, const Setting& setting, const char* record) {
    const std::string value =
        IsText(setting) ? Quoted(record + setting.offset) : std::to_string(NumberIn(record, setting));
    pairs.append(pairs.empty() ? "" : " ").append(szKey).append("=").append(value);
  });
  std::puts(pairs.c_str());
}

void Print(const Config& config) {
  std::printf("%s %s\n", Pairs<Network>(config.network, kNetworkFields).c_str(),
              Pairs<Config>(config, kConfigFields).c_str());
}

// Gives each KEY=VALUE to `set`, which tells whether it knows the key.
template <class Setter>
void SetAll(Arguments arguments, Setter set) {
  for (const std::string_view argument : arguments) {
    const std::size_t equals = argument.find('=');
    const std::string_view key = argument.substr(0, equals);
    if (equals == argument.npos) throw WrongCall("no KEY=VALUE: " + std::string(argument));
    if (!set(key, argument.substr(equals + 1))) throw WrongCall("no such key: " + std::string(key));
  }
}

Config ConfigOf(Arguments arguments) {
  Config config{};
  SetAll(arguments, [&](std::string_view key, std::string_view value) {
    return Set<Network>(config.network, kNetworkFields, key, value) || Set<Config>(config, kConfigFields, key, value);
  });
  return config;
}

// ---- Calls -------------------------------------------------------------------------------------------------------

// Says what the function returned, before its records.
int Told(int result) {
  std::printf("result=%d\n", result);
  return result;
}

template <class Record, class Function>
int CallForList(Function function) {
  Ring<Record> ring;
  const int result = Told(function(ring.head()));
  ring.ForEach([](const Record& record) { Print(record); });
  return result;
}

int Scan(Arguments arguments) {
  const std::string_view kind = arguments[0];
  if (kind != "last" && kind != "renew") throw WrongCall("neither last nor renew: " + std::string(kind));
  const WIRELESS_SCAN scan = kind == "renew" ? WIRELESS_SCAN_RENEW : WIRELESS_SCAN_LAST;
  return CallForList<Network>([scan](WIRELESS_LIST* head) { return MEROWirelessNetworkScan(scan, head); });
}

int GetBy(WIRELESS_FILTER filter, const char* value) {
  Network network{};
  const int result = Told(MEROWirelessNetworkGet(value, filter, &network));
  if (result == 1) Print(network);
  return result;
}

int Get(Arguments arguments) {
  const std::string_view filter = arguments[0];
  if (filter == "essid") return GetBy(WIRELESS_FILTER_ESSID, arguments[1]);
  if (filter != "bssid") throw WrongCall("neither essid nor bssid: " + std::string(filter));

  Address address;
  SetAddress(address, arguments[1]);
  return GetBy(WIRELESS_FILTER_BSSID, reinterpret_cast<const char*>(address));
}

int Save(Arguments arguments) {
  const Config config = ConfigOf(arguments);
  return Told(MEROWirelessConfSet(&config));
}

int Enum(Arguments) {
  return CallForList<Config>(MEROWirelessConfEnum);
}

int EnumByTime(Arguments) {
  return CallForList<Config>(MEROWirelessConfEnumByAtime);
}

int Connect(Arguments arguments) {
  const Config config = ConfigOf(arguments);
  return Told(MEROWirelessNetworkConnect(&config));
}

int Adhoc(Arguments arguments) {
  const Config config = ConfigOf(arguments);
  return Told(MEROWirelessAdhocCreate(&config));
}

int AutoConnect(Arguments) {
  return Told(MEROWirelessAutoConnect());
}

int Ifconfig(Arguments arguments) {
  return Told(MEROWirelessIfconfigSet(arguments[0], ConfigOf(arguments.subspan(1))));
}

int Gateway(Arguments arguments) {
  return Told(MEROWirelessDefaultGatewaySet(arguments[0]));
}

int Status(Arguments) {
  const WIRELESS_STATUS status = MEROWirelessConnStatusGet();
  Told(status);
  std::printf("status=%s\n", NameOf(status, kStatuses).c_str());
  return status;
}

int Disconnect(Arguments) {
  return Told(MEROWirelessNetworkDisconnect());
}

// The settings of the adapter that is plugged in, whose section they name; -1 when there is none.
int ReadSettings(Settings& settings) {
  char szSection[sizeof settings.szSecName] = {};
  if (MEROWirelessApConfigSecNameGet(szSection, sizeof szSection) == FALSE) return -1;
  return MEROWirelessGetAPConfig(szSection, &settings);
}

int ApShow(Arguments) {
  Settings settings{};
  const int result = Told(ReadSettings(settings));
  Print(settings);
  return result;
}

// Settings that are not given stay as they were, but for the switch: saving switches an access point on by default.
int ApSave(Arguments arguments) {
  Settings settings{};
  (void)ReadSettings(settings);
  settings.blEnable = TRUE;
  SetAll(arguments, [&](std::string_view key, std::string_view value) { return SetSetting(settings, key, value); });
  return Told(MEROWirelessSetAPConfig(&settings));
}

int ApEnable(Arguments) {
  return Told(MEROWirelessAPEnable());
}

int ApDisable(Arguments) {
  return Told(MEROWirelessAPDisable());
}

int Mode(Arguments arguments) {
  const std::string_view mode = arguments[0];
  if (mode != "ap" && mode != "client") throw WrongCall("neither ap nor client: " + std::string(mode));
  return Told(MEROWirelessModeChange(mode == "ap" ? WIRELESS_AP_MODE : WIRELESS_CLIENT_MODE));
}

using Succeeded = bool (*)(int result);
constexpr Succeeded kZero = [](int result) { return result == 0; };
constexpr Succeeded kPositive = [](int result) { return result > 0; };

struct Call {
  std::string_view name;
  const char* arguments;
  std::size_t fewest;
  std::size_t most;
  int (*make)(Arguments);
  Succeeded succeeded;
};

constexpr std::size_t kAny = 64;

constexpr Call kCalls[] = {
    {"scan", "last|renew", 1, 1, Scan, kZero},
    {"get", "essid|bssid VALUE", 2, 2, Get, kPositive},
    {"save", "[KEY=VALUE...]", 0, kAny, Save, kZero},
    {"enum", "", 0, 0, Enum, kZero},
    {"enum-by-time", "", 0, 0, EnumByTime, kZero},
    {"connect", "[KEY=VALUE...]", 0, kAny, Connect, kZero},
    {"adhoc", "[KEY=VALUE...]", 0, kAny, Adhoc, kZero},
    {"autoconnect", "", 0, 0, AutoConnect, kZero},
    {"ifconfig", "INTERFACE [KEY=VALUE...]", 1, kAny, Ifconfig, kZero},
    {"gateway", "ADDRESS", 1, 1, Gateway, kZero},
    {"status", "", 0, 0, Status, kPositive},
    {"ap-show", "", 0, 0, ApShow, kPositive},
    {"ap-save", "[KEY=VALUE...]", 0, kAny, ApSave, kPositive},
    {"ap-enable", "", 0, 0, ApEnable, kPositive},
    {"ap-disable", "", 0, 0, ApDisable, kPositive},
    {"mode", "ap|client", 1, 1, Mode, kPositive},
    // Not the library's but the platform's: the library joins networks, and has no function that leaves one.
    {"disconnect", "", 0, 0, Disconnect, kZero},
};

const Call& CallNamed(std::string_view name, std::size_t arguments) {
  for (const Call& call : kCalls) {
    if (call.name == name && call.fewest <= arguments && arguments <= call.most) return call;
  }
  throw WrongCall("no such call");
}

void PrintUsage() {
  for (const Call& call : kCalls) {
    std::fprintf(stderr, "usage: mero-call %s %s\n", std::string(call.name).c_str(), call.arguments);
  }
}

}  // namespace

int main(int argc, char* argv[]) {
  const Arguments arguments = Arguments(argv, static_cast<std::size_t>(argc)).subspan(1);
  try {
    if (arguments.empty()) throw WrongCall("no call");
    const Call& call = CallNamed(arguments[0], arguments.size() - 1);
    return call.succeeded(call.make(arguments.subspan(1))) ? 0 : 1;
  } catch (const WrongCall& wrong) {
    std::fprintf(stderr, "mero-call: %s\n", wrong.what());
    PrintUsage();
    return 2;
  }
}
