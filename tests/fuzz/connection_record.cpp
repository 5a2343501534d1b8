// The record of a connection: what a join writes is what is read of that connection, whatever the network's name holds,
// and nothing is read of another one; no name or secret adds a line to the supplicant's settings; of any bytes in the
// record's place, numbers within their enumerations are read.
//
// Runs: 5000
// Covers: platform/core/connection_record.cpp platform/core/current_info.cpp lib/obsolete/wireless_network_connect.cpp
#include <net/if.h>  // first: the kernel's own headers make room for it

#include <linux/wireless.h>
#include <sys/ioctl.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>

#include "common/paths.h"
#include "platform.h"
#include "tests/fuzz/support.h"

namespace {

using Octets = std::array<unsigned char, 6>;

Octets g_accessPoint;  // as the driver names it

int Asked(WIRELESS_REQUEST request) {
  WIRELESS_INFO info{};
  Require(MEROWirelessCurInfoGet(request, &info) == 0, "the current connection is told of");
  return request == REQUEST_PROTOCOL ? static_cast<int>(info.protocol) : static_cast<int>(info.auth);
}

// A line of a record, from its end.
std::string LineFromEnd(std::string text, int number) {
  for (; number > 0; --number) {
    if (text.ends_with('\n')) text.pop_back();
    text.resize(text.rfind('\n') + 1);
  }
  if (text.ends_with('\n')) text.pop_back();
  return text.substr(text.rfind('\n') + 1);
}

int NumberUpTo(int greatest, const std::string& text) {
  const std::size_t first = text.starts_with('-') ? 1 : 0;
  const bool isNumber = text.size() > first && text.find_first_not_of("0123456789", first) == text.npos;
  const long number = isNumber ? std::strtol(text.c_str(), nullptr, 10) : 0;
  return number >= 0 && number <= greatest ? static_cast<int>(number) : 0;
}

bool IsAddress(const std::string& text) {
  char szAddress[sizeof "00:00:00:00:00:00"];
  MEROWirelessBssidStringGet(g_accessPoint.data(), szAddress, sizeof szAddress);
  return std::ranges::equal(text, std::string(szAddress), {}, [](char c) { return std::toupper(c); });
}

// Drivers give such an address while there is no connection.
bool IsConnected() {
  return std::ranges::none_of(std::array{0x00, 0x44, 0xff}, [](int octet) {
    return std::ranges::count(g_accessPoint, octet) == std::ssize(g_accessPoint);
  });
}

void CheckReading(const std::string& record) {
  const bool isOfThis = IsConnected() && IsAddress(LineFromEnd(record, 0));
  const int auth = isOfThis ? NumberUpTo(WIRELESS_AUTH_WPA2EAP, LineFromEnd(record, 2)) : 0;
  const int protocol = isOfThis ? NumberUpTo(WIRELESS_PROTO_11BN, LineFromEnd(record, 3)) : 0;
  Require(Asked(REQUEST_AUTH) == auth && Asked(REQUEST_PROTOCOL) == protocol, "a record is read from its end",
          {record});
}

void CheckSettings() {
  constexpr const char* kKeys[] = {
      "ctrl_interface=", "network={",   "\tssid=\"",         "\tbssid=",          "\tscan_ssid=1",
      "\tkey_mgmt=",     "\twep_key0=", "\twep_tx_keyidx=0", "\tauth_alg=SHARED", "\teap=TTLS PEAP",
      "\tpairwise=",     "\tpsk=\"",    "\tidentity=\"",     "\tpassword=\"",     "}"};
  const std::string settings = FileAt(kSupplicantConfigPath).value_or("");
  std::size_t next = 0;
  for (const std::string& line : LinesOf(settings)) {
    while (next < std::size(kKeys) && !line.starts_with(kKeys[next])) ++next;
    Require(next++ < std::size(kKeys), "each line of the supplicant's is the library's", {settings});
  }
}

// A network as a caller gives it; its texts may fill their fields.
WIRELESS_NETWORK_CONFIG Taken(Fields& fields) {
  WIRELESS_NETWORK_CONFIG config{};
  fields.Fill(config.network.szEssid);
  char szBssid[sizeof config.network.bssid] = {};
  fields.Fill(szBssid);
  std::ranges::copy(szBssid, config.network.bssid);
  fields.Fill(config.szKey);
  fields.Fill(config.szUser);
  config.network.opmode = WIRELESS_OPMODE_MANAGED;
  config.network.protocol = static_cast<WIRELESS_PROTOCOL>(fields.Number());
  config.network.auth = static_cast<WIRELESS_AUTH>(fields.Number());
  config.network.encrypt = static_cast<WIRELESS_ENCRYPT>(fields.Number());
  config.noneBssid = fields.Number();
  return config;
}

}  // namespace

// ---- An adapter that joins whatever it is told to ----

extern "C" int MEROWirelessAdapterNum() {
  return 1;
}

extern "C" const char* MEROWirelessInterfaceGet() {
  return "wlan0";
}

extern "C" int MEROWirelessCheckBlock() {
  return 1;
}

extern "C" unsigned sleep(unsigned) {
  return 0;
}

extern "C" int system(const char*) {
  return 0;
}

extern "C" FILE* popen(const char*, const char*) {
  static char szState[] = "wpa_state=COMPLETED\n";
  return ::fmemopen(szState, sizeof szState - 1, "r");
}

extern "C" int pclose(FILE* stream) {
  return std::fclose(stream);
}

extern "C" int ioctl(int, unsigned long request, ...) noexcept {
  va_list arguments;
  va_start(arguments, request);
  auto& wireless = *va_arg(arguments, iwreq*);
  va_end(arguments);
  if (request == SIOCGIWMODE) wireless.u.mode = IW_MODE_INFRA;
  if (request == SIOCGIWAP) std::ranges::copy(g_accessPoint, wireless.u.ap_addr.sa_data);
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Fields fields(data, size);
  const WIRELESS_NETWORK_CONFIG config = Taken(fields);
  const std::string record = fields.Rest();
  g_accessPoint = {2, 0, 0, 0, 1, 0};
  PutFile(kConnectionRecordPath, record);
  CheckReading(record);

  if (MEROWirelessNetworkConnect(&config) < 0) return 0;
  CheckSettings();
  const std::string written = FileAt(kConnectionRecordPath).value_or("");
  CheckReading(written);
  std::ranges::copy(config.network.bssid, g_accessPoint.begin());
  CheckReading(written);
  if (!IsConnected()) return 0;
  Require(Asked(REQUEST_AUTH) == NumberUpTo(WIRELESS_AUTH_WPA2EAP, std::to_string(config.network.auth)) &&
              Asked(REQUEST_PROTOCOL) == NumberUpTo(WIRELESS_PROTO_11BN, std::to_string(config.network.protocol)),
          "what a join records is read", {written});
  return 0;
}
