// The functions that the program comes upon instead of the library's.
#include "library_fakes.h"

#include <dlfcn.h>
#include <sys/mman.h>
#include <syslog.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <sstream>

#include "common/paths.h"
#include "common/text.h"
#include "kernel_fakes.h"
#include "tests/support/fake_functions.h"
#include "tests/support/files.h"
#include "tests/support/ring.h"

namespace library {

#define DEFINE(name, count) std::function<decltype(::name)> name;
LIBRARY_QUERIES(DEFINE)
LIBRARY_ACTIONS(DEFINE)
#undef DEFINE

uid_t g_user = 0;
std::time_t g_now = 0;

namespace {

int g_calls = -1;  // shared with the processes that are forked

}  // namespace

void Reset() {
  if (g_calls >= 0) ::close(g_calls);
  g_calls = ::memfd_create("calls", MFD_CLOEXEC);
  g_user = 0;
  g_now = 0;
  kernel::Reset();

#define GIVE_ZERO(name, count) name = [](auto&&...) { return decltype(name)::result_type{}; };
  LIBRARY_ACTIONS(GIVE_ZERO)
  LIBRARY_QUERIES(GIVE_ZERO)
#undef GIVE_ZERO
  MEROWirelessAdapterNum = [] { return 1; };
  MEROWirelessInterfaceGet = [] { return "wlan0"; };
  MEROWirelessCheckBlock = [] { return 1; };
  MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_DISCONNECTED; };
  MEROWirelessTestAPMode = [] { return Exists(kApMarkerPath) ? TRUE : FALSE; };
  MEROWirelessAPEnable = [] { return kernel::BecomeAccessPoint("Office"), TRUE; };
  MEROWirelessAPDisable = [] { return kernel::BecomeClient(), TRUE; };
  MEROWirelessModeChange = [](MERO_WIRELESS_MODE mode) {
    mode == WIRELESS_AP_MODE ? kernel::BecomeAccessPoint("Office") : kernel::BecomeClient();
    return TRUE;
  };
  MEROWirelessApConfigSecNameGet = [](char* szName, size_t) { return std::strcpy(szName, "ExampleStick"), TRUE; };
  MEROWirelessSetAPConfig = [](PMERO_AP_CONF) { return TRUE; };
  PLIBCFileCheckKeyValue = [](const char* szPath, const char* szKey, const char* szExpected, int exact) {
    if (std::strcmp(szPath, kModelPath) == 0) return 1;
    static const auto real =
        reinterpret_cast<decltype(&::PLIBCFileCheckKeyValue)>(::dlsym(RTLD_NEXT, "PLIBCFileCheckKeyValue"));
    return real(szPath, szKey, szExpected, exact);
  };
  PLIBCFileSetKeyValue = [](const char*, const char*, const char*, const char*) { return 1; };
  PLIBCFileRemoveSection = [](const char*, const char*) { return 1; };
  InRange({});
  Known({});
}

void Record(std::string_view what) {
  const std::string line = std::string(what) + "\n";
  if (::write(g_calls, line.data(), line.size()) < 0) std::abort();
}

std::vector<std::string> Calls() {
  std::string text(static_cast<std::size_t>(::lseek(g_calls, 0, SEEK_END)), '\0');
  if (::pread(g_calls, text.data(), text.size(), 0) < 0) std::abort();
  std::istringstream lines(text);
  std::vector<std::string> calls;
  for (std::string line; std::getline(lines, line);) calls.push_back(line);
  return calls;
}

WIRELESS_NETWORK Network(std::string_view name, WIRELESS_AUTH auth, WIRELESS_ENCRYPT encrypt) {
  WIRELESS_NETWORK network{};
  CopyText(network.szEssid, name);
  for (unsigned char& octet : network.bssid) octet = 0x0A;
  network.channel = 6;
  network.signal = 74;
  network.protocol = WIRELESS_PROTO_11BGN;
  network.auth = auth;
  network.encrypt = encrypt;
  return network;
}

WIRELESS_NETWORK_CONFIG Home() {
  WIRELESS_NETWORK_CONFIG config{};
  config.network = Network("Home");
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  CopyText(config.szKey, "open sesame");
  CopyText(config.szIp, "DHCP");
  return config;
}

