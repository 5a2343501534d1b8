// Rows of the listing tool: of any output at all, the library's scan makes the networks that scanf() would make of it,
// in order, with texts that end.
//
// Runs: 20000
// Covers: lib/obsolete/wireless_network_scan.cpp lib/obsolete/ring.h
#include <strings.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <vector>

#include "platform.h"
#include "tests/fuzz/support.h"
#include "tests/support/ring.h"

namespace {

std::string g_listing;

// The rows as fgets() takes them into a buffer of 512 bytes, behind two headings. What stands behind a NUL is none.
std::vector<std::string> Rows() {
  std::vector<std::string> rows;
  std::size_t begin = 0;
  while (begin < g_listing.size()) {
    const std::size_t end = std::min({g_listing.find('\n', begin), g_listing.size() - 1, begin + std::size_t{510}});
    rows.emplace_back(g_listing.substr(begin, end + 1 - begin).c_str());
    begin = end + 1;
  }
  rows.erase(rows.begin(), rows.begin() + std::min<std::ptrdiff_t>(2, std::ssize(rows)));
  return rows;
}

WIRELESS_AUTH AuthOf(const std::string& security) {
  if (::strcasecmp(security.c_str(), "NONE") == 0) return WIRELESS_AUTH_OPEN;
  if (::strcasecmp(security.c_str(), "WEP") == 0) return WIRELESS_AUTH_SHARED;
  const std::size_t slash = security.find('/');
  if (slash == security.npos || slash == 0 || slash > 15 || slash + 1 == security.size()) return WIRELESS_AUTH_UNKNOWN;
  return MEROWirelessAuthParse(security.substr(0, slash).c_str());
}

// A row as scanf() reads it; nothing where it is none that is listed.
std::optional<WIRELESS_NETWORK> Scanned(const std::string& row) {
  WIRELESS_NETWORK network{};
  unsigned octets[6];
  char szProtocol[32];
  char szSecurity[32];
  if (row.size() < 32 || std::sscanf(row.c_str(), "%d", &network.channel) != 1) return std::nullopt;
  std::string name = row.substr(5, 32);
  while (!name.empty() && std::strchr(" \t\n\v\f\r", name.back()) != nullptr) name.pop_back();
  if (name.empty() || row.size() <= 37) return std::nullopt;
  std::memcpy(network.szEssid, name.c_str(), name.size() + 1);
  if (std::sscanf(row.c_str() + 37, " %x:%x:%x:%x:%x:%x %d %31s %31s", &octets[0], &octets[1], &octets[2], &octets[3],
                  &octets[4], &octets[5], &network.signal, szProtocol, szSecurity) != 9) {
    return std::nullopt;
  }
  for (std::size_t i = 0; i < std::size(octets); ++i) network.bssid[i] = static_cast<unsigned char>(octets[i]);
  network.protocol = MEROWirelessProtocolParse(szProtocol);
  network.auth = AuthOf(szSecurity);
  return network;
}

bool Same(const WIRELESS_NETWORK& a, const WIRELESS_NETWORK& b) {
  return EndedText(a.szEssid) == EndedText(b.szEssid) && std::memcmp(a.bssid, b.bssid, sizeof a.bssid) == 0 &&
         a.channel == b.channel && a.signal == b.signal && a.opmode == b.opmode && a.protocol == b.protocol &&
         a.auth == b.auth;
}

}  // namespace

// ---- An adapter that is up, and lists the input ----

extern "C" int MEROWirelessAdapterNum() {
  return 1;
}

extern "C" const char* MEROWirelessInterfaceGet() {
  return "wlan0";
}

extern "C" int PLIBNetIfUp(const char*) {
  return 1;
}

extern "C" unsigned sleep(unsigned) {
  return 0;
}

extern "C" FILE* popen(const char*, const char*) {
  return ::fmemopen(g_listing.data(), g_listing.size(), "r");
}

extern "C" int pclose(FILE* stream) {
  return std::fclose(stream);
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  g_listing.assign(reinterpret_cast<const char*>(data), size);
  Ring<WIRELESS_NETWORK> ring;
  Require(MEROWirelessNetworkScan(WIRELESS_SCAN_LAST, ring.head()) == 0, "a listing is read", {g_listing});
  const std::vector<WIRELESS_NETWORK*> networks = ring.Records();
  std::size_t next = 0;
  for (const std::string& row : Rows()) {
    const std::optional<WIRELESS_NETWORK> scanned = Scanned(row);
    if (!scanned) continue;
    Require(next < networks.size() && Same(*networks[next], *scanned), "a row is read as scanf() reads it", {row});
    ++next;
  }
  Require(next == networks.size(), "what is no row is no network", {g_listing});
  return 0;
}
