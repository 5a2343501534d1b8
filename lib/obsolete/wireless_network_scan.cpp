// Lists the networks in range, from the fixed columns of the listing tool.
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <utility>

#include "common/log.h"
#include "common/text.h"
#include "holders.h"
#include "platform.h"
#include "ring.h"
#include "shell_words.h"
#include "wireless.h"

namespace {

using ListCommand = Command<128>;

// A row: the channel at its start, the name in columns 5 to 37, and from column 37 on the information.
constexpr size_t kNameColumn = 5;
constexpr size_t kInfoColumn = 37;
constexpr size_t kLeastRow = 32;

// The fields of a row are taken off its text as sscanf() takes them by " %d", "%x" and " %31s", but in a fraction of
// the time. Each is false when its field is not there.
bool TakeNumber(const char*& szText, int& number) {
  char* szEnd;
  number = static_cast<int>(std::strtol(szText, &szEnd, 10));
  return szEnd != std::exchange(szText, szEnd);
}

bool TakeOctet(const char*& szText, unsigned char& octet) {
  char* szEnd;
  octet = static_cast<unsigned char>(std::strtoul(szText, &szEnd, 16));
  // A "0x" with no digit behind it is a 0 too, and taken whole.
  const ptrdiff_t size = szEnd - szText;
  if (size > 0 && ToLower(*szEnd) == 'x' && szEnd[-1] == '0' && (size == 1 || szEnd[-2] < '0')) ++szEnd;
  return szEnd != std::exchange(szText, szEnd);
}

bool TakeWord(const char*& szText, char (&szWord)[32]) {
  while (IsSpace(*szText)) ++szText;
  size_t size = 0;
  while (size < sizeof szWord - 1 && *szText != '\0' && !IsSpace(*szText)) szWord[size++] = *szText++;
  szWord[size] = '\0';
  return size > 0;
}

// Takes the security token: "NONE", "WEP", or AUTHENTICATION/ENCRYPTION. Any other leaves both unknown.
void NetworkScanParseSecurity(const char* szSec, WIRELESS_NETWORK* pNetwork) {
  if (szSec == nullptr || pNetwork == nullptr) return LOG_LINE(47, "Bad parameters");

  pNetwork->auth = WIRELESS_AUTH_UNKNOWN;
  pNetwork->encrypt = WIRELESS_ENCRYPT_UNKNOWN;
  const char* szSlash = std::strchr(szSec, '/');
  char szAuth[16];
  char szEncrypt[16];
  if (EqualIgnoringCase(szSec, "NONE")) {
    pNetwork->auth = WIRELESS_AUTH_OPEN;
    pNetwork->encrypt = WIRELESS_ENCRYPT_NONE;
  } else if (EqualIgnoringCase(szSec, "WEP")) {
    pNetwork->auth = WIRELESS_AUTH_SHARED;
    pNetwork->encrypt = WIRELESS_ENCRYPT_WEP;
  } else if (szSlash != nullptr && szSlash[1] != '\0' && szSlash > szSec && szSlash < szSec + sizeof szAuth) {
    CopyText(szAuth, {szSec, static_cast<size_t>(szSlash - szSec)});
    CopyText(szEncrypt, szSlash + 1);
    pNetwork->auth = MEROWirelessAuthParse(szAuth);
    pNetwork->encrypt = MEROWirelessEncryptParse(szEncrypt);
  } else {
    LOG_LINE(62, "Failed to parse security field '%s'", szSec);
  }
}

// The name in its column, without the white space behind it.
void ParseName(const char* szRow, WIRELESS_NETWORK& network) {
  constexpr size_t kLongest = sizeof network.szEssid - 1;
  CopyText(network.szEssid, TrimEnd({szRow + kNameColumn, ::strnlen(szRow + kNameColumn, kLongest)}));
}

// The information behind the name; false when it is not all there.
bool ParseInfo(const char* szInfo, WIRELESS_NETWORK& network) {
  for (unsigned char& octet : network.bssid) {
    if (&octet != network.bssid && *szInfo++ != ':') return false;
    if (!TakeOctet(szInfo, octet)) return false;
  }
  char szProtocol[32];
  char szSecurity[32];
  if (!TakeNumber(szInfo, network.signal) || !TakeWord(szInfo, szProtocol) || !TakeWord(szInfo, szSecurity)) {
    return false;
  }
  network.protocol = MEROWirelessProtocolParse(szProtocol);
  NetworkScanParseSecurity(szSecurity, &network);
  return true;
}

// Whether a row describes a network that is to be listed. Networks that hide their names are not listed.
bool ParseRow(const char* szRow, WIRELESS_NETWORK& network) {
  const size_t size = std::strlen(szRow);
  if (size < kLeastRow) return false;
  const char* szChannel = szRow;
  if (!TakeNumber(szChannel, network.channel)) {
    return LOG_LINE(110, "Failed to parse channel(%s)", szRow), false;
  }
  ParseName(szRow, network);
  if (network.szEssid[0] == '\0') return false;
  if (size <= kInfoColumn || !ParseInfo(szRow + kInfoColumn, network)) {
    return LOG_LINE(127, "Failed to parse network info(%s)", szRow), false;
  }
  return true;
}

// Reads the adapter's results once, and appends them to the ring. Gives the number of networks, or -1 after a report.
int NetworkScanParse(const char* szIfName, WIRELESS_LIST* pHead) {
  if (szIfName == nullptr || pHead == nullptr) return LOG_LINE(79, "Bad parameters"), -1;

  const ListCommand command("/sbin/iwlist %s scanning mero", ShellWord(szIfName).c_str());
  const Pipe listing(command);
  if (!listing) return LOG_LINE(83, "Failed to popen '%s', errno=%m", command.c_str()), -1;

  char szRow[512] = {};
  for (int header = 0; header < 2; ++header) {
    if (std::fgets(szRow, sizeof szRow, listing.get()) == nullptr) return 0;
  }

  int count = 0;
  while (std::fgets(szRow, sizeof szRow, listing.get()) != nullptr) {
    auto network = NewRecord<WIRELESS_NETWORK>();
    if (!network) return LOG_LINE(97, "Failed to alloc memory"), -1;
    if (!ParseRow(szRow, *network)) continue;
    Append(*pHead, network.release()->list);
    ++count;
  }
  return count;
}

// Reads until two readings in a row have the same number of networks, five times at most: the driver adds results
// while they are read. The ring holds the last reading. Gives its number of networks, negative when it failed.
int NetworkScanCheck(const char* szIfName, WIRELESS_LIST* pHead) {
  constexpr int kReadings = 5;
  int previous = 0;
  for (int i = 0;; ++i) {
    ResetRing(*pHead);
    const int count = NetworkScanParse(szIfName, pHead);
    if (count < 0) {
      LOG_LINE(162, "Scan %d: failed.", i);
    } else if (count > 0 && count == previous) {
      return LOG_LINE(164, "Scan %d: success.", i), count;
    } else if (count == 0) {
      LOG_LINE(167, "Scan %d: no scan result.", i);
    } else {
      LOG_LINE(169, "Scan %d: result is un-stable.", i);
    }
    if (i == kReadings - 1) return count;
    ClearRing<WIRELESS_NETWORK>(*pHead);
    previous = count;
  }
}

// Makes the driver scan. The tool's ordinary listing does that; its output is thrown away.
int ScanAfresh(const char* szIfName) {
  const ListCommand command("/sbin/iwlist %s scanning > /dev/null 2>&1", ShellWord(szIfName).c_str());
  if (command.Run() >= 0) return 0;
  return LOG_LINE(200, "Failed to execute '%s'", command.c_str()), -1;
}

int NetworkScan(const char* szIfName, WIRELESS_SCAN scan, WIRELESS_LIST* pHead) {
  if (szIfName == nullptr || pHead == nullptr) return LOG_LINE(188, "Bad parameters"), -1;
  if (PLIBNetIfUp(szIfName) == 0) {
    return LOG_LINE(191, "Failed to activate network interface %s", szIfName), -1;
  }
  ::sleep(1);
  if (scan == WIRELESS_SCAN_RENEW && ScanAfresh(szIfName) < 0) return -1;
  if (NetworkScanCheck(szIfName, pHead) < 0) return LOG_LINE(204, "Failed to get network scanning result"), -1;
  return 0;
}

}  // namespace

int MEROWirelessNetworkScan(const WIRELESS_SCAN scan, WIRELESS_LIST* pHead) {
  constexpr int kWaits = 5;
  for (int waited = 0; MEROWirelessAdapterNum() <= 0; ++waited) {
    if (waited == kWaits) return LOG_LINE(229, "There is no wireless USB adapter plugged"), -1;
    LOG_LINE(233, "Wait for wlan0 ready, %d", waited);
    ::sleep(1);
  }
  return NetworkScan(MEROWirelessInterfaceGet(), scan, pHead);
}