MERO_AP_CONF Office() {
  MERO_AP_CONF conf{};
  CopyText(conf.szSecName, "ExampleStick");
  MERO_HOSTAP_CONF& main = conf.hostapConf;
  CopyText(main.szSSID, "Office");
  CopyText(main.szBridge, "lbr0");
  main.hwMode = AP_MODE_80211G;
  main.ieee80211n = 1;
  main.wirelessWidth = AP_FREQ_ALL;
  main.channel = 6;
  main.maxStation = 256;
  main.wmm = 1;
  main.encryption = AP_ENCRYPT_WPA_PSK;
  main.encryptInfo.wpaPskInfo.wpaType = TYPE_WPA2;
  main.encryptInfo.wpaPskInfo.encryptType = TYPE_CCMP;
  CopyText(main.encryptInfo.wpaPskInfo.szPassPhrase, "open sesame");
  CopyText(main.guestNet.szSSID, "Guests");
  main.guestNet.maxStation = 10;
  conf.txpower = 10;
  conf.guestNetAccessRule.blLanBlock = TRUE;
  return conf;
}

void InRange(std::vector<WIRELESS_NETWORK> networks) {
  MEROWirelessNetworkScan = [networks](WIRELESS_SCAN scan, WIRELESS_LIST* head) {
    if (scan == WIRELESS_SCAN_RENEW) Record("MEROWirelessNetworkScan");
    return FillRing(head, networks), 0;
  };
}

void Known(std::vector<WIRELESS_NETWORK_CONFIG> configs) {
  MEROWirelessConfEnum = [configs](WIRELESS_LIST* head) { return FillRing(head, configs), 0; };
  std::ranges::sort(configs, std::greater{}, &WIRELESS_NETWORK_CONFIG::atime);
  MEROWirelessConfEnumByAtime = [configs](WIRELESS_LIST* head) { return FillRing(head, configs), 0; };
}

void Connected(std::string_view name) {
  MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_CONNECTED_MANAGED; };
  MEROWirelessCurInfoGet = [name = std::string(name)](WIRELESS_REQUEST request, PWIRELESS_INFO info) {
    if (request == REQUEST_ESSID) CopyText(info->szEssid, name);
    if (request == REQUEST_AUTH) info->auth = WIRELESS_AUTH_WPA2PSK;
    if (request == REQUEST_PROTOCOL) info->protocol = WIRELESS_PROTO_11BGN;
    if (request == REQUEST_MODE) info->opmode = WIRELESS_OPMODE_MANAGED;
    return 0;
  };
}

void InCell(std::string_view name) {
  MEROWirelessConnStatusGet = [] { return WIRELESS_STATUS_CONNECTED_ADHOC; };
  MEROWirelessCurInfoGet = [name = std::string(name)](WIRELESS_REQUEST request, PWIRELESS_INFO info) {
    if (request == REQUEST_MODE) info->opmode = WIRELESS_OPMODE_ADHOC;
    if (request == REQUEST_ESSID) CopyText(info->szEssid, name);
    return 0;
  };
}

void SavedAp(const MERO_AP_CONF& conf) {
  MEROWirelessGetAPConfig = [conf](const char*, PMERO_AP_CONF read) { return *read = conf, 1; };
}

void Report(const char* szUnit, const char* szMessage) {
  ::syslog(LOG_ERR, "%s:%d %s", szUnit, 7, szMessage);
}

}  // namespace library

#define DEFINE_QUERY(name, count)            \
  STAND_IN_FOR(name, count) {                \
    return library::name(ARGUMENTS_##count); \
  }
#define DEFINE_ACTION(name, count)           \
  STAND_IN_FOR(name, count) {                \
    library::Record(#name);                  \
    return library::name(ARGUMENTS_##count); \
  }
LIBRARY_QUERIES(DEFINE_QUERY)
LIBRARY_ACTIONS(DEFINE_ACTION)

extern "C" uid_t geteuid() {
  return library::g_user;
}

extern "C" std::time_t time(std::time_t* now) noexcept {
  timespec machine{};
  ::clock_gettime(CLOCK_REALTIME, &machine);
  const std::time_t told = library::g_now != 0 ? library::g_now : machine.tv_sec;
  if (now != nullptr) *now = told;
  return told;
}
